// The Advanced Configuration dialog run as the workstation page runs it, in registry hives of the
// test's own: what it shows of the stored settings and what Save and Cancel write.
#include <gtest/gtest.h>

#include <functional>
#include <ostream>

#include "framework/RegistryKey.h"
#include "framework/Wnd.h"
#include "inventory/AdminSession.h"
#include "res/resource.h"
#include "settings/AdvancedSettings.h"
#include "tests/support/TestSupport.h"

namespace {

using testing_support::ScopedRegistryKey;

constexpr wchar_t kDesktopKey[] = L"SOFTWARE\\KVEL\\Desktop10.5";
constexpr wchar_t kKueiKey[] = L"SOFTWARE\\KVEL\\Desktop10.5\\Settings";
constexpr DWORD kAbsent = 0xFFFFFFFF;
constexpr DWORD kGermanAustria = 0x0C07;
constexpr DWORD kItalian = 0x0410;
// Entries of the list with one pack installed (de-AT).
constexpr int kWindowsLanguageEntry = 0;
constexpr int kEnglishEntry = 1;
constexpr int kAustrianGermanEntry = 2;

class TestSession : public AdminSession {
 public:
  void EnableApply() override {}
  void OpenAdvancedSettings() override {}
};

DWORD Stored(HKEY root, const std::wstring& key, const wchar_t* name) {
  DWORD value = 0;
  if (!testing_support::ReadDword(root, key, name, value)) return kAbsent;
  return value;
}

struct DialogSearch {
  const wchar_t* caption;
  HWND found;
};

// A named callback: on 32-bit x86 a lambda does not convert to the stdcall pointer needed here.
BOOL CALLBACK MatchCaption(HWND window, LPARAM param) {
  auto* search = reinterpret_cast<DialogSearch*>(param);
  if (GetWindowTextOf(window) == search->caption && IsWindowVisible(window)) search->found = window;
  return search->found == nullptr;
}

HWND FindDialogOfThisThread(const wchar_t* caption) {
  DialogSearch search = {caption, nullptr};
  EnumThreadWindows(GetCurrentThreadId(), MatchCaption, reinterpret_cast<LPARAM>(&search));
  return search.found;
}

// What a test does while the dialog is open; set only during one run.
std::function<void(HWND)> g_whileOpen;

void CALLBACK ActOnOpenDialog(HWND, UINT, UINT_PTR, DWORD) {
  HWND dialog = FindDialogOfThisThread(L"Advanced Configuration");
  if (dialog == nullptr || !g_whileOpen) return;
  std::function<void(HWND)> action = std::move(g_whileOpen);
  g_whileOpen = nullptr;
  action(dialog);
}

// The user's actions on the open dialog: each control answers as it does to the mouse.
void Click(HWND dialog, int id) { SendMessageW(GetDlgItem(dialog, id), BM_CLICK, 0, 0); }

void SelectLanguage(HWND dialog, int index) {
  SendDlgItemMessageW(dialog, IDC_LANGUAGE_LIST, CB_SETCURSEL, static_cast<WPARAM>(index), 0);
  SendMessageW(dialog, WM_COMMAND, MAKEWPARAM(IDC_LANGUAGE_LIST, CBN_SELCHANGE),
               reinterpret_cast<LPARAM>(GetDlgItem(dialog, IDC_LANGUAGE_LIST)));
}

bool IsChecked(HWND dialog, int id) { return IsDlgButtonChecked(dialog, id) == BST_CHECKED; }
bool IsEnabled(HWND dialog, int id) { return IsWindowEnabled(GetDlgItem(dialog, id)) != FALSE; }
// The style bit: the dialog itself may not be painted yet.
bool IsShown(HWND dialog, int id) { return (GetWindowLongW(GetDlgItem(dialog, id), GWL_STYLE) & WS_VISIBLE) != 0; }

DWORD SelectedLanguage(HWND dialog) {
  const LRESULT index = SendDlgItemMessageW(dialog, IDC_LANGUAGE_LIST, CB_GETCURSEL, 0, 0);
  return static_cast<DWORD>(SendDlgItemMessageW(dialog, IDC_LANGUAGE_LIST, CB_GETITEMDATA, index, 0));
}

// A workstation with Desktop installed and its one language pack, de-AT; the session holds what
// the main window would have read.
class AdvancedConfiguration : public testing::Test {
 protected:
  AdvancedConfiguration() {
    m_desktop.SetString(L"InstallDir", m_folders.MakeDir(L"desktop"));
    m_folders.MakeDir(L"desktop\\bin\\de-AT");
    m_session.m_installedProducts.desktopKey = kDesktopKey;
    m_session.m_installedProducts.desktopInstalled = true;
    m_session.m_machineSettingsWritable = true;
  }

  void StoreLanguage(DWORD langId) {
    m_user.SetDword(kUILangIDValue, langId);
    m_session.m_dwUILangID = langId;
  }

  // Opens the dialog as the workstation page's button does; once it shows, whileOpen acts on it
  // and closeWith (IDOK for Save, IDCANCEL) ends it.
  void Run(int closeWith, const std::function<void(HWND)>& whileOpen = nullptr) {
    bool shown = false;
    g_whileOpen = [&](HWND dialog) {
      shown = true;
      if (whileOpen) whileOpen(dialog);
      Click(dialog, closeWith);
    };
    const UINT_PTR timer = SetTimer(nullptr, 0, 10, ActOnOpenDialog);
    PersistAdvancedSettings(m_session);
    KillTimer(nullptr, timer);
    g_whileOpen = nullptr;
    EXPECT_TRUE(shown) << "the dialog never showed";
  }

  testing_support::ScopedHiveOverride m_hives;
  testing_support::ScopedDirectory m_folders{testing_support::ModuleFolder() + L"\\advanced-config-" +
                                             std::to_wstring(GetCurrentProcessId())};
  ScopedRegistryKey m_desktop{HKEY_LOCAL_MACHINE, kDesktopKey};
  ScopedRegistryKey m_user{HKEY_CURRENT_USER, kSuiteUserKey};
  TestSession m_session;
};

TEST_F(AdvancedConfiguration, ListsTheFixedEntriesAndThePack) {
  std::vector<std::pair<std::wstring, DWORD>> entries;
  Run(IDCANCEL, [&](HWND dialog) {
    const LRESULT count = SendDlgItemMessageW(dialog, IDC_LANGUAGE_LIST, CB_GETCOUNT, 0, 0);
    for (LRESULT index = 0; index < count; ++index) {
      wchar_t text[256] = L"";
      SendDlgItemMessageW(dialog, IDC_LANGUAGE_LIST, CB_GETLBTEXT, index, reinterpret_cast<LPARAM>(text));
      const DWORD data = static_cast<DWORD>(SendDlgItemMessageW(dialog, IDC_LANGUAGE_LIST, CB_GETITEMDATA, index, 0));
      entries.emplace_back(text, data);
    }
  });

  const std::vector<std::pair<std::wstring, DWORD>> expected = {{L"Display language (English - United States)", 0},
                                                                {L"English", 9},
                                                                {L"Deutsch (\u00d6sterreich)", kGermanAustria}};
  EXPECT_EQ(entries, expected);
}

TEST_F(AdvancedConfiguration, SelectsTheStoredLanguage) {
  StoreLanguage(kGermanAustria);
  DWORD selected = 0;

  Run(IDCANCEL, [&](HWND dialog) { selected = SelectedLanguage(dialog); });

  EXPECT_EQ(selected, kGermanAustria);
}

TEST_F(AdvancedConfiguration, ForgetsAStoredLanguageWhosePackHasGoneEvenOnCancel) {
  StoreLanguage(kItalian);
  DWORD storedWhileOpen = 0;
  DWORD selected = kAbsent;

  Run(IDCANCEL, [&](HWND dialog) {
    storedWhileOpen = Stored(HKEY_CURRENT_USER, kSuiteUserKey, kUILangIDValue);
    selected = SelectedLanguage(dialog);
  });

  EXPECT_EQ(storedWhileOpen, kAbsent);
  EXPECT_EQ(selected, 0u);
  EXPECT_EQ(m_session.m_dwUILangID, 0u);
  EXPECT_EQ(Stored(HKEY_CURRENT_USER, kSuiteUserKey, kUILangIDValue), kAbsent);
}

TEST_F(AdvancedConfiguration, SaveStoresTheChosenLanguage) {
  Run(IDOK, [](HWND dialog) { SelectLanguage(dialog, kAustrianGermanEntry); });

  EXPECT_EQ(m_session.m_dwUILangID, kGermanAustria);
  EXPECT_EQ(Stored(HKEY_CURRENT_USER, kSuiteUserKey, kUILangIDValue), kGermanAustria);
}

TEST_F(AdvancedConfiguration, SaveOfTheWindowsLanguageDeletesTheStoredValue) {
  StoreLanguage(kGermanAustria);

  Run(IDOK, [](HWND dialog) { SelectLanguage(dialog, kWindowsLanguageEntry); });

  EXPECT_EQ(Stored(HKEY_CURRENT_USER, kSuiteUserKey, kUILangIDValue), kAbsent);
}

TEST_F(AdvancedConfiguration, CancelOnlyRewritesTheSessionLanguage) {
  StoreLanguage(kGermanAustria);
  WriteRegistryDword(kKueiKey, kEnableKueiValue, 0, HKEY_LOCAL_MACHINE);
  WriteRegistryDword(kConnectionSettingsKey, kSupportLocalPortalValue, 0, HKEY_CURRENT_USER);

  Run(IDCANCEL, [this](HWND dialog) {
    // Removed behind the dialog's back: the value afterwards is the one Cancel wrote.
    m_user.DeleteValue(kUILangIDValue);
    SelectLanguage(dialog, kEnglishEntry);
    Click(dialog, IDC_KUEI_CHECK);
    Click(dialog, IDC_LOCAL_PORTAL);
  });

  EXPECT_EQ(Stored(HKEY_CURRENT_USER, kSuiteUserKey, kUILangIDValue), kGermanAustria);
  EXPECT_EQ(Stored(HKEY_LOCAL_MACHINE, kKueiKey, kEnableKueiValue), 0u);
  EXPECT_EQ(Stored(HKEY_CURRENT_USER, kConnectionSettingsKey, kSupportLocalPortalValue), 0u);
}

TEST_F(AdvancedConfiguration, ProgrammeBoxShowsAnyNonzeroValueCheckedAndSaveLeavesItUntouched) {
  WriteRegistryDword(kKueiKey, kEnableKueiValue, 2, HKEY_LOCAL_MACHINE);
  bool checked = false;

  Run(IDOK, [&](HWND dialog) { checked = IsChecked(dialog, IDC_KUEI_CHECK); });

  EXPECT_TRUE(checked);
  EXPECT_EQ(Stored(HKEY_LOCAL_MACHINE, kKueiKey, kEnableKueiValue), 2u);
}

TEST_F(AdvancedConfiguration, ProgrammeBoxUncheckedAndCheckedAgainSavesOne) {
  WriteRegistryDword(kKueiKey, kEnableKueiValue, 2, HKEY_LOCAL_MACHINE);

  Run(IDOK, [](HWND dialog) {
    Click(dialog, IDC_KUEI_CHECK);
    Click(dialog, IDC_KUEI_CHECK);
  });

  EXPECT_EQ(Stored(HKEY_LOCAL_MACHINE, kKueiKey, kEnableKueiValue), 1u);
}

TEST_F(AdvancedConfiguration, ProgrammeBoxDisabledWithoutTheRightToWriteMachineSettings) {
  m_session.m_machineSettingsWritable = false;
  bool enabled = true;

  Run(IDOK, [&](HWND dialog) { enabled = IsEnabled(dialog, IDC_KUEI_CHECK); });

  EXPECT_FALSE(enabled);
  EXPECT_EQ(Stored(HKEY_LOCAL_MACHINE, kKueiKey, kEnableKueiValue), kAbsent);
}

TEST_F(AdvancedConfiguration, ProgrammeControlsHiddenWithoutDesktop) {
  m_session.m_installedProducts.desktopInstalled = false;
  std::vector<bool> shown;

  Run(IDOK, [&](HWND dialog) {
    for (int id : {IDC_KUEI_CHECK, IDC_KUEI_GROUP, IDC_KUEI_LINK}) shown.push_back(IsShown(dialog, id));
  });

  EXPECT_EQ(shown, std::vector<bool>({false, false, false}));
  EXPECT_EQ(Stored(HKEY_LOCAL_MACHINE, kKueiKey, kEnableKueiValue), kAbsent);
}

struct LocalPortalRow {
  const char* name;
  DWORD stored;
  bool clicked;
  bool shownChecked;
  DWORD saved;
};

void PrintTo(const LocalPortalRow& row, std::ostream* out) { *out << row.name; }

class LocalPortal : public AdvancedConfiguration, public testing::WithParamInterface<LocalPortalRow> {};

TEST_P(LocalPortal, CountsOnlyExactlyOneAndSaveWritesZeroOrOne) {
  const LocalPortalRow& row = GetParam();
  if (row.stored != kAbsent)
    WriteRegistryDword(kConnectionSettingsKey, kSupportLocalPortalValue, row.stored, HKEY_CURRENT_USER);
  bool checked = false;

  Run(IDOK, [&](HWND dialog) {
    checked = IsChecked(dialog, IDC_LOCAL_PORTAL);
    if (row.clicked) Click(dialog, IDC_LOCAL_PORTAL);
  });

  EXPECT_EQ(checked, row.shownChecked);
  EXPECT_EQ(Stored(HKEY_CURRENT_USER, kConnectionSettingsKey, kSupportLocalPortalValue), row.saved);
}

INSTANTIATE_TEST_SUITE_P(
    StoredValues, LocalPortal,
    testing::Values(LocalPortalRow{"Absent", kAbsent, false, false, 0}, LocalPortalRow{"One", 1, false, true, 1},
                    LocalPortalRow{"Two", 2, false, false, 0}, LocalPortalRow{"TwoClicked", 2, true, false, 1}),
    [](const testing::TestParamInfo<LocalPortalRow>& info) { return std::string(info.param.name); });

TEST_F(AdvancedConfiguration, OpeningCreatesThePortalSettingsKey) {
  Run(IDCANCEL);

  fw::RegistryKey key;
  EXPECT_EQ(key.Open(HKEY_CURRENT_USER, kConnectionSettingsKey, KEY_READ), ERROR_SUCCESS);
}

TEST_F(AdvancedConfiguration, PortalControlsDisabledWhenAnAdministratorSetTheServer) {
  WriteRegistryDword(kPortalMachineSettingsKey, kPortalServerSetByAdminValue, 1, HKEY_LOCAL_MACHINE);
  bool managerEnabled = true;
  bool localPortalEnabled = true;

  Run(IDCANCEL, [&](HWND dialog) {
    managerEnabled = IsEnabled(dialog, IDC_MANAGE_PORTALS);
    localPortalEnabled = IsEnabled(dialog, IDC_LOCAL_PORTAL);
  });

  EXPECT_FALSE(managerEnabled);
  EXPECT_FALSE(localPortalEnabled);
}

// Run in a process of its own with a German Windows (LANG de_DE): no pack serves de-DE here.
using GermanWindows = AdvancedConfiguration;

TEST_F(GermanWindows, IsNamedAndWarnedAboutWhileItsEntryIsSelected) {
  std::wstring windowsEntry;
  std::wstring warning;
  std::vector<bool> warningShown;

  Run(IDCANCEL, [&](HWND dialog) {
    wchar_t text[256] = L"";
    SendDlgItemMessageW(dialog, IDC_LANGUAGE_LIST, CB_GETLBTEXT, 0, reinterpret_cast<LPARAM>(text));
    windowsEntry = text;
    warning = GetWindowTextOf(GetDlgItem(dialog, IDC_LANGUAGE_WARNING));
    warningShown.push_back(IsShown(dialog, IDC_LANGUAGE_WARNING));
    SelectLanguage(dialog, kEnglishEntry);
    warningShown.push_back(IsShown(dialog, IDC_LANGUAGE_WARNING));
    SelectLanguage(dialog, kWindowsLanguageEntry);
    warningShown.push_back(IsShown(dialog, IDC_LANGUAGE_WARNING));
  });

  EXPECT_EQ(windowsEntry, L"Display language (Deutsch - Deutschland)");
  EXPECT_EQ(
      warning,
      L"Warning: Mapora Deutsch language pack is not available on your system, Mapora UI will display as English.");
  EXPECT_EQ(warningShown, std::vector<bool>({true, false, true}));
}

}  // namespace
