#include "settings/URLTokenManager.h"

#include "settings/AdvancedSettings.h"

CURLTokenManager::CURLTokenManager() = default;

CURLTokenManager::~CURLTokenManager() = default;

bool CURLTokenManager::PortalServerSetByAdmin() {
  return ReadRegistryDword(HKEY_LOCAL_MACHINE, kPortalMachineSettingsKey, kPortalServerSetByAdminValue, 0) != 0;
}
