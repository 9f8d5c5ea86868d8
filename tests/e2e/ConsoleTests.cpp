// The real console and its Advanced Configuration dialog, started in the test prefix.
#include <gtest/gtest.h>

#include "tests/e2e/ConsoleDriver.h"
#include "tests/support/TestSupport.h"

using namespace e2e;
using namespace testing_support;

namespace {

constexpr wchar_t kSuiteKey[] = L"SOFTWARE\\KVEL", kDesktopKey[] = L"SOFTWARE\\KVEL\\Desktop10.5";
constexpr wchar_t kPortalKey[] = L"Software\\KVEL\\Mapora Connection\\Settings", kPortal[] = L"Support Local Portal";
constexpr wchar_t kEnglishUS[] = L"Display language (English - United States)";
constexpr wchar_t kPackFile[] = L"\\ResMaporaAdmin.dll", kHelpFile[] = L"\\administering_mapora_desktop.chm";
constexpr DWORD kAbsent = 0xFFFFFFFF, kGerman = 0x0407, kFrench = 0x040C;

DWORD Stored(const wchar_t* key, const wchar_t* name) {
  DWORD value = kAbsent;
  return ReadDword(HKEY_CURRENT_USER, key, name, value) ? value : kAbsent;
}

std::wstring Env(const wchar_t* name) {
  wchar_t value[MAX_PATH] = L"";
  GetEnvironmentVariableW(name, value, MAX_PATH);
  return value;
}

// /Lang picks the pack (laid out as its language reads) and help file; without a pack it stays English.
struct LanguageCase {
  const wchar_t *pack, *arguments, *title, *reportLabel, *reportHeading, *helpTitle;
  bool rightToLeft;
  const char* screenshot;
};

class ConsoleLanguage : public testing::TestWithParam<LanguageCase> {};

TEST_P(ConsoleLanguage, ShowsThePackThatLangNames) {
  const LanguageCase& c = GetParam();
  ScopedDirectory pack(MaporaCommonFolder() + L"\\bin\\" + c.pack), desktop(ModuleFolder() + L"\\e2e-desktop");
  ScopedRegistryKey desktopKey(HKEY_LOCAL_MACHINE, kDesktopKey);
  desktopKey.SetString(L"InstallDir", desktop.Path() + L"\\");
  ASSERT_TRUE(CopyFileTo(WindowsPath(MAPORA_PACKS_DIR) + L"\\" + c.pack + kPackFile, pack.Path() + kPackFile));
  for (const wchar_t* language : {L"", L"\\fr"})
    ASSERT_TRUE(CopyFileTo(WindowsPath(MAPORA_HELP_DIR) + language + kHelpFile,
                           desktop.Path() + L"\\help" + language + kHelpFile));
  Process console(c.arguments, ConsolePath(), {L"KVEL_DESKTOP10.5_INSTALLED=1"});
  HWND main = console.WaitForWindow();
  ASSERT_NE(main, nullptr);
  HWND page = FindWindowExW(main, nullptr, L"#32770", nullptr);
  EXPECT_EQ(Text(main), c.title);
  EXPECT_EQ(TreeRootText(Control(main, IDC_PAGE_TREE)), L"Mapora (" + Env(L"COMPUTERNAME") + L")");
  EXPECT_EQ(Text(Control(page, IDC_REPORT_LABEL)), c.reportLabel);
  EXPECT_NE(Text(Control(page, IDC_REPORT)).find(c.reportHeading), std::wstring::npos);
  for (HWND window : {main, page})
    EXPECT_EQ((GetWindowLongPtrW(window, GWL_EXSTYLE) & WS_EX_LAYOUTRTL) != 0, c.rightToLeft);
  EXPECT_TRUE(Screenshot(main, c.screenshot));
  // Wine has no HTML engine here, so the viewer's pages stay blank; its title names the file.
  Click(main, IDC_HELP_BUTTON);
  EXPECT_NE(console.WaitForWindow(c.helpTitle), nullptr);
}

constexpr wchar_t kEnglishHelp[] = L"Administering Mapora Desktop";

INSTANTIATE_TEST_SUITE_P(
    Packs, ConsoleLanguage,
    testing::Values(  // German has no pack here.
        LanguageCase{L"fr", L"/Lang 1031", L"Mapora Administrator", L"Mapora Configuration Information:",
                     L"Installation Information", kEnglishHelp, false, "main-window"},
        LanguageCase{L"fr", L"/Lang 1036", L"Administrateur Mapora", L"Informations de configuration de Mapora :",
                     L"Informations d'installation", L"Administration de Mapora Desktop", false, "console-fr"},
        LanguageCase{L"ja", L"/Lang 1041", L"Mapora 管理ツール", L"Mapora の構成情報:", L"インストール情報",
                     kEnglishHelp, false, "console-ja"},
        // Arabic (Saudi Arabia) has no ar-SA folder and falls back to the language folder.
        LanguageCase{L"ar", L"/Lang 1025", L"أداة إدارة Mapora", L"معلومات تكوين Mapora:", L"معلومات التثبيت",
                     kEnglishHelp, true, "console-ar"}));

// A save writes back the language the console started with (or deletes one stored while it ran),
// unless a suite application runs: then it says so and writes nothing.
struct SaveCase {
  int button;
  DWORD atStart, whileRunning, afterwards;
  bool suiteAppRuns;
};

class ConsoleSave : public testing::TestWithParam<SaveCase> {};

TEST_P(ConsoleSave, StoresTheStartLanguageUnlessASuiteApplicationRuns) {
  const SaveCase& c = GetParam();
  ScopedRegistryKey settings(HKEY_CURRENT_USER, kSuiteKey);
  ScopedDirectory folder(ModuleFolder() + L"\\e2e-suite-app");
  const std::wstring app = folder.Path() + (c.suiteAppRuns ? L"\\Tessera.exe" : L"\\Unwatched.exe");
  ASSERT_TRUE(CopyFileTo(WindowsPath(E2E_WAITING_PROCESS), app));
  Process running(L"- " + std::to_wstring(GetCurrentProcessId()) + L" 300000", app);  // no semaphore, lives on
  if (c.atStart != kAbsent) settings.SetDword(L"UILANGID", c.atStart);
  Process console;
  HWND main = console.WaitForWindow();
  ASSERT_NE(main, nullptr);
  settings.DeleteValue(L"UILANGID");
  if (c.whileRunning != kAbsent) settings.SetDword(L"UILANGID", c.whileRunning);
  EnableWindow(Control(main, IDC_APPLY_NOW), TRUE);  // as a page with changes does
  Click(main, c.button);
  if (c.suiteAppRuns) {
    HWND box = console.WaitForWindow(L"Mapora Administrator");
    ASSERT_NE(box, nullptr);
    EXPECT_EQ(Text(Control(box, 0xFFFF)),
              L"The following application(s) are running:\r\n\r\n  Tessera.exe\r\n\r\n"
              L"You must close these application(s) before you can save your changes.");
    Click(box, IDOK);
    EXPECT_TRUE(WaitUntil([&] { return !IsWindow(box); }) && console.Running() && IsWindowVisible(main));
  } else {
    ASSERT_TRUE(
        WaitUntil([&] { return c.button == IDOK ? !console.Running() : !IsWindowEnabled(Control(main, c.button)); }));
  }
  EXPECT_EQ(Stored(kSuiteKey, L"UILANGID"), c.afterwards);
}

INSTANTIATE_TEST_SUITE_P(Buttons, ConsoleSave,
                         testing::Values(SaveCase{IDOK, kGerman, kAbsent, kGerman, false},
                                         SaveCase{IDC_APPLY_NOW, kAbsent, kFrench, kAbsent, false},
                                         SaveCase{IDOK, kGerman, kFrench, kFrench, true}));

struct AboutCase {
  const wchar_t *name, *build, *shownName, *shownBuild;
};

class ConsoleAbout : public testing::TestWithParam<AboutCase> {};

TEST_P(ConsoleAbout, ShowsTheDesktopServicePack) {
  const AboutCase& c = GetParam();
  ScopedRegistryKey desktop(HKEY_LOCAL_MACHINE, kDesktopKey);
  if (c.name) desktop.SetString(L"SPDisplayName", c.name);
  if (c.build) desktop.SetString(L"SPBuild", c.build);
  Process console;
  HWND main = console.WaitForWindow();
  PostMessageW(main, WM_SYSCOMMAND, IDM_ABOUTBOX, 0);
  HWND about = console.WaitForWindow(L"About Mapora Administrator");
  ASSERT_NE(about, nullptr);
  EXPECT_EQ(Text(Control(about, IDC_SERVICE_PACK)), c.shownName);
  EXPECT_EQ(Text(Control(about, IDC_SERVICE_PACK_BUILD)), c.shownBuild);
  EXPECT_TRUE(!c.name || !c.build || Screenshot(about, "about-box"));
}

INSTANTIATE_TEST_SUITE_P(ServicePacks, ConsoleAbout,
                         testing::Values(AboutCase{L"Service Pack 1", L"1.6491", L"Service Pack 1", L"(Build 6491)"},
                                         // Without a service pack name the build is not shown either.
                                         AboutCase{nullptr, L"1.6491", L"", L""}));

// A copy of the console in the shared 32-bit program folder, with Desktop holding an Austrian German
// pack. Run per Windows UI language: German in Germany has no pack, and the dialog warns of that.
struct AdvancedCase {
  int button;
  DWORD atStart;
  int chosen;  // entry: 0 the Windows language, 1 English, 2 Austrian German
  DWORD afterwards, portal;
};

class AdvancedConfig : public testing::TestWithParam<AdvancedCase> {};

TEST_P(AdvancedConfig, StoresTheChoiceOnlyWithOK) {
  const AdvancedCase& c = GetParam();
  ScopedRegistryKey user(HKEY_CURRENT_USER, kSuiteKey), portal(HKEY_CURRENT_USER, kPortalKey);
  ScopedRegistryKey desktop(HKEY_LOCAL_MACHINE, kDesktopKey);
  ScopedDirectory desktopFolder(ModuleFolder() + L"\\e2e-advanced-desktop");
  ScopedDirectory shared(Env(L"CommonProgramFiles(x86)") + L"\\e2e-advanced");
  const bool german = GetUserDefaultUILanguage() == kGerman;
  desktop.SetString(L"InstallDir", desktopFolder.Path());
  desktopFolder.MakeDir(L"bin\\de-AT");
  if (c.atStart != kAbsent) user.SetDword(L"UILANGID", c.atStart);
  portal.SetDword(kPortal, 0);
  ASSERT_TRUE(CopyFileTo(ConsolePath(), shared.Path() + L"\\MaporaAdmin.exe"));
  Process console(L"", shared.Path() + L"\\MaporaAdmin.exe", {L"KVEL_DESKTOP10.5_INSTALLED=1"});
  HWND main = console.WaitForWindow();
  ASSERT_TRUE(main && WaitUntil([&] { return IsWindowVisible(Control(main, IDC_ADVANCED)); }));
  Click(main, IDC_ADVANCED);
  HWND dialog = console.WaitForWindow(L"Advanced Configuration");
  ASSERT_NE(dialog, nullptr);
  HWND list = Control(dialog, IDC_LANGUAGE_LIST), warning = Control(dialog, IDC_LANGUAGE_WARNING);
  EXPECT_EQ(ComboText(list, 0), german ? L"Display language (Deutsch - Deutschland)" : kEnglishUS);
  EXPECT_EQ(ComboText(list, 2), L"Deutsch (\u00d6sterreich)");
  EXPECT_EQ(SendMessageW(list, CB_GETCURSEL, 0, 0), c.atStart == kAbsent ? 0 : 2);
  EXPECT_EQ(IsWindowVisible(warning) ? Text(warning) : L"",
            german && c.atStart == kAbsent ? L"Warning: Mapora Deutsch language pack is not available on your "
                                             L"system, Mapora UI will display as English."
                                           : L"");
  EXPECT_TRUE(c.atStart != kAbsent || Screenshot(dialog, german ? "advanced-config-warning" : "advanced-config"));
  // Removed behind the dialog's back: what is stored afterwards was written when it ended.
  user.DeleteValue(L"UILANGID");
  SelectCombo(list, c.chosen);
  EXPECT_TRUE(WaitUntil([&] { return !IsWindowVisible(warning) == !(german && c.chosen == 0); }));
  Click(dialog, IDC_LOCAL_PORTAL);
  Click(dialog, c.button);
  ASSERT_TRUE(WaitUntil([&] { return !IsWindow(dialog); }));
  // The writes follow in the same handler; the console's one thread answers only afterwards.
  DWORD_PTR ignored = 0;
  ASSERT_TRUE(SendMessageTimeoutW(main, WM_NULL, 0, 0, SMTO_NORMAL, kWaitMs, &ignored));
  EXPECT_EQ(Stored(kSuiteKey, L"UILANGID"), c.afterwards);
  EXPECT_EQ(Stored(kPortalKey, kPortal), c.portal);
}

INSTANTIATE_TEST_SUITE_P(Buttons, AdvancedConfig,
                         testing::Values(AdvancedCase{IDOK, kAbsent, 2, 0x0C07, 1},
                                         // The Windows language is stored as no value at all.
                                         AdvancedCase{IDOK, 0x0C07, 0, kAbsent, 1},
                                         AdvancedCase{IDCANCEL, 0x0C07, 1, 0x0C07, 0}));

}  // namespace
