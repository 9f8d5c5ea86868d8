// The process-wide user locale and UI language, and where their language packs live.
#include "locale/LocaleInternals.h"
#include "locale/SuiteUserSettings.h"

#include <shlobj.h>
#include <shlwapi.h>
#include <strsafe.h>

namespace KVELLocale {

LocaleState g_localeState = {};

namespace {

LocaleState& s = g_localeState;

// Joins a and b; an overlong result is cleared rather than cut, so that it never counts.
void Combine(wchar_t (&out)[kLocalePathChars], const wchar_t* a, const wchar_t* b) {
  if (!PathCombineW(out, a, b)) out[0] = L'\0';
}

// The running executable's path; false when it cannot be read whole.
bool GetExecutablePath(wchar_t (&path)[kLocalePathChars]) {
  DWORD length = GetModuleFileNameW(nullptr, path, kLocalePathChars);
  return length > 0 && length < static_cast<DWORD>(kLocalePathChars);
}

// q4.exe ships its own language packs and keeps its own stored UI language.
bool IsQ4Executable() {
  wchar_t path[kLocalePathChars];
  return GetExecutablePath(path) && lstrcmpiW(PathFindFileNameW(path), L"q4.exe") == 0;
}

void GetUILanguageBase(wchar_t (&base)[kLocalePathChars]) {
  if (IsQ4Executable() && GetExecutablePath(base)) {
    // q4.exe sits in <base>\<folder>\q4.exe with its packs in <base>\bin.
    PathRemoveFileSpecW(base);
    PathRemoveFileSpecW(base);
    return;
  }
  GetSuiteFolder(base);
}

// ISO names of a locale; both empty when the language name cannot be had.
void FetchLocaleNames(LANGID id, wchar_t (&langName)[kLocaleNameChars],
                      wchar_t (&countryName)[kLocaleNameChars]) {
  if (GetLocaleInfoW(id, LOCALE_SISO3166CTRYNAME, countryName, kLocaleNameChars) <= 0)
    countryName[0] = L'\0';
  if (GetLocaleInfoW(id, LOCALE_SISO639LANGNAME, langName, kLocaleNameChars) <= 0) {
    langName[0] = L'\0';
    countryName[0] = L'\0';
  }
}

// A language pack counts only as an existing folder with something in it.
bool FolderCounts(const wchar_t* folder) {
  if (folder[0] == L'\0' || !PathIsDirectoryW(folder)) return false;
  wchar_t pattern[kLocalePathChars];
  Combine(pattern, folder, L"*");
  if (pattern[0] == L'\0') return false;
  WIN32_FIND_DATAW entry;
  HANDLE find = FindFirstFileW(pattern, &entry);
  if (find == INVALID_HANDLE_VALUE) return false;
  bool found = false;
  do {
    found = lstrcmpW(entry.cFileName, L".") != 0 && lstrcmpW(entry.cFileName, L"..") != 0;
  } while (!found && FindNextFileW(find, &entry));
  FindClose(find);
  return found;
}

// Forms <base>\bin\<lang> and <base>\bin\<lang>-<country> and keeps the ones that count.
// When the language-and-country pack counts both are kept as formed, because callers try that
// one first anyway. Returns false (both cleared) when no pack counts.
bool FindLanguagePacks(const wchar_t* base, const wchar_t* langName, const wchar_t* countryName,
                       wchar_t (&langDir)[kLocalePathChars],
                       wchar_t (&langCountryDir)[kLocalePathChars]) {
  wchar_t binDir[kLocalePathChars];
  Combine(binDir, base, L"bin");
  bool langOk = false;
  if (langName[0] != L'\0') {
    Combine(langDir, binDir, langName);
    langOk = FolderCounts(langDir);
  }
  if (countryName[0] != L'\0') {
    wchar_t folderName[kLocalePathChars];
    StringCchPrintfW(folderName, kLocalePathChars, L"%s-%s", langName, countryName);
    Combine(langCountryDir, binDir, folderName);
    if (FolderCounts(langCountryDir)) return true;
  }
  if (!langOk) langDir[0] = L'\0';
  langCountryDir[0] = L'\0';
  return langOk;
}

bool IsEnglish(LANGID id) { return id == kEnglishUS || id == kEnglishNeutral; }

void InitUserLocale() {
  LANGID id = GetUserDefaultLangID();
  s.langId = id & 0x3FF;
  s.countryId = id >> 10;
  s.langDir[0] = s.langCountryDir[0] = L'\0';
  if (IsEnglish(id)) return;  // English is built in: no names, no packs
  FetchLocaleNames(id, s.langName, s.countryName);
  // The user locale's packs always live under the suite folder, q4.exe included.
  wchar_t base[kLocalePathChars];
  GetSuiteFolder(base);
  FindLanguagePacks(base, s.langName, s.countryName, s.langDir, s.langCountryDir);
}

LANGID ComposeLangID(unsigned short langId, unsigned short countryId) {
  return static_cast<LANGID>((countryId << 10) | langId);
}

// A field of the state as it stands once the state has been computed.
template <class Field>
const Field& AfterInit(const Field& field) {
  InitLocale();
  return field;
}

}  // namespace

void GetSuiteFolder(wchar_t (&folder)[kLocalePathChars]) {
  if (SHGetSpecialFolderPathW(nullptr, folder, CSIDL_PROGRAM_FILES_COMMON, FALSE))
    PathAppendW(folder, L"Mapora");
  else
    folder[0] = L'\0';
}

bool QuerySettingsValue(const wchar_t* valueName, void* buffer, DWORD size) {
  HKEY key = nullptr;
  if (RegOpenKeyExW(HKEY_CURRENT_USER, kSuiteUserKey, 0, KEY_READ, &key) != ERROR_SUCCESS)
    return false;
  LONG rc = RegQueryValueExW(key, valueName, nullptr, nullptr, static_cast<BYTE*>(buffer), &size);
  RegCloseKey(key);
  return rc == ERROR_SUCCESS;
}

LANGID ReadStoredUILangID() {
  // The type is deliberately not checked: any 4-byte value is taken as a LANGID. A value that
  // does not fit leaves the buffer undefined, so it counts as no choice.
  DWORD value = 0;
  if (!QuerySettingsValue(IsQ4Executable() ? kQ4UILangIDValue : kUILangIDValue, &value, sizeof value))
    return 0;
  return LOWORD(value);
}

LANGID DetermineUILangID() {
  LANGID stored = ReadStoredUILangID();
  LANGID userDefault = GetUserDefaultUILanguage();
  if (stored != userDefault && IsValidLangID(stored)) {
    if (SetThreadUILanguage(stored) != 0) return stored;
  }
  SetThreadUILanguage(userDefault);
  return userDefault;
}

void InitUILocale() {
  if (s.uiLangId != 0 && !s.overridePending) return;
  LANGID id;
  if (s.overridePending) {
    // A forced language bypasses the stored choice and leaves the thread alone.
    id = ComposeLangID(s.uiLangId, s.uiCountryId);
    s.overridePending = false;
  } else {
    id = DetermineUILangID();
    s.uiLangId = id & 0x3FF;
    s.uiCountryId = id >> 10;
  }
  s.uiLangDir[0] = s.uiLangCountryDir[0] = L'\0';
  if (IsEnglish(id)) return;
  FetchLocaleNames(id, s.uiLangName, s.uiCountryName);
  wchar_t base[kLocalePathChars];
  GetUILanguageBase(base);
  if (!FindLanguagePacks(base, s.uiLangName, s.uiCountryName, s.uiLangDir, s.uiLangCountryDir)) {
    // No pack: show English, but keep the requested names so that translated help is still
    // found for a language whose resources are not installed.
    s.uiLangId = kEnglishUS & 0x3FF;
    s.uiCountryId = kEnglishUS >> 10;
  }
}

void InitLocale() {
  if (s.langId != 0) return;
  InitUILocale();
  InitUserLocale();
}

KVEL_LOCALE_API bool SetupEXEOverRide(unsigned short langId) {
  if (s.uiLangId != 0 || s.uiCountryId != 0) return false;
  if (!IsValidLangID(langId)) return false;
  s.overridePending = true;
  s.uiLangId = langId & 0x3FF;
  s.uiCountryId = langId >> 10;
  return true;
}

KVEL_LOCALE_API unsigned short GetLangID() { return AfterInit(s.langId); }
KVEL_LOCALE_API unsigned short GetCountryID() { return AfterInit(s.countryId); }
KVEL_LOCALE_API const wchar_t* GetLangIDString() { return AfterInit(s.langName); }
KVEL_LOCALE_API const wchar_t* GetCountryIDString() { return AfterInit(s.countryName); }
KVEL_LOCALE_API unsigned short GetUILangID() { return AfterInit(s.uiLangId); }
KVEL_LOCALE_API unsigned short GetUICountryID() { return AfterInit(s.uiCountryId); }
KVEL_LOCALE_API const wchar_t* GetUILangIDString() { return AfterInit(s.uiLangName); }
KVEL_LOCALE_API const wchar_t* GetUICountryIDString() { return AfterInit(s.uiCountryName); }

KVEL_LOCALE_API unsigned short GetLocale() {
  InitLocale();
  return ComposeLangID(s.langId, s.countryId);
}

KVEL_LOCALE_API unsigned short GetUILocale() {
  InitLocale();
  return ComposeLangID(s.uiLangId, s.uiCountryId);
}

}  // namespace KVELLocale
