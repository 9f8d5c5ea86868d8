// The real console, started in the test prefix and driven through its windows.
#include <gtest/gtest.h>

#include <memory>
#include <string>

#include "res/resource.h"
#include "tests/e2e/ConsoleDriver.h"
#include "tests/support/TestSupport.h"

using namespace e2e;
using namespace testing_support;

namespace {

constexpr wchar_t kSettingsKey[] = L"SOFTWARE\\KVEL";
constexpr wchar_t kDesktopKey[] = L"SOFTWARE\\KVEL\\Desktop10.5";
constexpr DWORD kGerman = 0x0407;
constexpr DWORD kFrench = 0x040C;

std::wstring ComputerName() {
  wchar_t name[MAX_COMPUTERNAME_LENGTH + 1] = L"";
  DWORD size = MAX_COMPUTERNAME_LENGTH + 1;
  GetComputerNameW(name, &size);
  return name;
}

std::wstring RootNodeText(HWND mainWindow) {
  HWND tree = Control(mainWindow, IDC_PAGE_TREE);
  return TreeItemText(tree, TreeRoot(tree));
}

std::wstring Joined(const std::vector<std::wstring>& texts) {
  std::wstring all;
  for (const std::wstring& text : texts) all += (all.empty() ? L"" : L"|") + text;
  return all;
}

// ---------------------------------------------------------------------------------------------

TEST(ConsoleWindow, ShowsTitleAndSelectedWorkstationNode) {
  Console console;
  ASSERT_TRUE(console.Started());
  HWND mainWindow = console.WaitForMainWindow();
  ASSERT_NE(mainWindow, nullptr);

  EXPECT_EQ(WindowText(mainWindow), L"Mapora Administrator");
  EXPECT_EQ(RootNodeText(mainWindow), L"Mapora (" + ComputerName() + L")");
  HWND tree = Control(mainWindow, IDC_PAGE_TREE);
  EXPECT_EQ(TreeSelection(tree), TreeRoot(tree));
  EXPECT_FALSE(IsWindowEnabled(Control(mainWindow, IDC_APPLY_NOW)));
  EXPECT_FALSE(SaveScreenshot(mainWindow, "main-window").empty());
}

// ---------------------------------------------------------------------------------------------

struct LanguageCase {
  const wchar_t* arguments;
  bool frenchShown;
};

class ConsoleLanguage : public ::testing::TestWithParam<LanguageCase> {};

TEST_P(ConsoleLanguage, LangOptionPicksTheLanguagePack) {
  ScopedDirectory pack(MaporaCommonFolder() + L"\\bin\\fr");
  ASSERT_TRUE(CopyFileTo(WindowsPath(E2E_FRENCH_PACK), pack.Path() + L"\\ResMaporaAdmin.dll"));

  Console console({GetParam().arguments, {}});
  HWND mainWindow = console.WaitForMainWindow();
  ASSERT_NE(mainWindow, nullptr);

  if (GetParam().frenchShown) {
    EXPECT_EQ(WindowText(mainWindow), L"Administrateur Mapora");
    EXPECT_EQ(RootNodeText(mainWindow), L"Poste de travail Mapora (" + ComputerName() + L")");
  } else {
    EXPECT_EQ(WindowText(mainWindow), L"Mapora Administrator");
    EXPECT_EQ(RootNodeText(mainWindow), L"Mapora (" + ComputerName() + L")");
  }
}

INSTANTIATE_TEST_SUITE_P(Options, ConsoleLanguage,
                         ::testing::Values(LanguageCase{L"/Lang 1036", true}, LanguageCase{L"-LANG 1036", true},
                                           // German has no pack here: the built-in English stays.
                                           LanguageCase{L"/Lang 1031", false},
                                           // The value belongs to the option; alone it is no language.
                                           LanguageCase{L"1036", false}));

// ---------------------------------------------------------------------------------------------

// A copy of a small waiting program running under a suite application's name.
class SuiteApplication {
 public:
  SuiteApplication(const ScopedDirectory& folder, const wchar_t* name) {
    std::wstring program = folder.Path() + L"\\" + name;
    if (!CopyFileTo(WindowsPath(E2E_WAITING_PROCESS), program)) return;
    const std::wstring semaphoreName = L"e2e-suite-app-" + std::to_wstring(GetCurrentProcessId());
    HANDLE started = CreateSemaphoreW(nullptr, 0, 1, semaphoreName.c_str());
    process_ = std::make_unique<ChildProcess>(
        program, semaphoreName + L" " + std::to_wstring(GetCurrentProcessId()) + L" " + std::to_wstring(kWaitMs * 10));
    running_ = process_->Started() && WaitForSingleObject(started, kWaitMs) == WAIT_OBJECT_0;
    CloseHandle(started);
  }
  bool Running() const { return running_; }
  void End() { process_.reset(); }

 private:
  std::unique_ptr<ChildProcess> process_;
  bool running_ = false;
};

// OK and Apply share the save; each case runs with both buttons.
class ConsoleSave : public ::testing::TestWithParam<int> {
 protected:
  // Apply is enabled by pages with changes; here the test stands in for such a page.
  void PressSave(HWND mainWindow) {
    if (GetParam() == IDC_APPLY_NOW) EnableWindow(Control(mainWindow, IDC_APPLY_NOW), TRUE);
    Click(mainWindow, GetParam());
  }
  // A save that went through closes the console (OK) or disables Apply again.
  bool WaitForSaved(const Console& console, HWND mainWindow) {
    if (GetParam() == IDOK) return console.WaitForExit();
    return WaitUntil([&] { return !IsWindowEnabled(Control(mainWindow, IDC_APPLY_NOW)); });
  }

  ScopedRegistryKey settings_{HKEY_CURRENT_USER, kSettingsKey};
};

TEST_P(ConsoleSave, WritesBackTheLanguageItStartedWith) {
  settings_.SetDword(L"UILANGID", kGerman);
  Console console;
  HWND mainWindow = console.WaitForMainWindow();
  ASSERT_NE(mainWindow, nullptr);

  settings_.DeleteValue(L"UILANGID");
  PressSave(mainWindow);
  ASSERT_TRUE(WaitForSaved(console, mainWindow));
  DWORD stored = 0;
  ASSERT_TRUE(ReadDword(HKEY_CURRENT_USER, kSettingsKey, L"UILANGID", stored));
  EXPECT_EQ(stored, kGerman);
}

TEST_P(ConsoleSave, DeletesALanguageStoredWhileItRan) {
  Console console;
  HWND mainWindow = console.WaitForMainWindow();
  ASSERT_NE(mainWindow, nullptr);

  settings_.SetDword(L"UILANGID", kFrench);
  PressSave(mainWindow);
  ASSERT_TRUE(WaitForSaved(console, mainWindow));
  EXPECT_FALSE(ValueExists(HKEY_CURRENT_USER, kSettingsKey, L"UILANGID"));
}

TEST_P(ConsoleSave, RefusedWhileASuiteApplicationRuns) {
  ScopedDirectory folder(ModuleFolder() + L"\\e2e-suite-app");
  SuiteApplication tessera(folder, L"Tessera.exe");
  ASSERT_TRUE(tessera.Running());
  settings_.SetDword(L"UILANGID", kGerman);
  Console console;
  HWND mainWindow = console.WaitForMainWindow();
  ASSERT_NE(mainWindow, nullptr);

  // Changed behind the console's back: a save would put German back.
  settings_.SetDword(L"UILANGID", kFrench);
  PressSave(mainWindow);
  HWND box = console.WaitForDialog(L"Mapora Administrator");
  ASSERT_NE(box, nullptr);
  EXPECT_EQ(Joined(StaticTexts(box)),
            L"The following application(s) are running:\r\n\r\n  Tessera.exe\r\n\r\n"
            L"You must close these application(s) before you can save your changes.");
  DWORD stored = 0;
  EXPECT_TRUE(ReadDword(HKEY_CURRENT_USER, kSettingsKey, L"UILANGID", stored));
  EXPECT_EQ(stored, kFrench);

  Click(box, IDOK);
  EXPECT_TRUE(WaitUntil([&] { return !IsWindow(box); }));
  EXPECT_TRUE(console.Running());
  EXPECT_TRUE(IsWindowVisible(mainWindow));
  EXPECT_EQ(IsWindowEnabled(Control(mainWindow, IDC_APPLY_NOW)) != FALSE, GetParam() == IDC_APPLY_NOW);

  // Once the application has ended, the same press saves.
  tessera.End();
  PressSave(mainWindow);
  ASSERT_TRUE(WaitForSaved(console, mainWindow));
  EXPECT_TRUE(ReadDword(HKEY_CURRENT_USER, kSettingsKey, L"UILANGID", stored));
  EXPECT_EQ(stored, kGerman);
}

INSTANTIATE_TEST_SUITE_P(Buttons, ConsoleSave, ::testing::Values(IDOK, IDC_APPLY_NOW),
                         [](const ::testing::TestParamInfo<int>& info) {
                           return std::string(info.param == IDOK ? "OK" : "Apply");
                         });

// ---------------------------------------------------------------------------------------------

struct AboutCase {
  const wchar_t* spDisplayName;  // null: value absent
  const wchar_t* spBuild;
  const wchar_t* shownServicePack;
  const wchar_t* shownBuild;
  const char* screenshot;  // null: none taken
};

class ConsoleAbout : public ::testing::TestWithParam<AboutCase> {};

TEST_P(ConsoleAbout, ShowsTheDesktopServicePack) {
  const AboutCase& c = GetParam();
  ScopedRegistryKey desktop(HKEY_LOCAL_MACHINE, kDesktopKey);
  if (c.spDisplayName) desktop.SetString(L"SPDisplayName", c.spDisplayName);
  if (c.spBuild) desktop.SetString(L"SPBuild", c.spBuild);

  Console console;
  HWND mainWindow = console.WaitForMainWindow();
  ASSERT_NE(mainWindow, nullptr);
  OpenAboutBox(mainWindow);
  HWND about = console.WaitForDialog(L"About Mapora Administrator");
  ASSERT_NE(about, nullptr);

  EXPECT_EQ(WindowText(Control(about, IDC_SERVICE_PACK)), c.shownServicePack);
  EXPECT_EQ(WindowText(Control(about, IDC_SERVICE_PACK_BUILD)), c.shownBuild);
  if (c.screenshot) {
    EXPECT_FALSE(SaveScreenshot(about, c.screenshot).empty());
  }
}

INSTANTIATE_TEST_SUITE_P(
    ServicePacks, ConsoleAbout,
    ::testing::Values(AboutCase{nullptr, nullptr, L"", L"", nullptr},
                      AboutCase{L"Service Pack 1", L"1.6491", L"Service Pack 1", L"(Build 6491)", "about-box"},
                      AboutCase{L"Service Pack 1", L"6491", L"Service Pack 1", L"(Build 6491)", nullptr},
                      AboutCase{L"Service Pack 2", nullptr, L"Service Pack 2", L"", nullptr},
                      // Without a service pack name the build is not shown either.
                      AboutCase{nullptr, L"1.6491", L"", L"", nullptr}));

}  // namespace
