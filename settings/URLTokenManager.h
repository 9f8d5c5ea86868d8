// Stands in for the suite file-helper library's CURLTokenManager, which is not installed beside
// the console. Only the question the console asks is answered.
//
// An administrator fixes the portal server for every user of the workstation with the value
//   HKEY_LOCAL_MACHINE\SOFTWARE\KVEL\Mapora Connection\Settings
//     "Portal Server Set By Admin"   REG_DWORD, nonzero = set by the administrator
// (as a 32-bit program sees HKEY_LOCAL_MACHINE\SOFTWARE: under WOW6432Node on 64-bit Windows).
// Absent, unreadable or 0 means the users choose their own portal connections.
#pragma once

#include <windows.h>

#include "settings/SettingsRegistry.h"


class CURLTokenManager {
 public:
  CURLTokenManager();
  ~CURLTokenManager();
  CURLTokenManager(const CURLTokenManager&) = delete;
  CURLTokenManager& operator=(const CURLTokenManager&) = delete;

  // True when an administrator has fixed the portal server; read afresh on every call.
  bool PortalServerSetByAdmin();
};
