// The real console started in the test prefix: one smoke test per window, and one test per edge
// that only the whole program shows (the registry written on OK, the save refused while a suite
// application runs, the language packs, help). The rules behind them are proved in-process.
#include <gtest/gtest.h>

#include <memory>
#include <ostream>

#include "tests/e2e/ConsoleDriver.h"
#include "tests/support/TestSupport.h"

namespace {

using e2e::Click;
using e2e::Control;
using e2e::Process;
using e2e::Text;
using testing_support::ScopedDirectory;
using testing_support::ScopedRegistryKey;

constexpr wchar_t kSuiteKey[] = L"SOFTWARE\\KVEL";
constexpr wchar_t kDesktopKey[] = L"SOFTWARE\\KVEL\\Desktop10.5";
constexpr wchar_t kPortalKey[] = L"Software\\KVEL\\Mapora Connection\\Settings";
constexpr wchar_t kSupportLocalPortal[] = L"Support Local Portal";
constexpr wchar_t kDesktopInstalled[] = L"KVEL_DESKTOP10.5_INSTALLED=1";
constexpr wchar_t kPackFile[] = L"\\ResMaporaAdmin.dll";
constexpr wchar_t kHelpFile[] = L"\\administering_mapora_desktop.chm";
constexpr DWORD kAbsent = 0xFFFFFFFF;
constexpr DWORD kGerman = 0x0407;
constexpr DWORD kGermanAustria = 0x0C07;

DWORD StoredForUser(const wchar_t* key, const wchar_t* name) {
  DWORD value = 0;
  if (!testing_support::ReadDword(HKEY_CURRENT_USER, key, name, value)) return kAbsent;
  return value;
}

std::wstring Environment(const wchar_t* name) {
  wchar_t value[MAX_PATH] = L"";
  GetEnvironmentVariableW(name, value, MAX_PATH);
  return value;
}

TEST(MainWindow, ShowsTheWorkstationAndItsReport) {
  ScopedDirectory desktopFolder(testing_support::ModuleFolder() + L"\\e2e-main-desktop");
  ScopedRegistryKey desktop(HKEY_LOCAL_MACHINE, kDesktopKey);
  desktop.SetString(L"InstallDir", desktopFolder.Path());
  Process console(L"", e2e::ConsolePath(), {kDesktopInstalled});
  HWND main = console.WaitForMainWindow();
  ASSERT_NE(main, nullptr);
  HWND page = FindWindowExW(main, nullptr, L"#32770", nullptr);

  EXPECT_EQ(Text(main), L"Mapora Administrator");
  EXPECT_EQ(e2e::TreeRootText(Control(main, IDC_PAGE_TREE)), L"Mapora (" + Environment(L"COMPUTERNAME") + L")");
  EXPECT_EQ(Text(Control(page, IDC_REPORT_LABEL)), L"Mapora Configuration Information:");
  EXPECT_NE(Text(Control(page, IDC_REPORT)).find(L"Installation Information"), std::wstring::npos);
  EXPECT_TRUE(e2e::Screenshot(main, "main-window"));
}

TEST(AboutBox, ShowsTheDesktopServicePack) {
  ScopedRegistryKey desktop(HKEY_LOCAL_MACHINE, kDesktopKey);
  desktop.SetString(L"SPDisplayName", L"Service Pack 1");
  desktop.SetString(L"SPBuild", L"1.6491");
  Process console;
  HWND main = console.WaitForMainWindow();
  ASSERT_NE(main, nullptr);

  PostMessageW(main, WM_SYSCOMMAND, IDM_ABOUTBOX, 0);
  HWND about = console.WaitForWindow(L"About Mapora Administrator");

  ASSERT_NE(about, nullptr);
  EXPECT_EQ(Text(Control(about, IDC_SERVICE_PACK)), L"Service Pack 1");
  EXPECT_EQ(Text(Control(about, IDC_SERVICE_PACK_BUILD)), L"(Build 6491)");
  EXPECT_TRUE(e2e::Screenshot(about, "about-box"));
}

// Run with a German Windows (LANG de_DE), for which no pack is installed: the dialog warns. The
// "Advanced..." button shows only for a console in the 32-bit common program files folder, so a
// copy runs from there, with Desktop holding an Austrian German pack.
TEST(AdvancedConfiguration, ListsThePacksAndSavesTheChoices) {
  ScopedRegistryKey user(HKEY_CURRENT_USER, kSuiteKey);
  ScopedRegistryKey portal(HKEY_CURRENT_USER, kPortalKey);
  ScopedRegistryKey desktop(HKEY_LOCAL_MACHINE, kDesktopKey);
  ScopedDirectory desktopFolder(testing_support::ModuleFolder() + L"\\e2e-advanced-desktop");
  ScopedDirectory shared(Environment(L"CommonProgramFiles(x86)") + L"\\e2e-advanced");
  desktop.SetString(L"InstallDir", desktopFolder.Path());
  desktopFolder.MakeDir(L"bin\\de-AT");
  portal.SetDword(kSupportLocalPortal, 0);
  ASSERT_TRUE(testing_support::CopyFileTo(e2e::ConsolePath(), shared.Path() + L"\\MaporaAdmin.exe"));
  Process console(L"", shared.Path() + L"\\MaporaAdmin.exe", {kDesktopInstalled});
  HWND main = console.WaitForMainWindow();
  ASSERT_NE(main, nullptr);
  ASSERT_TRUE(e2e::WaitUntil([&] { return IsWindowVisible(Control(main, IDC_ADVANCED)) != FALSE; }));

  Click(main, IDC_ADVANCED);
  HWND dialog = console.WaitForWindow(L"Advanced Configuration");

  ASSERT_NE(dialog, nullptr);
  HWND list = Control(dialog, IDC_LANGUAGE_LIST);
  HWND warning = Control(dialog, IDC_LANGUAGE_WARNING);
  EXPECT_EQ(e2e::ComboText(list, 0), L"Display language (Deutsch - Deutschland)");
  EXPECT_EQ(e2e::ComboText(list, 1), L"English");
  EXPECT_EQ(e2e::ComboText(list, 2), L"Deutsch (\u00d6sterreich)");
  EXPECT_TRUE(IsWindowVisible(warning));
  EXPECT_EQ(
      Text(warning),
      L"Warning: Mapora Deutsch language pack is not available on your system, Mapora UI will display as English.");
  EXPECT_TRUE(e2e::Screenshot(dialog, "advanced-config"));

  e2e::SelectCombo(list, 2);
  Click(dialog, IDC_LOCAL_PORTAL);
  Click(dialog, IDOK);
  ASSERT_TRUE(e2e::WaitUntil([&] { return !IsWindow(dialog); }));
  ASSERT_TRUE(e2e::WaitForIdle(main));

  EXPECT_EQ(StoredForUser(kSuiteKey, L"UILANGID"), kGermanAustria);
  EXPECT_EQ(StoredForUser(kPortalKey, kSupportLocalPortal), 1u);
}

TEST(Save, OKStoresTheLanguageTheConsoleStartedWith) {
  ScopedRegistryKey user(HKEY_CURRENT_USER, kSuiteKey);
  user.SetDword(L"UILANGID", kGerman);
  Process console;
  HWND main = console.WaitForMainWindow();
  ASSERT_NE(main, nullptr);
  // Removed behind the console's back: the value afterwards is the one OK wrote.
  user.DeleteValue(L"UILANGID");

  Click(main, IDOK);

  ASSERT_TRUE(e2e::WaitUntil([&] { return !console.Running(); }));
  EXPECT_EQ(StoredForUser(kSuiteKey, L"UILANGID"), kGerman);
}

// A copy of the waiting program named as a suite application, running until the test ends.
class RunningSuiteApplication {
 public:
  explicit RunningSuiteApplication(const wchar_t* executableName)
      : m_folder(testing_support::ModuleFolder() + L"\\e2e-suite-app") {
    const std::wstring program = m_folder.Path() + L"\\" + executableName;
    const std::wstring parent = std::to_wstring(GetCurrentProcessId());
    const std::wstring semaphoreName = L"MaporaE2eSuiteApp-" + parent;
    HANDLE started = CreateSemaphoreW(nullptr, 0, 1, semaphoreName.c_str());
    if (testing_support::CopyFileTo(e2e::WindowsPath(E2E_WAITING_PROCESS), program))
      m_process = std::make_unique<Process>(semaphoreName + L" " + parent + L" 300000", program);
    m_started = started != nullptr && WaitForSingleObject(started, e2e::kWaitMs) == WAIT_OBJECT_0;
    if (started != nullptr) CloseHandle(started);
  }

  bool Started() const { return m_started; }

 private:
  ScopedDirectory m_folder;
  std::unique_ptr<Process> m_process;
  bool m_started = false;
};

TEST(Save, RefusedWhileASuiteApplicationRuns) {
  ScopedRegistryKey user(HKEY_CURRENT_USER, kSuiteKey);
  user.SetDword(L"UILANGID", kGerman);
  RunningSuiteApplication tessera(L"Tessera.exe");
  ASSERT_TRUE(tessera.Started());
  Process console;
  HWND main = console.WaitForMainWindow();
  ASSERT_NE(main, nullptr);
  user.DeleteValue(L"UILANGID");

  Click(main, IDOK);
  HWND box = console.WaitForWindow(L"Mapora Administrator");

  ASSERT_NE(box, nullptr);
  EXPECT_EQ(Text(Control(box, 0xFFFF)),
            L"The following application(s) are running:\r\n\r\n  Tessera.exe\r\n\r\n"
            L"You must close these application(s) before you can save your changes.");
  Click(box, IDOK);
  ASSERT_TRUE(e2e::WaitUntil([&] { return !IsWindow(box); }));
  ASSERT_TRUE(e2e::WaitForIdle(main));
  EXPECT_TRUE(IsWindowVisible(main));
  EXPECT_EQ(StoredForUser(kSuiteKey, L"UILANGID"), kAbsent);
}

// "/Lang" picks the pack under <Common Files>\Mapora\bin, laid out as its language reads; a
// language without a pack stays English.
struct LanguagePackRow {
  const char* name;
  const wchar_t* installedPack;
  const wchar_t* arguments;
  const wchar_t* title;
  const wchar_t* reportLabel;
  bool rightToLeft;
  const char* screenshot;  // none: nothing new to see
};

void PrintTo(const LanguagePackRow& row, std::ostream* out) { *out << row.name; }

class LanguagePack : public testing::TestWithParam<LanguagePackRow> {};

TEST_P(LanguagePack, DecidesTheConsolesLanguageAndLayout) {
  const LanguagePackRow& row = GetParam();
  ScopedDirectory pack(testing_support::MaporaCommonFolder() + L"\\bin\\" + row.installedPack);
  ASSERT_TRUE(testing_support::CopyFileTo(e2e::WindowsPath(MAPORA_PACKS_DIR) + L"\\" + row.installedPack + kPackFile,
                                          pack.Path() + kPackFile));
  Process console(row.arguments);
  HWND main = console.WaitForMainWindow();
  ASSERT_NE(main, nullptr);
  HWND page = FindWindowExW(main, nullptr, L"#32770", nullptr);

  EXPECT_EQ(Text(main), row.title);
  EXPECT_EQ(Text(Control(page, IDC_REPORT_LABEL)), row.reportLabel);
  EXPECT_EQ((GetWindowLongPtrW(main, GWL_EXSTYLE) & WS_EX_LAYOUTRTL) != 0, row.rightToLeft);
  EXPECT_EQ((GetWindowLongPtrW(page, GWL_EXSTYLE) & WS_EX_LAYOUTRTL) != 0, row.rightToLeft);
  if (row.screenshot != nullptr) {
    EXPECT_TRUE(e2e::Screenshot(main, row.screenshot));
  }
}

INSTANTIATE_TEST_SUITE_P(
    Packs, LanguagePack,
    testing::Values(LanguagePackRow{"French", L"fr", L"/Lang 1036", L"Administrateur Mapora",
                                    L"Informations de configuration de Mapora :", false, "console-fr"},
                    LanguagePackRow{"Japanese", L"ja", L"-lang 1041", L"Mapora 管理ツール", L"Mapora の構成情報:",
                                    false, "console-ja"},
                    // Arabic (Saudi Arabia) has no ar-SA folder and takes the language folder.
                    LanguagePackRow{"Arabic", L"ar", L"/Lang 1025", L"أداة إدارة Mapora", L"معلومات تكوين Mapora:",
                                    true, "console-ar"},
                    LanguagePackRow{"GermanWithoutPack", L"fr", L"/Lang 1031", L"Mapora Administrator",
                                    L"Mapora Configuration Information:", false, nullptr}),
    [](const testing::TestParamInfo<LanguagePackRow>& info) { return std::string(info.param.name); });

// Help opens the help file under the Desktop product's folder, translated where the pack's
// language has one. Wine has no HTML engine here, so the viewer stays blank; its title names the file.
struct HelpRow {
  const char* name;
  const wchar_t* arguments;
  const wchar_t* viewerTitle;
};

void PrintTo(const HelpRow& row, std::ostream* out) { *out << row.name; }

class Help : public testing::TestWithParam<HelpRow> {};

TEST_P(Help, OpensTheHelpFileOfTheConsolesLanguage) {
  const HelpRow& row = GetParam();
  ScopedDirectory pack(testing_support::MaporaCommonFolder() + L"\\bin\\fr");
  ScopedDirectory desktop(testing_support::ModuleFolder() + L"\\e2e-help-desktop");
  ScopedRegistryKey desktopKey(HKEY_LOCAL_MACHINE, kDesktopKey);
  desktopKey.SetString(L"InstallDir", desktop.Path() + L"\\");
  ASSERT_TRUE(
      testing_support::CopyFileTo(e2e::WindowsPath(MAPORA_PACKS_DIR) + L"\\fr" + kPackFile, pack.Path() + kPackFile));
  for (const wchar_t* language : {L"", L"\\fr"}) {
    ASSERT_TRUE(testing_support::CopyFileTo(e2e::WindowsPath(MAPORA_HELP_DIR) + language + kHelpFile,
                                            desktop.Path() + L"\\help" + language + kHelpFile));
  }
  Process console(row.arguments, e2e::ConsolePath(), {kDesktopInstalled});
  HWND main = console.WaitForMainWindow();
  ASSERT_NE(main, nullptr);

  Click(main, IDC_HELP_BUTTON);

  EXPECT_NE(console.WaitForWindow(row.viewerTitle), nullptr);
}

INSTANTIATE_TEST_SUITE_P(Languages, Help,
                         testing::Values(HelpRow{"English", L"", L"Administering Mapora Desktop"},
                                         HelpRow{"French", L"/Lang 1036", L"Administration de Mapora Desktop"}),
                         [](const testing::TestParamInfo<HelpRow>& info) { return std::string(info.param.name); });

}  // namespace
