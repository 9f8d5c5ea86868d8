// Late binding to the HTML Help control, so that programs start on systems without it.
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

bool BindHtmlHelp() {
  if (g_htmlHelp) return true;
  HMODULE control = LoadRegisteredControl();
  if (!control) control = LoadLibraryW(L"hhctrl.ocx");
  if (!control) return false;
  auto entry =
      reinterpret_cast<HtmlHelpProc>(reinterpret_cast<void*>(GetProcAddress(control, "HtmlHelpW")));
  if (!entry) {
    FreeLibrary(control);
    return false;
  }
  g_helpControl = control;
  g_htmlHelp = entry;
  return true;
}

}  // namespace

HWND CallHtmlHelp(HWND window, const wchar_t* file, UINT command, DWORD_PTR data) {
  if (!BindHtmlHelp()) return nullptr;
  return g_htmlHelp(window, file, command, data);
}

}  // namespace KVELLocale
