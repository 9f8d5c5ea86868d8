// Which help file a help reference means for the UI language. The rule looks at no disk itself:
// the caller says which paths exist, so that it can be followed (and tested) on its own.
#pragma once

#include <functional>
#include <string>

namespace KVELLocale {

struct HelpLookup {
  std::wstring suiteFolder;    // <Common Files>\Mapora; "" when the shell folder is unknown
  std::wstring uiLangName;     // ISO 639 name of the UI language; "" for English
  std::wstring uiCountryName;  // ISO 3166 name of the UI language
  std::function<bool(const std::wstring&)> exists;       // a file (or folder) is there
  std::function<bool(const std::wstring&)> isDirectory;  // a folder is there
};

// A reference is a path, optionally followed by "::topic" or ">window", which is kept aside and
// appended to the result. A file name without extension gets defaultExt; a reference without a
// folder is looked for in suiteFolder\help. Tried in order: <folder>\<lang>-<country>\<file>,
// <folder>\<lang>\<file>, <folder>\<file>; the first that exists wins, none gives "" (plus the
// suffix). An empty reference, or one naming a folder, gives "".
std::wstring ResolveHelpReference(const wchar_t* reference, const wchar_t* defaultExt, const HelpLookup& lookup);

}  // namespace KVELLocale
