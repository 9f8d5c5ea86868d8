// Language packs: which pack folders of a language count, and the file name of a module's
// resource library inside a pack.
#pragma once

#include <functional>

#include "locale/LocaleInternals.h"

namespace KVELLocale {

// Forms langDir = <base>\bin\<langName> and langCountryDir = <base>\bin\<langName>-<countryName>
// (an empty name forms no folder) and keeps the ones for which counts holds. When the
// language-and-country pack counts, both are kept as formed, because callers try that one first
// anyway. False, with both cleared, when no pack counts.
bool ChooseLanguagePacks(const wchar_t* base, const wchar_t* langName, const wchar_t* countryName,
                         const std::function<bool(const wchar_t*)>& counts, wchar_t (&langDir)[kLocalePathChars],
                         wchar_t (&langCountryDir)[kLocalePathChars]);

// A pack counts as an existing folder with something in it.
bool LanguagePackCounts(const wchar_t* folder);

// "Res" + the file name of modulePath, whose ".exe" or ".ocx" extension becomes ".dll" (any other
// extension, or none, stays); "" when the name does not fit a path.
std::wstring ResourceLibraryName(const wchar_t* modulePath);

}  // namespace KVELLocale
