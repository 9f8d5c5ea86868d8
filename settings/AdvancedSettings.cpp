#include "settings/AdvancedSettings.h"

#include "framework/RegistryKey.h"
#include "inventory/AdminSession.h"
#include "inventory/InstalledProducts.h"
#include "settings/ClientMaporaAdvancedConfigDlg.h"

namespace {

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
