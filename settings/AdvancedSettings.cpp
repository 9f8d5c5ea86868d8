#include "settings/AdvancedSettings.h"

#include <commctrl.h>

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

// The probe key and each of its parents below the root, deepest first.
std::vector<std::wstring> ProbeKeyChain() {
  std::vector<std::wstring> chain;
  for (std::wstring path = kMachineWriteProbeKey;; path.erase(path.rfind(L'\\'))) {
    chain.push_back(path);
    if (path.find(L'\\') == std::wstring::npos) return chain;
  }
}

// Removes the key when it holds neither subkeys nor values: whatever was put there meanwhile stays.
void DeleteEmptyClassesKey(const std::wstring& path) {
  HKEY key = nullptr;
  if (RegOpenKeyExW(HKEY_CLASSES_ROOT, path.c_str(), 0, KEY_QUERY_VALUE, &key) != ERROR_SUCCESS) return;
  DWORD subkeys = 0, values = 0;
  LONG status = RegQueryInfoKeyW(key, nullptr, nullptr, nullptr, &subkeys, nullptr, nullptr, &values, nullptr,
                                 nullptr, nullptr, nullptr);
  RegCloseKey(key);
  if (status == ERROR_SUCCESS && subkeys == 0 && values == 0) RegDeleteKeyW(HKEY_CLASSES_ROOT, path.c_str());
}

// The per-user portal settings key, created when missing; null when it cannot be.
HKEY OpenConnectionSettings() {
  HKEY key = nullptr;
  if (RegCreateKeyExW(HKEY_CURRENT_USER, kConnectionSettingsKey, 0, nullptr, 0, KEY_READ | KEY_WRITE, nullptr, &key,
                      nullptr) != ERROR_SUCCESS)
    return nullptr;
  return key;
}

void WriteSupportLocalPortal(DWORD supported) {
  HKEY key = OpenConnectionSettings();
  if (key == nullptr) return;
  DWORD value = supported != 0 ? 1 : 0;
  RegSetValueExW(key, kSupportLocalPortalValue, 0, REG_DWORD, reinterpret_cast<const BYTE*>(&value), sizeof value);
  RegCloseKey(key);
}

}  // namespace

void DeleteStoredUILangID() {
  HKEY key = nullptr;
  if (RegOpenKeyExW(HKEY_CURRENT_USER, kSuiteUserKey, 0, KEY_SET_VALUE, &key) != ERROR_SUCCESS) return;
  RegDeleteValueW(key, kUILangIDValue);
  RegCloseKey(key);
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
  DWORD value = 0;
  if (HKEY key = OpenConnectionSettings()) {
    DWORD size = sizeof value;
    if (RegQueryValueExW(key, kSupportLocalPortalValue, nullptr, nullptr, reinterpret_cast<BYTE*>(&value), &size) !=
        ERROR_SUCCESS)
      value = 0;
    RegCloseKey(key);
  }
  return LocalPortalSupportFromValue(value);
}

void PersistAdvancedSettings(AdminSession& mainDlg) {
  // The link control's class is registered at start-up with the others.
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
  // Creating the probe key creates whichever of its parents are missing too (the class key where
  // the suite has not registered its class, its categories key where it lists none); those go
  // again, so that looking leaves the workstation as it was.
  const std::vector<std::wstring> chain = ProbeKeyChain();
  std::vector<bool> missing;
  for (const std::wstring& path : chain) missing.push_back(ClassesKeyStatus(path) == ERROR_FILE_NOT_FOUND);
  const bool writable = ProbeMachineWrite();
  for (size_t i = 0; i < chain.size(); ++i)
    if (missing[i]) DeleteEmptyClassesKey(chain[i]);
  if (!writable) return false;
  CStringArray running;
  GetRunningSuiteApps(running);
  return running.empty();
}
