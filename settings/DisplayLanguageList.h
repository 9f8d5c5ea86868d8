// The display-language list of Advanced Configuration as a plain rule: what was found on the
// workstation goes in, the list's entries, its selection and the warning's state come out. The
// dialog gathers the inputs (LanguagePackFolders.h) and applies the result; nothing here touches a
// window, the registry or the file system.
#pragma once

#include <windows.h>

#include <optional>
#include <vector>

#include "framework/Strings.h"

// Item data of the two fixed entries: the Windows language (no stored value) and English, the
// primary language alone.
inline constexpr DWORD kWindowsLanguageEntryLangId = 0;
inline constexpr DWORD kEnglishEntryLangId = MAKELANGID(LANG_ENGLISH, SUBLANG_NEUTRAL);
inline constexpr int kWindowsLanguageEntry = 0;
inline constexpr int kEnglishEntry = 1;

// A folder of a product's bin folder whose name names a supported locale.
struct LanguagePackFolder {
  CString name;   // as found: "de", "de-AT"
  LANGID langId;  // what the name stands for: 0x0007, 0x0C07
  // The native language name, with the native country in brackets for a whole locale:
  // "Deutsch", "Deutsch (Österreich)". None when the system has no name for the language.
  std::optional<CString> entryText;
};

// The language packs of one installed product, in the order the file system listed them.
using ProductLanguagePacks = std::vector<LanguagePackFolder>;

struct DisplayLanguageInput {
  CString windowsEntryText;  // entry 0: "Display language (Deutsch - Deutschland)"
  // The Windows UI language as "<ISO 639>-<ISO 3166>" ("de-DE"); just the language when the
  // country is unknown, "" when the language is.
  CString uiLocaleName;
  // One element per installed product, Desktop before Engine; a product that is not installed has
  // none, one without pack folders an empty one.
  std::vector<ProductLanguagePacks> products;
  DWORD storedLangId = 0;  // the session's display language; 0 = the Windows language
};

struct DisplayLanguageEntry {
  CString text;
  DWORD langId;  // the entry's item data
};

struct DisplayLanguageList {
  std::vector<DisplayLanguageEntry> entries;
  int selection = kWindowsLanguageEntry;
  DWORD selectedLangId = 0;
  // The stored language has no entry any longer (its pack has gone): the stored value is to be
  // deleted at once and the session's language becomes 0.
  bool forgetStoredLanguage = false;
  // A pack serves the Windows UI language (decided by the last product scanned only).
  bool windowsLanguagePackFound = false;
};

DisplayLanguageList BuildDisplayLanguageList(const DisplayLanguageInput& input);

// The warning that the Windows language has no pack shows only while its entry is selected.
bool ShowsLanguagePackWarning(bool windowsLanguagePackFound, int selectedIndex);
