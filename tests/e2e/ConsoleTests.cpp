// The real console started in the test prefix, one test per window and per edge that only the
// whole program shows; the rules behind them are proved in-process.
#include <gtest/gtest.h>

#include <memory>

#include "tests/e2e/ConsoleDriver.h"
#include "tests/support/TestSupport.h"

namespace {

using namespace e2e;
using namespace testing_support;

constexpr wchar_t kSuiteKey[] = L"SOFTWARE\\KVEL";
constexpr wchar_t kPortalKey[] = L"Software\\KVEL\\Mapora Connection\\Settings";
constexpr wchar_t kPackFile[] = L"\\ResMaporaAdmin.dll";
constexpr wchar_t kHelpFile[] = L"\\administering_mapora_desktop.chm";

DWORD StoredForUser(const wchar_t* key, const wchar_t* name) { return StoredDword(HKEY_CURRENT_USER, key, name); }

// The console as installed, on a German Windows (LANG de_DE) that no pack serves: a copy in the
// 32-bit common program files folder (only there does "Advanced..." show); Desktop with an Austrian
// German pack, a service pack and its help in English and French; French and Arabic packs.
class Console : public testing::Test {
 protected:
  void SetUp() override {
    m_desktop.SetString(L"InstallDir", m_desktopFolder.Path() + L"\\");
    m_desktop.SetString(L"SPDisplayName", L"Service Pack 1");
    m_desktop.SetString(L"SPBuild", L"1.6491");
    m_desktopFolder.MakeDir(L"bin\\de-AT");
    for (const wchar_t* language : {L"", L"\\fr"}) {
      ASSERT_TRUE(CopyFileTo(WindowsPath(MAPORA_HELP_DIR) + language + kHelpFile,
                             m_desktopFolder.Path() + L"\\help" + language + kHelpFile));
    }
    for (const wchar_t* language : {L"\\fr", L"\\ar"}) {
      ASSERT_TRUE(CopyFileTo(WindowsPath(MAPORA_PACKS_DIR) + language + kPackFile,
                             MaporaCommonFolder() + L"\\bin" + language + kPackFile));
    }
    ASSERT_TRUE(CopyFileTo(ConsolePath(), m_shared.Path() + L"\\MaporaAdmin.exe"));
    ASSERT_TRUE(CopyFileTo(WindowsPath(E2E_WAITING_PROCESS), m_shared.Path() + L"\\Tessera.exe"));
  }

  // Starts the console; its main window, or null.
  HWND Launch(const std::wstring& arguments = L"") {
    m_console = std::make_unique<Process>(arguments, m_shared.Path() + L"\\MaporaAdmin.exe",
                                          std::vector<std::wstring>{L"KVEL_DESKTOP10.5_INSTALLED=1"});
    return m_console->WaitForMainWindow();
  }

  ScopedRegistryKey m_user{HKEY_CURRENT_USER, kSuiteKey};
  ScopedRegistryKey m_portal{HKEY_CURRENT_USER, kPortalKey};
  ScopedRegistryKey m_desktop{HKEY_LOCAL_MACHINE, L"SOFTWARE\\KVEL\\Desktop10.5"};
  ScopedDirectory m_desktopFolder{ModuleFolder() + L"\\e2e-desktop"};
  ScopedDirectory m_french{MaporaCommonFolder() + L"\\bin\\fr"};
  ScopedDirectory m_arabic{MaporaCommonFolder() + L"\\bin\\ar"};
  ScopedDirectory m_shared{EnvironmentVariable(L"CommonProgramFiles(x86)") + L"\\e2e"};
  std::unique_ptr<Process> m_console;
};

// "/Lang" picks the pack, laid out as its language reads (Arabic takes the language folder, there
// being no ar-SA one), and help opens the file of the console's language, English without one
// (Wine has no HTML engine here: only the viewer's title names the file).
TEST_F(Console, MainWindowInTheLanguageOfThePackWithItsHelp) {
  const struct {
    const char* name;
    const wchar_t *arguments, *title, *reportLabel;
    bool rightToLeft;
    const wchar_t* help;
    const char* screenshot;
  } rows[] = {
      {"WindowsLanguageWithoutPack", L"", L"Mapora Administrator", L"Mapora Configuration Information:", false,
       L"Administering Mapora Desktop", "main-window"},
      {"French", L"/Lang 1036", L"Administrateur Mapora", L"Informations de configuration de Mapora :", false,
       L"Administration de Mapora Desktop", "console-fr"},
      {"Arabic", L"-lang 1025", L"أداة إدارة Mapora", L"معلومات تكوين Mapora:", true, L"Administering Mapora Desktop",
       "console-ar"},
  };
  for (const auto& row : rows) {
    SCOPED_TRACE(row.name);
    HWND main = Launch(row.arguments);
    ASSERT_NE(main, nullptr);
    HWND page = FindWindowExW(main, nullptr, L"#32770", nullptr);
    EXPECT_EQ(Text(main), row.title);
    EXPECT_EQ(TreeRootText(Control(main, IDC_PAGE_TREE)), L"Mapora (" + EnvironmentVariable(L"COMPUTERNAME") + L")");
    EXPECT_EQ(Text(Control(page, IDC_REPORT_LABEL)), row.reportLabel);
    EXPECT_EQ((GetWindowLongPtrW(main, GWL_EXSTYLE) & WS_EX_LAYOUTRTL) != 0, row.rightToLeft);
    EXPECT_EQ((GetWindowLongPtrW(page, GWL_EXSTYLE) & WS_EX_LAYOUTRTL) != 0, row.rightToLeft);
    EXPECT_TRUE(Screenshot(main, row.screenshot));
    Click(main, IDC_HELP_BUTTON);
    EXPECT_NE(m_console->WaitForWindow(row.help), nullptr);
  }
}

TEST_F(Console, AboutBoxShowsTheDesktopServicePack) {
  HWND main = Launch();
  ASSERT_NE(main, nullptr);
  PostMessageW(main, WM_SYSCOMMAND, IDM_ABOUTBOX, 0);
  HWND about = m_console->WaitForWindow(L"About Mapora Administrator");
  ASSERT_NE(about, nullptr);
  EXPECT_EQ(Text(Control(about, IDC_SERVICE_PACK)), L"Service Pack 1");
  EXPECT_EQ(Text(Control(about, IDC_SERVICE_PACK_BUILD)), L"(Build 6491)");
  EXPECT_TRUE(Screenshot(about, "about-box"));
}

TEST_F(Console, AdvancedConfigurationWarnsAndSavesTheChoices) {
  HWND main = Launch();
  ASSERT_NE(main, nullptr);
  ASSERT_TRUE(WaitUntil([&] { return IsWindowVisible(Control(main, IDC_ADVANCED)) != FALSE; }));
  Click(main, IDC_ADVANCED);
  HWND dialog = m_console->WaitForWindow(L"Advanced Configuration");
  ASSERT_NE(dialog, nullptr);
  HWND warning = Control(dialog, IDC_LANGUAGE_WARNING);
  EXPECT_EQ(Text(warning), L"Warning: Mapora Deutsch language pack is not available on your system, Mapora UI will "
                           L"display as English.");
  EXPECT_TRUE(IsWindowVisible(warning));
  EXPECT_TRUE(Screenshot(dialog, "advanced-config"));
  SelectCombo(Control(dialog, IDC_LANGUAGE_LIST), 2);
  EXPECT_TRUE(WaitUntil([&] { return IsWindowVisible(warning) == FALSE; })) << "the warning stays with another entry";
  Click(dialog, IDC_LOCAL_PORTAL);
  Click(dialog, IDOK);
  ASSERT_TRUE(WaitUntil([&] { return !IsWindow(dialog); }));
  ASSERT_TRUE(WaitForIdle(main));
  EXPECT_EQ(StoredForUser(kSuiteKey, L"UILANGID"), 0x0C07u);
  EXPECT_EQ(StoredForUser(kPortalKey, L"Support Local Portal"), 1u);
}

// The stored language is removed behind the console's back: afterwards it holds what OK wrote.
TEST_F(Console, OKStoresTheLanguageOnceNoSuiteApplicationRuns) {
  m_user.SetDword(L"UILANGID", 0x0407);
  HWND main = Launch();
  ASSERT_NE(main, nullptr);
  m_user.DeleteValue(L"UILANGID");
  {
    // waiting_process <semaphore to release> <process to outlive> <time limit>, as a suite application.
    Process tessera(L"none " + std::to_wstring(GetCurrentProcessId()) + L" 300000", m_shared.Path() + L"\\Tessera.exe");
    Click(main, IDOK);
    HWND box = m_console->WaitForWindow(L"Mapora Administrator");
    ASSERT_NE(box, nullptr);
    EXPECT_EQ(Text(Control(box, 0xFFFF)), L"The following application(s) are running:\r\n\r\n  Tessera.exe\r\n\r\n"
                                          L"You must close these application(s) before you can save your changes.");
    Click(box, IDOK);
    ASSERT_TRUE(WaitUntil([&] { return !IsWindow(box); }));
    ASSERT_TRUE(WaitForIdle(main));
    EXPECT_EQ(StoredForUser(kSuiteKey, L"UILANGID"), kAbsent);
  }
  Click(main, IDOK);
  ASSERT_TRUE(WaitUntil([&] { return !m_console->Running(); }));
  EXPECT_EQ(StoredForUser(kSuiteKey, L"UILANGID"), 0x0407u);
}

}  // namespace
