// What the display-language list (DisplayLanguageList.h) needs from the workstation: the
// installed products' language-pack folders, recognised by name, and the Windows UI language's
// names. Reads the registry, the file system and the system's locale data.
#pragma once

#include <windows.h>

#include <vector>

#include "settings/DisplayLanguageList.h"

struct InstalledProducts;

// The pack folders of the installed Desktop and Engine products, Desktop first, each product only
// when installed: every folder of its bin folder whose name names a supported locale, with its
// LANGID and entry text. The system's locales are read once per call and each language's native
// names once, however many folders there are; nothing is kept between calls.
std::vector<ProductLanguagePacks> FindLanguagePackFolders(const InstalledProducts& products);

// The language's name in that language ("Deutsch"); false when the system has none.
bool ReadNativeLanguageName(LANGID langId, CString& name);
// The country's name in its language ("Deutschland"), only for a locale the system supports as a
// whole; false otherwise.
bool ReadNativeCountryName(LANGID langId, CString& country);

// The Windows UI language as "<ISO 639>-<ISO 3166>" ("de-DE"); just the language when the country
// is unknown, "" when the language is.
CString UILocaleName(LANGID uiLang);
