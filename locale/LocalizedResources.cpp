// Finding and loading a module's localized resource library in the UI language's pack folder.
#include "locale/LanguagePacks.h"

#include <shlwapi.h>
#include <strsafe.h>

namespace KVELLocale {

namespace {

// The library in folder when it exists there; null otherwise or when it does not load.
HINSTANCE LoadFromFolder(const wchar_t* folder, const wchar_t* fileName) {
  if (folder[0] == L'\0') return nullptr;
  wchar_t path[kLocalePathChars];
  if (!PathCombineW(path, folder, fileName) || !PathFileExistsW(path)) return nullptr;
  return LoadLibraryW(path);
}

}  // namespace

KVEL_LOCALE_API HINSTANCE LoadLocalizedRes(HINSTANCE module) {
  if (!module) return nullptr;
  wchar_t path[kLocalePathChars];
  DWORD length = GetModuleFileNameW(module, path, kLocalePathChars);
  if (length == 0 || length >= static_cast<DWORD>(kLocalePathChars)) return nullptr;
  // A short (8.3) path would give a short resource library name.
  wchar_t longPath[kLocalePathChars];
  length = GetLongPathNameW(path, longPath, kLocalePathChars);
  if (length > 0 && length < static_cast<DWORD>(kLocalePathChars)) StringCchCopyW(path, kLocalePathChars, longPath);
  const std::wstring resourceName = ResourceLibraryName(path);
  if (resourceName.empty()) return nullptr;
  return LoadLocalizedResFromFile(resourceName.c_str());
}

KVEL_LOCALE_API HINSTANCE LoadLocalizedResFromFile(const wchar_t* fileName) {
  InitLocale();
  if (!fileName) return nullptr;
  // A right-to-left language whose mirrored UI is switched off keeps the built-in resources.
  if (IsRightToLeftLanguage() && !IsRightToLeftUI()) return nullptr;
  // The built-in resources are the US English ones.
  if (GetUILocale() == kEnglishUS) return nullptr;
  const LocaleState& s = g_localeState;
  if (HINSTANCE library = LoadFromFolder(s.uiLangCountryDir, fileName)) return library;
  return LoadFromFolder(s.uiLangDir, fileName);
}

}  // namespace KVELLocale
