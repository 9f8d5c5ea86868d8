// The system's supported locales by their ISO names, for recognising many language-pack folder
// names at once. GetLangIDFromName walks the system's locales afresh for every name; a list of
// hundreds of folders reads them once into a catalog and resolves every name against that, with
// the same rule. Not exported: the suite's own code uses it.
#pragma once

#include <windows.h>

#include <string>
#include <unordered_map>
#include <utility>
#include <vector>

namespace KVELLocale {

// GetLocaleInfoW with a buffer of capacity characters; false when the call fails (a text that
// does not fit fails too). data: every character the call wrote, terminator included.
bool ReadLocaleInfo(LCID locale, LCTYPE type, int capacity, std::wstring& data);
// The same for a text: up to its first zero character.
bool ReadLocaleText(LCID locale, LCTYPE type, int capacity, std::wstring& text);

// Walks the system's specific locales (a language with its country) in the system's order,
// handing each one's LANGID and context to visit until visit returns false. Walks may nest.
using LocaleVisitor = bool (*)(LANGID langId, void* context);
void WalkSupportedLocales(LocaleVisitor visit, void* context);

// The ISO names one supported locale goes by.
struct LocaleIsoNames {
  LANGID langId = 0;
  std::wstring language;  // ISO 639: "pt"
  // ISO 639 + "-" + ISO 3166: "pt-BR"; empty when the system cannot give the country.
  std::wstring languageAndCountry;
};

// The ISO names of langId; false when even its language name cannot be had (no folder name can
// name such a locale).
bool ReadLocaleIsoNames(LANGID langId, LocaleIsoNames& names);

// Whether a language-pack folder name names this locale, and the LANGID it stands for then. The
// language name alone names the locale's primary language with no sub-language ("fr" gives
// 0x000C, also when matched against fr-CA); language + "-" + country names the whole LANGID
// ("fr-CA" gives 0x0C0C). Letter case is ignored. langId is left alone when the name does not match.
bool MatchFolderName(const wchar_t* folderName, const LocaleIsoNames& locale, LANGID& langId);

class LocaleNameCatalog {
 public:
  explicit LocaleNameCatalog(std::vector<LocaleIsoNames> locales);

  // The supported locales in the system's order, as GetLangIDFromName walks them.
  static LocaleNameCatalog FromSystem();

  // As GetLangIDFromName: the first locale in the catalog's order that the name names wins.
  // langId is 0 unless one does.
  bool LangIdFromName(const wchar_t* name, unsigned short& langId) const;

  const std::vector<LocaleIsoNames>& Locales() const { return m_locales; }

 private:
  // The locales a name can match at all, in catalog order, so that a name is compared with a few
  // locales instead of all of them.
  std::vector<size_t> Candidates(const wchar_t* name) const;

  std::vector<LocaleIsoNames> m_locales;
  // Positions in m_locales by the plain key (PlainNameKey) of either of the locale's names.
  std::unordered_map<std::wstring, std::vector<size_t>> m_byPlainKey;
  // Locales with a name that has no plain key: every name is compared with them.
  std::vector<size_t> m_withoutPlainKey;
};

}  // namespace KVELLocale
