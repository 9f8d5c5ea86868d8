// Pushing the user locale into the C runtime and the UI language into the calling thread.
#include "locale/LocaleInternals.h"
#include "locale/LocaleNameCatalog.h"

#include <strsafe.h>

#include <clocale>

namespace KVELLocale {

namespace {

std::wstring InfoOrEmpty(LCID locale, LCTYPE type) {
  std::wstring text;
  if (!ReadLocaleText(locale, type, kLocalePathChars, text)) text.clear();
  return text;
}

}  // namespace

KVEL_LOCALE_API void SetLocale(int category) {
  InitLocale();
  const std::wstring language = InfoOrEmpty(GetLocale(), LOCALE_SENGLANGUAGE);
  const std::wstring country = InfoOrEmpty(GetLocale(), LOCALE_SENGCOUNTRY);
  // The runtime converts with the system's ANSI code page, whatever the user locale's is.
  const std::wstring codePage = InfoOrEmpty(LOCALE_SYSTEM_DEFAULT, LOCALE_IDEFAULTANSICODEPAGE);
  wchar_t name[kLocalePathChars];
  StringCchPrintfW(name, kLocalePathChars, L"%s_%s.%s", language.c_str(), country.c_str(), codePage.c_str());
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
