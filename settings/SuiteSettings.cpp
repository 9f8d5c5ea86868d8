#include "settings/SuiteSettings.h"

#include "framework/RegistryKey.h"
#include "inventory/InstalledProducts.h"
#include "locale/SuiteUserSettings.h"
#include "settings/SettingsRegistry.h"

namespace {

// All-ones is no LANGID, so it can stand for "not stored".
constexpr DWORD kNoStoredLanguage = 0xFFFFFFFF;

}  // namespace

std::optional<DWORD> ReadStoredUILangID() {
  const DWORD stored = ReadRegistryDword(HKEY_CURRENT_USER, kSuiteUserKey, kUILangIDValue, kNoStoredLanguage);
  if (stored == kNoStoredLanguage) return std::nullopt;
  return stored;
}

DWORD ReadEnableKuei(const InstalledProducts& products) {
  return ReadRegistryDword(HKEY_LOCAL_MACHINE, EnableKueiKey(products.desktopKey), kEnableKueiValue, 0);
}

DWORD ReadSupportLocalPortal(ConnectionKeyAccess access) {
  // Any value of at most 4 bytes counts, whatever its type; a failed read leaves 0.
  DWORD value = 0;
  fw::RegistryKey key;
  const LONG opened = access == ConnectionKeyAccess::CreateMissing
                          ? key.Create(HKEY_CURRENT_USER, kConnectionSettingsKey, KEY_READ | KEY_WRITE)
                          : key.Open(HKEY_CURRENT_USER, kConnectionSettingsKey);
  if (opened == ERROR_SUCCESS) key.ReadUpTo4BytesOverDword(kSupportLocalPortalValue, value);
  return LocalPortalSupportFromValue(value);
}

bool ReadPortalServerSetByAdmin() {
  return ReadRegistryDword(HKEY_LOCAL_MACHINE, kPortalMachineSettingsKey, kPortalServerSetByAdminValue, 0) != 0;
}

StoredSuiteSettings ReadStoredSuiteSettings(const InstalledProducts& products) {
  StoredSuiteSettings settings;
  settings.uiLangId = ReadStoredUILangID();
  settings.enableKuei = ReadEnableKuei(products);
  settings.localPortalSupport = ReadSupportLocalPortal(ConnectionKeyAccess::OpenOnly);
  settings.portalServerSetByAdmin = ReadPortalServerSetByAdmin();
  return settings;
}
