// The Advanced Configuration dialog of the running console: a copy started from the shared 32-bit
// program folder on a workstation with Desktop, whose bin folder holds language packs.
#include <gtest/gtest.h>
#include <shlobj.h>

#include <algorithm>
#include <initializer_list>
#include <iterator>
#include <memory>
#include <string>
#include <vector>

#include "res/resource.h"
#include "tests/e2e/ConsoleDriver.h"
#include "tests/support/TestSupport.h"

using namespace e2e;
using namespace testing_support;

namespace {

constexpr wchar_t kSuiteKey[] = L"SOFTWARE\\KVEL";
constexpr wchar_t kDesktopKey[] = L"SOFTWARE\\KVEL\\Desktop10.5";
constexpr wchar_t kDesktopSettingsKey[] = L"SOFTWARE\\KVEL\\Desktop10.5\\Settings";
constexpr wchar_t kConnectionKey[] = L"Software\\KVEL\\Mapora Connection\\Settings";
constexpr wchar_t kLocalPortal[] = L"Support Local Portal";
constexpr DWORD kAbsent = 0xFFFFFFFF;
constexpr wchar_t kEnglishUSEntry[] = L"Display language (English - United States)";

std::wstring CommonFilesX86() {
  wchar_t path[MAX_PATH] = L"";
  SHGetFolderPathW(nullptr, CSIDL_PROGRAM_FILES_COMMONX86, nullptr, SHGFP_TYPE_CURRENT, path);
  return path;
}

DWORD Dword(HKEY root, const std::wstring& key, const wchar_t* name) {
  DWORD value = 0;
  return ReadDword(root, key, name, value) ? value : kAbsent;
}

bool Checked(HWND dialog, int id) { return SendMessageW(Control(dialog, id), BM_GETCHECK, 0, 0) == BST_CHECKED; }

class AdvancedConfig : public ::testing::Test {
 protected:
  // packs: folder names under the Desktop's bin folder.
  void InstallDesktop(std::initializer_list<const wchar_t*> packs) {
    desktop_.SetString(L"InstallDir", desktopFolder_.Path());
    for (const wchar_t* pack : packs) desktopFolder_.MakeDir(std::wstring(L"bin\\") + pack);
  }

  // Starts the shared copy and opens the dialog from the workstation page; null when that fails.
  HWND OpenDialog() {
    const std::wstring program = sharedFolder_.Path() + L"\\MaporaAdmin.exe";
    if (!CopyFileTo(ConsolePath(), program)) return nullptr;
    console_ = std::make_unique<Console>(LaunchOptions{L"", {L"KVEL_DESKTOP10.5_INSTALLED=1"}}, program);
    mainWindow_ = console_->WaitForMainWindow();
    HWND advanced = nullptr;
    if (mainWindow_ == nullptr || !WaitUntil([&] {
          advanced = Descendant(mainWindow_, IDC_ADVANCED);
          return advanced != nullptr && IsWindowVisible(advanced);
        }))
      return nullptr;
    PostMessageW(advanced, BM_CLICK, 0, 0);
    return console_->WaitForDialog(L"Advanced Configuration");
  }

  // Ends the dialog with a button and returns once the console has written what it writes then.
  bool EndDialog(HWND dialog, int button) {
    Click(dialog, button);
    if (!WaitUntil([&] { return !IsWindow(dialog); })) return false;
    // The writes follow in the same handler; the console's one thread answers only afterwards.
    DWORD_PTR ignored = 0;
    return SendMessageTimeoutW(mainWindow_, WM_NULL, 0, 0, SMTO_NORMAL, kWaitMs, &ignored) != 0;
  }

  ScopedRegistryKey user_{HKEY_CURRENT_USER, kSuiteKey};
  ScopedRegistryKey desktop_{HKEY_LOCAL_MACHINE, kDesktopKey};
  ScopedDirectory desktopFolder_{ModuleFolder() + L"\\e2e-advanced-desktop"};
  ScopedDirectory sharedFolder_{CommonFilesX86() + L"\\e2e-advanced"};
  // Last, so that the console has ended before its folder is removed.
  std::unique_ptr<Console> console_;
  HWND mainWindow_ = nullptr;
};

// ---------------------------------------------------------------------------------------------

struct PersistCase {
  const char* name;
  int button;
  DWORD storedLanguage;  // kAbsent: none
  const wchar_t* selectedOnOpening;
  const wchar_t* chosen;
  DWORD languageAfterwards;
  bool boxesWritten;
};

class AdvancedConfigPersist : public AdvancedConfig, public ::testing::WithParamInterface<PersistCase> {};

TEST_P(AdvancedConfigPersist, ChangesEveryControlAndEnds) {
  const PersistCase& c = GetParam();
  InstallDesktop({L"de", L"fr"});
  if (c.storedLanguage != kAbsent) user_.SetDword(L"UILANGID", c.storedLanguage);
  ScopedRegistryKey machineSettings(HKEY_LOCAL_MACHINE, kDesktopSettingsKey);
  machineSettings.SetDword(L"EnableKUEI", 0);
  ScopedRegistryKey connection(HKEY_CURRENT_USER, kConnectionKey);
  connection.SetDword(kLocalPortal, 0);

  HWND dialog = OpenDialog();
  ASSERT_NE(dialog, nullptr);
  HWND list = Control(dialog, IDC_LANGUAGE_LIST);
  const std::vector<std::wstring> items = ComboItems(list);
  ASSERT_EQ(items.size(), 4u);
  EXPECT_EQ(items[0], kEnglishUSEntry);
  EXPECT_EQ(items[1], L"English");
  // Packs come in the order the file system lists them.
  std::vector<std::wstring> packs(items.begin() + 2, items.end());
  std::sort(packs.begin(), packs.end());
  EXPECT_EQ(packs, (std::vector<std::wstring>{L"Deutsch", L"fran\u00e7ais"}));
  ASSERT_GE(ComboSelection(list), 0);
  EXPECT_EQ(items[static_cast<size_t>(ComboSelection(list))], c.selectedOnOpening);

  const auto chosen = std::find(items.begin(), items.end(), c.chosen);
  ASSERT_NE(chosen, items.end());
  SelectComboItem(list, static_cast<int>(chosen - items.begin()));
  // The programme box is disabled for users who may not change machine settings.
  const bool kueiEnabled = IsWindowEnabled(Control(dialog, IDC_KUEI_CHECK)) != FALSE;
  ASSERT_TRUE(IsWindowEnabled(Control(dialog, IDC_LOCAL_PORTAL)));
  ASSERT_FALSE(Checked(dialog, IDC_KUEI_CHECK) || Checked(dialog, IDC_LOCAL_PORTAL));
  if (kueiEnabled) Click(dialog, IDC_KUEI_CHECK);
  Click(dialog, IDC_LOCAL_PORTAL);
  ASSERT_TRUE(WaitUntil(
      [&] { return Checked(dialog, IDC_LOCAL_PORTAL) && Checked(dialog, IDC_KUEI_CHECK) == kueiEnabled; }));

  ASSERT_TRUE(EndDialog(dialog, c.button));
  EXPECT_EQ(Dword(HKEY_CURRENT_USER, kSuiteKey, L"UILANGID"), c.languageAfterwards);
  EXPECT_EQ(Dword(HKEY_LOCAL_MACHINE, kDesktopSettingsKey, L"EnableKUEI"), c.boxesWritten && kueiEnabled ? 1u : 0u);
  EXPECT_EQ(Dword(HKEY_CURRENT_USER, kConnectionKey, kLocalPortal), c.boxesWritten ? 1u : 0u);
}

INSTANTIATE_TEST_SUITE_P(
    Buttons, AdvancedConfigPersist,
    ::testing::Values(PersistCase{"SaveGerman", IDOK, kAbsent, kEnglishUSEntry, L"Deutsch", 0x0007, true},
                      // The Windows language is stored as no value at all.
                      PersistCase{"SaveWindowsLanguage", IDOK, 0x0007, L"Deutsch", kEnglishUSEntry, kAbsent, true},
                      PersistCase{"Cancel", IDCANCEL, 0x0007, L"Deutsch", L"fran\u00e7ais", 0x0007, false}),
    [](const ::testing::TestParamInfo<PersistCase>& info) { return std::string(info.param.name); });

// ---------------------------------------------------------------------------------------------

struct LookCase {
  const wchar_t* uiLanguage;
  const wchar_t* windowsEntry;
  const wchar_t* warning;  // null: none shown
  const char* screenshot;
};

// Registered once per Windows UI language; each run photographs its own case.
TEST_F(AdvancedConfig, WarnsWhileTheWindowsLanguageHasNoPack) {
  static const LookCase kLooks[] = {
      {L"de-DE", L"Display language (Deutsch - Deutschland)",
       L"Warning: Mapora Deutsch language pack is not available on your system, Mapora UI will display as English.",
       "advanced-config-warning"},
      {L"en-US", kEnglishUSEntry, nullptr, "advanced-config"},
  };
  wchar_t uiLanguage[LOCALE_NAME_MAX_LENGTH] = L"";
  LCIDToLocaleName(GetUserDefaultUILanguage(), uiLanguage, LOCALE_NAME_MAX_LENGTH, 0);
  const LookCase* look = std::find_if(std::begin(kLooks), std::end(kLooks),
                                      [&](const LookCase& l) { return std::wstring(l.uiLanguage) == uiLanguage; });
  ASSERT_NE(look, std::end(kLooks)) << "no case for the Windows UI language";
  // Austrian German is no pack for German in Germany.
  InstallDesktop({L"de-AT"});

  HWND dialog = OpenDialog();
  ASSERT_NE(dialog, nullptr);
  HWND list = Control(dialog, IDC_LANGUAGE_LIST);
  HWND warning = Control(dialog, IDC_LANGUAGE_WARNING);
  const std::vector<std::wstring> items = ComboItems(list);
  ASSERT_EQ(items.size(), 3u);
  EXPECT_EQ(items[0], look->windowsEntry);
  EXPECT_EQ(items[2], L"Deutsch (\u00d6sterreich)");
  EXPECT_EQ(ComboSelection(list), 0);
  EXPECT_EQ(IsWindowVisible(warning) != FALSE, look->warning != nullptr);
  if (look->warning) {
    EXPECT_EQ(WindowText(warning), look->warning);
  }
  EXPECT_FALSE(SaveScreenshot(dialog, look->screenshot).empty());

  SelectComboItem(list, 2);
  EXPECT_TRUE(WaitUntil([&] { return !IsWindowVisible(warning); }));
}

}  // namespace
