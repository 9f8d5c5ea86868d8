#include "tests/support/TestSupport.h"

#include <gtest/gtest.h>
#include <shellapi.h>
#include <shlobj.h>
#include <shlwapi.h>

#include <cstdlib>
#include <regex>

#include "framework/Strings.h"

namespace testing_support {

namespace {

constexpr wchar_t kScratchHives[] = L"Software\\MaporaTestHives";

// RegDeleteTree has no view flag: the key is opened in its view and cleared from there.
void DeleteKeyTree(HKEY root, const std::wstring& path, REGSAM view) {
  HKEY key = nullptr;
  if (RegOpenKeyExW(root, path.c_str(), 0, KEY_ALL_ACCESS | view, &key) == ERROR_SUCCESS) {
    RegDeleteTreeW(key, nullptr);
    RegCloseKey(key);
  }
  RegDeleteKeyExW(root, path.c_str(), view, 0);
}

std::string Narrow(const std::wstring& text) {
  std::string narrow;
  for (wchar_t c : text) narrow += c < 0x80 ? static_cast<char>(c) : '?';
  return narrow;
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

void CreateDirectories(const std::wstring& path) {
  const int status = SHCreateDirectoryExW(nullptr, path.c_str(), nullptr);
  if (status != ERROR_ALREADY_EXISTS && status != ERROR_FILE_EXISTS)
    CheckStatus(status, "creating folder " + Narrow(path));
}

// Scratch hives of test programs that are no longer running.
void SweepDeadScratchHives() {
  HKEY hives = nullptr;
  if (RegOpenKeyExW(HKEY_CURRENT_USER, kScratchHives, 0, KEY_READ, &hives) != ERROR_SUCCESS) return;
  std::vector<std::wstring> dead;
  wchar_t name[32];
  for (DWORD index = 0;; ++index) {
    DWORD length = 32;
    if (RegEnumKeyExW(hives, index, name, &length, nullptr, nullptr, nullptr, nullptr) != ERROR_SUCCESS) break;
    const DWORD processId = std::wcstoul(name, nullptr, 10);
    HANDLE process = OpenProcess(SYNCHRONIZE, FALSE, processId);
    const bool running = process != nullptr && WaitForSingleObject(process, 0) == WAIT_TIMEOUT;
    if (process != nullptr) CloseHandle(process);
    if (!running && processId != GetCurrentProcessId()) dead.push_back(name);
  }
  RegCloseKey(hives);
  for (const std::wstring& key : dead)
    SHDeleteKeyW(HKEY_CURRENT_USER, (std::wstring(kScratchHives) + L"\\" + key).c_str());
}

}  // namespace

std::string Win32ErrorText(DWORD error) {
  return std::to_string(error) + " (" + Narrow(fw::SystemErrorText(error)) + ")";
}

bool CheckStatus(LONG status, const std::string& what) {
  if (status == ERROR_SUCCESS) return true;
  ADD_FAILURE() << what << " failed: error " << Win32ErrorText(static_cast<DWORD>(status));
  return false;
}

bool CheckCall(BOOL succeeded, const std::string& what) {
  if (succeeded) return true;
  const DWORD error = GetLastError();
  ADD_FAILURE() << what << " failed: error " << Win32ErrorText(error);
  return false;
}

ScopedRegistryKey::ScopedRegistryKey(HKEY root, std::wstring path, REGSAM view)
    : root_(root), path_(std::move(path)), view_(view) {
  DeleteKeyTree(root_, path_, view_);
}

ScopedRegistryKey::~ScopedRegistryKey() { DeleteKeyTree(root_, path_, view_); }

void SetRegistryBytes(HKEY root, const std::wstring& path, const wchar_t* name, DWORD type, const void* data,
                      DWORD size, REGSAM view) {
  HKEY key = nullptr;
  const std::string what = Narrow(path) + " " + Narrow(name ? name : L"(default)");
  if (!CheckStatus(RegCreateKeyExW(root, path.c_str(), 0, nullptr, 0, KEY_ALL_ACCESS | view, nullptr, &key, nullptr),
                   "creating " + what))
    return;
  CheckStatus(RegSetValueExW(key, name, 0, type, static_cast<const BYTE*>(data), size), "setting " + what);
  RegCloseKey(key);
}

void SetRegistryString(HKEY root, const std::wstring& path, const wchar_t* name, const std::wstring& value, DWORD type,
                       REGSAM view) {
  SetRegistryBytes(root, path, name, type, value.c_str(), static_cast<DWORD>((value.size() + 1) * sizeof(wchar_t)),
                   view);
}

void SetRegistryDword(HKEY root, const std::wstring& path, const wchar_t* name, DWORD value, REGSAM view) {
  SetRegistryBytes(root, path, name, REG_DWORD, &value, sizeof value, view);
}

DWORD StoredDword(HKEY root, const std::wstring& path, const wchar_t* name) {
  DWORD type = 0, value = 0, size = sizeof value;
  const bool stored = RegGetValueW(root, path.c_str(), name, RRF_RT_ANY, &type, &value, &size) == ERROR_SUCCESS &&
                      type == REG_DWORD && size == sizeof value;
  return stored ? value : kAbsent;
}

bool CopyFileTo(const std::wstring& from, const std::wstring& to) {
  std::wstring folder = to;
  PathRemoveFileSpecW(&folder[0]);
  folder.resize(wcslen(folder.c_str()));
  CreateDirectories(folder);
  return CheckCall(CopyFileW(from.c_str(), to.c_str(), FALSE), "copying " + Narrow(from) + " to " + Narrow(to));
}

std::vector<std::wstring> FormatArguments(const std::wstring& text) {
  static const std::wregex conversion(
      L"%(%|[-+ #0]*[0-9*]*(\\.[0-9*]+)?([hlLwzjtI36]*[diouxXcCsSeEfgGaAp])|[1-9][0-9]?|)");
  std::vector<std::wstring> arguments;
  for (std::wsregex_iterator match(text.begin(), text.end(), conversion), end; match != end; ++match)
    if (match->str() != L"%%") arguments.push_back(L"%" + (match->length(3) ? match->str(3) : match->str(1)));
  return arguments;
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
  if (!CheckCall(file != INVALID_HANDLE_VALUE, "creating " + Narrow(full))) return full;
  DWORD written = 0;
  CheckCall(WriteFile(file, content.data(), static_cast<DWORD>(content.size()), &written, nullptr),
            "writing " + Narrow(full));
  CloseHandle(file);
  return full;
}

std::wstring MaporaCommonFolder() {
  wchar_t path[MAX_PATH] = L"";
  SHGetSpecialFolderPathW(nullptr, path, CSIDL_PROGRAM_FILES_COMMON, FALSE);
  return std::wstring(path) + L"\\Mapora";
}

std::wstring EnvironmentVariable(const wchar_t* name) {
  wchar_t value[MAX_PATH] = L"";
  GetEnvironmentVariableW(name, value, MAX_PATH);
  return value;
}

std::wstring ModuleFolder() {
  wchar_t path[MAX_PATH] = L"";
  GetModuleFileNameW(nullptr, path, MAX_PATH);
  PathRemoveFileSpecW(path);
  return path;
}

ScopedHiveOverride::ScopedHiveOverride()
    : scratch_(std::wstring(kScratchHives) + L"\\" + std::to_wstring(GetCurrentProcessId())) {
  SweepDeadScratchHives();
  SHDeleteKeyW(HKEY_CURRENT_USER, scratch_.c_str());
  const struct {
    HKEY root;
    const wchar_t* name;
    HKEY* scratch;
  } hives[] = {{HKEY_CURRENT_USER, L"HKCU", &user_},
               {HKEY_LOCAL_MACHINE, L"HKLM", &machine_},
               {HKEY_CLASSES_ROOT, L"HKCR", &classes_}};
  // Every scratch key is made before the first override: HKEY_CURRENT_USER is one of them.
  for (const auto& hive : hives)
    CheckStatus(RegCreateKeyExW(HKEY_CURRENT_USER, (scratch_ + L"\\" + hive.name).c_str(), 0, nullptr, 0,
                                KEY_ALL_ACCESS, nullptr, hive.scratch, nullptr),
                "creating the scratch " + Narrow(hive.name));
  for (const auto& hive : hives)
    CheckStatus(RegOverridePredefKey(hive.root, *hive.scratch), "overriding " + Narrow(hive.name));
}

ScopedHiveOverride::~ScopedHiveOverride() {
  for (HKEY root : {HKEY_CLASSES_ROOT, HKEY_CURRENT_USER, HKEY_LOCAL_MACHINE}) RegOverridePredefKey(root, nullptr);
  for (HKEY scratch : {user_, machine_, classes_})
    if (scratch != nullptr) RegCloseKey(scratch);
  SHDeleteKeyW(HKEY_CURRENT_USER, scratch_.c_str());
}

}  // namespace testing_support
