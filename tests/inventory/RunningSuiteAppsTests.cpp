// The running-application guard: which watched names a process list shows, the refusal text,
// and the process snapshot it reads them from.
#include <gtest/gtest.h>
#include <process.h>

#include "framework/ScopedHandle.h"
#include "inventory/RunningSuiteApps.h"
#include "tests/support/TestSupport.h"

using testing_support::CopyFileTo;
using testing_support::ModuleFolder;
using testing_support::ScopedDirectory;

namespace {

struct MatchRow {
  const char* name;
  CString processList;
  CStringArray expected;
};

const MatchRow kMatchRows[] = {
    {"table order, not process order", L"System|QuillonHost.exe|Vistamo.exe|Tessera.exe|",
     {L"Tessera.exe", L"Vistamo.exe", L"QuillonHost.exe"}},
    {"two processes of one application give one name", L"Tessera.exe|Tessera.exe|", {L"Tessera.exe"}},
    {"QuillonHost.exe alone is not Quillon.exe", L"QuillonHost.exe|", {L"QuillonHost.exe"}},
    {"a name ending in a watched name counts", L"OldTessera.exe|", {L"Tessera.exe"}},
    {"another letter case does not count", L"tessera.exe|TESSERA.EXE|", {}},
    {"no suite application", L"System|smss.exe|", {}},
};

TEST(FindSuiteApps, WatchedNamesAreCaseSensitiveSubstringsInTableOrder) {
  for (const MatchRow& row : kMatchRows) EXPECT_EQ(FindSuiteApps(row.processList), row.expected) << row.name;
}

TEST(RunningAppsText, OneIndentedLinePerName) {
  EXPECT_EQ(RunningAppsText({L"Tessera.exe", L"QuillonHost.exe"}), L"  Tessera.exe\r\n  QuillonHost.exe\r\n");
  EXPECT_EQ(RunningAppsText({}), L"");
}

// A copy of waiting_process.exe, running under the given name until the object goes.
class RunningCopy {
 public:
  RunningCopy(const std::wstring& folder, const std::wstring& exeName) {
    const std::wstring parent = std::to_wstring(GetCurrentProcessId());
    const std::wstring signal = L"MaporaGuardTest-" + parent;
    fw::ScopedHandle started(CreateSemaphoreW(nullptr, 0, 1, signal.c_str()));
    const std::wstring exe = folder + L"\\" + exeName;
    if (!CopyFileTo(ModuleFolder() + L"\\waiting_process.exe", exe)) return;
    process_.Reset(reinterpret_cast<HANDLE>(
        _wspawnl(_P_NOWAIT, exe.c_str(), exeName.c_str(), signal.c_str(), parent.c_str(), L"120000", nullptr)));
    // Only a program that has signalled surely shows in a snapshot.
    running_ = process_ && WaitForSingleObject(started.Get(), 30000) == WAIT_OBJECT_0;
  }
  ~RunningCopy() {
    if (!process_) return;
    TerminateProcess(process_.Get(), 0);
    WaitForSingleObject(process_.Get(), 30000);
  }
  bool IsRunning() const { return running_; }

 private:
  fw::ScopedHandle process_;
  bool running_ = false;
};

TEST(RunningSuiteApps, NoWatchedApplicationLeavesTheTextUntouched) {
  CString text = L"untouched";
  EXPECT_FALSE(GetRunningSuiteAppsText(text));
  EXPECT_EQ(text, L"untouched");
}

TEST(RunningSuiteApps, ARunningApplicationIsFoundInTheSnapshot) {
  ScopedDirectory folder(ModuleFolder() + L"\\guard-programs");
  RunningCopy tessera(folder.Path(), L"Tessera.exe");
  ASSERT_TRUE(tessera.IsRunning());

  CString processes;
  ASSERT_TRUE(GetProcessNameList(processes));
  EXPECT_NE(processes.find(L"|Tessera.exe|"), CString::npos) << processes;
  CString text;
  EXPECT_TRUE(GetRunningSuiteAppsText(text));
  EXPECT_EQ(text, L"  Tessera.exe\r\n");
}

}  // namespace
