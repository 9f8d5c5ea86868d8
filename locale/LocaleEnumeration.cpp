// Matching LANGIDs and language-pack folder names against the system's supported locales.
#include "locale/LocaleInternals.h"
#include "locale/LocaleNameCatalog.h"

#include <algorithm>
#include <cwchar>

namespace KVELLocale {

namespace {

LocaleState& s = g_localeState;

// The LANGID of one entry of the system's enumeration; false for an entry that ends it (no
// hexadecimal number, or one whose LANGID is 0).
bool ParseLocaleString(const wchar_t* localeString, LANGID& id) {
  unsigned int value = 0;
  if (!localeString || swscanf(localeString, L"%x", &value) != 1) return false;
  id = LOWORD(value);
  return id != 0;
}

bool ReadLocaleText(LANGID id, LCTYPE type, std::wstring& text) {
  wchar_t buffer[kLocaleNameChars];
  if (GetLocaleInfoW(id, type, buffer, kLocaleNameChars) <= 0) return false;
  text = buffer;
  return true;
}

BOOL MatchByIdentifier(LANGID id) {
  // Any supported locale of the same primary language makes the target usable.
  if (PRIMARYLANGID(id) != s.enumLangId) return TRUE;
  s.enumFound = true;
  return FALSE;
}

BOOL MatchByName(LANGID id) {
  if (!s.enumName) return FALSE;
  LocaleIsoNames names;
  LANGID named = 0;
  if (!ReadLocaleIsoNames(id, names) || !MatchFolderName(s.enumName, names, named)) return TRUE;
  s.enumFound = true;
  s.enumLangId = PRIMARYLANGID(named);
  s.enumCountryId = SUBLANGID(named);
  return FALSE;
}

void Enumerate(unsigned short langId, unsigned short countryId, const wchar_t* name) {
  s.enumFound = false;
  s.enumLangId = langId;
  s.enumCountryId = countryId;
  s.enumName = name;
  EnumSystemLocalesW(EnumLocalesProc, LCID_SUPPORTED);
  s.enumName = nullptr;  // the caller's text does not outlive the call
}

// For a name of ASCII letters, digits and hyphens only (as every ISO name is): its letters in
// upper case and its digits, hyphens left out; false for any other name. lstrcmpiW finds such a
// name equal to an ISO name only when their keys are equal: no locale's letter case folds one ASCII
// letter into another, and whatever a hyphen weighs, the key has none. So the key picks the only
// locales such a name can match, and lstrcmpiW still decides whether it does.
bool PlainNameKey(const wchar_t* name, std::wstring& key) {
  key.clear();
  if (name == nullptr || *name == L'\0') return false;
  for (const wchar_t* c = name; *c != L'\0'; ++c) {
    if (*c >= L'a' && *c <= L'z') {
      key += static_cast<wchar_t>(*c - L'a' + L'A');
    } else if ((*c >= L'A' && *c <= L'Z') || (*c >= L'0' && *c <= L'9')) {
      key += *c;
    } else if (*c != L'-') {
      return false;
    }
  }
  return true;
}

// The catalog being filled by FromSystem; the enumeration's callback takes no context.
std::vector<LocaleIsoNames>* g_catalogBeingRead = nullptr;

BOOL CALLBACK AddToCatalog(LPWSTR localeString) {
  LANGID id = 0;
  if (!ParseLocaleString(localeString, id)) return FALSE;
  LocaleIsoNames names;
  if (ReadLocaleIsoNames(id, names)) g_catalogBeingRead->push_back(std::move(names));
  return TRUE;
}

}  // namespace

BOOL CALLBACK EnumLocalesProc(LPWSTR localeString) {
  LANGID id = 0;
  if (!ParseLocaleString(localeString, id)) return FALSE;
  return s.enumLangId != 0 ? MatchByIdentifier(id) : MatchByName(id);
}

bool IsValidLangID(unsigned short langId) {
  if (langId == 0) return false;
  // A primary language of 0 selects name mode with no name, which never matches.
  Enumerate(PRIMARYLANGID(langId), SUBLANGID(langId), nullptr);
  return s.enumFound;
}

bool GetLangIDFromName(const wchar_t* name, unsigned short& langId) {
  langId = 0;
  if (!name) return false;
  Enumerate(0, 0, name);
  if (s.enumFound) langId = MAKELANGID(s.enumLangId, s.enumCountryId);
  return s.enumFound;
}

bool ReadLocaleIsoNames(LANGID langId, LocaleIsoNames& names) {
  names = LocaleIsoNames();
  names.langId = langId;
  if (!ReadLocaleText(langId, LOCALE_SISO639LANGNAME, names.language)) return false;
  std::wstring country;
  if (ReadLocaleText(langId, LOCALE_SISO3166CTRYNAME, country))
    names.languageAndCountry = names.language + L"-" + country;
  return true;
}

bool MatchFolderName(const wchar_t* folderName, const LocaleIsoNames& locale, LANGID& langId) {
  if (lstrcmpiW(locale.language.c_str(), folderName) == 0) {
    langId = MAKELANGID(PRIMARYLANGID(locale.langId), SUBLANG_NEUTRAL);
    return true;
  }
  if (locale.languageAndCountry.empty() || lstrcmpiW(locale.languageAndCountry.c_str(), folderName) != 0) return false;
  langId = locale.langId;
  return true;
}

LocaleNameCatalog LocaleNameCatalog::FromSystem() {
  std::vector<LocaleIsoNames> locales;
  g_catalogBeingRead = &locales;
  EnumSystemLocalesW(AddToCatalog, LCID_SUPPORTED);
  g_catalogBeingRead = nullptr;
  return LocaleNameCatalog(std::move(locales));
}

LocaleNameCatalog::LocaleNameCatalog(std::vector<LocaleIsoNames> locales) : m_locales(std::move(locales)) {
  std::wstring languageKey;
  std::wstring localeKey;
  for (size_t i = 0; i < m_locales.size(); ++i) {
    const LocaleIsoNames& locale = m_locales[i];
    const bool plainLanguage = PlainNameKey(locale.language.c_str(), languageKey);
    const bool plainLocale =
        locale.languageAndCountry.empty() || PlainNameKey(locale.languageAndCountry.c_str(), localeKey);
    if (!plainLanguage || !plainLocale) {
      m_withoutPlainKey.push_back(i);
      continue;
    }
    m_byPlainKey[languageKey].push_back(i);
    if (!locale.languageAndCountry.empty() && localeKey != languageKey) m_byPlainKey[localeKey].push_back(i);
  }
}

std::vector<size_t> LocaleNameCatalog::Candidates(const wchar_t* name) const {
  std::wstring key;
  if (!PlainNameKey(name, key)) {
    std::vector<size_t> all(m_locales.size());
    for (size_t i = 0; i < all.size(); ++i) all[i] = i;
    return all;
  }
  std::vector<size_t> candidates = m_withoutPlainKey;
  const auto keyed = m_byPlainKey.find(key);
  if (keyed != m_byPlainKey.end()) candidates.insert(candidates.end(), keyed->second.begin(), keyed->second.end());
  std::sort(candidates.begin(), candidates.end());
  return candidates;
}

bool LocaleNameCatalog::LangIdFromName(const wchar_t* name, unsigned short& langId) const {
  langId = 0;
  if (!name) return false;
  for (size_t i : Candidates(name)) {
    LANGID named = 0;
    if (MatchFolderName(name, m_locales[i], named)) {
      langId = named;
      return true;
    }
  }
  return false;
}

}  // namespace KVELLocale
