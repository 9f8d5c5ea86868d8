// Pushing the user locale into the C runtime and the UI language into the calling thread.
#include "locale/LocaleInternals.h"

#include <strsafe.h>

#include <clocale>

namespace KVELLocale {

namespace {

void GetInfoOrEmpty(LCID locale, LCTYPE type, wchar_t (&text)[kLocalePathChars]) {
  if (GetLocaleInfoW(locale, type, text, kLocalePathChars) <= 0) text[0] = L'\0';
}

}  // namespace

KVEL_LOCALE_API void SetLocale(int category) {
  InitLocale();
  wchar_t language[kLocalePathChars];
  wchar_t country[kLocalePathChars];
  wchar_t codePage[kLocalePathChars];
  GetInfoOrEmpty(GetLocale(), LOCALE_SENGLANGUAGE, language);
  GetInfoOrEmpty(GetLocale(), LOCALE_SENGCOUNTRY, country);
  // The runtime converts with the system's ANSI code page, whatever the user locale's is.
  GetInfoOrEmpty(LOCALE_SYSTEM_DEFAULT, LOCALE_IDEFAULTANSICODEPAGE, codePage);
  wchar_t name[kLocalePathChars];
  StringCchPrintfW(name, kLocalePathChars, L"%s_%s.%s", language, country, codePage);
  _wsetlocale(category, name);
}

KVEL_LOCALE_API void SetThreadLocale() {
  InitLocale();
  ::SetThreadLocale(MAKELCID(GetLocale(), SORT_DEFAULT));
}

KVEL_LOCALE_API void SetThreadUILocale() {
  InitLocale();
  SetThreadUILanguage(GetUILocale());
}

}  // namespace KVELLocale
