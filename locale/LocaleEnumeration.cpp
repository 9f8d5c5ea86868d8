// Matching LANGIDs and language-pack folder names against the system's supported locales.
#include "locale/LocaleInternals.h"

#include <strsafe.h>

#include <cwchar>

namespace KVELLocale {

namespace {

LocaleState& s = g_localeState;

BOOL MatchByIdentifier(LANGID id) {
  // Any supported locale of the same primary language makes the target usable.
  if ((id & 0x3FF) != s.enumLangId) return TRUE;
  s.enumFound = true;
  return FALSE;
}

BOOL MatchByName(LANGID id) {
  if (!s.enumName) return FALSE;
  wchar_t langName[kLocaleNameChars];
  if (GetLocaleInfoW(id, LOCALE_SISO639LANGNAME, langName, kLocaleNameChars) <= 0) return TRUE;
  if (lstrcmpiW(langName, s.enumName) == 0) {
    // A bare language folder names the primary language only.
    s.enumFound = true;
    s.enumLangId = id & 0x3FF;
    s.enumCountryId = 0;
    return FALSE;
  }
  wchar_t countryName[kLocaleNameChars];
  if (GetLocaleInfoW(id, LOCALE_SISO3166CTRYNAME, countryName, kLocaleNameChars) <= 0) return TRUE;
  wchar_t fullName[2 * kLocaleNameChars];
  StringCchPrintfW(fullName, 2 * kLocaleNameChars, L"%s-%s", langName, countryName);
  if (lstrcmpiW(fullName, s.enumName) != 0) return TRUE;
  s.enumFound = true;
  s.enumLangId = id & 0x3FF;
  s.enumCountryId = id >> 10;
  return FALSE;
}

void Enumerate(unsigned short langId, unsigned short countryId, const wchar_t* name) {
  s.enumFound = false;
  s.enumLangId = langId;
  s.enumCountryId = countryId;
  s.enumName = name;
  EnumSystemLocalesW(EnumLocalesProc, LCID_SUPPORTED);
  s.enumName = nullptr;  // the caller's text does not outlive the call
}

}  // namespace

BOOL CALLBACK EnumLocalesProc(LPWSTR localeString) {
  unsigned int value = 0;
  if (!localeString || swscanf(localeString, L"%x", &value) != 1) return FALSE;
  LANGID id = LOWORD(value);
  if (id == 0) return FALSE;
  return s.enumLangId != 0 ? MatchByIdentifier(id) : MatchByName(id);
}

bool IsValidLangID(unsigned short langId) {
  if (langId == 0) return false;
  // A primary language of 0 selects name mode with no name, which never matches.
  Enumerate(langId & 0x3FF, langId >> 10, nullptr);
  return s.enumFound;
}

bool GetLangIDFromName(const wchar_t* name, unsigned short& langId) {
  langId = 0;
  if (!name) return false;
  Enumerate(0, 0, name);
  if (s.enumFound) langId = static_cast<unsigned short>((s.enumCountryId << 10) | s.enumLangId);
  return s.enumFound;
}

}  // namespace KVELLocale
