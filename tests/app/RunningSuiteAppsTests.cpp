// The running-application guard against real processes started under the watched names.
#include <gtest/gtest.h>

#include <string>

#include "app/RunningSuiteApps.h"
#include "tests/support/TestSupport.h"

using testing_support::ModuleFolder;

namespace {

// Copies of waiting_process.exe, each in a folder of its own so that names may repeat; ended
// and removed when the object goes.
class RunningPrograms {
 public:
  explicit RunningPrograms(const std::vector<std::wstring>& names) : folder_(ModuleFolder() + L"\\guard-programs") {
    const std::wstring semaphoreName = L"MaporaGuardTest-" + std::to_wstring(GetCurrentProcessId());
    HANDLE started = CreateSemaphoreW(nullptr, 0, static_cast<LONG>(names.size()) + 1, semaphoreName.c_str());
    for (size_t i = 0; i < names.size(); ++i) {
      std::wstring exe = folder_.Path() + L"\\" + std::to_wstring(i) + L"\\" + names[i];
      if (!testing_support::CopyFileTo(ModuleFolder() + L"\\waiting_process.exe", exe)) continue;
      std::wstring commandLine =
          L"\"" + exe + L"\" " + semaphoreName + L" " + std::to_wstring(GetCurrentProcessId()) + L" 120000";
      STARTUPINFOW startup = {};
      startup.cb = sizeof startup;
      PROCESS_INFORMATION process = {};
      if (!CreateProcessW(exe.c_str(), &commandLine[0], nullptr, nullptr, FALSE, 0, nullptr, nullptr, &startup,
                          &process))
        continue;
      CloseHandle(process.hThread);
      processes_.push_back(process.hProcess);
    }
    // Each program signals once it runs; only then does it surely show in a snapshot.
    allStarted_ = processes_.size() == names.size();
    for (size_t i = 0; i < processes_.size() && allStarted_; ++i)
      allStarted_ = WaitForSingleObject(started, 30000) == WAIT_OBJECT_0;
    CloseHandle(started);
  }
  ~RunningPrograms() {
    for (HANDLE process : processes_) {
      TerminateProcess(process, 0);
      WaitForSingleObject(process, 30000);
      CloseHandle(process);
    }
  }
  RunningPrograms(const RunningPrograms&) = delete;
  RunningPrograms& operator=(const RunningPrograms&) = delete;

  bool AllStarted() const { return allStarted_; }

 private:
  testing_support::ScopedDirectory folder_;
  std::vector<HANDLE> processes_;
  bool allStarted_ = false;
};

TEST(RunningSuiteApps, ProcessListNamesEveryProcessFollowedByABar) {
  CString list;
  ASSERT_TRUE(GetProcessNameList(list));
  EXPECT_NE(list.find(L"running_apps_tests.exe|"), CString::npos) << list.c_str();
  EXPECT_EQ(list.back(), L'|');
}

TEST(RunningSuiteApps, WatchedNamesFoundAsPlainCaseSensitiveSubstrings) {
  // An empty text: nothing blocks the save.
  const struct { const char* label; std::vector<std::wstring> running; CString expectedText; } cases[] = {
      {"table order, not start order", {L"QuillonHost.exe", L"Tessera.exe"},
       L"  Tessera.exe\r\n  QuillonHost.exe\r\n"},
      {"one line for two processes", {L"Tessera.exe", L"Tessera.exe"}, L"  Tessera.exe\r\n"},
      {"a name ending in a watched name", {L"OldTessera.exe"}, L"  Tessera.exe\r\n"},
      {"other letter case", {L"tessera.exe", L"TESSERA.EXE"}, L""},
      {"the other watched names", {L"Spherix.exe", L"Quillon.exe", L"Ledgerly.exe", L"Vistamo.exe"},
       L"  Ledgerly.exe\r\n  Vistamo.exe\r\n  Spherix.exe\r\n  Quillon.exe\r\n"},
  };
  for (const auto& c : cases) {
    {
      RunningPrograms programs(c.running);
      ASSERT_TRUE(programs.AllStarted()) << c.label;
      CString text = L"untouched";
      EXPECT_EQ(GetRunningSuiteAppsText(text), !c.expectedText.empty()) << c.label;
      EXPECT_EQ(text, c.expectedText.empty() ? L"untouched" : c.expectedText) << c.label;
    }
    // Ended with the scope: nothing is left running to block the next case or a save.
    CStringArray found = {L"stale"};
    GetRunningSuiteApps(found);
    EXPECT_TRUE(found.empty()) << c.label;
  }
}

}  // namespace
