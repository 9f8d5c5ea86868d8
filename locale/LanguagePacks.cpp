// Language-pack folders and the resource library names looked for in them.
#include "locale/LanguagePacks.h"

#include <shlwapi.h>
#include <strsafe.h>

#include "framework/ScopedHandle.h"

namespace KVELLocale {

namespace {

// Joins a and b; an overlong result is cleared rather than cut, so that it never counts.
void Combine(wchar_t (&out)[kLocalePathChars], const wchar_t* a, const wchar_t* b) {
  if (!PathCombineW(out, a, b)) out[0] = L'\0';
}

bool HasExtension(const wchar_t* extension, const wchar_t* wanted) { return _wcsnicmp(extension, wanted, 4) == 0; }

}  // namespace

bool ChooseLanguagePacks(const wchar_t* base, const wchar_t* langName, const wchar_t* countryName,
                         const std::function<bool(const wchar_t*)>& counts, wchar_t (&langDir)[kLocalePathChars],
                         wchar_t (&langCountryDir)[kLocalePathChars]) {
  wchar_t binDir[kLocalePathChars];
  Combine(binDir, base, L"bin");
  bool langOk = false;
  if (langName[0] != L'\0') {
    Combine(langDir, binDir, langName);
    langOk = counts(langDir);
  }
  if (countryName[0] != L'\0') {
    wchar_t folderName[kLocalePathChars];
    StringCchPrintfW(folderName, kLocalePathChars, L"%s-%s", langName, countryName);
    Combine(langCountryDir, binDir, folderName);
    if (counts(langCountryDir)) return true;
  }
  if (!langOk) langDir[0] = L'\0';
  langCountryDir[0] = L'\0';
  return langOk;
}

bool LanguagePackCounts(const wchar_t* folder) {
  if (folder[0] == L'\0' || !PathIsDirectoryW(folder)) return false;
  wchar_t pattern[kLocalePathChars];
  Combine(pattern, folder, L"*");
  if (pattern[0] == L'\0') return false;
  WIN32_FIND_DATAW entry;
  fw::ScopedFindHandle find(FindFirstFileW(pattern, &entry));
  if (!find) return false;
  bool found = false;
  do {
    found = lstrcmpW(entry.cFileName, L".") != 0 && lstrcmpW(entry.cFileName, L"..") != 0;
  } while (!found && FindNextFileW(find.Get(), &entry));
  return found;
}

std::wstring ResourceLibraryName(const wchar_t* modulePath) {
  wchar_t path[kLocalePathChars];
  if (FAILED(StringCchCopyW(path, kLocalePathChars, modulePath))) return std::wstring();
  // Programs and controls keep their translations in a .dll; libraries keep their own extension.
  const wchar_t* extension = PathFindExtensionW(path);
  if (HasExtension(extension, L".exe") || HasExtension(extension, L".ocx")) PathRenameExtensionW(path, L".dll");
  wchar_t name[kLocalePathChars];
  if (FAILED(StringCchPrintfW(name, kLocalePathChars, L"Res%s", PathFindFileNameW(path)))) return std::wstring();
  return name;
}

}  // namespace KVELLocale
