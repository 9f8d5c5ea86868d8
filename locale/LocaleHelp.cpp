// Resolving a help reference to the help file of the UI language, and the help calls using it.
#include "locale/HelpReference.h"
#include "locale/LocaleInternals.h"

#include <shlwapi.h>

namespace KVELLocale {

namespace {

// Splits "file::topic" or "file>window" into the file and its suffix (separator included).
void SplitHelpSuffix(const std::wstring& reference, std::wstring& path, std::wstring& suffix) {
  size_t at = reference.rfind(L"::");
  if (at == std::wstring::npos) at = reference.rfind(L'>');
  if (at == std::wstring::npos) at = reference.size();
  path = reference.substr(0, at);
  suffix = reference.substr(at);
}

// helpDir\subFolder\fileName when it exists (subFolder may be empty).
bool FindHelpFile(const HelpLookup& lookup, const wchar_t* helpDir, const std::wstring& subFolder,
                  const std::wstring& fileName, std::wstring& found) {
  wchar_t folder[kLocalePathChars];
  wchar_t candidate[kLocalePathChars];
  if (!PathCombineW(folder, helpDir, subFolder.c_str()) || !PathCombineW(candidate, folder, fileName.c_str()) ||
      !lookup.exists(candidate))
    return false;
  found = candidate;
  return true;
}

// The translated help file, most specific first; empty when none exists.
std::wstring FindLocalizedHelpFile(const std::wstring& path, const wchar_t* defaultExt, const HelpLookup& lookup) {
  if (path.size() >= static_cast<size_t>(kLocalePathChars)) return std::wstring();
  std::wstring fileName = PathFindFileNameW(path.c_str());
  if (*PathFindExtensionW(fileName.c_str()) == L'\0' && defaultExt) fileName += defaultExt;
  wchar_t helpDir[kLocalePathChars];
  lstrcpynW(helpDir, path.c_str(), kLocalePathChars);
  PathRemoveFileSpecW(helpDir);
  // A bare file name is looked for in the suite's help folder (a relative "help" when the
  // suite folder is unknown).
  if (helpDir[0] == L'\0' && !PathCombineW(helpDir, lookup.suiteFolder.c_str(), L"help")) helpDir[0] = L'\0';

  const std::wstring& language = lookup.uiLangName;
  const std::wstring& country = lookup.uiCountryName;
  std::wstring found;
  if (!language.empty() && !country.empty() &&
      FindHelpFile(lookup, helpDir, language + L"-" + country, fileName, found))
    return found;
  if (!language.empty() && FindHelpFile(lookup, helpDir, language, fileName, found)) return found;
  FindHelpFile(lookup, helpDir, std::wstring(), fileName, found);
  return found;
}

// What the system's help call gets: an empty reference untouched, any other one resolved. An
// unresolved reference still goes on (as "" plus its suffix) for the help system to report.
const wchar_t* ResolveForHelpCall(const wchar_t* helpReference, std::wstring& resolved, const wchar_t* defaultExt) {
  InitLocale();
  if (!helpReference || !*helpReference) return helpReference;
  return GetLocaleHelpFile(helpReference, resolved, defaultExt);
}

}  // namespace

std::wstring ResolveHelpReference(const wchar_t* reference, const wchar_t* defaultExt, const HelpLookup& lookup) {
  if (!reference || !*reference || lookup.isDirectory(reference)) return std::wstring();
  std::wstring path, suffix;
  SplitHelpSuffix(reference, path, suffix);
  return FindLocalizedHelpFile(path, defaultExt, lookup) + suffix;
}

KVEL_LOCALE_API const wchar_t* GetLocaleHelpFile(const wchar_t* helpReference, std::wstring& result,
                                                 const wchar_t* defaultExt) {
  InitLocale();
  HelpLookup lookup;
  wchar_t suiteFolder[kLocalePathChars];
  GetSuiteFolder(suiteFolder);
  lookup.suiteFolder = suiteFolder;
  // A UI language without a pack keeps its names, so its users still get translated help.
  lookup.uiLangName = GetUILangIDString();
  lookup.uiCountryName = GetUICountryIDString();
  lookup.exists = [](const std::wstring& path) { return PathFileExistsW(path.c_str()) != FALSE; };
  lookup.isDirectory = [](const std::wstring& path) { return PathIsDirectoryW(path.c_str()) != FALSE; };
  result = ResolveHelpReference(helpReference, defaultExt, lookup);
  return result.c_str();
}

KVEL_LOCALE_API HWND KVEL_HtmlHelp(HWND window, const wchar_t* helpReference, UINT command, DWORD_PTR data) {
  std::wstring resolved;
  return CallHtmlHelp(window, ResolveForHelpCall(helpReference, resolved, L".CHM"), command, data);
}

KVEL_LOCALE_API HWND KVEL_HtmlHelp(HWND window, UINT command, DWORD_PTR data) {
  return KVEL_HtmlHelp(window, L"TallisMain.chm", command, data);
}

KVEL_LOCALE_API BOOL KVEL_WinHelp(HWND window, const wchar_t* helpReference, UINT command, ULONG_PTR data) {
  std::wstring resolved;
  return WinHelpW(window, ResolveForHelpCall(helpReference, resolved, L".HLP"), command, data);
}

}  // namespace KVELLocale
