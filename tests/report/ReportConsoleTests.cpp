// The report as the running console shows it on a workstation with Desktop and Skyloft.
#include <gtest/gtest.h>

#include <algorithm>
#include <string>

#include "res/resource.h"
#include "tests/e2e/ConsoleDriver.h"
#include "tests/support/TestSupport.h"

using testing_support::ScopedRegistryKey;

namespace {

// The first descendant of window with the control identifier id.
HWND Descendant(HWND window, int id) {
  struct Search {
    int id;
    HWND found;
  } search = {id, nullptr};
  EnumChildWindows(
      window,
      [](HWND child, LPARAM data) -> BOOL {
        Search* s = reinterpret_cast<Search*>(data);
        if (GetDlgCtrlID(child) != s->id) return TRUE;
        s->found = child;
        return FALSE;
      },
      reinterpret_cast<LPARAM>(&search));
  return search.found;
}

TEST(ReportInConsole, ShowsTheWorkstationsProducts) {
  ScopedRegistryKey desktop(HKEY_LOCAL_MACHINE, L"SOFTWARE\\KVEL\\Desktop10.5");
  desktop.SetString(L"ProductName", L"Mapora Desktop");
  desktop.SetString(L"RealVersion", L"10.5.0.6491");
  desktop.SetString(L"InstallDir", L"C:\\Program Files (x86)\\Mapora\\Desktop10.5");
  desktop.SetString(L"Installer", L"ws-admin");
  desktop.SetString(L"InstallDate", L"2024-03-01");
  desktop.SetString(L"InstallTime", L"09:15:00");
  desktop.SetString(L"ImageLocation", L"\\\\depot\\mapora\\10.5\\Desktop");
  desktop.SetString(L"SPNumber", L"1");
  desktop.SetString(L"SPBuild", L"6491");
  ScopedRegistryKey skyloft(HKEY_LOCAL_MACHINE, L"SOFTWARE\\Kvel\\Skyloft2016.1", KEY_WOW64_64KEY);
  skyloft.SetString(L"InstallDir", L"C:\\Program Files\\Mapora\\Skyloft");

  e2e::Console console({L"", {L"KVEL_DESKTOP10.5_INSTALLED=1"}});
  ASSERT_TRUE(console.Started());
  HWND mainWindow = console.WaitForMainWindow();
  ASSERT_NE(mainWindow, nullptr);
  HWND report = nullptr;
  ASSERT_TRUE(e2e::WaitUntil([&] {
    report = Descendant(mainWindow, IDC_REPORT);
    return report != nullptr && !e2e::WindowText(report).empty();
  }));

  const std::wstring text = e2e::WindowText(report);
  EXPECT_EQ(text.rfind(L" DESKTOP\r\n\r\n    Installation Information\r\n    Product Name: Mapora Desktop\r\n", 0), 0u)
      << testing::PrintToString(text);
  EXPECT_NE(text.find(L"\r\n    Install Image: \\\\depot\\mapora\\10.5\\Desktop\r\n"), std::wstring::npos);
  EXPECT_NE(text.find(L"\r\n    Mapora Service Pack: 1 (build 6491)\r\n\r\n SKYLOFT\r\n"), std::wstring::npos);
  const std::wstring skyloftEnd = L"    Installation Folder: C:\\Program Files\\Mapora\\Skyloft\r\n ";
  EXPECT_EQ(text.substr(text.size() - std::min(text.size(), skyloftEnd.size())), skyloftEnd);
  // Started from the build folder, not from the shared 32-bit program folder.
  HWND advanced = Descendant(mainWindow, IDC_ADVANCED);
  ASSERT_NE(advanced, nullptr);
  EXPECT_FALSE(IsWindowVisible(advanced));
  EXPECT_FALSE(e2e::SaveScreenshot(mainWindow, "report-desktop-skyloft").empty());
}

}  // namespace
