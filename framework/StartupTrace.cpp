#include "framework/StartupTrace.h"

#include <windows.h>

#include <cstdio>

namespace fw {

namespace {

constexpr wchar_t kTraceVariable[] = L"MAPORA_STARTUP_TRACE";
constexpr int kLineChars = 160;

// The trace file, opened for appending, so that several runs can share one file; each run
// begins with a line naming its process.
HANDLE OpenTraceFile() {
  wchar_t path[MAX_PATH] = L"";
  DWORD length = GetEnvironmentVariableW(kTraceVariable, path, MAX_PATH);
  if (length == 0 || length >= MAX_PATH) return INVALID_HANDLE_VALUE;
  HANDLE file = CreateFileW(path, FILE_APPEND_DATA, FILE_SHARE_READ | FILE_SHARE_WRITE | FILE_SHARE_DELETE, nullptr,
                            OPEN_ALWAYS, FILE_ATTRIBUTE_NORMAL, nullptr);
  if (file == INVALID_HANDLE_VALUE) return file;
  char header[kLineChars];
  int chars = std::snprintf(header, sizeof header, "# process %lu\n", GetCurrentProcessId());
  DWORD written = 0;
  if (chars > 0) WriteFile(file, header, static_cast<DWORD>(chars), &written, nullptr);
  return file;
}

HANDLE TraceFile() {
  static const HANDLE file = OpenTraceFile();
  return file;
}

// The counter in microseconds, split so that the product cannot overflow.
unsigned long long Microseconds(LARGE_INTEGER counter, LARGE_INTEGER frequency) {
  const unsigned long long ticks = static_cast<unsigned long long>(counter.QuadPart);
  const unsigned long long perSecond = static_cast<unsigned long long>(frequency.QuadPart);
  return ticks / perSecond * 1000000ULL + ticks % perSecond * 1000000ULL / perSecond;
}

}  // namespace

void TraceStartup(const char* step) {
  const HANDLE file = TraceFile();
  if (file == INVALID_HANDLE_VALUE) return;
  LARGE_INTEGER counter;
  LARGE_INTEGER frequency;
  QueryPerformanceCounter(&counter);
  QueryPerformanceFrequency(&frequency);
  char line[kLineChars];
  int chars = std::snprintf(line, sizeof line, "%llu\t%s\n", Microseconds(counter, frequency), step ? step : "");
  if (chars <= 0) return;
  // A step name too long for the line is cut; the line still ends.
  if (chars >= kLineChars) {
    chars = kLineChars - 1;
    line[chars - 1] = '\n';
  }
  DWORD written = 0;
  WriteFile(file, line, static_cast<DWORD>(chars), &written, nullptr);
}

}  // namespace fw
