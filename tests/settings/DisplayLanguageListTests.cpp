// The display-language list of Advanced Configuration as a rule: packs found, Windows language and
// stored choice in; entries, selection, warning and the removal of a stale choice out.
#include <gtest/gtest.h>

#include <ostream>

#include "settings/DisplayLanguageList.h"

bool operator==(const DisplayLanguageEntry& left, const DisplayLanguageEntry& right) {
  return left.text == right.text && left.langId == right.langId;
}

void PrintTo(const DisplayLanguageEntry& entry, std::ostream* out) {
  *out << testing::PrintToString(entry.text) << " with data 0x" << std::hex << entry.langId;
}

namespace {

using Entries = std::vector<DisplayLanguageEntry>;

constexpr wchar_t kWindowsEntry[] = L"Display language (Deutsch - Deutschland)";
constexpr wchar_t kAustrianGerman[] = L"Deutsch (\u00d6sterreich)";
constexpr wchar_t kEnglishUS[] = L"English (United States)";

constexpr LANGID kGermanAustria = 0x0C07;
constexpr LANGID kFrench = 0x000C;
constexpr LANGID kEnglishUnitedStates = 0x0409;
constexpr LANGID kItalian = 0x0410;

LanguagePackFolder Pack(const wchar_t* name, LANGID langId, const wchar_t* entryText) {
  return {name, langId, CString(entryText)};
}

const LanguagePackFolder kAustrianPack = Pack(L"de-AT", kGermanAustria, kAustrianGerman);
const LanguagePackFolder kFrenchPack = Pack(L"fr", kFrench, L"fran\u00e7ais");
const LanguagePackFolder kEnglishUSPack = Pack(L"en-US", kEnglishUnitedStates, kEnglishUS);

DisplayLanguageInput Input(std::vector<ProductLanguagePacks> products, DWORD storedLangId = 0) {
  DisplayLanguageInput input;
  input.windowsEntryText = kWindowsEntry;
  input.uiLocaleName = L"de-DE";
  input.products = std::move(products);
  input.storedLangId = storedLangId;
  return input;
}

// The entries after the two fixed ones.
Entries PackEntries(const DisplayLanguageList& list) {
  if (list.entries.size() < 2) return {};
  return Entries(list.entries.begin() + 2, list.entries.end());
}

TEST(DisplayLanguageList, StartsWithTheWindowsLanguageAndEnglish) {
  const DisplayLanguageList list = BuildDisplayLanguageList(Input({{kFrenchPack}}));

  ASSERT_GE(list.entries.size(), 2u);
  const Entries firstTwo(list.entries.begin(), list.entries.begin() + 2);
  EXPECT_EQ(firstTwo, (Entries{{kWindowsEntry, 0}, {L"English", 9}}));
}

struct ListingRow {
  const char* name;
  std::vector<ProductLanguagePacks> products;
  Entries listed;  // after the two fixed entries
};

void PrintTo(const ListingRow& row, std::ostream* out) { *out << row.name; }

class Listing : public testing::TestWithParam<ListingRow> {};

TEST_P(Listing, ListsEachLanguageOnce) {
  const DisplayLanguageList list = BuildDisplayLanguageList(Input(GetParam().products));

  EXPECT_EQ(PackEntries(list), GetParam().listed);
}

INSTANTIATE_TEST_SUITE_P(
    Packs, Listing,
    testing::Values(
        ListingRow{"NothingInstalled", {}, {}},
        ListingRow{"DesktopBeforeEngineInFoundOrder",
                   {{kFrenchPack, kAustrianPack}, {Pack(L"ja", 0x0011, L"\u65e5\u672c\u8a9e")}},
                   {{L"fran\u00e7ais", kFrench}, {kAustrianGerman, kGermanAustria}, {L"\u65e5\u672c\u8a9e", 0x0011}}},
        ListingRow{
            "SamePackUnderBothProductsOnce", {{kAustrianPack}, {kAustrianPack}}, {{kAustrianGerman, kGermanAustria}}},
        ListingRow{"SameTextIgnoringCaseOnce",
                   {{kAustrianPack, Pack(L"de-at", kGermanAustria, L"DEUTSCH (\u00d6STERREICH)")}},
                   {{kAustrianGerman, kGermanAustria}}},
        ListingRow{"EnglishPackIsTheFixedEnglishEntry", {{Pack(L"en", 0x0009, L"English")}}, {}},
        ListingRow{
            "EnglishUSOncePerFolder",
            {{kEnglishUSPack}, {kEnglishUSPack, Pack(L"EN-us", kEnglishUnitedStates, L"english (united states)")}},
            {{kEnglishUS, kEnglishUnitedStates},
             {kEnglishUS, kEnglishUnitedStates},
             {L"english (united states)", kEnglishUnitedStates}}},
        ListingRow{"PackWithoutNativeNameNotListed", {{LanguagePackFolder{L"qps-ploc", 0x0501, std::nullopt}}}, {}}),
    [](const testing::TestParamInfo<ListingRow>& info) { return std::string(info.param.name); });

struct SelectionRow {
  const char* name;
  DWORD stored;
  ProductLanguagePacks packs;
  int selection;
  DWORD selectedLangId;
  bool forgetStoredLanguage;
};

void PrintTo(const SelectionRow& row, std::ostream* out) { *out << row.name; }

class Selection : public testing::TestWithParam<SelectionRow> {};

TEST_P(Selection, SelectsTheStoredLanguageOrForgetsIt) {
  const SelectionRow& row = GetParam();

  const DisplayLanguageList list = BuildDisplayLanguageList(Input({row.packs}, row.stored));

  EXPECT_EQ(list.selection, row.selection);
  EXPECT_EQ(list.selectedLangId, row.selectedLangId);
  EXPECT_EQ(list.forgetStoredLanguage, row.forgetStoredLanguage);
}

INSTANTIATE_TEST_SUITE_P(
    StoredLanguages, Selection,
    testing::Values(SelectionRow{"NoneStoredIsTheWindowsLanguage", 0, {kAustrianPack}, 0, 0, false},
                    SelectionRow{"EnglishNeedsNoPack", 9, {}, 1, 9, false},
                    SelectionRow{"EnglishIsTheFixedEntryWhateverElseIsListed",
                                 9,
                                 {Pack(L"en-XX", 0x0009, L"English (made-up country)")},
                                 1,
                                 9,
                                 false},
                    SelectionRow{"StoredPack", kGermanAustria, {kFrenchPack, kAustrianPack}, 3, kGermanAustria, false},
                    SelectionRow{"LastOfSeveralEntriesWins",
                                 kEnglishUnitedStates,
                                 {kEnglishUSPack, kAustrianPack, kEnglishUSPack},
                                 4,
                                 kEnglishUnitedStates,
                                 false},
                    SelectionRow{"LanguageWhosePackHasGone", kItalian, {kAustrianPack}, 0, 0, true}),
    [](const testing::TestParamInfo<SelectionRow>& info) { return std::string(info.param.name); });

// Whether a pack serves the Windows UI language. Only the folder names matter here.
struct PackFoundRow {
  const char* name;
  const wchar_t* uiLocaleName;
  std::vector<std::vector<const wchar_t*>> folders;  // per installed product
  bool found;
};

void PrintTo(const PackFoundRow& row, std::ostream* out) { *out << row.name; }

class WindowsLanguagePack : public testing::TestWithParam<PackFoundRow> {};

TEST_P(WindowsLanguagePack, IsFoundOnlyInTheLastScannedProduct) {
  const PackFoundRow& row = GetParam();
  DisplayLanguageInput input = Input({});
  input.uiLocaleName = row.uiLocaleName;
  for (const std::vector<const wchar_t*>& names : row.folders) {
    ProductLanguagePacks packs;
    for (const wchar_t* name : names) packs.push_back(Pack(name, kGermanAustria, name));
    input.products.push_back(packs);
  }

  EXPECT_EQ(BuildDisplayLanguageList(input).windowsLanguagePackFound, row.found);
}

INSTANTIATE_TEST_SUITE_P(
    Folders, WindowsLanguagePack,
    testing::Values(PackFoundRow{"EnglishUSNeedsNoPack", L"en-US", {{}}, true},
                    PackFoundRow{"NothingScannedWithoutProducts", L"en-US", {}, false},
                    PackFoundRow{"CountryPack", L"de-DE", {{L"fr-FR", L"de-DE"}}, true},
                    PackFoundRow{"FolderCaseIgnored", L"de-DE", {{L"DE-de"}}, true},
                    PackFoundRow{"LanguagePackServesEveryCountry", L"de-DE", {{L"de"}}, true},
                    PackFoundRow{"OtherCountryDoesNotServe", L"de-DE", {{L"de-AT"}}, false},
                    PackFoundRow{"EngineScanForgetsTheDesktopPack", L"de-DE", {{L"de-DE"}, {L"fr-FR"}}, false},
                    // Any language-only folder shortens the name for the rest of the build.
                    PackFoundRow{"ShortenedNameMissesACountryPack", L"de-DE", {{L"ja"}, {L"de-DE"}}, false},
                    PackFoundRow{"ShortenedNameFindsALanguagePack", L"de-DE", {{L"ja"}, {L"de"}}, true},
                    PackFoundRow{"ShortenedEnglishIsNoLongerEnglishUS", L"en-US", {{L"ja"}, {L"de-AT"}}, false},
                    PackFoundRow{"UnknownWindowsLanguage", L"", {{L"de", L"de-DE"}}, false}),
    [](const testing::TestParamInfo<PackFoundRow>& info) { return std::string(info.param.name); });

struct WarningRow {
  const char* name;
  bool packFound;
  int selectedIndex;
  bool shows;
};

void PrintTo(const WarningRow& row, std::ostream* out) { *out << row.name; }

class LanguagePackWarning : public testing::TestWithParam<WarningRow> {};

TEST_P(LanguagePackWarning, ShowsOnlyForTheWindowsLanguageWithoutPack) {
  EXPECT_EQ(ShowsLanguagePackWarning(GetParam().packFound, GetParam().selectedIndex), GetParam().shows);
}

INSTANTIATE_TEST_SUITE_P(Selections, LanguagePackWarning,
                         testing::Values(WarningRow{"WindowsLanguageWithoutPack", false, 0, true},
                                         WarningRow{"EnglishWithoutPack", false, 1, false},
                                         WarningRow{"OtherPackWithoutPack", false, 2, false},
                                         WarningRow{"WindowsLanguageWithPack", true, 0, false}),
                         [](const testing::TestParamInfo<WarningRow>& info) { return std::string(info.param.name); });

}  // namespace
