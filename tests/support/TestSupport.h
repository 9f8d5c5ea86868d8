// Fixtures for tests that run in the shared Wine test prefix. Tests take turns in that prefix,
// so whatever a test creates in the registry or on disk it removes again through these.
#pragma once

#include <windows.h>

#include <string>
#include <vector>

namespace testing_support {

// "5 (Access is denied.)": a Win32 error code with the system's text, for failure messages.
std::string Win32ErrorText(DWORD error);
// Setup calls that tests depend on: a failure fails the running test with what and the error (a
// registry status, or GetLastError for the BOOL form) and returns false.
bool CheckStatus(LONG status, const std::string& what);
bool CheckCall(BOOL succeeded, const std::string& what);

// Deletes a registry key tree when created and again when destroyed; creates nothing itself.
class ScopedRegistryKey {
 public:
  ScopedRegistryKey(HKEY root, std::wstring path, REGSAM view = 0);
  ~ScopedRegistryKey();
  ScopedRegistryKey(const ScopedRegistryKey&) = delete;
  ScopedRegistryKey& operator=(const ScopedRegistryKey&) = delete;

  void SetString(const wchar_t* name, const std::wstring& value, DWORD type = REG_SZ);
  void SetDword(const wchar_t* name, DWORD value);

 private:
  HKEY root_;
  std::wstring path_;
  REGSAM view_;
};

// For the life of the object, HKEY_CURRENT_USER, HKEY_LOCAL_MACHINE and HKEY_CLASSES_ROOT of this
// process are fresh empty keys under a scratch key of the real HKEY_CURRENT_USER (removed again at
// the end), so in-process registry tests neither see nor change the real hives and may run in
// parallel. Child processes still see the real hives. A scratch key left by a test program that
// died is swept away by the next one; an override that cannot be installed fails the test.
class ScopedHiveOverride {
 public:
  ScopedHiveOverride();
  ~ScopedHiveOverride();
  ScopedHiveOverride(const ScopedHiveOverride&) = delete;
  ScopedHiveOverride& operator=(const ScopedHiveOverride&) = delete;

 private:
  std::wstring scratch_;
  HKEY user_ = nullptr;
  HKEY machine_ = nullptr;
  HKEY classes_ = nullptr;
};

// Write a value, creating its key and the key's parents (in the registry view given). Meant for
// tests under ScopedHiveOverride, where nothing written needs removing afterwards.
void SetRegistryBytes(HKEY root, const std::wstring& path, const wchar_t* name, DWORD type, const void* data,
                      DWORD size, REGSAM view = 0);
void SetRegistryString(HKEY root, const std::wstring& path, const wchar_t* name, const std::wstring& value,
                       DWORD type = REG_SZ, REGSAM view = 0);
void SetRegistryDword(HKEY root, const std::wstring& path, const wchar_t* name, DWORD value, REGSAM view = 0);

inline void ScopedRegistryKey::SetString(const wchar_t* name, const std::wstring& value, DWORD type) {
  SetRegistryString(root_, path_, name, value, type, view_);
}
inline void ScopedRegistryKey::SetDword(const wchar_t* name, DWORD value) {
  SetRegistryDword(root_, path_, name, value, view_);
}

// A stored DWORD value; kAbsent when the key or value is missing or not a DWORD (no failure).
constexpr DWORD kAbsent = 0xFFFFFFFF;
DWORD StoredDword(HKEY root, const std::wstring& path, const wchar_t* name);

// What a format text consumes, in order: printf conversions ("%-5ls" gives "%ls"), message inserts
// ("%1" to "%99") and any stray "%"; "%%" is none.
std::vector<std::wstring> FormatArguments(const std::wstring& text);

// A folder tree removed (recursively) when created and again when destroyed.
class ScopedDirectory {
 public:
  explicit ScopedDirectory(std::wstring path);
  ~ScopedDirectory();
  ScopedDirectory(const ScopedDirectory&) = delete;
  ScopedDirectory& operator=(const ScopedDirectory&) = delete;

  const std::wstring& Path() const { return path_; }
  // Creates path\relative (and its parents) as a folder; a failure fails the test.
  std::wstring MakeDir(const std::wstring& relative) const;
  // Writes a small file path\relative, creating its folders; a failure fails the test.
  std::wstring MakeFile(const std::wstring& relative, const std::string& content = "x") const;

 private:
  std::wstring path_;
};

// Copies a file, creating the target's folders; a failure fails the test.
bool CopyFileTo(const std::wstring& from, const std::wstring& to);

// <Common Files>\Mapora as the program sees it.
std::wstring MaporaCommonFolder();
// Folder of the running test program.
std::wstring ModuleFolder();
// An environment variable of this process; "" when unset.
std::wstring EnvironmentVariable(const wchar_t* name);

}  // namespace testing_support
