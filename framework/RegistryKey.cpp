#include "framework/RegistryKey.h"

#include <cwchar>
#include <utility>
#include <vector>

namespace fw {

RegistryKey::RegistryKey(RegistryKey&& other) noexcept
    : key_(std::exchange(other.key_, nullptr)), owned_(std::exchange(other.owned_, false)) {}

RegistryKey& RegistryKey::operator=(RegistryKey&& other) noexcept {
  if (this != &other) {
    Close();
    key_ = std::exchange(other.key_, nullptr);
    owned_ = std::exchange(other.owned_, false);
  }
  return *this;
}

void RegistryKey::Close() {
  if (key_ != nullptr && owned_) ::RegCloseKey(key_);
  key_ = nullptr;
  owned_ = false;
}

LONG RegistryKey::Adopt(LONG status, HKEY key, HKEY root) {
  if (status != ERROR_SUCCESS) return status;
  key_ = key;
  // An empty path hands back root itself, which belongs to whoever opened root.
  owned_ = key != root;
  return status;
}

LONG RegistryKey::Open(HKEY root, const wchar_t* path) {
  Close();
  HKEY key = nullptr;
  const LONG status = ::RegOpenKeyW(root, path, &key);
  return Adopt(status, key, root);
}

LONG RegistryKey::Open(HKEY root, const wchar_t* path, REGSAM access) {
  Close();
  HKEY key = nullptr;
  const LONG status = ::RegOpenKeyExW(root, path, 0, access, &key);
  return Adopt(status, key, root);
}

LONG RegistryKey::Create(HKEY root, const wchar_t* path) {
  Close();
  HKEY key = nullptr;
  const LONG status = ::RegCreateKeyW(root, path, &key);
  return Adopt(status, key, root);
}

LONG RegistryKey::Create(HKEY root, const wchar_t* path, REGSAM access) {
  Close();
  HKEY key = nullptr;
  const LONG status = ::RegCreateKeyExW(root, path, 0, nullptr, 0, access, nullptr, &key, nullptr);
  return Adopt(status, key, root);
}

LONG RegistryKey::ReadText(const wchar_t* name, std::wstring& out, DWORD& type) const {
  if (key_ == nullptr) return ERROR_INVALID_HANDLE;
  DWORD size = 0;
  LONG status = ::RegQueryValueExW(key_, name, nullptr, nullptr, nullptr, &size);
  std::vector<wchar_t> buffer;
  // A value that keeps growing under the reader is given up on after a few tries.
  for (int attempt = 0; attempt < 4 && (status == ERROR_SUCCESS || status == ERROR_MORE_DATA); ++attempt) {
    // Whole zero characters after the data (also after an odd last byte) end the text even when
    // the value carries no terminator of its own.
    buffer.assign(size / sizeof(wchar_t) + 2, L'\0');
    DWORD read = size;
    status = ::RegQueryValueExW(key_, name, nullptr, &type, reinterpret_cast<BYTE*>(buffer.data()), &read);
    if (status == ERROR_SUCCESS) {
      out.assign(buffer.data(), wcsnlen(buffer.data(), buffer.size()));
      return status;
    }
    // The value grew between the two queries: the second one reported the new size.
    size = read;
  }
  return status == ERROR_SUCCESS ? ERROR_MORE_DATA : status;
}

LONG RegistryKey::ReadString(const wchar_t* name, std::wstring& out, DWORD* type) const {
  std::wstring text;
  DWORD found = REG_NONE;
  const LONG status = ReadText(name, text, found);
  if (status != ERROR_SUCCESS) return status;
  if (found != REG_SZ && found != REG_EXPAND_SZ) return ERROR_UNSUPPORTED_TYPE;
  out = std::move(text);
  if (type != nullptr) *type = found;
  return status;
}

LONG RegistryKey::ReadAnyValueAsText(const wchar_t* name, std::wstring& out) const {
  DWORD type = REG_NONE;
  return ReadText(name, out, type);
}

LONG RegistryKey::ReadDword(const wchar_t* name, DWORD& out) const {
  if (key_ == nullptr) return ERROR_INVALID_HANDLE;
  DWORD type = REG_NONE;
  DWORD size = 0;
  LONG status = ::RegQueryValueExW(key_, name, nullptr, &type, nullptr, &size);
  if (status != ERROR_SUCCESS) return status;
  if (type != REG_DWORD) return ERROR_UNSUPPORTED_TYPE;
  if (size != sizeof(DWORD)) return ERROR_INVALID_DATA;
  DWORD value = 0;
  status = ::RegQueryValueExW(key_, name, nullptr, &type, reinterpret_cast<BYTE*>(&value), &size);
  if (status != ERROR_SUCCESS) return status;
  // Changed between the two queries.
  if (type != REG_DWORD || size != sizeof(DWORD)) return ERROR_INVALID_DATA;
  out = value;
  return status;
}

LONG RegistryKey::ReadUpTo4BytesOverDword(const wchar_t* name, DWORD& out) const {
  DWORD value = out;
  DWORD size = sizeof value;
  LONG status = ReadBytes(name, &value, size);
  if (status == ERROR_SUCCESS) out = value;
  return status;
}

LONG RegistryKey::ReadBytes(const wchar_t* name, void* data, DWORD& size) const {
  if (key_ == nullptr) return ERROR_INVALID_HANDLE;
  return ::RegQueryValueExW(key_, name, nullptr, nullptr, static_cast<BYTE*>(data), &size);
}

LONG RegistryKey::CountChildren(DWORD& subkeys, DWORD& values) const {
  if (key_ == nullptr) return ERROR_INVALID_HANDLE;
  return ::RegQueryInfoKeyW(key_, nullptr, nullptr, nullptr, &subkeys, nullptr, nullptr, &values, nullptr, nullptr,
                            nullptr, nullptr);
}

LONG RegistryKey::DeleteSubKey(const wchar_t* path) const {
  if (key_ == nullptr) return ERROR_INVALID_HANDLE;
  return ::RegDeleteKeyW(key_, path);
}

LONG RegistryKey::WriteDword(const wchar_t* name, DWORD value) const {
  if (key_ == nullptr) return ERROR_INVALID_HANDLE;
  return ::RegSetValueExW(key_, name, 0, REG_DWORD, reinterpret_cast<const BYTE*>(&value), sizeof value);
}

LONG RegistryKey::DeleteValue(const wchar_t* name) const {
  if (key_ == nullptr) return ERROR_INVALID_HANDLE;
  return ::RegDeleteValueW(key_, name);
}

}  // namespace fw

DWORD ReadRegistryDword(HKEY root, const std::wstring& keyPath, const std::wstring& valueName, DWORD defaultValue) {
  fw::RegistryKey key;
  DWORD value = defaultValue;
  if (key.Open(root, keyPath.c_str()) == ERROR_SUCCESS) key.ReadUpTo4BytesOverDword(valueName.c_str(), value);
  return value;
}

bool WriteRegistryDword(const std::wstring& keyPath, const std::wstring& valueName, DWORD value, HKEY root) {
  fw::RegistryKey key;
  return key.Create(root, keyPath.c_str()) == ERROR_SUCCESS && key.WriteDword(valueName.c_str(), value) == ERROR_SUCCESS;
}
