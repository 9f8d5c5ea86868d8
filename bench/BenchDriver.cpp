// Driver of the start-up benchmark (tools/bench.sh runs it under the same wineserver as the
// programs it starts). It starts the console and the floor program in turn and times each
// from "process created" to "main window visible with the report text filled", reads their peak
// working sets, then times the opening of Advanced Configuration, and prints medians, minimums,
// ratios and one summary line beginning with "BENCH ".
//
//   BenchDriver --console PATH --floor PATH [--baseline PATH] [--runs N] [--trace FOLDER] [--close]
//
// --baseline PATH is another build of the console, timed in turn with the first in every phase,
// so that a change is measured against the program before it under the same load. --trace FOLDER
// has every started program write its start-up trace (MAPORA_STARTUP_TRACE) into FOLDER and
// prints, per traced step, the median and the fastest time it took. --close ends each program through its Cancel
// button instead of terminating it and times that too.
#include <windows.h>
#include <psapi.h>
#include <tlhelp32.h>

#include <algorithm>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <cwchar>
#include <functional>
#include <sstream>
#include <string>
#include <vector>

#include "bench/BenchDialog.h"
#include "framework/ScopedHandle.h"
#include "res/resource.h"
#include "tests/e2e/ConsoleDriver.h"

namespace {

constexpr int kDefaultRuns = 15;
// Runs of each program before the measured ones, so that every file and library is cached.
constexpr int kWarmUpRuns = 2;
constexpr DWORD kReadyTimeoutMs = 30000;
constexpr DWORD kExitTimeoutMs = 15000;
constexpr DWORD kPollIntervalMs = 1;
constexpr UINT kMessageTimeoutMs = 2000;
// A traced run waits this long once the window is ready, so that the first paint is traced too.
constexpr DWORD kTraceSettleMs = 400;
// "Advanced..." is clicked this long after the main window is ready, as a person would: the
// window has painted and whatever the console does after showing it is over.
constexpr DWORD kClickDelayMs = 500;
// The list holds the Windows-language and English entries before any language pack is listed.
constexpr LRESULT kEntriesBeforePacks = 2;
constexpr wchar_t kTraceVariable[] = L"MAPORA_STARTUP_TRACE";
constexpr double kBytesPerMegabyte = 1024.0 * 1024.0;

// QueryPerformanceCounter in microseconds, computed as the trace facility computes it, so that
// the programs' trace lines and the driver's own times share one clock.
double NowMicroseconds() {
  LARGE_INTEGER counter;
  LARGE_INTEGER frequency;
  QueryPerformanceCounter(&counter);
  QueryPerformanceFrequency(&frequency);
  const unsigned long long ticks = static_cast<unsigned long long>(counter.QuadPart);
  const unsigned long long perSecond = static_cast<unsigned long long>(frequency.QuadPart);
  return static_cast<double>(ticks / perSecond * 1000000ULL + ticks % perSecond * 1000000ULL / perSecond);
}

double Median(std::vector<double> values) {
  if (values.empty()) return 0.0;
  std::sort(values.begin(), values.end());
  const size_t middle = values.size() / 2;
  return values.size() % 2 != 0 ? values[middle] : (values[middle - 1] + values[middle]) / 2.0;
}

double Minimum(const std::vector<double>& values) {
  return values.empty() ? 0.0 : *std::min_element(values.begin(), values.end());
}

double Ratio(double value, double base) { return base > 0.0 ? value / base : 0.0; }

// --- Windows of another process ------------------------------------------------------------

// The first visible top-level window of the process that matches.
HWND FindTopLevel(DWORD processId, const std::function<bool(HWND)>& matches) {
  e2e::WindowSearch search{[&](HWND window) {
    DWORD owner = 0;
    GetWindowThreadProcessId(window, &owner);
    return owner == processId && IsWindowVisible(window) && matches(window);
  }};
  EnumWindows(e2e::MatchWindow, reinterpret_cast<LPARAM>(&search));
  return search.found;
}

// The answer of the window's thread, or -1 when it does not answer in time.
LRESULT Ask(HWND window, UINT message, WPARAM wParam = 0, LPARAM lParam = 0) {
  DWORD_PTR result = 0;
  if (!SendMessageTimeoutW(window, message, wParam, lParam, SMTO_NORMAL, kMessageTimeoutMs, &result)) return -1;
  return static_cast<LRESULT>(result);
}

// The main window once it is visible and its report (control reportId) holds text; null before.
HWND ReadyMainWindow(DWORD processId, int reportId) {
  return FindTopLevel(processId, [reportId](HWND window) {
    HWND report = e2e::Control(window, reportId);
    return report != nullptr && Ask(report, WM_GETTEXTLENGTH) > 0;
  });
}

// Advanced Configuration once it is visible and its language list holds the language packs.
HWND ReadyAdvancedDialog(DWORD processId, HWND mainWindow) {
  return FindTopLevel(processId, [mainWindow](HWND window) {
    HWND list = window != mainWindow ? e2e::Control(window, IDC_LANGUAGE_LIST) : nullptr;
    return list != nullptr && Ask(list, CB_GETCOUNT) > kEntriesBeforePacks;
  });
}

// --- Traces ----------------------------------------------------------------------------------

struct Mark {
  double at;  // microseconds, the driver's clock
  std::string step;
};

std::vector<Mark> ReadTrace(const std::wstring& path) {
  std::vector<Mark> marks;
  fw::ScopedHandle file(CreateFileW(path.c_str(), GENERIC_READ, FILE_SHARE_READ | FILE_SHARE_WRITE | FILE_SHARE_DELETE,
                                    nullptr, OPEN_EXISTING, FILE_ATTRIBUTE_NORMAL, nullptr));
  if (!file) return marks;
  std::string text;
  char buffer[4096];
  DWORD read = 0;
  while (ReadFile(file.Get(), buffer, sizeof buffer, &read, nullptr) && read > 0) text.append(buffer, read);
  std::istringstream lines(text);
  std::string line;
  while (std::getline(lines, line)) {
    if (line.empty() || line[0] == '#') continue;
    const size_t tab = line.find('\t');
    if (tab == std::string::npos) continue;
    marks.push_back({std::strtod(line.substr(0, tab).c_str(), nullptr), line.substr(tab + 1)});
  }
  return marks;
}

// Per traced step, over all runs: when it began (first occurrence) and how long it took until
// the next mark (summed over its occurrences), both from the run's start, cut at the run's end.
// Marks after the end and up to the limit are listed with no time taken (the first paint).
class TraceTable {
 public:
  void AddRun(const std::vector<Mark>& marks, double start, double end, double limit) {
    std::vector<Mark> inRun;
    for (const Mark& mark : marks) {
      if (mark.at >= start && mark.at <= limit) inRun.push_back(mark);
    }
    if (inRun.empty()) return;
    m_toFirstMark.push_back((inRun.front().at - start) / 1000.0);
    std::vector<Row*> seen;
    for (size_t i = 0; i < inRun.size(); ++i) {
      Row& row = RowOf(inRun[i].step);
      const bool first = std::find(seen.begin(), seen.end(), &row) == seen.end();
      if (first) {
        seen.push_back(&row);
        row.at.push_back((inRun[i].at - start) / 1000.0);
        row.took.push_back(0.0);
        row.count.push_back(0.0);
      }
      if (inRun[i].at > end) continue;
      const double next = i + 1 < inRun.size() ? std::min(inRun[i + 1].at, end) : end;
      row.took.back() += (next - inRun[i].at) / 1000.0;
      row.count.back() += 1.0;
    }
  }

  void Print(const char* title, const char* startName, const char* endName) const {
    if (m_rows.empty()) return;
    std::printf("\n%s (median and fastest of %zu runs; ms from %s)\n", title, m_toFirstMark.size(), startName);
    std::printf("  %-52s %9s %9s %9s %6s\n", "step (until the next mark)", "begins", "takes", "fastest", "times");
    std::printf("  %-52s %9.1f %9.1f %9.1f %6d\n", "(before the first mark)", 0.0, Median(m_toFirstMark),
                Minimum(m_toFirstMark), 1);
    for (const Row& row : m_rows) {
      std::printf("  %-52.52s %9.1f %9.1f %9.1f %6.0f\n", row.step.c_str(), Median(row.at), Median(row.took),
                  Minimum(row.took), Median(row.count));
    }
    std::printf("  (a step that begins after %s takes no part in it)\n", endName);
  }

 private:
  struct Row {
    std::string step;
    std::vector<double> at;
    std::vector<double> took;
    std::vector<double> count;
  };

  Row& RowOf(const std::string& step) {
    for (Row& row : m_rows) {
      if (row.step == step) return row;
    }
    m_rows.push_back({step, {}, {}, {}});
    return m_rows.back();
  }

  std::vector<Row> m_rows;
  std::vector<double> m_toFirstMark;
};

// --- Runs ------------------------------------------------------------------------------------

struct Options {
  std::wstring console;
  std::wstring floor;
  std::wstring baseline;
  std::wstring traceFolder;
  int runs = kDefaultRuns;
  bool close = false;
};

class Run {
 public:
  // reportId: the control whose text says the main window is ready.
  Run(const std::wstring& program, int reportId, const std::wstring& traceFile)
      : m_traceFile(traceFile), m_reportId(reportId) {
    if (traceFile.empty()) {
      SetEnvironmentVariableW(kTraceVariable, nullptr);
    } else {
      DeleteFileW(traceFile.c_str());
      SetEnvironmentVariableW(kTraceVariable, traceFile.c_str());
    }
    m_start = NowMicroseconds();
    m_process.Reset(e2e::Start(L"\"" + program + L"\""));
    m_processId = m_process ? GetProcessId(m_process.Get()) : 0;
  }

  ~Run() {
    if (!m_process) return;
    if (WaitForSingleObject(m_process.Get(), 0) == WAIT_TIMEOUT) {
      TerminateProcess(m_process.Get(), 1);
      WaitForSingleObject(m_process.Get(), kExitTimeoutMs);
    }
  }

  Run(const Run&) = delete;
  Run& operator=(const Run&) = delete;

  bool Started() const { return m_process.IsValid(); }
  double Start() const { return m_start; }

  // Polls until the main window is ready; its time in microseconds, or a negative value.
  double WaitForMainWindow() {
    const double deadline = m_start + kReadyTimeoutMs * 1000.0;
    while (NowMicroseconds() < deadline) {
      if (WaitForSingleObject(m_process.Get(), 0) != WAIT_TIMEOUT) return -1.0;
      m_mainWindow = ReadyMainWindow(m_processId, m_reportId);
      if (m_mainWindow != nullptr) return NowMicroseconds();
      Sleep(kPollIntervalMs);
    }
    return -1.0;
  }

  // Clicks "Advanced..." and polls until its dialog is ready; the click and ready times, or false.
  bool OpenAdvanced(double& clicked, double& ready) {
    HWND button = e2e::Control(m_mainWindow, IDC_ADVANCED);
    if (button == nullptr || !IsWindowVisible(button)) {
      std::fprintf(stderr, "the console shows no visible \"Advanced...\" button\n");
      return false;
    }
    Sleep(kClickDelayMs);
    clicked = NowMicroseconds();
    PostMessageW(GetParent(button), WM_COMMAND, MAKEWPARAM(IDC_ADVANCED, BN_CLICKED), reinterpret_cast<LPARAM>(button));
    const double deadline = clicked + kReadyTimeoutMs * 1000.0;
    while (NowMicroseconds() < deadline) {
      if (ReadyAdvancedDialog(m_processId, m_mainWindow) != nullptr) {
        ready = NowMicroseconds();
        return true;
      }
      Sleep(kPollIntervalMs);
    }
    std::fprintf(stderr, "Advanced Configuration did not open with its language list filled\n");
    return false;
  }

  // The names of the libraries the process has loaded, in lower case and sorted.
  std::vector<std::wstring> Libraries() const {
    std::vector<std::wstring> names;
    fw::ScopedHandle snapshot(CreateToolhelp32Snapshot(TH32CS_SNAPMODULE, m_processId));
    if (!snapshot) return names;
    MODULEENTRY32W module = {};
    module.dwSize = sizeof module;
    for (BOOL more = Module32FirstW(snapshot.Get(), &module); more; more = Module32NextW(snapshot.Get(), &module)) {
      std::wstring name = module.szModule;
      CharLowerBuffW(&name[0], static_cast<DWORD>(name.size()));
      names.push_back(name);
    }
    std::sort(names.begin(), names.end());
    return names;
  }

  double PeakWorkingSetMb() const {
    PROCESS_MEMORY_COUNTERS counters = {};
    counters.cb = sizeof counters;
    if (!GetProcessMemoryInfo(m_process.Get(), &counters, sizeof counters)) return 0.0;
    return static_cast<double>(counters.PeakWorkingSetSize) / kBytesPerMegabyte;
  }

  // Presses Cancel on the main window and waits for the process to end; milliseconds from
  // pressed, or < 0.
  double Close(double& pressed) {
    pressed = NowMicroseconds();
    PostMessageW(m_mainWindow, WM_COMMAND, MAKEWPARAM(IDCANCEL, BN_CLICKED), 0);
    if (WaitForSingleObject(m_process.Get(), kExitTimeoutMs) != WAIT_OBJECT_0) return -1.0;
    return (NowMicroseconds() - pressed) / 1000.0;
  }

  void Settle() const {
    if (!m_traceFile.empty()) Sleep(kTraceSettleMs);
  }

 private:
  std::wstring m_traceFile;
  int m_reportId;
  fw::ScopedHandle m_process;
  DWORD m_processId = 0;
  double m_start = 0.0;
  HWND m_mainWindow = nullptr;
};

// One program under test and what was measured of it.
struct Subject {
  const char* name = "";      // in the output
  const wchar_t* kind = L"";  // in the names of its trace files
  std::wstring path;
  bool isConsole = false;  // it has "Advanced..."
  std::vector<double> startupMs;
  std::vector<double> peakWorkingSetMb;
  std::vector<double> closeMs;
  std::vector<double> advancedMs;
  TraceTable startupSteps;
  TraceTable advancedSteps;
  TraceTable closeSteps;
  std::vector<std::wstring> libraries;  // loaded when the window was ready, in a traced run
};

Subject MakeSubject(const char* name, const wchar_t* kind, const std::wstring& path, bool isConsole) {
  Subject subject;
  subject.name = name;
  subject.kind = kind;
  subject.path = path;
  subject.isConsole = isConsole;
  return subject;
}

std::wstring TraceFile(const Options& options, const wchar_t* kind, const wchar_t* phase, int index) {
  if (options.traceFolder.empty()) return std::wstring();
  return options.traceFolder + L"\\" + kind + L"-" + phase + L"-" + std::to_wstring(index) + L".txt";
}

// One start of a program, timed to its ready main window; with advanced, also the opening of
// Advanced Configuration. Adds what it measured to the subject unless it is a warm-up.
bool TimeStart(const Options& options, Subject& subject, int index, bool advanced, bool warmUp) {
  const wchar_t* phase = advanced ? L"advanced" : L"startup";
  const std::wstring traceFile = warmUp ? std::wstring() : TraceFile(options, subject.kind, phase, index);
  // With Advanced Configuration open the main window cannot close; such a run is terminated.
  const bool close = options.close && !advanced;
  Run run(subject.path, subject.isConsole ? IDC_REPORT : IDC_BENCH_REPORT, traceFile);
  if (!run.Started()) return false;
  const double ready = run.WaitForMainWindow();
  if (ready < 0.0) {
    std::fprintf(stderr, "%ls: no ready main window within %lu ms\n", subject.path.c_str(), kReadyTimeoutMs);
    return false;
  }
  double clicked = 0.0;
  double advancedReady = 0.0;
  if (advanced && !run.OpenAdvanced(clicked, advancedReady)) return false;
  run.Settle();
  const double settled = NowMicroseconds();
  const double peakWorkingSetMb = run.PeakWorkingSetMb();
  if (!traceFile.empty() && !advanced && subject.libraries.empty()) subject.libraries = run.Libraries();
  double closeMs = 0.0;
  double closePressed = 0.0;
  if (close) {
    closeMs = run.Close(closePressed);
    if (closeMs < 0.0) {
      std::fprintf(stderr, "%ls did not end within %lu ms of Cancel\n", subject.path.c_str(), kExitTimeoutMs);
      return false;
    }
  }
  if (warmUp) return true;

  const std::vector<Mark> marks = traceFile.empty() ? std::vector<Mark>() : ReadTrace(traceFile);
  if (advanced) {
    subject.advancedMs.push_back((advancedReady - clicked) / 1000.0);
    subject.advancedSteps.AddRun(marks, clicked, advancedReady, settled);
    return true;
  }
  subject.startupMs.push_back((ready - run.Start()) / 1000.0);
  subject.peakWorkingSetMb.push_back(peakWorkingSetMb);
  subject.startupSteps.AddRun(marks, run.Start(), ready, settled);
  if (close) {
    subject.closeMs.push_back(closeMs);
    const double ended = closePressed + closeMs * 1000.0;
    subject.closeSteps.AddRun(marks, closePressed, ended, ended);
  }
  return true;
}

bool ParseOptions(int argc, wchar_t** argv, Options& options) {
  for (int i = 1; i < argc; ++i) {
    const std::wstring name = argv[i];
    const bool hasValue = i + 1 < argc;
    if (name == L"--console" && hasValue) {
      options.console = argv[++i];
    } else if (name == L"--floor" && hasValue) {
      options.floor = argv[++i];
    } else if (name == L"--baseline" && hasValue) {
      options.baseline = argv[++i];
    } else if (name == L"--trace" && hasValue) {
      options.traceFolder = argv[++i];
    } else if (name == L"--runs" && hasValue) {
      options.runs = _wtoi(argv[++i]);
    } else if (name == L"--close") {
      options.close = true;
    } else {
      return false;
    }
  }
  return !options.console.empty() && !options.floor.empty() && options.runs > 0;
}

// The fastest time first: on a shared machine it moves far less with the load than the median.
void PrintTimes(const Subject& subject, const std::vector<double>& times) {
  std::printf("  %-22s min %8.1f ms   median %8.1f ms\n", subject.name, Minimum(times), Median(times));
}

void PrintRatio(const char* name, const std::vector<double>& times, const std::vector<double>& base) {
  std::printf("  %-22s min %8.2f      median %8.2f\n", name, Ratio(Minimum(times), Minimum(base)),
              Ratio(Median(times), Median(base)));
}

// Warm-up, start-up and Advanced Configuration runs, each program in turn; false when one failed.
bool Measure(const Options& options, std::vector<Subject>& subjects) {
  Subject& console = subjects[0];
  Subject* baseline = options.baseline.empty() ? nullptr : &subjects[2];
  const size_t count = subjects.size();
  std::printf("warming up (%d runs of each program)\n", kWarmUpRuns);
  for (int i = 0; i < kWarmUpRuns; ++i) {
    for (Subject& subject : subjects) {
      if (!TimeStart(options, subject, i, subject.isConsole, true)) return false;
    }
  }

  std::printf("start-up: %d runs of each program, taking turns\n", options.runs);
  for (int i = 0; i < options.runs; ++i) {
    // The order rotates too, so that no program always follows the same one.
    for (size_t turn = 0; turn < count; ++turn) {
      if (!TimeStart(options, subjects[(static_cast<size_t>(i) + turn) % count], i, false, false)) return false;
    }
  }

  std::printf("Advanced Configuration: %d openings, each in a freshly started console\n", options.runs);
  for (int i = 0; i < options.runs; ++i) {
    const bool baselineFirst = baseline != nullptr && i % 2 != 0;
    if (baselineFirst && !TimeStart(options, *baseline, i, true, false)) return false;
    if (!TimeStart(options, console, i, true, false)) return false;
    if (baseline != nullptr && !baselineFirst && !TimeStart(options, *baseline, i, true, false)) return false;
  }
  return true;
}

// Medians, minimums and ratios, the libraries only the console loads, the traced steps, and the
// summary line for scripts.
void PrintResults(const Options& options, const std::vector<Subject>& subjects) {
  const Subject& console = subjects[0];
  const Subject& floor = subjects[1];
  const Subject* baseline = options.baseline.empty() ? nullptr : &subjects[2];

  std::printf("\nstart-up, console / floor: fastest to fastest %.2f, median to median %.2f\n",
              Ratio(Minimum(console.startupMs), Minimum(floor.startupMs)),
              Ratio(Median(console.startupMs), Median(floor.startupMs)));
  std::printf("\nprocess created -> main window visible with the report text filled\n");
  for (const Subject& subject : subjects) PrintTimes(subject, subject.startupMs);
  PrintRatio("console / floor", console.startupMs, floor.startupMs);
  if (baseline != nullptr) PrintRatio("console / baseline", console.startupMs, baseline->startupMs);
  std::printf("peak working set\n");
  for (const Subject& subject : subjects)
    std::printf("  %-22s median %8.1f MB\n", subject.name, Median(subject.peakWorkingSetMb));
  std::printf("  %-22s median %8.2f\n", "console / floor",
              Ratio(Median(console.peakWorkingSetMb), Median(floor.peakWorkingSetMb)));
  std::printf("click on \"Advanced...\" -> Advanced Configuration shown with its language list filled\n");
  PrintTimes(console, console.advancedMs);
  if (baseline != nullptr) {
    PrintTimes(*baseline, baseline->advancedMs);
    PrintRatio("console / baseline", console.advancedMs, baseline->advancedMs);
  }
  if (options.close) {
    std::printf("Cancel -> process ended\n");
    for (const Subject& subject : subjects) PrintTimes(subject, subject.closeMs);
  }

  if (!console.libraries.empty() && !floor.libraries.empty()) {
    std::printf("\nlibraries the console has loaded and the floor has not:");
    for (const std::wstring& library : console.libraries) {
      if (!std::binary_search(floor.libraries.begin(), floor.libraries.end(), library))
        std::printf(" %ls", library.c_str());
    }
    std::printf("\n");
  }
  for (const Subject& subject : subjects) {
    const std::string name = subject.name;
    subject.startupSteps.Print((name + ": start-up steps").c_str(), "process creation", "the window was ready");
    subject.advancedSteps.Print((name + ": Advanced Configuration steps").c_str(), "the click",
                                "the dialog was ready");
    subject.closeSteps.Print((name + ": shutdown steps").c_str(), "Cancel", "the process ended");
  }

  std::printf(
      "\nBENCH startup_min_ratio=%.2f startup_ratio=%.2f console_min_ms=%.1f floor_min_ms=%.1f "
      "console_ms=%.1f floor_ms=%.1f advanced_ms=%.1f advanced_min_ms=%.1f ws_ratio=%.2f "
      "console_ws_mb=%.1f floor_ws_mb=%.1f",
      Ratio(Minimum(console.startupMs), Minimum(floor.startupMs)),
      Ratio(Median(console.startupMs), Median(floor.startupMs)), Minimum(console.startupMs), Minimum(floor.startupMs),
      Median(console.startupMs), Median(floor.startupMs), Median(console.advancedMs), Minimum(console.advancedMs),
      Ratio(Median(console.peakWorkingSetMb), Median(floor.peakWorkingSetMb)), Median(console.peakWorkingSetMb),
      Median(floor.peakWorkingSetMb));
  if (options.close)
    std::printf(" console_close_ms=%.1f floor_close_ms=%.1f", Median(console.closeMs), Median(floor.closeMs));
  if (baseline != nullptr)
    std::printf(" baseline_ms=%.1f baseline_advanced_ms=%.1f", Median(baseline->startupMs),
                Median(baseline->advancedMs));
  std::printf(" runs=%d traced=%d\n", options.runs, options.traceFolder.empty() ? 0 : 1);
}

int RunBenchmark(const Options& options) {
  if (!options.traceFolder.empty()) CreateDirectoryW(options.traceFolder.c_str(), nullptr);
  std::setvbuf(stdout, nullptr, _IONBF, 0);

  std::vector<Subject> subjects;
  subjects.push_back(MakeSubject("console", L"console", options.console, true));
  subjects.push_back(MakeSubject("floor", L"floor", options.floor, false));
  if (!options.baseline.empty())
    subjects.push_back(MakeSubject("baseline console", L"baseline", options.baseline, true));
  if (!Measure(options, subjects)) return 1;
  PrintResults(options, subjects);
  return 0;
}

}  // namespace

int wmain(int argc, wchar_t** argv) {
  Options options;
  if (!ParseOptions(argc, argv, options)) {
    std::fprintf(stderr,
                 "usage: BenchDriver --console PATH --floor PATH [--baseline PATH] [--runs N] [--trace FOLDER] "
                 "[--close]\n");
    return 2;
  }
  return RunBenchmark(options);
}
