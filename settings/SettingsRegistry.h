// Registry names of the settings that Advanced Configuration reads and writes, and of the
// machine-wide values an administrator sets for it. The display language lives in
// locale/SuiteUserSettings.h, the product keys in inventory/ProductRegistry.h.
#pragma once

#include <string>

#include "inventory/ProductRegistry.h"

// Per machine, under the Desktop product key + "\Settings" (HKEY_LOCAL_MACHINE), REG_DWORD:
// nonzero = take part in the user experience improvement programme; absent = 0.
inline constexpr wchar_t kProductSettingsSubkey[] = L"\\Settings";
inline constexpr wchar_t kEnableKueiValue[] = L"EnableKUEI";
inline std::wstring EnableKueiKey(const std::wstring& desktopKey) { return desktopKey + kProductSettingsSubkey; }

// Per user (HKEY_CURRENT_USER), REG_DWORD: exactly 1 = connecting to a local portal without a
// network is supported.
inline constexpr wchar_t kConnectionSettingsKey[] = L"Software\\KVEL\\Mapora Connection\\Settings";
inline constexpr wchar_t kSupportLocalPortalValue[] = L"Support Local Portal";

// Per machine (HKEY_LOCAL_MACHINE, as a 32-bit program sees it: under WOW6432Node on 64-bit
// Windows). "Portal Server Set By Admin", REG_DWORD: nonzero locks the portal settings.
// "Portal Manager Class", REG_SZ (braced GUID): the portal connection manager to create.
inline constexpr wchar_t kPortalMachineSettingsKey[] = L"SOFTWARE\\KVEL\\Mapora Connection\\Settings";
inline constexpr wchar_t kPortalServerSetByAdminValue[] = L"Portal Server Set By Admin";
inline constexpr wchar_t kPortalManagerClassValue[] = L"Portal Manager Class";

// Per machine (HKEY_LOCAL_MACHINE), REG_SZ: scheme and host behind "Learn More".
inline constexpr wchar_t kAdministratorMachineKey[] = L"SOFTWARE\\KVEL\\Mapora Administrator";
inline constexpr wchar_t kSupportSiteValue[] = L"Support Site";
inline constexpr wchar_t kDefaultSupportSite[] = L"https://support.kvel.example";
inline constexpr wchar_t kLearnMorePath[] = L"/en/knowledgebase/techarticles/detail/38987";
