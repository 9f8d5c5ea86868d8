// Late binding to the HTML Help control, so that programs start on systems without it.
#include "locale/LocaleInternals.h"

#include <htmlhelp.h>

#include "framework/RegistryKey.h"
#include "framework/ScopedHandle.h"
#include "framework/SystemLibrary.h"

namespace KVELLocale {

namespace {

using HtmlHelpProc = HWND(WINAPI*)(HWND, LPCWSTR, UINT, DWORD_PTR);

// Set once a control with the entry is loaded; the control then stays loaded for the rest of
// the process.
HtmlHelpProc g_htmlHelp = nullptr;

// The control where its class is registered, so that a relocated installation is honoured.
HMODULE LoadRegisteredControl() {
  fw::RegistryKey key;
  if (key.Open(HKEY_CLASSES_ROOT, L"CLSID\\{ADB880A6-D8FF-11CF-9377-00AA003B7A11}\\InprocServer32",
               KEY_QUERY_VALUE) != ERROR_SUCCESS)
    return nullptr;
  std::wstring path;
  DWORD type = REG_NONE;
  // A path longer than the system's limit could never load.
  if (key.ReadString(nullptr, path, &type) != ERROR_SUCCESS || path.size() >= MAX_PATH) return nullptr;
  if (type == REG_EXPAND_SZ) {
    wchar_t expanded[MAX_PATH];
    DWORD length = ExpandEnvironmentStringsW(path.c_str(), expanded, MAX_PATH);
    if (length == 0 || length > MAX_PATH) return nullptr;
    return LoadLibraryW(expanded);
  }
  return LoadLibraryW(path.c_str());
}

// The system's own copy, by name but only from the system folder: a file of that name beside
// the program or on the search path is never loaded.
HMODULE LoadSystemControl() { return fw::LoadSystemLibrary(L"hhctrl.ocx"); }

// The Unicode entry, by name or by its export ordinal.
HtmlHelpProc FindEntry(HMODULE control) {
  FARPROC entry = GetProcAddress(control, "HtmlHelpW");
  if (!entry) entry = GetProcAddress(control, MAKEINTRESOURCEA(15));
  return reinterpret_cast<HtmlHelpProc>(reinterpret_cast<void*>(entry));
}

// Keeps control when it has the entry; otherwise it is freed again.
bool Adopt(fw::ScopedLibrary control) {
  if (!control) return false;
  g_htmlHelp = FindEntry(control.Get());
  if (!g_htmlHelp) return false;
  control.Take();
  return true;
}

bool BindHtmlHelp() {
  if (g_htmlHelp) return true;
  // A registered control without the entry is no better than none: the system's copy is next.
  // It is only loaded when the registered one fails.
  return Adopt(fw::ScopedLibrary(LoadRegisteredControl())) || Adopt(fw::ScopedLibrary(LoadSystemControl()));
}

}  // namespace

HWND CallHtmlHelp(HWND window, const wchar_t* file, UINT command, DWORD_PTR data) {
  // No help window can be open while no control was ever loaded, so closing them all needs no
  // control (the console closes help windows at every shutdown).
  if (command == HH_CLOSE_ALL && !g_htmlHelp) return nullptr;
  if (!BindHtmlHelp()) return nullptr;
  return g_htmlHelp(window, file, command, data);
}

}  // namespace KVELLocale
