// An owned registry key, and the registry helpers the console's settings use on top of it.
// Every read leaves its out-parameter untouched on failure, so a caller presets its default.
// Typed reads accept only their type; the lenient ones say so in their names.
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

  // Typed reads. Each fails on a value of another type (ERROR_UNSUPPORTED_TYPE) or size
  // (ERROR_INVALID_DATA) as on a missing one, and leaves out untouched whenever it fails.
  // REG_DWORD of exactly 4 bytes.
  LONG ReadDword(const wchar_t* name, DWORD& out) const;
  // REG_SZ or REG_EXPAND_SZ (unexpanded; type tells which), up to its first zero character.
  LONG ReadString(const wchar_t* name, std::wstring& out, DWORD* type = nullptr) const;

  // Lenient reads, for the values the console's rules take whatever an administrator stored.
  // Any value of any type and size, taken as UTF-16 text up to its first zero character (or its
  // end). An existing empty value gives "".
  LONG ReadAnyValueAsText(const wchar_t* name, std::wstring& out) const;
  // At most 4 bytes of any type, copied over out's own bytes: a shorter value replaces only its
  // low bytes, and a longer one fails (ERROR_MORE_DATA).
  LONG ReadUpTo4BytesOverDword(const wchar_t* name, DWORD& out) const;
  // At most size bytes of any type into data; size becomes the number read (or needed).
  LONG ReadBytes(const wchar_t* name, void* data, DWORD& size) const;

  // The numbers of subkeys and values the key holds.
  LONG CountChildren(DWORD& subkeys, DWORD& values) const;
  LONG WriteDword(const wchar_t* name, DWORD value) const;
  LONG DeleteValue(const wchar_t* name) const;
  // Deletes the subkey path, which must have no subkeys of its own.
  LONG DeleteSubKey(const wchar_t* path) const;

 private:
  // Takes key when status says it was opened.
  LONG Adopt(LONG status, HKEY key, HKEY root);
  // The value's bytes as UTF-16 text up to the first zero character, and its type.
  LONG ReadText(const wchar_t* name, std::wstring& out, DWORD& type) const;

  HKEY key_ = nullptr;
  bool owned_ = false;
};

}  // namespace fw

// The settings helpers: each returns its default (or false) on any failure and uses no explicit
// view. ReadRegistryDword opens with default access and reads any value of at most 4 bytes over
// the default (ReadUpTo4BytesOverDword), so a missing key or value, or a longer value, gives the
// default.
DWORD ReadRegistryDword(HKEY root, const std::wstring& keyPath, const std::wstring& valueName, DWORD defaultValue);
// Creates or opens the key and sets a 4-byte REG_DWORD.
bool WriteRegistryDword(const std::wstring& keyPath, const std::wstring& valueName, DWORD value, HKEY root);
