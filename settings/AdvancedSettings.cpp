#include "settings/AdvancedSettings.h"

// Placeholders until the Advanced Configuration dialog lands.
void PersistAdvancedSettings(CClientAdminDlg&) {}

bool CanWriteMachineSettings() { return false; }

DWORD ReadRegistryDword(HKEY root, const std::wstring& keyPath, const std::wstring& valueName, DWORD defaultValue) {
  HKEY key = nullptr;
  if (RegOpenKeyW(root, keyPath.c_str(), &key) != ERROR_SUCCESS) return defaultValue;
  DWORD value = defaultValue;
  DWORD size = sizeof value;
  if (RegQueryValueExW(key, valueName.c_str(), nullptr, nullptr, reinterpret_cast<BYTE*>(&value), &size) !=
      ERROR_SUCCESS)
    value = defaultValue;
  RegCloseKey(key);
  return value;
}

bool WriteRegistryDword(const std::wstring& keyPath, const std::wstring& valueName, DWORD value, HKEY root) {
  HKEY key = nullptr;
  if (RegCreateKeyW(root, keyPath.c_str(), &key) != ERROR_SUCCESS) return false;
  bool ok = RegSetValueExW(key, valueName.c_str(), 0, REG_DWORD, reinterpret_cast<const BYTE*>(&value),
                           sizeof value) == ERROR_SUCCESS;
  RegCloseKey(key);
  return ok;
}
