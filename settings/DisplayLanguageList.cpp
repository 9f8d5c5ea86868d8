#include "settings/DisplayLanguageList.h"

#include <unordered_set>

namespace {

constexpr wchar_t kEnglishEntryText[] = L"English";
// The Windows UI language that needs no pack.
constexpr wchar_t kEnglishUSLocaleName[] = L"en-US";
// Every en-US pack is listed, even when another product already brought one.
constexpr wchar_t kEnglishUSEntryText[] = L"English (United States)";

bool SameTextIgnoringCase(const CString& a, const CString& b) {
  return CompareStringOrdinal(a.c_str(), static_cast<int>(a.size()), b.c_str(), static_cast<int>(b.size()), TRUE) ==
         CSTR_EQUAL;
}

// The entries so far, searched as the list control's exact search (CB_FINDSTRINGEXACT) does:
// the whole text, case ignored the way lstrcmpiW ignores it.
class ListedEntries {
 public:
  explicit ListedEntries(std::vector<DisplayLanguageEntry>& entries) : m_entries(entries) {
    for (const DisplayLanguageEntry& entry : entries) m_texts.insert(entry.text);
  }

  bool Contains(const CString& text) const {
    // The same language under a second product brings the very same text: no comparison needed.
    if (m_texts.count(text) != 0) return true;
    for (const DisplayLanguageEntry& entry : m_entries)
      if (lstrcmpiW(entry.text.c_str(), text.c_str()) == 0) return true;
    return false;
  }

  void Add(const CString& text, DWORD langId) {
    m_entries.push_back({text, langId});
    m_texts.insert(text);
  }

 private:
  std::vector<DisplayLanguageEntry>& m_entries;
  std::unordered_set<CString> m_texts;  // exactly as listed
};

// Lists one product's packs; true when one of them serves the Windows UI language. A
// language-only pack shortens uiLocaleName for the rest of the build.
bool ScanProduct(const ProductLanguagePacks& packs, CString& uiLocaleName, ListedEntries& entries) {
  // Each product's scan starts afresh, so only the last scanned product decides the warning.
  bool found = SameTextIgnoringCase(uiLocaleName, kEnglishUSLocaleName);
  for (const LanguagePackFolder& folder : packs) {
    if (folder.name.find(L'-') == CString::npos) {
      // A language-only pack serves every country of its language.
      const size_t dash = uiLocaleName.find(L'-');
      if (dash != CString::npos && dash > 0) uiLocaleName.resize(dash);
    }
    if (SameTextIgnoringCase(uiLocaleName, folder.name)) found = true;
    if (!folder.entryText) continue;
    const CString& text = *folder.entryText;
    if (!entries.Contains(text) || SameTextIgnoringCase(text, kEnglishUSEntryText)) entries.Add(text, folder.langId);
  }
  return found;
}

}  // namespace

DisplayLanguageList BuildDisplayLanguageList(const DisplayLanguageInput& input) {
  DisplayLanguageList list;
  list.entries.push_back({input.windowsEntryText, kWindowsLanguageEntryLangId});
  list.entries.push_back({kEnglishEntryText, kEnglishEntryLangId});
  ListedEntries listed(list.entries);
  CString uiLocaleName = input.uiLocaleName;
  for (const ProductLanguagePacks& packs : input.products)
    list.windowsLanguagePackFound = ScanProduct(packs, uiLocaleName, listed);

  list.selectedLangId = input.storedLangId;
  if (input.storedLangId == kEnglishEntryLangId) {
    list.selection = kEnglishEntry;
    return list;
  }
  // The last entry with the stored language wins (en-US may be listed more than once).
  bool matched = false;
  for (size_t index = 0; index < list.entries.size(); ++index) {
    if (list.entries[index].langId != input.storedLangId) continue;
    list.selection = static_cast<int>(index);
    matched = true;
  }
  if (!matched) {
    list.forgetStoredLanguage = true;
    list.selectedLangId = kWindowsLanguageEntryLangId;
    list.selection = kWindowsLanguageEntry;
  }
  return list;
}

bool ShowsLanguagePackWarning(bool windowsLanguagePackFound, int selectedIndex) {
  return !windowsLanguagePackFound && selectedIndex == kWindowsLanguageEntry;
}
