// The process-wide user locale and UI language, and where their language packs live.
#include "framework/RegistryKey.h"
#include "locale/LanguagePacks.h"
#include "locale/LocaleNameCatalog.h"
#include "locale/SuiteUserSettings.h"

#include <shlobj.h>
#include <shlwapi.h>
#include <strsafe.h>

namespace KVELLocale {

LocaleState g_localeState = {};

namespace {

LocaleState& s = g_localeState;

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
  std::wstring language;
  std::wstring country;
  // No country without a language; what fits the wrapper's buffer fits the field.
  if (ReadLocaleText(id, LOCALE_SISO639LANGNAME, kLocaleNameChars, language))
    ReadLocaleText(id, LOCALE_SISO3166CTRYNAME, kLocaleNameChars, country);
  StringCchCopyW(langName, kLocaleNameChars, language.c_str());
  StringCchCopyW(countryName, kLocaleNameChars, country.c_str());
}

bool IsEnglish(LANGID id) { return id == kEnglishUS || id == kEnglishNeutral; }

void InitUserLocale() {
  LANGID id = GetUserDefaultLangID();
  s.langId = PRIMARYLANGID(id);
  s.countryId = SUBLANGID(id);
  s.langDir[0] = s.langCountryDir[0] = L'\0';
  if (IsEnglish(id)) return;  // English is built in: no names, no packs
  FetchLocaleNames(id, s.langName, s.countryName);
  // The user locale's packs always live under the suite folder, q4.exe included.
  wchar_t base[kLocalePathChars];
  GetSuiteFolder(base);
  ChooseLanguagePacks(base, s.langName, s.countryName, LanguagePackCounts, s.langDir, s.langCountryDir);
}

LANGID ComposeLangID(unsigned short langId, unsigned short countryId) {
  return static_cast<LANGID>(MAKELANGID(langId, countryId));
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
  fw::RegistryKey key;
  return key.Open(HKEY_CURRENT_USER, kSuiteUserKey, KEY_READ) == ERROR_SUCCESS &&
         key.ReadBytes(valueName, buffer, size) == ERROR_SUCCESS;
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
    s.uiLangId = PRIMARYLANGID(id);
    s.uiCountryId = SUBLANGID(id);
  }
  s.uiLangDir[0] = s.uiLangCountryDir[0] = L'\0';
  if (IsEnglish(id)) return;
  FetchLocaleNames(id, s.uiLangName, s.uiCountryName);
  wchar_t base[kLocalePathChars];
  GetUILanguageBase(base);
  if (!ChooseLanguagePacks(base, s.uiLangName, s.uiCountryName, LanguagePackCounts, s.uiLangDir,
                           s.uiLangCountryDir)) {
    // No pack: show English, but keep the requested names so that translated help is still
    // found for a language whose resources are not installed.
    s.uiLangId = PRIMARYLANGID(kEnglishUS);
    s.uiCountryId = SUBLANGID(kEnglishUS);
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
  s.uiLangId = PRIMARYLANGID(langId);
  s.uiCountryId = SUBLANGID(langId);
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
