// An owned registry key, and the registry helpers the console's settings use on top of it.
// Every read leaves its out-parameter untouched on failure, so a caller presets its default.
#pragma once

#include <windows.h>

#include <string>

namespace fw {

class RegistryKey {
 public:
  RegistryKey() = default;
  ~RegistryKey() { Close(); }
  RegistryKey(RegistryKey&& other) noexcept;
  RegistryKey& operator=(RegistryKey&& other) noexcept;
  RegistryKey(const RegistryKey&) = delete;
  RegistryKey& operator=(const RegistryKey&) = delete;

  // RegOpenKeyW: default access in the process's default view. An empty path opens root itself,
  // which the key then uses without owning.
  LONG Open(HKEY root, const wchar_t* path);
  // RegOpenKeyExW with access, which may name a view (KEY_WOW64_64KEY).
  LONG Open(HKEY root, const wchar_t* path, REGSAM access);
  // RegCreateKeyW: creates the key and its missing parents, or opens it, with full access.
  LONG Create(HKEY root, const wchar_t* path);
  // RegCreateKeyExW with access.
  LONG Create(HKEY root, const wchar_t* path, REGSAM access);
  void Close();

  bool IsValid() const { return key_ != nullptr; }
  HKEY Get() const { return key_; }

  // Any value of any type and size, taken as UTF-16 text up to its first zero character (or its
  // end). An existing empty value gives "".
  LONG ReadString(const wchar_t* name, std::wstring& out) const;
  // At most 4 bytes of any type, copied over out's own bytes: a shorter value replaces only its
  // low bytes, and a longer one fails (ERROR_MORE_DATA).
  LONG ReadDword(const wchar_t* name, DWORD& out) const;
  // At most size bytes into data; size becomes the number read (or needed).
  LONG ReadBytes(const wchar_t* name, void* data, DWORD& size) const;
  LONG WriteDword(const wchar_t* name, DWORD value) const;
  LONG DeleteValue(const wchar_t* name) const;

 private:
  // Takes key when status says it was opened.
  LONG Adopt(LONG status, HKEY key, HKEY root);

  HKEY key_ = nullptr;
  bool owned_ = false;
};

}  // namespace fw

// The settings helpers: each returns its default (or false) on any failure and uses no explicit
// view. ReadRegistryDword opens with default access and reads 4 bytes over the default, so a
// missing key or value, or a value longer than 4 bytes, gives the default.
DWORD ReadRegistryDword(HKEY root, const std::wstring& keyPath, const std::wstring& valueName, DWORD defaultValue);
// Creates or opens the key and sets a 4-byte REG_DWORD.
bool WriteRegistryDword(const std::wstring& keyPath, const std::wstring& valueName, DWORD value, HKEY root);
