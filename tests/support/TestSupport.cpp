#include "tests/support/TestSupport.h"

#include <shellapi.h>
#include <shlobj.h>
#include <shlwapi.h>

namespace testing_support {

namespace {

// RegDeleteTree has no view flag: the key is opened in its view and cleared from there.
void DeleteKeyTree(HKEY root, const std::wstring& path, REGSAM view) {
  HKEY key = nullptr;
  if (RegOpenKeyExW(root, path.c_str(), 0, KEY_ALL_ACCESS | view, &key) == ERROR_SUCCESS) {
    RegDeleteTreeW(key, nullptr);
    RegCloseKey(key);
  }
  RegDeleteKeyExW(root, path.c_str(), view, 0);
}

void SetValue(HKEY root, const std::wstring& path, REGSAM view, const wchar_t* name, DWORD type, const void* data,
              DWORD size) {
  HKEY key = nullptr;
  if (RegCreateKeyExW(root, path.c_str(), 0, nullptr, 0, KEY_ALL_ACCESS | view, nullptr, &key, nullptr) !=
      ERROR_SUCCESS)
    return;
  RegSetValueExW(key, name, 0, type, static_cast<const BYTE*>(data), size);
  RegCloseKey(key);
}

void RemoveTree(const std::wstring& path) {
  // The shell's delete takes a list ended by an empty entry.
  std::wstring from = path + L'\0';
  SHFILEOPSTRUCTW operation = {};
  operation.wFunc = FO_DELETE;
  operation.pFrom = from.c_str();
  operation.fFlags = FOF_NO_UI;
  SHFileOperationW(&operation);
}

void CreateDirectories(const std::wstring& path) { SHCreateDirectoryExW(nullptr, path.c_str(), nullptr); }

}  // namespace

ScopedRegistryKey::ScopedRegistryKey(HKEY root, std::wstring path, REGSAM view)
    : root_(root), path_(std::move(path)), view_(view) {
  DeleteKeyTree(root_, path_, view_);
}

ScopedRegistryKey::~ScopedRegistryKey() { DeleteKeyTree(root_, path_, view_); }

void ScopedRegistryKey::SetString(const wchar_t* name, const std::wstring& value, DWORD type) {
  SetValue(root_, path_, view_, name, type, value.c_str(),
           static_cast<DWORD>((value.size() + 1) * sizeof(wchar_t)));
}

void ScopedRegistryKey::SetDword(const wchar_t* name, DWORD value) {
  SetValue(root_, path_, view_, name, REG_DWORD, &value, sizeof value);
}

void ScopedRegistryKey::SetBinary(const wchar_t* name, const void* data, DWORD size, DWORD type) {
  SetValue(root_, path_, view_, name, type, data, size);
}

void ScopedRegistryKey::DeleteValue(const wchar_t* name) {
  HKEY key = nullptr;
  if (RegOpenKeyExW(root_, path_.c_str(), 0, KEY_SET_VALUE | view_, &key) != ERROR_SUCCESS) return;
  RegDeleteValueW(key, name);
  RegCloseKey(key);
}

void SetRegistryString(HKEY root, const std::wstring& path, const wchar_t* name, const std::wstring& value) {
  SetValue(root, path, 0, name, REG_SZ, value.c_str(), static_cast<DWORD>((value.size() + 1) * sizeof(wchar_t)));
}

void SetRegistryDword(HKEY root, const std::wstring& path, const wchar_t* name, DWORD value) {
  SetValue(root, path, 0, name, REG_DWORD, &value, sizeof value);
}

void SetRegistryBytes(HKEY root, const std::wstring& path, const wchar_t* name, DWORD type, const void* data,
                      DWORD size) {
  SetValue(root, path, 0, name, type, data, size);
}

bool ReadDword(HKEY root, const std::wstring& path, const wchar_t* name, DWORD& value) {
  DWORD type = 0, size = sizeof value;
  return RegGetValueW(root, path.c_str(), name, RRF_RT_ANY, &type, &value, &size) == ERROR_SUCCESS &&
         type == REG_DWORD && size == sizeof value;
}

bool CopyFileTo(const std::wstring& from, const std::wstring& to) {
  std::wstring folder = to;
  PathRemoveFileSpecW(&folder[0]);
  folder.resize(wcslen(folder.c_str()));
  CreateDirectories(folder);
  return CopyFileW(from.c_str(), to.c_str(), FALSE) != FALSE;
}

ScopedDirectory::ScopedDirectory(std::wstring path) : path_(std::move(path)) { RemoveTree(path_); }

ScopedDirectory::~ScopedDirectory() { RemoveTree(path_); }

std::wstring ScopedDirectory::MakeDir(const std::wstring& relative) const {
  std::wstring full = path_ + L"\\" + relative;
  CreateDirectories(full);
  return full;
}

std::wstring ScopedDirectory::MakeFile(const std::wstring& relative, const std::string& content) const {
  std::wstring full = path_ + L"\\" + relative;
  std::wstring folder = full.substr(0, full.find_last_of(L'\\'));
  CreateDirectories(folder);
  HANDLE file = CreateFileW(full.c_str(), GENERIC_WRITE, 0, nullptr, CREATE_ALWAYS, 0, nullptr);
  if (file != INVALID_HANDLE_VALUE) {
    DWORD written = 0;
    WriteFile(file, content.data(), static_cast<DWORD>(content.size()), &written, nullptr);
    CloseHandle(file);
  }
  return full;
}

std::wstring MaporaCommonFolder() {
  wchar_t path[MAX_PATH] = L"";
  SHGetSpecialFolderPathW(nullptr, path, CSIDL_PROGRAM_FILES_COMMON, FALSE);
  return std::wstring(path) + L"\\Mapora";
}

std::wstring ModuleFolder() {
  wchar_t path[MAX_PATH] = L"";
  GetModuleFileNameW(nullptr, path, MAX_PATH);
  PathRemoveFileSpecW(path);
  return path;
}

ScopedHiveOverride::ScopedHiveOverride()
    : scratch_(L"Software\\MaporaTestHives\\" + std::to_wstring(GetCurrentProcessId())) {
  SHDeleteKeyW(HKEY_CURRENT_USER, scratch_.c_str());
  RegCreateKeyExW(HKEY_CURRENT_USER, (scratch_ + L"\\HKCU").c_str(), 0, nullptr, 0, KEY_ALL_ACCESS, nullptr, &user_,
                  nullptr);
  RegCreateKeyExW(HKEY_CURRENT_USER, (scratch_ + L"\\HKLM").c_str(), 0, nullptr, 0, KEY_ALL_ACCESS, nullptr,
                  &machine_, nullptr);
  RegOverridePredefKey(HKEY_LOCAL_MACHINE, machine_);
  RegOverridePredefKey(HKEY_CURRENT_USER, user_);
}

ScopedHiveOverride::~ScopedHiveOverride() {
  RegOverridePredefKey(HKEY_CURRENT_USER, nullptr);
  RegOverridePredefKey(HKEY_LOCAL_MACHINE, nullptr);
  RegCloseKey(user_);
  RegCloseKey(machine_);
  SHDeleteKeyW(HKEY_CURRENT_USER, scratch_.c_str());
}

}  // namespace testing_support
