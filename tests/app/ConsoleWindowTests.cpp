// The main window and the About box, run modally in this process: a thread timer looks at the
// window once it is up and then closes it. The refused save runs a copy of waiting_process
// under a watched suite application's name.
#include <gtest/gtest.h>

#include <windows.h>
#include <commctrl.h>

#include <functional>
#include <string>

#include "app/AboutDlg.h"
#include "app/ClientAdminDlg.h"
#include "app/RunningSuiteApps.h"
#include "framework/App.h"
#include "inventory/ClientMaporaConfigDlg.h"
#include "res/resource.h"
#include "tests/support/TestSupport.h"

using testing_support::ScopedRegistryKey;

namespace {

const wchar_t kSettingsKey[] = L"SOFTWARE\\KVEL";
const wchar_t kDesktopKey[] = L"SOFTWARE\\KVEL\\Desktop10.5";
const wchar_t kEngineKey[] = L"SOFTWARE\\KVEL\\Engine10.5";

// Calls probe with the first visible top-level window of this thread that pick accepts, then
// lets closer end it. Gives up after about 30 seconds so that a broken window fails the test
// instead of hanging it.
struct WindowProbe {
  std::function<HWND()> find;
  std::function<void(HWND)> probe;
  bool probed = false;
  int ticks = 0;
};
WindowProbe* g_probe = nullptr;

void CALLBACK ProbeTimer(HWND, UINT, UINT_PTR id, DWORD) {
  if (g_probe == nullptr) return;
  HWND window = g_probe->find();
  if (window == nullptr || !IsWindowVisible(window)) {
    if (++g_probe->ticks > 600) {
      KillTimer(nullptr, id);
      PostQuitMessage(1);
    }
    return;
  }
  KillTimer(nullptr, id);
  g_probe->probed = true;
  g_probe->probe(window);
  PostMessageW(window, WM_COMMAND, MAKEWPARAM(IDCANCEL, BN_CLICKED), 0);
}

// Runs body (which opens something modal) with find/probe watching for the window.
bool RunWithProbe(const std::function<void()>& body, std::function<HWND()> find, std::function<void(HWND)> probe) {
  WindowProbe watcher{std::move(find), std::move(probe)};
  g_probe = &watcher;
  UINT_PTR timer = SetTimer(nullptr, 0, 50, ProbeTimer);
  body();
  KillTimer(nullptr, timer);
  g_probe = nullptr;
  MSG quit;
  PeekMessageW(&quit, nullptr, WM_QUIT, WM_QUIT, PM_REMOVE);
  return watcher.probed;
}

CString ItemText(HWND tree, HTREEITEM item) {
  wchar_t text[256] = L"";
  TVITEMW info = {};
  info.mask = TVIF_TEXT;
  info.hItem = item;
  info.pszText = text;
  info.cchTextMax = 256;
  TreeView_GetItem(tree, &info);
  return text;
}

CString MenuItemText(HMENU menu, UINT command) {
  wchar_t text[256] = L"";
  GetMenuStringW(menu, command, text, 256, MF_BYCOMMAND);
  return text;
}

CString ComputerName() {
  wchar_t name[MAX_COMPUTERNAME_LENGTH + 1] = L"";
  DWORD size = MAX_COMPUTERNAME_LENGTH + 1;
  GetComputerNameW(name, &size);
  return name;
}

class ConsoleWindow : public testing::Test {
 protected:
  static void SetUpTestSuite() {
    OleInitialize(nullptr);
    INITCOMMONCONTROLSEX classes = {sizeof classes, ICC_TREEVIEW_CLASSES | ICC_STANDARD_CLASSES | ICC_LINK_CLASS};
    InitCommonControlsEx(&classes);
    LoadLibraryW(L"RICHED20.DLL");
  }
  static void TearDownTestSuite() { OleUninitialize(); }

  CWinApp app_;  // the help file path lives in the application object
  ScopedRegistryKey settings_{HKEY_CURRENT_USER, kSettingsKey};
  ScopedRegistryKey desktop_{HKEY_LOCAL_MACHINE, kDesktopKey};
  ScopedRegistryKey engine_{HKEY_LOCAL_MACHINE, kEngineKey};
};

// Start-up state of the main window against the registry it finds.
struct StartCase {
  const char* name;
  const wchar_t* desktopDir;  // nullptr: no InstallDir recorded
  const wchar_t* engineDir;
  DWORD storedLangType;       // REG_NONE: no UILANGID
  DWORD storedLang;
  const wchar_t* helpFile;
  DWORD uiLangId;
};

const StartCase kStartCases[] = {
    {"DesktopHelpAndStoredLanguage", L"C:\\Mapora\\Desktop", nullptr, REG_DWORD, 1036,
     L"C:\\Mapora\\Desktop\\help\\administering_mapora_desktop.chm", 1036},
    {"EngineHelpWhenNoDesktop", nullptr, L"D:\\Engine", REG_NONE, 0,
     L"D:\\Engine\\help\\administering_mapora_desktop.chm", 0},
    {"DesktopBeforeEngine", L"C:\\Desktop", L"D:\\Engine", REG_DWORD, 0xFFFFFFFF,
     L"C:\\Desktop\\help\\administering_mapora_desktop.chm", 0},
    {"NoProductNoHelpFile", nullptr, nullptr, REG_SZ, 0, L"", 0},
};

class MainWindowStart : public ConsoleWindow, public testing::WithParamInterface<StartCase> {};

TEST_P(MainWindowStart, ShowsTheWorkstationPageAndLoadsTheSettings) {
  const StartCase& c = GetParam();
  if (c.desktopDir) desktop_.SetString(L"InstallDir", c.desktopDir);
  if (c.engineDir) engine_.SetString(L"InstallDir", c.engineDir);
  if (c.storedLangType == REG_DWORD) settings_.SetDword(L"UILANGID", c.storedLang);
  if (c.storedLangType == REG_SZ) settings_.SetString(L"UILANGID", L"1036");

  CClientAdminDlg dlg;
  CString rootText, helpFile, aboutItem;
  bool rootSelected = false, pageVisible = false, applyEnabled = true;
  int images = -1;
  bool probed = RunWithProbe([&] { dlg.DoModal(); }, [&] { return dlg.m_hWnd; },
                             [&](HWND window) {
                               HWND tree = GetDlgItem(window, IDC_PAGE_TREE);
                               HTREEITEM root = TreeView_GetRoot(tree);
                               rootText = ItemText(tree, root);
                               rootSelected = root != nullptr && TreeView_GetSelection(tree) == root;
                               images = ImageList_GetImageCount(TreeView_GetImageList(tree, TVSIL_NORMAL));
                               pageVisible = IsWindowVisible(GetRootPage().m_hWnd) != FALSE;
                               applyEnabled = IsWindowEnabled(GetDlgItem(window, IDC_APPLY_NOW)) != FALSE;
                               aboutItem = MenuItemText(GetSystemMenu(window, FALSE), IDM_ABOUTBOX);
                               helpFile = app_.GetHelpFilePath();
                             });
  ASSERT_TRUE(probed);
  EXPECT_EQ(rootText, L"Mapora (" + ComputerName() + L")");
  EXPECT_TRUE(rootSelected);
  EXPECT_TRUE(pageVisible);
  EXPECT_FALSE(applyEnabled);
  EXPECT_EQ(images, 3);
  EXPECT_EQ(aboutItem, L"&About Mapora Administrator...");
  EXPECT_EQ(helpFile, c.helpFile);
  EXPECT_EQ(dlg.m_dwUILangID, c.uiLangId);
  // Closing the window forgets the help file; Cancel writes nothing.
  EXPECT_EQ(app_.GetHelpFilePath(), L"");
  DWORD stored = 0;
  EXPECT_EQ(testing_support::ReadDword(HKEY_CURRENT_USER, kSettingsKey, L"UILANGID", stored),
            c.storedLangType == REG_DWORD);
  if (c.storedLangType == REG_DWORD) {
    EXPECT_EQ(stored, c.storedLang);
  }
}

INSTANTIATE_TEST_SUITE_P(Cases, MainWindowStart, testing::ValuesIn(kStartCases),
                         [](const testing::TestParamInfo<StartCase>& info) { return info.param.name; });

// What a save leaves in HKCU\SOFTWARE\KVEL; another value there always survives.
struct SaveCase {
  const char* name;
  bool keyExists;
  bool stored;  // UILANGID 1033 present before
  DWORD chosen;
  bool expectValue;
  DWORD expected;
};

const SaveCase kSaveCases[] = {
    {"NoKeyNothingChosenCreatesNothing", false, false, 0, false, 0},
    {"NothingStoredNothingChosen", true, false, 0, false, 0},
    {"ChosenIsWritten", false, false, 1036, true, 1036},
    {"ChosenReplacesStored", true, true, 1036, true, 1036},
    {"NoneChosenDeletesStored", true, true, 0, false, 0},
};

class MainWindowSave : public ConsoleWindow, public testing::WithParamInterface<SaveCase> {};

TEST_P(MainWindowSave, WritesOrDeletesTheDisplayLanguage) {
  const SaveCase& c = GetParam();
  if (c.keyExists) settings_.SetDword(L"Other", 7);
  if (c.stored) settings_.SetDword(L"UILANGID", 1033);

  CClientAdminDlg dlg;
  dlg.m_dwUILangID = c.chosen;
  EXPECT_TRUE(dlg.Save());

  DWORD value = 0;
  EXPECT_EQ(testing_support::ReadDword(HKEY_CURRENT_USER, kSettingsKey, L"UILANGID", value), c.expectValue);
  if (c.expectValue) {
    EXPECT_EQ(value, c.expected);
  }
  if (c.keyExists) {
    EXPECT_TRUE(testing_support::ValueExists(HKEY_CURRENT_USER, kSettingsKey, L"Other"));
  }
  HKEY key = nullptr;
  bool keyNow = RegOpenKeyExW(HKEY_CURRENT_USER, kSettingsKey, 0, KEY_READ, &key) == ERROR_SUCCESS;
  if (keyNow) RegCloseKey(key);
  EXPECT_EQ(keyNow, c.keyExists || c.expectValue);
}

INSTANTIATE_TEST_SUITE_P(Cases, MainWindowSave, testing::ValuesIn(kSaveCases),
                         [](const testing::TestParamInfo<SaveCase>& info) { return info.param.name; });

// A copy of waiting_process started as a watched suite application; ended with the object.
class RunningSuiteApp {
 public:
  explicit RunningSuiteApp(const wchar_t* name)
      : folder_(testing_support::ModuleFolder() + L"\\save-guard") {
    std::wstring exe = folder_.Path() + L"\\" + name;
    std::wstring commandLine = L"\"" + exe + L"\" unused " + std::to_wstring(GetCurrentProcessId()) + L" 120000";
    STARTUPINFOW startup = {};
    startup.cb = sizeof startup;
    PROCESS_INFORMATION process = {};
    testing_support::CreateDirectories(folder_.Path());
    if (testing_support::CopyFileTo(testing_support::ModuleFolder() + L"\\waiting_process.exe", exe) &&
        CreateProcessW(exe.c_str(), &commandLine[0], nullptr, nullptr, FALSE, 0, nullptr, nullptr, &startup,
                       &process)) {
      CloseHandle(process.hThread);
      process_ = process.hProcess;
    }
  }
  ~RunningSuiteApp() {
    if (process_ == nullptr) return;
    TerminateProcess(process_, 0);
    WaitForSingleObject(process_, 30000);
    CloseHandle(process_);
  }
  RunningSuiteApp(const RunningSuiteApp&) = delete;
  RunningSuiteApp& operator=(const RunningSuiteApp&) = delete;

  // Until the process shows in a snapshot, the guard cannot see it.
  bool Visible() const {
    for (int i = 0; i < 300 && process_ != nullptr; ++i, Sleep(100)) {
      CString text;
      if (GetRunningSuiteAppsText(text)) return true;
    }
    return false;
  }

 private:
  testing_support::ScopedDirectory folder_;
  HANDLE process_ = nullptr;
};

HWND FindMessageBox() {
  HWND found = nullptr;
  EnumThreadWindows(
      GetCurrentThreadId(),
      [](HWND window, LPARAM result) {
        wchar_t className[16] = L"";
        GetClassNameW(window, className, 16);
        if (lstrcmpW(className, L"#32770") != 0 || !IsWindowVisible(window)) return TRUE;
        *reinterpret_cast<HWND*>(result) = window;
        return FALSE;
      },
      reinterpret_cast<LPARAM>(&found));
  return found;
}

TEST_F(ConsoleWindow, SaveIsRefusedWhileASuiteApplicationRuns) {
  settings_.SetDword(L"UILANGID", 1033);
  RunningSuiteApp tessera(L"Tessera.exe");
  ASSERT_TRUE(tessera.Visible());

  CClientAdminDlg dlg;
  dlg.m_dwUILangID = 1036;
  bool saved = true;
  CString caption, message;
  HWND owner = reinterpret_cast<HWND>(1);
  bool probed = RunWithProbe([&] { saved = dlg.Save(); }, FindMessageBox, [&](HWND box) {
    caption = GetWindowTextOf(box);
    message = GetWindowTextOf(GetDlgItem(box, 0xFFFF));
    owner = GetWindow(box, GW_OWNER);
  });
  ASSERT_TRUE(probed);
  EXPECT_FALSE(saved);
  EXPECT_EQ(caption, L"Mapora Administrator");
  EXPECT_EQ(message,
            L"The following application(s) are running:\r\n\r\n  Tessera.exe\r\n\r\n"
            L"You must close these application(s) before you can save your changes.");
  EXPECT_EQ(owner, nullptr);
  DWORD stored = 0;
  EXPECT_TRUE(testing_support::ReadDword(HKEY_CURRENT_USER, kSettingsKey, L"UILANGID", stored));
  EXPECT_EQ(stored, 1033u);
}

TEST(ServicePackBuild, KeepsTheDigitsFromTheFirstDotOn) {
  const struct { const wchar_t* recorded; const wchar_t* shown; } cases[] = {
      {L"2.6491", L"6491"}, {L"10.5.6491", L"56491"}, {L".", L""},
      {L"6491", L"6491"},   {L"6491.", L""},          {L"", L""},
  };
  for (const auto& c : cases) EXPECT_EQ(NormalizeServicePackBuild(c.recorded), c.shown) << c.recorded;
}

// The About box's two service-pack fields against what the Desktop key records.
struct AboutCase {
  const char* name;
  const wchar_t* spName;  // nullptr: value absent
  const wchar_t* spBuild;
  const wchar_t* shownName;
  const wchar_t* shownBuild;
};

const AboutCase kAboutCases[] = {
    {"NoServicePack", nullptr, nullptr, L"", L""},
    {"DottedBuild", L"Service Pack 1", L"1.6491", L"Service Pack 1", L"(Build 6491)"},
    {"PlainBuild", L"Service Pack 1", L"6491", L"Service Pack 1", L"(Build 6491)"},
    {"DotOnly", L"Service Pack 2", L".", L"Service Pack 2", L"(Build )"},
    {"NameWithoutBuild", L"Service Pack 2", nullptr, L"Service Pack 2", L""},
    {"BuildWithoutName", nullptr, L"1.6491", L"", L""},
    {"EmptyName", L"", L"1.6491", L"", L""},
    {"InsertLikeBuildTakenLiterally", L"SP", L"%1%2", L"SP", L"(Build %1%2)"},
};

class AboutBox : public ConsoleWindow, public testing::WithParamInterface<AboutCase> {};

TEST_P(AboutBox, ShowsTheDesktopServicePack) {
  const AboutCase& c = GetParam();
  if (c.spName) desktop_.SetString(L"SPDisplayName", c.spName);
  if (c.spBuild) desktop_.SetString(L"SPBuild", c.spBuild);

  CAboutDlg about;
  LoadInstalledServicePack(about);
  CString shownName, shownBuild;
  bool probed = RunWithProbe([&] { about.DoModal(); }, [&] { return about.m_hWnd; }, [&](HWND box) {
    shownName = GetWindowTextOf(GetDlgItem(box, IDC_SERVICE_PACK));
    shownBuild = GetWindowTextOf(GetDlgItem(box, IDC_SERVICE_PACK_BUILD));
  });
  ASSERT_TRUE(probed);
  EXPECT_EQ(shownName, c.shownName);
  EXPECT_EQ(shownBuild, c.shownBuild);
}

INSTANTIATE_TEST_SUITE_P(Cases, AboutBox, testing::ValuesIn(kAboutCases),
                         [](const testing::TestParamInfo<AboutCase>& info) { return info.param.name; });

}  // namespace
