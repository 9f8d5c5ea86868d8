#include "settings/URLTokenManager.h"

#include "settings/SuiteSettings.h"

CURLTokenManager::CURLTokenManager() = default;

CURLTokenManager::~CURLTokenManager() = default;

bool CURLTokenManager::PortalServerSetByAdmin() { return ReadPortalServerSetByAdmin(); }
