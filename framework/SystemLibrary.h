// Libraries of the Windows system folder, loaded by name without ever being taken from the
// program's folder or the current directory, where anyone could have put a file of that name.
//
//   fw::SystemLibrary version(L"version.dll");
//   auto size = version.Find<DWORD(WINAPI*)(LPCWSTR, LPDWORD)>("GetFileVersionInfoSizeW");
//   if (size) ...
#pragma once

#include <windows.h>

#include <string>

#include "framework/ScopedHandle.h"

namespace fw {

// Restricts the search of every later load by name, the system's own loads on the program's
// behalf included, to the system folder. Windows 7 knows that restriction only with its loader
// update; without it, at least the current directory leaves the search.
inline void RestrictLibrarySearch() {
  using SetDefaultDllDirectoriesProc = BOOL(WINAPI*)(DWORD);
  // kernel32 is mapped from the system's known libraries, never from a file nearby.
  auto setDefault = reinterpret_cast<SetDefaultDllDirectoriesProc>(
      reinterpret_cast<void*>(GetProcAddress(GetModuleHandleW(L"kernel32.dll"), "SetDefaultDllDirectories")));
  if (setDefault != nullptr) setDefault(LOAD_LIBRARY_SEARCH_SYSTEM32);
  SetDllDirectoryW(L"");
}

// The library of that name in the system folder, or null. The caller frees it.
inline HMODULE LoadSystemLibrary(const wchar_t* name) {
  HMODULE module = LoadLibraryExW(name, nullptr, LOAD_LIBRARY_SEARCH_SYSTEM32);
  // A loader without the search flags refuses them as invalid: the full path does the same there,
  // with the library's own dependencies looked for in the system folder first.
  if (module != nullptr || GetLastError() != ERROR_INVALID_PARAMETER) return module;
  wchar_t folder[MAX_PATH] = L"";
  UINT length = GetSystemDirectoryW(folder, MAX_PATH);
  if (length == 0 || length >= MAX_PATH) return nullptr;
  const std::wstring path = std::wstring(folder, length) + L"\\" + name;
  return LoadLibraryExW(path.c_str(), nullptr, LOAD_WITH_ALTERED_SEARCH_PATH);
}

// Owns a system library for as long as its functions are used.
class SystemLibrary {
 public:
  explicit SystemLibrary(const wchar_t* name) : m_module(LoadSystemLibrary(name)) {}

  bool Loaded() const { return m_module.IsValid(); }
  // The exported function of that name as the given pointer type; null when the library or the
  // function is missing.
  template <class Proc>
  Proc Find(const char* name) const {
    if (!m_module) return nullptr;
    return reinterpret_cast<Proc>(reinterpret_cast<void*>(GetProcAddress(m_module.Get(), name)));
  }

 private:
  ScopedLibrary m_module;
};

}  // namespace fw
