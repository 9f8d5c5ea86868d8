// The display-language list as a rule (packs found, Windows language and stored choice in;
// entries, selection and warning out), and how pack folders are recognised by name.
#include <gtest/gtest.h>

#include "locale/LocaleInternals.h"
#include "locale/LocaleNameCatalog.h"
#include "settings/LanguagePackFolders.h"

namespace {

std::wstring Shown(const CString& text, DWORD langId) { return text + L" = " + std::to_wstring(langId); }  // an entry

constexpr wchar_t kWindowsEntry[] = L"Display language (Deutsch - Deutschland)";
constexpr wchar_t kAustrianGerman[] = L"Deutsch (\u00d6sterreich)";
const LanguagePackFolder kAustrian = {L"de-AT", 0x0C07, kAustrianGerman};
const LanguagePackFolder kFrench = {L"fr", 0x000C, L"fran\u00e7ais"};
const LanguagePackFolder kJapanese = {L"ja", 0x0011, L"\u65e5\u672c\u8a9e"};
const LanguagePackFolder kEnglishUS = {L"en-US", 0x0409, L"English (United States)"};
const LanguagePackFolder kEnglishUSLower = {L"EN-us", 0x0409, L"english (united states)"};
const LanguagePackFolder kEnglishXX = {L"en-XX", 9, L"English (XX)"};
LanguagePackFolder Folder(const wchar_t* name) { return {name, 0x0407, std::nullopt}; }  // only its name counts

TEST(DisplayLanguageList, ListsSelectsAndWarns) {
  const struct {
    const char* name;
    const wchar_t* uiLocaleName;                 // of the Windows language
    std::vector<ProductLanguagePacks> products;  // Desktop, then Engine
    DWORD stored;
    ProductLanguagePacks listed;  // after the Windows language and English
    int selection;
    bool forgotten, packFound, warning;  // stored choice dropped; a pack serves the Windows language; warning shows
  } rows[] = {
      {"NoProductNothingScanned", L"en-US", {}, 0, {}, 0, false, false, true},
      {"EnglishUSWindowsNeedsNoPack", L"en-US", {{}}, 0, {}, 0, false, true, false},
      {"DesktopFirstNamedOnlyStoredSelected", L"de-DE", {{kFrench, {L"qps-ploc", 0x0501, {}}, kAustrian}, {kJapanese}},
       0x0C07, {kFrench, kAustrian, kJapanese}, 3, false, false, false},
      {"SameTextOnceAnyCase", L"de-DE", {{kAustrian, {L"de-at", 0x0C07, L"DEUTSCH (\u00d6STERREICH)"}}, {kAustrian}},
       0, {kAustrian}, 0, false, false, true},
      {"EnglishUSPerFolderLastWins", L"de-DE", {{kEnglishUS}, {kEnglishUS, kEnglishUSLower}}, 0x0409,
       {kEnglishUS, kEnglishUS, kEnglishUSLower}, 4, false, false, false},
      {"EnglishIsEntryOne", L"de-DE", {{{L"en", 9, L"English"}, kEnglishXX}}, 9, {kEnglishXX}, 1, false, false, false},
      {"StaleLanguageForgotten", L"de-DE", {{kAustrian}}, 0x0410, {kAustrian}, 0, true, false, true},
      {"CountryPackCaseIgnored", L"de-DE", {{Folder(L"fr-FR"), Folder(L"DE-de")}}, 0, {}, 0, false, true, false},
      {"LanguagePackServesEveryCountry", L"de-DE", {{Folder(L"de")}}, 0, {}, 0, false, true, false},
      {"EngineForgetsDesktopPack", L"de-DE", {{Folder(L"de-DE")}, {Folder(L"fr-FR")}}, 0, {}, 0, false, false, true},
      // A language-only folder shortens the Windows language's name for the rest of the list.
      {"ShortenedMissesCountryPack", L"de-DE", {{Folder(L"ja")}, {Folder(L"de-DE")}}, 0, {}, 0, false, false, true},
      {"ShortenedEnglishIsNotEnglishUS", L"en-US", {{Folder(L"ja")}, {Folder(L"de-AT")}}, 0, {}, 0, false, false, true},
  };
  for (const auto& row : rows) {
    SCOPED_TRACE(row.name);
    const auto list = BuildDisplayLanguageList({kWindowsEntry, row.uiLocaleName, row.products, row.stored});

    std::vector<std::wstring> entries, expected = {Shown(kWindowsEntry, 0), Shown(L"English", 9)};
    for (const DisplayLanguageEntry& entry : list.entries) entries.push_back(Shown(entry.text, entry.langId));
    for (const LanguagePackFolder& pack : row.listed) expected.push_back(Shown(*pack.entryText, pack.langId));
    EXPECT_EQ(entries, expected);
    EXPECT_EQ(list.selection, row.selection);
    EXPECT_EQ(list.selectedLangId, list.entries.at(list.selection).langId);
    EXPECT_EQ(list.forgetStoredLanguage, row.forgotten);
    EXPECT_EQ(list.windowsLanguagePackFound, row.packFound);
    EXPECT_EQ(ShowsLanguagePackWarning(list.windowsLanguagePackFound, list.selection), row.warning);
  }
}

TEST(LocaleNameCatalog, NamesALanguageOrAWholeLocaleFirstInItsOrder) {
  // Japanese without a known country; a made-up pt-BR before the real one.
  const KVELLocale::LocaleNameCatalog catalog(
      {{0x0C0C, L"fr", L"fr-CA"}, {0x0411, L"ja", L""}, {0x0407, L"pt", L"pt-BR"}, {0x0416, L"pt", L"pt-BR"}});
  const struct { const char* name; const wchar_t* folder; LANGID langId; /* 0: none */ } rows[] = {
      {"LanguageAloneIsThePrimaryLanguage", L"fr", 0x000C}, {"LanguageAndCountryIsTheLocale", L"fr-CA", 0x0C0C},
      {"CaseIgnored", L"FR-ca", 0x0C0C}, {"OtherCountry", L"fr-FR", 0}, {"DanglingHyphen", L"fr-", 0},
      {"CountryAlone", L"CA", 0}, {"EmptyNameIsNoUnknownCountry", L"", 0}, {"UnknownLanguage", L"xx", 0},
      {"UnknownCountryStillKnowsTheLanguage", L"ja", 0x0011}, {"FirstInTheCatalogWins", L"pt-BR", 0x0407},
  };
  for (const auto& row : rows) {
    SCOPED_TRACE(row.name);
    unsigned short langId = 0xFFFF;
    EXPECT_EQ(catalog.LangIdFromName(row.folder, langId), row.langId != 0);
    EXPECT_EQ(langId, row.langId);
  }
  EXPECT_EQ(UILocaleName(0x0C0C), L"fr-CA");
}

// The exported walk over the system's locales, and the catalog of them giving the same: names the
// catalog narrows down by their letters, and names it must compare with every locale.
TEST(LocaleNameCatalog, SystemCatalogFindsWhatTheEnumerationFinds) {
  const struct { const wchar_t* folder; int langId; /* -1: whatever the walk finds */ } rows[] = {
      {L"fr", 0x000C},  {L"FR-ca", 0x0C0C},      {L"xx", 0},           {L"fr-", 0},        {nullptr, 0},
      {L"de-AT", -1},   {L"deAT", -1},           {L"de-", -1},         {L"-de", -1},       {L"zh-CN", -1},
      {L"es-419", -1},  {L"id-ID", -1},          {L"ID-id", -1},       {L"", -1},          {L"de_AT", -1},
      {L"fr-CA ", -1},  {L"d\u00e9", -1},        {L"de\u00ad-AT", -1}, {L"fr-\u0421A", -1}, {L"\uff46\uff52", -1},
      {L"sr-Latn-RS", -1},
  };
  const KVELLocale::LocaleNameCatalog catalog = KVELLocale::LocaleNameCatalog::FromSystem();
  ASSERT_GT(catalog.Locales().size(), 100u);
  for (const auto& row : rows) {
    SCOPED_TRACE(testing::Message() << "folder \"" << row.folder << "\"");
    unsigned short walked = 0xFFFF, got = 0xFFFF;
    const bool found = KVELLocale::GetLangIDFromName(row.folder, walked);
    if (row.langId >= 0) {
      EXPECT_EQ(walked, row.langId);
    }
    EXPECT_EQ(found, walked != 0);
    EXPECT_EQ(catalog.LangIdFromName(row.folder, got), found);
    EXPECT_EQ(got, walked);
  }
}

}  // namespace
