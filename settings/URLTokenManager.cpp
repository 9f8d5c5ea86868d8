#include "settings/URLTokenManager.h"

#include "framework/RegistryKey.h"

CURLTokenManager::CURLTokenManager() = default;

CURLTokenManager::~CURLTokenManager() = default;

bool CURLTokenManager::PortalServerSetByAdmin() {
  return ReadRegistryDword(HKEY_LOCAL_MACHINE, kPortalMachineSettingsKey, kPortalServerSetByAdminValue, 0) != 0;
}
