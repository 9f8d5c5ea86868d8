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
    ASSERT_TRUE(CopyFileTo(WindowsPath(MAPORA_PACKS_DIR) + L"\\ar" + kPackFile, m_arabic.Path() + kPackFile));
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

// The main window's caption, its page's label, the About box's caption and service-pack build, Advanced
// Configuration's caption: the windows in the order a user meets them.
const wchar_t* const kEnglish[] = {L"Mapora Administrator", L"Mapora Configuration Information:",
                                   L"About Mapora Administrator", L"(Build 6491)", L"Advanced Configuration"};
const wchar_t* const kFrench[] = {L"Administrateur Mapora", L"Informations de configuration de Mapora :",
                                  L"\u00c0 propos de l'Administrateur Mapora", L"(build 6491)",
                                  L"Configuration avanc\u00e9e"};
const wchar_t* const kArabic[] = {L"أداة إدارة Mapora", L"معلومات تكوين Mapora:", L"حول أداة إدارة Mapora",
                                  L"(البنية 6491)", L"التكوين المتقدم"};

// "/Lang" picks the pack, laid out as its language reads (Arabic takes the language folder, there being no
// ar-SA one), and help opens the file of the console's language, English without one (Wine has no HTML
// engine here: only the viewer's title names the file). A French pack without one window's template still
// opens every window: in French up to that one, from there on in English.
TEST_F(Console, EveryWindowInTheLanguageOfThePackWithItsHelp) {
  const wchar_t* const kFrenchHelp = L"Administration de Mapora Desktop";
  const struct {
    const char* name;
    const wchar_t* arguments;
    const wchar_t* const* language;
    const wchar_t* without;  // the template left out of the French pack
    int firstEnglish;        // the first text shown in English
    bool rightToLeft;
    const wchar_t* help;
  } rows[] = {
      {"WindowsLanguageWithoutPack", L"", kEnglish, nullptr, 0, false, L"Administering Mapora Desktop"},
      {"French", L"/Lang 1036", kFrench, nullptr, 5, false, kFrenchHelp},
      {"Arabic", L"-lang 1025", kArabic, nullptr, 5, true, L"Administering Mapora Desktop"},
      {"FrenchWithoutMainWindow", L"/Lang 1036", kFrench, L"IDD_MAPORAADMIN_DIALOG", 0, false, kFrenchHelp},
      {"FrenchWithoutPage", L"/Lang 1036", kFrench, L"IDD_MAPORA_CONFIG", 1, false, kFrenchHelp},
      {"FrenchWithoutAboutBox", L"/Lang 1036", kFrench, L"IDD_ABOUTBOX", 2, false, kFrenchHelp},
      {"FrenchWithoutAdvanced", L"/Lang 1036", kFrench, L"IDD_ADVANCED_CONFIG", 4, false, kFrenchHelp},
  };
  for (const auto& row : rows) {
    SCOPED_TRACE(row.name);
    const auto text = [&](int index) { return (index < row.firstEnglish ? row.language : kEnglish)[index]; };
    const std::wstring pack =
        row.without ? WindowsPath(E2E_BROKEN_PACKS_DIR) + L"\\" + row.without : WindowsPath(MAPORA_PACKS_DIR) + L"\\fr";
    m_console.reset();  // the last run's console holds its pack open
    ASSERT_TRUE(CopyFileTo(pack + kPackFile, m_french.Path() + kPackFile));
    HWND main = Launch(row.arguments);
    ASSERT_NE(main, nullptr);
    HWND page = FindWindowExW(main, nullptr, L"#32770", nullptr);
    EXPECT_EQ(Text(main), text(0));
    EXPECT_EQ(TreeRootText(Control(main, IDC_PAGE_TREE)), L"Mapora (" + EnvironmentVariable(L"COMPUTERNAME") + L")");
    EXPECT_EQ(Text(Control(page, IDC_REPORT_LABEL)), text(1));
    EXPECT_EQ((GetWindowLongPtrW(main, GWL_EXSTYLE) & WS_EX_LAYOUTRTL) != 0, row.rightToLeft);
    EXPECT_EQ((GetWindowLongPtrW(page, GWL_EXSTYLE) & WS_EX_LAYOUTRTL) != 0, row.rightToLeft);
    EXPECT_TRUE(Screenshot(main, row.name));
    Click(main, IDC_HELP_BUTTON);
    EXPECT_NE(m_console->WaitForWindow(row.help), nullptr);
    PostMessageW(main, WM_SYSCOMMAND, IDM_ABOUTBOX, 0);
    HWND about = m_console->WaitForWindow(text(2));
    ASSERT_NE(about, nullptr);
    EXPECT_EQ(Text(Control(about, IDC_SERVICE_PACK)), L"Service Pack 1");
    EXPECT_EQ(Text(Control(about, IDC_SERVICE_PACK_BUILD)), text(3));
    EXPECT_TRUE(Screenshot(about, row.name + std::string("-about")));
    Click(about, IDOK);
    ASSERT_TRUE(WaitUntil([&] { return !IsWindow(about); }));
    ASSERT_TRUE(WaitUntil([&] { return IsWindowVisible(Control(page, IDC_ADVANCED)) != FALSE; }));
    Click(page, IDC_ADVANCED);
    EXPECT_NE(m_console->WaitForWindow(text(4)), nullptr);
  }
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
  RegDeleteKeyValueW(HKEY_CURRENT_USER, kSuiteKey, L"UILANGID");
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
