// The main window, run modally in this process and looked at by a thread timer once it is up,
// its save, and the About box's service-pack fields.
#include <gtest/gtest.h>

#include <windows.h>
#include <commctrl.h>

#include <functional>

#include "app/AboutDlg.h"
#include "app/ClientAdminDlg.h"
#include "framework/App.h"
#include "inventory/ClientMaporaConfigDlg.h"
#include "res/resource.h"
#include "tests/support/TestSupport.h"

using testing_support::ScopedRegistryKey;

namespace {

const wchar_t kSettingsKey[] = L"SOFTWARE\\KVEL";

class ConsoleWindow : public testing::Test {
 protected:
  static void SetUpTestSuite() {
    OleInitialize(nullptr);
    INITCOMMONCONTROLSEX classes = {sizeof classes, ICC_TREEVIEW_CLASSES | ICC_STANDARD_CLASSES};
    InitCommonControlsEx(&classes);
    LoadLibraryW(L"RICHED20.DLL");
  }
  static void TearDownTestSuite() { OleUninitialize(); }

  CWinApp app_;  // keeps the help file path
  ScopedRegistryKey settings_{HKEY_CURRENT_USER, kSettingsKey};
  ScopedRegistryKey desktop_{HKEY_LOCAL_MACHINE, L"SOFTWARE\\KVEL\\Desktop10.5"};
};

std::function<void()> g_probe;
CClientAdminDlg* g_dialog = nullptr;

int g_ticks = 0;

// Waits for the main window to show (30 seconds at most), looks at it, then cancels it.
void CALLBACK ProbeTimer(HWND, UINT, UINT_PTR id, DWORD) {
  if (g_dialog->m_hWnd == nullptr) return;
  if (!IsWindowVisible(g_dialog->m_hWnd) && ++g_ticks < 600) return;
  KillTimer(nullptr, id);
  g_probe();
  PostMessageW(g_dialog->m_hWnd, WM_COMMAND, MAKEWPARAM(IDCANCEL, BN_CLICKED), 0);
}

TEST_F(ConsoleWindow, StartsWithTheWorkstationPageAndTheStoredSettings) {
  desktop_.SetString(L"InstallDir", L"C:\\Mapora\\Desktop");
  settings_.SetDword(L"UILANGID", 1036);

  CClientAdminDlg dlg;
  wchar_t rootText[64] = L"";
  bool pageVisible = false, applyEnabled = true;
  CString helpFile;
  g_dialog = &dlg;
  g_probe = [&] {
    HWND tree = GetDlgItem(dlg.m_hWnd, IDC_PAGE_TREE);
    TVITEMW item = {};
    item.mask = TVIF_TEXT;
    item.hItem = TreeView_GetSelection(tree);
    item.pszText = rootText;
    item.cchTextMax = 64;
    TreeView_GetItem(tree, &item);
    pageVisible = IsWindowVisible(GetRootPage().m_hWnd) != FALSE;
    applyEnabled = IsWindowEnabled(GetDlgItem(dlg.m_hWnd, IDC_APPLY_NOW)) != FALSE;
    helpFile = app_.GetHelpFilePath();
  };
  SetTimer(nullptr, 0, 50, ProbeTimer);
  EXPECT_EQ(dlg.DoModal(), IDCANCEL);

  wchar_t computer[MAX_COMPUTERNAME_LENGTH + 1] = L"";
  DWORD size = MAX_COMPUTERNAME_LENGTH + 1;
  GetComputerNameW(computer, &size);
  EXPECT_EQ(CString(rootText), L"Mapora (" + CString(computer) + L")");
  EXPECT_TRUE(pageVisible);
  EXPECT_FALSE(applyEnabled);
  EXPECT_EQ(helpFile, L"C:\\Mapora\\Desktop\\help\\administering_mapora_desktop.chm");
  EXPECT_EQ(dlg.m_dwUILangID, 1036u);
  EXPECT_EQ(app_.GetHelpFilePath(), L"");  // forgotten with the window
}

TEST_F(ConsoleWindow, SaveWritesOrDeletesOnlyTheDisplayLanguage) {
  const struct { const char* label; bool stored; DWORD chosen; bool written; } cases[] = {
      {"nothing stored, none chosen", false, 0, false},
      {"chosen language written", false, 1036, true},
      {"chosen replaces stored", true, 1036, true},
      {"none chosen deletes stored", true, 0, false},
  };
  for (const auto& c : cases) {
    ScopedRegistryKey settings(HKEY_CURRENT_USER, kSettingsKey);
    settings.SetDword(L"Other", 7);
    if (c.stored) settings.SetDword(L"UILANGID", 1033);
    CClientAdminDlg dlg;
    dlg.m_dwUILangID = c.chosen;
    EXPECT_TRUE(dlg.Save()) << c.label;
    DWORD value = 0;
    EXPECT_EQ(testing_support::ReadDword(HKEY_CURRENT_USER, kSettingsKey, L"UILANGID", value), c.written) << c.label;
    EXPECT_EQ(value, c.written ? c.chosen : 0u) << c.label;
    EXPECT_TRUE(testing_support::ValueExists(HKEY_CURRENT_USER, kSettingsKey, L"Other")) << c.label;
  }
}

TEST(ServicePackBuild, KeepsTheDigitsFromTheFirstDotOn) {
  const struct { const wchar_t* recorded; const wchar_t* shown; } cases[] = {
      {L"2.6491", L"6491"}, {L"10.5.6491", L"56491"}, {L".", L""}, {L"6491", L"6491"}, {L"6491.", L""}};
  for (const auto& c : cases) EXPECT_EQ(NormalizeServicePackBuild(c.recorded), c.shown) << c.recorded;
}

TEST_F(ConsoleWindow, AboutBoxShowsTheDesktopServicePack) {
  const struct { const wchar_t* name; const wchar_t* build; const wchar_t* shownName; const wchar_t* shownBuild; }
      cases[] = {
          {nullptr, nullptr, L"", L""},
          {L"Service Pack 1", L"1.6491", L"Service Pack 1", L"(Build 6491)"},
          {L"Service Pack 1", L"6491", L"Service Pack 1", L"(Build 6491)"},
          {L"Service Pack 2", L".", L"Service Pack 2", L"(Build )"},
          {L"Service Pack 2", nullptr, L"Service Pack 2", L""},
          {nullptr, L"1.6491", L"", L""},
          {L"SP", L"%1%2", L"SP", L"(Build %1%2)"},  // inserts in the value stay text
      };
  for (const auto& c : cases) {
    ScopedRegistryKey desktop(HKEY_LOCAL_MACHINE, L"SOFTWARE\\KVEL\\Desktop10.5");
    if (c.name) desktop.SetString(L"SPDisplayName", c.name);
    if (c.build) desktop.SetString(L"SPBuild", c.build);
    CAboutDlg about;
    LoadInstalledServicePack(about);
    EXPECT_EQ(about.m_strServicePack, c.shownName);
    EXPECT_EQ(about.m_strServicePackBuild, c.shownBuild) << (c.build ? c.build : L"(none)");
  }
}

}  // namespace
