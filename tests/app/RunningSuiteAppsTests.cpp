// The running-application guard against copies of waiting_process.exe running under the
// watched names, each in a folder of its own so that names may repeat.
#include <gtest/gtest.h>

#include "inventory/RunningSuiteApps.h"
#include "tests/support/TestSupport.h"

using namespace testing_support;

namespace {

TEST(RunningSuiteApps, WatchedNamesAreCaseSensitiveSubstringsListedInTableOrder) {
  const struct { std::vector<std::wstring> running; CString text; } cases[] = {  // empty: nothing blocks
      {{L"QuillonHost.exe", L"Vistamo.exe", L"Tessera.exe"}, L"  Tessera.exe\r\n  Vistamo.exe\r\n  QuillonHost.exe\r\n"},
      {{L"Tessera.exe", L"Tessera.exe"}, L"  Tessera.exe\r\n"},
      {{L"OldTessera.exe"}, L"  Tessera.exe\r\n"},
      {{L"tessera.exe", L"TESSERA.EXE"}, L""},
  };
  const std::wstring parent = std::to_wstring(GetCurrentProcessId());
  const std::wstring semaphore = L"MaporaGuardTest-" + parent;
  for (const auto& c : cases) {
    ScopedDirectory folder(ModuleFolder() + L"\\guard-programs");
    HANDLE started = CreateSemaphoreW(nullptr, 0, 8, semaphore.c_str());
    std::vector<PROCESS_INFORMATION> processes(c.running.size());
    for (size_t i = 0; i < c.running.size(); ++i) {
      std::wstring exe = folder.Path() + L"\\" + std::to_wstring(i) + L"\\" + c.running[i];
      std::wstring line = L"\"" + exe + L"\" " + semaphore + L" " + parent + L" 120000";
      STARTUPINFOW startup = {};
      startup.cb = sizeof startup;
      ASSERT_TRUE(CopyFileTo(ModuleFolder() + L"\\waiting_process.exe", exe) &&
                  CreateProcessW(exe.c_str(), &line[0], nullptr, nullptr, FALSE, 0, nullptr, nullptr, &startup,
                                 &processes[i]));
      // Only a program that has signalled surely shows in a snapshot.
      ASSERT_EQ(WaitForSingleObject(started, 30000), WAIT_OBJECT_0);
    }
    CString text = L"untouched";
    EXPECT_EQ(GetRunningSuiteAppsText(text), !c.text.empty()) << c.running[0];
    EXPECT_EQ(text, c.text.empty() ? CString(L"untouched") : c.text);
    for (const PROCESS_INFORMATION& process : processes) {
      TerminateProcess(process.hProcess, 0);
      WaitForSingleObject(process.hProcess, 30000);
      CloseHandle(process.hProcess);
      CloseHandle(process.hThread);
    }
    CloseHandle(started);
  }
}

}  // namespace
