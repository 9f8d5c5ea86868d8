#include "settings/AdvancedSettings.h"

#include "framework/RegistryKey.h"
#include "inventory/AdminSession.h"
#include "inventory/RunningSuiteApps.h"
#include "inventory/InstalledProducts.h"
#include "settings/ClientMaporaAdvancedConfigDlg.h"

namespace {

// Only an administrator may create keys here. The class is one of the suite's own, registered
// under the standard "controls" category.
const std::wstring kMachineWriteProbeClassKey = L"CLSID\\{EACA595B-B64B-4B80-91AF-DD4517EB4ABC}";
const std::wstring kMachineWriteProbeCategoriesKey = kMachineWriteProbeClassKey + L"\\Implemented Categories";
const std::wstring kMachineWriteProbeKey = kMachineWriteProbeCategoriesKey + L"\\{40FC6ED5-2438-11CF-A3DB-080036F12502}";

// ERROR_SUCCESS when the key opens; ERROR_FILE_NOT_FOUND only when it is really missing.
LONG ClassesKeyStatus(const std::wstring& path) {
  HKEY key = nullptr;
  LONG status = RegOpenKeyW(HKEY_CLASSES_ROOT, path.c_str(), &key);
  if (status == ERROR_SUCCESS) RegCloseKey(key);
  return status;
}

// Two rounds of create-or-delete leave the probe key as they found it.
bool ProbeMachineWrite() {
  for (int round = 0; round < 2; ++round) {
    HKEY key = nullptr;
    if (ClassesKeyStatus(kMachineWriteProbeKey) == ERROR_SUCCESS) {
      if (RegDeleteKeyW(HKEY_CLASSES_ROOT, kMachineWriteProbeKey.c_str()) != ERROR_SUCCESS) return false;
    } else {
      if (RegCreateKeyW(HKEY_CLASSES_ROOT, kMachineWriteProbeKey.c_str(), &key) != ERROR_SUCCESS) return false;
      RegCloseKey(key);
    }
  }
  return true;
}

// The per-user portal settings key with read and write access, created when missing.
LONG OpenConnectionSettings(fw::RegistryKey& key) {
  return key.Create(HKEY_CURRENT_USER, kConnectionSettingsKey, KEY_READ | KEY_WRITE);
}

void WriteSupportLocalPortal(DWORD supported) {
  fw::RegistryKey key;
  if (OpenConnectionSettings(key) != ERROR_SUCCESS) return;
  key.WriteDword(kSupportLocalPortalValue, supported != 0 ? 1 : 0);
}

}  // namespace

void DeleteStoredUILangID() {
  fw::RegistryKey key;
  if (key.Open(HKEY_CURRENT_USER, kSuiteUserKey, KEY_SET_VALUE) != ERROR_SUCCESS) return;
  key.DeleteValue(kUILangIDValue);
}

void StoreUILangID(DWORD langId) {
  if (langId != 0)
    WriteRegistryDword(kSuiteUserKey, kUILangIDValue, langId, HKEY_CURRENT_USER);
  else
    DeleteStoredUILangID();
}

DWORD ReadEnableKuei(const InstalledProducts& products) {
  return ReadRegistryDword(HKEY_LOCAL_MACHINE, EnableKueiKey(products.desktopKey), kEnableKueiValue, 0);
}

DWORD ReadSupportLocalPortal() {
  // Any value of at most 4 bytes counts, whatever its type; a failed read leaves 0.
  DWORD value = 0;
  fw::RegistryKey key;
  if (OpenConnectionSettings(key) == ERROR_SUCCESS) key.ReadDword(kSupportLocalPortalValue, value);
  return LocalPortalSupportFromValue(value);
}

void PersistAdvancedSettings(AdminSession& mainDlg) {
  // Without a parent the box belongs to the main window, as every box of the program does.
  CClientMaporaAdvancedConfigDlg dlg;
  dlg.m_pMainDlg = &mainDlg;
  if (dlg.DoModal() == IDOK) {
    mainDlg.m_dwUILangID = dlg.m_selectedLangId;
    // An untouched box still holds the raw value, so only a real change is written.
    const InstalledProducts& products = mainDlg.m_installedProducts;
    if (dlg.m_enableKuei != ReadEnableKuei(products))
      WriteRegistryDword(EnableKueiKey(products.desktopKey), kEnableKueiValue, dlg.m_enableKuei, HKEY_LOCAL_MACHINE);
    WriteSupportLocalPortal(dlg.m_supportLocalPortal);
  }
  // Also after Cancel: this rewrites the stored value, or keeps the removal made on opening.
  StoreUILangID(mainDlg.m_dwUILangID);
}

bool CanWriteMachineSettings() {
  // Where the suite has not registered its class, the probe's create makes the class key too;
  // it goes again, so that looking leaves the workstation as it was.
  const bool classMissing = ClassesKeyStatus(kMachineWriteProbeClassKey) == ERROR_FILE_NOT_FOUND;
  const bool writable = ProbeMachineWrite();
  if (classMissing) {
    // Only empty keys go: anything registered there meanwhile stays.
    RegDeleteKeyW(HKEY_CLASSES_ROOT, kMachineWriteProbeCategoriesKey.c_str());
    RegDeleteKeyW(HKEY_CLASSES_ROOT, kMachineWriteProbeClassKey.c_str());
  }
  if (!writable) return false;
  CStringArray running;
  GetRunningSuiteApps(running);
  return running.empty();
}
