// Late binding to the HTML Help control, so that programs start on systems without it.
#include "framework/SystemLibrary.h"
#include "locale/LocaleInternals.h"

namespace KVELLocale {

namespace {

using HtmlHelpProc = HWND(WINAPI*)(HWND, LPCWSTR, UINT, DWORD_PTR);

// Kept for the life of the process once found.
HMODULE g_helpControl = nullptr;
HtmlHelpProc g_htmlHelp = nullptr;

// The control where its class is registered, so that a relocated installation is honoured.
HMODULE LoadRegisteredControl() {
  HKEY key = nullptr;
  if (RegOpenKeyExW(HKEY_CLASSES_ROOT,
                    L"CLSID\\{ADB880A6-D8FF-11CF-9377-00AA003B7A11}\\InprocServer32", 0,
                    KEY_QUERY_VALUE, &key) != ERROR_SUCCESS)
    return nullptr;
  wchar_t path[MAX_PATH + 1] = {};
  DWORD type = 0;
  DWORD size = MAX_PATH * sizeof(wchar_t);  // leaves room for a terminator the data may lack
  LONG rc = RegQueryValueExW(key, nullptr, nullptr, &type, reinterpret_cast<BYTE*>(path), &size);
  RegCloseKey(key);
  if (rc != ERROR_SUCCESS || (type != REG_SZ && type != REG_EXPAND_SZ)) return nullptr;
  if (type == REG_EXPAND_SZ) {
    wchar_t expanded[MAX_PATH];
    DWORD length = ExpandEnvironmentStringsW(path, expanded, MAX_PATH);
    if (length == 0 || length > MAX_PATH) return nullptr;
    return LoadLibraryW(expanded);
  }
  return LoadLibraryW(path);
}

// The Unicode entry, by name or by its export ordinal.
HtmlHelpProc FindEntry(HMODULE control) {
  FARPROC entry = GetProcAddress(control, "HtmlHelpW");
  if (!entry) entry = GetProcAddress(control, MAKEINTRESOURCEA(15));
  return reinterpret_cast<HtmlHelpProc>(reinterpret_cast<void*>(entry));
}

bool BindHtmlHelp() {
  if (g_htmlHelp) return true;
  // A registered control without the entry is no better than none: the control by name is next,
  // from the system folder only.
  for (HMODULE control : {LoadRegisteredControl(), fw::LoadSystemLibrary(L"hhctrl.ocx")}) {
    if (!control) continue;
    if (HtmlHelpProc entry = FindEntry(control)) {
      g_helpControl = control;
      g_htmlHelp = entry;
      return true;
    }
    FreeLibrary(control);
  }
  return false;
}

}  // namespace

HWND CallHtmlHelp(HWND window, const wchar_t* file, UINT command, DWORD_PTR data) {
  if (!BindHtmlHelp()) return nullptr;
  return g_htmlHelp(window, file, command, data);
}

}  // namespace KVELLocale
