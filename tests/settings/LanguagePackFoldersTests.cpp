// Recognising language-pack folders: the one matching rule for folder names, the catalog that
// applies it to many names at once, and the search of the installed products' bin folders.
#include <gtest/gtest.h>

#include <algorithm>
#include <ostream>

#include "inventory/InstalledProducts.h"
#include "locale/LocaleInternals.h"
#include "locale/LocaleNameCatalog.h"
#include "settings/LanguagePackFolders.h"
#include "tests/support/TestSupport.h"

bool operator==(const LanguagePackFolder& left, const LanguagePackFolder& right) {
  return left.name == right.name && left.langId == right.langId && left.entryText == right.entryText;
}

void PrintTo(const LanguagePackFolder& folder, std::ostream* out) {
  *out << testing::PrintToString(folder.name) << " as 0x" << std::hex << folder.langId << " "
       << testing::PrintToString(folder.entryText.value_or(L"(no entry text)"));
}

namespace {

using KVELLocale::LocaleIsoNames;
using KVELLocale::LocaleNameCatalog;

constexpr LANGID kUntouched = 0xFFFF;

const LocaleIsoNames kFrenchCanada = {0x0C0C, L"fr", L"fr-CA"};
const LocaleIsoNames kFrenchWithoutCountry = {0x0C0C, L"fr", L""};

struct MatchRow {
  const char* name;
  LocaleIsoNames locale;
  const wchar_t* folderName;
  LANGID langId;  // kUntouched: the name does not name the locale
};

void PrintTo(const MatchRow& row, std::ostream* out) { *out << row.name; }

class FolderName : public testing::TestWithParam<MatchRow> {};

TEST_P(FolderName, NamesALanguageOrAWholeLocale) {
  const MatchRow& row = GetParam();
  LANGID langId = kUntouched;

  const bool matches = KVELLocale::MatchFolderName(row.folderName, row.locale, langId);

  EXPECT_EQ(matches, row.langId != kUntouched);
  EXPECT_EQ(langId, row.langId);
}

INSTANTIATE_TEST_SUITE_P(
    Names, FolderName,
    testing::Values(MatchRow{"LanguageAloneNamesThePrimaryLanguage", kFrenchCanada, L"fr", 0x000C},
                    MatchRow{"LanguageAndCountryNameTheLocale", kFrenchCanada, L"fr-CA", 0x0C0C},
                    MatchRow{"CaseIgnored", kFrenchCanada, L"FR-ca", 0x0C0C},
                    MatchRow{"OtherCountry", kFrenchCanada, L"fr-FR", kUntouched},
                    MatchRow{"DanglingHyphen", kFrenchCanada, L"fr-", kUntouched},
                    MatchRow{"CountryAlone", kFrenchCanada, L"CA", kUntouched},
                    MatchRow{"EmptyName", kFrenchCanada, L"", kUntouched},
                    MatchRow{"UnknownCountryStillKnowsTheLanguage", kFrenchWithoutCountry, L"fr", 0x000C},
                    MatchRow{"UnknownCountryNamesNoLocale", kFrenchWithoutCountry, L"fr-CA", kUntouched}),
    [](const testing::TestParamInfo<MatchRow>& info) { return std::string(info.param.name); });

TEST(LocaleNameCatalog, FirstLocaleInItsOrderWins) {
  // A made-up locale listed before the real one under the same names.
  const LocaleNameCatalog catalog({{0x0407, L"pt", L"pt-BR"}, {0x0416, L"pt", L"pt-BR"}});
  unsigned short language = kUntouched;
  unsigned short locale = kUntouched;

  EXPECT_TRUE(catalog.LangIdFromName(L"pt", language));
  EXPECT_TRUE(catalog.LangIdFromName(L"pt-BR", locale));

  EXPECT_EQ(language, 0x0007);
  EXPECT_EQ(locale, 0x0407);
}

TEST(LocaleNameCatalog, UnknownNameGivesZero) {
  const LocaleNameCatalog catalog({kFrenchCanada});
  unsigned short langId = kUntouched;

  EXPECT_FALSE(catalog.LangIdFromName(L"xx", langId));

  EXPECT_EQ(langId, 0);
}

TEST(LocaleNameCatalog, ResolvesEveryNameAsTheLocaleWalkDoes) {
  const LocaleNameCatalog catalog = LocaleNameCatalog::FromSystem();
  ASSERT_FALSE(catalog.Locales().empty());
  const wchar_t* names[] = {L"fr", L"fr-CA", L"PT-br", L"de",  L"de-AT", L"en",      L"en-US", L"zh-CN",
                            L"sr", L"ar-SA", L"xx",    L"fr-", L"",      L"de-DE-x", L"-DE"};
  for (const wchar_t* name : names) {
    unsigned short fromCatalog = kUntouched;
    unsigned short fromWalk = kUntouched;
    const bool foundInCatalog = catalog.LangIdFromName(name, fromCatalog);
    const bool foundByWalk = KVELLocale::GetLangIDFromName(name, fromWalk);
    EXPECT_EQ(foundInCatalog, foundByWalk) << "folder name " << testing::PrintToString(std::wstring(name));
    EXPECT_EQ(fromCatalog, fromWalk) << "folder name " << testing::PrintToString(std::wstring(name));
  }
}

struct UILocaleRow {
  LANGID uiLang;
  const wchar_t* name;
};

TEST(UILocaleName, IsLanguageHyphenCountry) {
  const UILocaleRow rows[] = {{0x0407, L"de-DE"}, {0x0C0C, L"fr-CA"}, {0x0409, L"en-US"}};
  for (const UILocaleRow& row : rows) EXPECT_EQ(UILocaleName(row.uiLang), row.name) << "LANGID " << row.uiLang;
}

// Desktop and Engine installed under a folder of this process's own, in hives of its own.
class InstalledPacks : public testing::Test {
 protected:
  InstalledPacks() {
    m_products.desktopKey = kDesktopKey;
    m_products.engineKey = kEngineKey;
  }

  static constexpr wchar_t kDesktopKey[] = L"SOFTWARE\\KVEL\\Desktop10.5";
  static constexpr wchar_t kEngineKey[] = L"SOFTWARE\\KVEL\\Engine10.5";

  testing_support::ScopedHiveOverride m_hives;
  testing_support::ScopedDirectory m_folders{testing_support::ModuleFolder() + L"\\pack-folders-" +
                                             std::to_wstring(GetCurrentProcessId())};
  testing_support::ScopedRegistryKey m_desktop{HKEY_LOCAL_MACHINE, kDesktopKey};
  testing_support::ScopedRegistryKey m_engine{HKEY_LOCAL_MACHINE, kEngineKey};
  InstalledProducts m_products;
};

TEST_F(InstalledPacks, AreTheFoldersNamingALocale) {
  m_folders.MakeDir(L"desktop\\bin\\de-AT");
  m_folders.MakeDir(L"desktop\\bin\\de");
  m_folders.MakeDir(L"desktop\\bin\\xx-YY");
  m_folders.MakeFile(L"desktop\\bin\\it");
  m_folders.MakeDir(L"engine\\bin\\DE-at");
  // A trailing backslash gives a doubled one in the search, which the file system accepts.
  m_desktop.SetString(L"InstallDir", m_folders.Path() + L"\\desktop\\");
  m_engine.SetString(L"InstallDir", m_folders.Path() + L"\\engine");
  m_products.desktopInstalled = true;
  m_products.engineInstalled = true;

  std::vector<ProductLanguagePacks> found = FindLanguagePackFolders(m_products);

  ASSERT_EQ(found.size(), 2u);
  // The file system's order is its own.
  std::sort(found[0].begin(), found[0].end(), [](auto& left, auto& right) { return left.name < right.name; });
  const CString austrianGerman = L"Deutsch (\u00d6sterreich)";
  EXPECT_EQ(found[0], (ProductLanguagePacks{{L"de", 0x0007, CString(L"Deutsch")}, {L"de-AT", 0x0C07, austrianGerman}}));
  EXPECT_EQ(found[1], (ProductLanguagePacks{{L"DE-at", 0x0C07, austrianGerman}}));
}

TEST_F(InstalledPacks, OnlyOfInstalledProducts) {
  m_folders.MakeDir(L"desktop\\bin\\fr");
  m_folders.MakeDir(L"engine\\bin\\de");
  m_desktop.SetString(L"InstallDir", m_folders.Path() + L"\\desktop");
  m_engine.SetString(L"InstallDir", m_folders.Path() + L"\\engine");
  m_products.engineInstalled = true;

  const std::vector<ProductLanguagePacks> found = FindLanguagePackFolders(m_products);

  ASSERT_EQ(found.size(), 1u);
  EXPECT_EQ(found[0], (ProductLanguagePacks{{L"de", 0x0007, CString(L"Deutsch")}}));
}

}  // namespace
