// Advanced Configuration as the workstation page runs it, in hives of the test's own: what only it shows and writes.
#include <gtest/gtest.h>

#include <functional>
#include <utility>

#include "framework/RegistryKey.h"
#include "inventory/AdminSession.h"
#include "settings/AdvancedSettings.h"
#include "tests/e2e/ConsoleDriver.h"
#include "tests/support/TestSupport.h"

namespace {

using namespace testing_support;

constexpr wchar_t kDesktopKey[] = L"SOFTWARE\\KVEL\\Desktop10.5";
const std::wstring kKueiKey = EnableKueiKey(kDesktopKey);

std::function<void(HWND)> g_whileOpen;  // the running test's look at the open dialog

void CALLBACK ActOnOpenDialog(HWND, UINT, UINT_PTR, DWORD) {
  HWND dialog = GetActiveWindow();
  if (!g_whileOpen || e2e::Text(dialog) != L"Advanced Configuration") return;
  std::exchange(g_whileOpen, nullptr)(dialog);
}

struct Row {
  const char* name;
  bool desktop;  // installed
  bool locked;   // no right to write machine settings, and an administrator set the portal server
  DWORD language, kuei, portal;  // stored before opening; kAbsent: none
  int entry;                     // chosen from the list; -1: none
  std::vector<int> clicks;       // the last one closes the dialog
  std::vector<int> hidden, disabled, checked;  // controls on opening
  DWORD languageWhileOpen, savedLanguage, savedKuei, savedPortal;
};

// Desktop (if so) and Engine installed, each with a pack among other names; the session as the main window read it.
class Workstation : public AdminSession {
 public:
  Workstation(bool desktop, bool locked) {
    m_installedProducts.desktopKey = kDesktopKey;
    m_installedProducts.engineKey = L"SOFTWARE\\KVEL\\Engine10.5";
    m_installedProducts.desktopInstalled = desktop;
    m_installedProducts.engineInstalled = true;
    m_machineSettingsWritable = !locked;
    SetRegistryDword(HKEY_LOCAL_MACHINE, kPortalMachineSettingsKey, kPortalServerSetByAdminValue, locked);
    // A trailing backslash gives a doubled one in the search, which the file system accepts.
    SetRegistryString(HKEY_LOCAL_MACHINE, kDesktopKey, L"InstallDir", m_folders.Path() + L"\\d\\");
    SetRegistryString(HKEY_LOCAL_MACHINE, m_installedProducts.engineKey, L"InstallDir", m_folders.Path() + L"\\e");
    for (const wchar_t* folder : {L"d\\bin\\de-AT", L"d\\bin\\xx-YY", L"e\\bin\\de"}) m_folders.MakeDir(folder);
    m_folders.MakeFile(L"d\\bin\\it");
  }
  void OpenAdvancedSettings() override {}

  void Open(const Row& row) {
    g_whileOpen = [&](HWND dialog) {
      HWND list = e2e::Control(dialog, IDC_LANGUAGE_LIST);
      for (int index = 0; index < SendMessageW(list, CB_GETCOUNT, 0, 0); ++index)
        m_entries.push_back(e2e::ComboText(list, index) + L" = " +
                            std::to_wstring(SendMessageW(list, CB_GETITEMDATA, index, 0)));
      for (int id : {IDC_KUEI_CHECK, IDC_KUEI_GROUP, IDC_KUEI_LINK, IDC_MANAGE_PORTALS, IDC_LOCAL_PORTAL}) {
        // The style bit: the dialog itself may not be painted yet.
        if ((GetWindowLongW(e2e::Control(dialog, id), GWL_STYLE) & WS_VISIBLE) == 0) m_hidden.push_back(id);
        if (!IsWindowEnabled(e2e::Control(dialog, id))) m_disabled.push_back(id);
        if (IsDlgButtonChecked(dialog, id) == BST_CHECKED) m_checked.push_back(id);
      }
      m_languageWhileOpen = StoredDword(HKEY_CURRENT_USER, kSuiteUserKey, kUILangIDValue);
      // Removed behind the dialog's back: afterwards the value is the one its closing wrote.
      RegDeleteKeyValueW(HKEY_CURRENT_USER, kSuiteUserKey, kUILangIDValue);
      if (row.entry >= 0) e2e::SelectCombo(list, row.entry);
      for (int id : row.clicks) e2e::Click(dialog, id);
    };
    const UINT_PTR timer = SetTimer(nullptr, 0, 10, ActOnOpenDialog);
    PersistAdvancedSettings(*this);
    KillTimer(nullptr, timer);
  }

  std::vector<std::wstring> m_entries;  // text = item data
  std::vector<int> m_hidden, m_disabled, m_checked;
  DWORD m_languageWhileOpen = 0;

 private:
  ScopedHiveOverride m_hives;
  ScopedDirectory m_folders{ModuleFolder() + L"\\advanced-config-" + std::to_wstring(GetCurrentProcessId())};
};

TEST(AdvancedConfiguration, ShowsTheWorkstationAndWritesWhatTheButtonSays) {
  const int kKuei = IDC_KUEI_CHECK, kPortal = IDC_LOCAL_PORTAL;
  const Row rows[] = {
      {"UntouchedSaveLeavesTheRawProgrammeValue", true, false, kAbsent, 2, 1, -1, {IDOK}, {}, {}, {kKuei, kPortal},
       kAbsent, kAbsent, 2, 1},
      {"ProgrammeBoxClickedTwiceSavesOne", true, false, kAbsent, 2, 2, -1, {kKuei, kKuei, IDOK}, {}, {}, {kKuei},
       kAbsent, kAbsent, 1, 0},
      {"CancelWritesOnlyTheLanguage", true, false, 0x0C07, 2, 2, 1, {kKuei, kPortal, IDCANCEL}, {}, {}, {kKuei},
       0x0C07, 0x0C07, 2, 2},
      {"StaleLanguageForgottenOnOpeningProgrammeHiddenWithoutDesktop", false, false, 0x0410, kAbsent, kAbsent, -1,
       {IDCANCEL}, {kKuei, IDC_KUEI_GROUP, IDC_KUEI_LINK}, {}, {}, kAbsent, kAbsent, kAbsent, kAbsent},
      {"LockedProgrammeBoxAndPortalControls", true, true, kAbsent, kAbsent, kAbsent, -1, {IDOK}, {},
       {kKuei, IDC_MANAGE_PORTALS, kPortal}, {}, kAbsent, kAbsent, kAbsent, 0},
  };
  for (const Row& row : rows) {
    SCOPED_TRACE(row.name);
    Workstation workstation(row.desktop, row.locked);
    if (row.language != kAbsent) SetRegistryDword(HKEY_CURRENT_USER, kSuiteUserKey, kUILangIDValue, row.language);
    if (row.language != kAbsent) workstation.m_dwUILangID = row.language;
    if (row.kuei != kAbsent) SetRegistryDword(HKEY_LOCAL_MACHINE, kKueiKey, kEnableKueiValue, row.kuei);
    if (row.portal != kAbsent)
      SetRegistryDword(HKEY_CURRENT_USER, kConnectionSettingsKey, kSupportLocalPortalValue, row.portal);

    workstation.Open(row);

    // The folders naming a locale of the installed products, Desktop's first.
    std::vector<std::wstring> entries = {L"Display language (English - United States) = 0", L"English = 9",
                                         L"Deutsch (\u00d6sterreich) = 3079", L"Deutsch = 7"};
    if (!row.desktop) entries.erase(entries.begin() + 2);
    EXPECT_EQ(workstation.m_entries, entries);
    EXPECT_EQ(workstation.m_hidden, row.hidden);
    EXPECT_EQ(workstation.m_disabled, row.disabled);
    EXPECT_EQ(workstation.m_checked, row.checked);
    EXPECT_EQ(workstation.m_languageWhileOpen, row.languageWhileOpen);
    EXPECT_EQ(StoredDword(HKEY_CURRENT_USER, kSuiteUserKey, kUILangIDValue), row.savedLanguage);
    EXPECT_EQ(StoredDword(HKEY_LOCAL_MACHINE, kKueiKey, kEnableKueiValue), row.savedKuei);
    EXPECT_EQ(StoredDword(HKEY_CURRENT_USER, kConnectionSettingsKey, kSupportLocalPortalValue), row.savedPortal);
    EXPECT_EQ(fw::RegistryKey().Open(HKEY_CURRENT_USER, kConnectionSettingsKey), ERROR_SUCCESS) << "made on opening";
  }
}

}  // namespace
