#include "settings/LanguagePackFolders.h"

#include <map>
#include <utility>

#include "framework/ScopedHandle.h"
#include "inventory/InstalledProducts.h"
#include "locale/LocaleNameCatalog.h"

namespace {

constexpr int kLocaleTextChars = 256;

bool ReadLocaleText(LANGID langId, LCTYPE type, CString& text) {
  return KVELLocale::ReadLocaleText(langId, type, kLocaleTextChars, text);
}

// What one list build learns about names and languages, kept for that build only: many folders
// share a name (each product brings its own "de-AT") or a language ("de-AT", "DE-at").
class PackNames {
 public:
  PackNames() : m_locales(KVELLocale::LocaleNameCatalog::FromSystem()) {}

  // False when the folder name names no supported locale.
  bool Recognise(const CString& folderName, LanguagePackFolder& folder) {
    auto known = m_langIds.find(folderName);
    if (known == m_langIds.end()) {
      std::optional<LANGID> named;
      unsigned short langId = 0;
      if (m_locales.LangIdFromName(folderName.c_str(), langId)) named = langId;
      known = m_langIds.emplace(folderName, named).first;
    }
    if (!known->second) return false;
    folder = {folderName, *known->second, EntryText(*known->second)};
    return true;
  }

 private:
  const std::optional<CString>& EntryText(LANGID langId) {
    auto known = m_entryTexts.find(langId);
    if (known == m_entryTexts.end()) known = m_entryTexts.emplace(langId, ReadEntryText(langId)).first;
    return known->second;
  }

  static std::optional<CString> ReadEntryText(LANGID langId) {
    CString text;
    if (!ReadNativeLanguageName(langId, text)) return std::nullopt;
    CString country;
    if (ReadNativeCountryName(langId, country)) text += L" (" + country + L")";
    return text;
  }

  KVELLocale::LocaleNameCatalog m_locales;
  std::map<CString, std::optional<LANGID>> m_langIds;  // by folder name, exactly as found
  std::map<LANGID, std::optional<CString>> m_entryTexts;
};

ProductLanguagePacks ScanBinFolder(const CString& pattern, PackNames& names) {
  ProductLanguagePacks packs;
  WIN32_FIND_DATAW entry;
  fw::ScopedFindHandle find(FindFirstFileW(pattern.c_str(), &entry));
  if (!find) return packs;
  do {
    if ((entry.dwFileAttributes & FILE_ATTRIBUTE_DIRECTORY) == 0) continue;
    // Also passes over "." and "..".
    LanguagePackFolder folder;
    if (names.Recognise(entry.cFileName, folder)) packs.push_back(std::move(folder));
  } while (FindNextFileW(find.Get(), &entry));
  return packs;
}

}  // namespace

bool ReadNativeLanguageName(LANGID langId, CString& name) {
  return ReadLocaleText(langId, LOCALE_SNATIVELANGNAME, name);
}

bool ReadNativeCountryName(LANGID langId, CString& country) {
  // A language without a country (sub-language 0, as a "de" pack names it) is never a whole
  // locale, although some systems' IsValidLocale accept it and then report the language's main
  // country.
  return SUBLANGID(langId) != SUBLANG_NEUTRAL && IsValidLocale(langId, LCID_SUPPORTED) &&
         ReadLocaleText(langId, LOCALE_SNATIVECTRYNAME, country);
}

CString UILocaleName(LANGID uiLang) {
  KVELLocale::LocaleIsoNames names;
  if (!KVELLocale::ReadLocaleIsoNames(uiLang, names)) return CString();
  return names.languageAndCountry.empty() ? names.language : names.languageAndCountry;
}

std::vector<ProductLanguagePacks> FindLanguagePackFolders(const InstalledProducts& products) {
  if (!products.desktopInstalled && !products.engineInstalled) return {};
  PackNames names;
  std::vector<ProductLanguagePacks> found;
  for (const auto& [installed, key] : {std::make_pair(products.desktopInstalled, &products.desktopKey),
                                       std::make_pair(products.engineInstalled, &products.engineKey)}) {
    if (!installed) continue;
    // Plain concatenation: an InstallDir ending in a backslash gives a doubled one, which the
    // file system accepts.
    found.push_back(ScanBinFolder(GetProductBinFolder(*key) + L"*", names));
  }
  return found;
}
