// Matching LANGIDs and language-pack folder names against the system's supported locales.
#include "locale/LocaleInternals.h"
#include "locale/LocaleNameCatalog.h"

#include <algorithm>
#include <utility>
#include <vector>

namespace KVELLocale {

namespace {

struct LocaleWalk {
  LocaleVisitor visit;
  void* context;
};

// Neutral locales (a language alone) and the invariant one are no supported locale; locales
// without an identifier of their own (added by a user or an application) are passed over. A name
// the system cannot map at all ends the walk.
BOOL CALLBACK VisitLocale(LPWSTR name, DWORD flags, LPARAM context) {
  if ((flags & LOCALE_SPECIFICDATA) == 0 || name == nullptr || name[0] == L'\0') return TRUE;
  const LCID locale = LocaleNameToLCID(name, 0);
  if (locale == LOCALE_CUSTOM_UNSPECIFIED || locale == LOCALE_CUSTOM_DEFAULT || locale == LOCALE_CUSTOM_UI_DEFAULT)
    return TRUE;
  const LANGID id = LANGIDFROMLCID(locale);
  if (id == 0) return FALSE;
  const auto* walk = reinterpret_cast<const LocaleWalk*>(context);
  return walk->visit(id, walk->context) ? TRUE : FALSE;
}

struct NameSearch {
  const wchar_t* name;
  bool found = false;
  LANGID langId = 0;
};

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

}  // namespace

void WalkSupportedLocales(LocaleVisitor visit, void* context) {
  LocaleWalk walk = {visit, context};
  EnumSystemLocalesEx(VisitLocale, LOCALE_WINDOWS, reinterpret_cast<LPARAM>(&walk), nullptr);
}

bool ReadLocaleInfo(LCID locale, LCTYPE type, int capacity, std::wstring& data) {
  std::vector<wchar_t> buffer(static_cast<size_t>(capacity), L'\0');
  const int written = GetLocaleInfoW(locale, type, buffer.data(), capacity);
  if (written <= 0) return false;
  data.assign(buffer.data(), static_cast<size_t>(written));
  return true;
}

bool ReadLocaleText(LCID locale, LCTYPE type, int capacity, std::wstring& text) {
  std::wstring data;
  if (!ReadLocaleInfo(locale, type, capacity, data)) return false;
  text.assign(data.c_str());
  return true;
}

bool IsValidLangID(unsigned short langId) {
  // A primary language of 0 is no language at all.
  WORD primary = PRIMARYLANGID(langId);
  if (primary == 0) return false;
  bool found = false;
  struct Search {
    WORD primary;
    bool* found;
  } search = {primary, &found};
  // Any supported locale of the same primary language makes the target usable.
  WalkSupportedLocales(
      [](LANGID id, void* context) {
        auto* target = static_cast<Search*>(context);
        if (PRIMARYLANGID(id) != target->primary) return true;
        *target->found = true;
        return false;
      },
      &search);
  return found;
}

bool GetLangIDFromName(const wchar_t* name, unsigned short& langId) {
  langId = 0;
  if (!name) return false;
  NameSearch search = {name};
  WalkSupportedLocales(
      [](LANGID id, void* context) {
        auto* target = static_cast<NameSearch*>(context);
        LocaleIsoNames names;
        target->found = ReadLocaleIsoNames(id, names) && MatchFolderName(target->name, names, target->langId);
        return !target->found;
      },
      &search);
  langId = search.langId;
  return search.found;
}

bool ReadLocaleIsoNames(LANGID langId, LocaleIsoNames& names) {
  names = LocaleIsoNames();
  names.langId = langId;
  if (!ReadLocaleText(langId, LOCALE_SISO639LANGNAME, kLocaleNameChars, names.language)) return false;
  std::wstring country;
  if (ReadLocaleText(langId, LOCALE_SISO3166CTRYNAME, kLocaleNameChars, country))
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
  WalkSupportedLocales(
      [](LANGID id, void* context) {
        LocaleIsoNames names;
        if (ReadLocaleIsoNames(id, names))
          static_cast<std::vector<LocaleIsoNames>*>(context)->push_back(std::move(names));
        return true;
      },
      &locales);
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
