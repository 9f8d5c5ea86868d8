// The advanced settings the workstation page opens, and what the main window needs of them.
#pragma once

#include <windows.h>

#include <string>

class CClientAdminDlg;
struct InstalledProducts;

// Per-user suite settings: HKEY_CURRENT_USER\SOFTWARE\KVEL, value UILANGID (REG_DWORD, a LANGID;
// absent = follow the Windows UI language, 9 = English). It is never stored as 0.
inline constexpr wchar_t kSuiteUserKey[] = L"SOFTWARE\\KVEL";
inline constexpr wchar_t kUILangIDValue[] = L"UILANGID";
// Per-user portal settings: value "Support Local Portal" (REG_DWORD, exactly 1 = supported).
inline constexpr wchar_t kConnectionSettingsKey[] = L"Software\\KVEL\\Mapora Connection\\Settings";
inline constexpr wchar_t kSupportLocalPortalValue[] = L"Support Local Portal";
// Per-machine, under the Desktop product key + "\Settings" in HKEY_LOCAL_MACHINE: nonzero = take
// part in the user experience improvement programme.
inline constexpr wchar_t kEnableKueiValue[] = L"EnableKUEI";

// The workstation page's "Advanced..." handler: runs the Advanced Configuration dialog modally
// and writes what it chose.
void PersistAdvancedSettings(CClientAdminDlg& mainDlg);

// Whether this user may change machine-wide suite settings right now: a write probe under
// HKEY_CLASSES_ROOT (left as it was found) and no suite application running.
bool CanWriteMachineSettings();

// Registry helpers shared with the main window; each returns its default on any failure.
DWORD ReadRegistryDword(HKEY root, const std::wstring& keyPath, const std::wstring& valueName, DWORD defaultValue);
bool WriteRegistryDword(const std::wstring& keyPath, const std::wstring& valueName, DWORD value, HKEY root);

// Writes UILANGID, or deletes it when langId is 0 (a missing key or value is no error).
void StoreUILangID(DWORD langId);
// Removes UILANGID; nothing happens when the key cannot be opened.
void DeleteStoredUILangID();

// The raw EnableKUEI of the Desktop product (0 when absent).
DWORD ReadEnableKuei(const InstalledProducts& products);
// 1 when "Support Local Portal" holds exactly 1, else 0. Creates the per-user key when missing.
DWORD ReadSupportLocalPortal();
