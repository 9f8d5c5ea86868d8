// The display-language list: which packs are listed, when the missing-pack warning shows, and
// how the stored choice is selected or corrected. Each process runs under one Windows UI
// language and takes the cases written for it.
#include <gtest/gtest.h>

#include <algorithm>

#include "res/resource.h"
#include "tests/settings/SettingsTestSupport.h"

using settings_tests::OpenDialog;
using settings_tests::Workstation;

namespace {

constexpr LANGID kEnUS = 0x0409, kDeDE = 0x0407, kFrCA = 0x0C0C;

#define REQUIRE_UI_LANGUAGE(uiLang) \
  if (GetUserDefaultUILanguage() != (uiLang)) GTEST_SKIP() << "written for another Windows UI language"

struct WindowsLanguageCase {
  LANGID uiLang;
  const wchar_t* entry;
  const wchar_t* warning;
};

const WindowsLanguageCase kWindowsLanguageCases[] = {
    {kEnUS, L"Display language (English - United States)", L"Warning: Mapora English language pack"},
    {kDeDE, L"Display language (Deutsch - Deutschland)", L"Warning: Mapora Deutsch language pack"},
    {kFrCA, L"Display language (fran\u00e7ais - Canada)", L"Warning: Mapora fran\u00e7ais language pack"},
};

class WindowsLanguageEntry : public testing::TestWithParam<WindowsLanguageCase> {};

TEST_P(WindowsLanguageEntry, NamesTheLanguageAndItsCountryAndTheWarningTheLanguageAlone) {
  const WindowsLanguageCase& c = GetParam();
  REQUIRE_UI_LANGUAGE(c.uiLang);
  Workstation ws;
  OpenDialog dlg(ws.mainDlg);
  auto entries = dlg.Entries();
  ASSERT_EQ(entries.size(), 2u);
  EXPECT_EQ(entries[0], std::make_pair(std::wstring(c.entry), DWORD{0}));
  EXPECT_EQ(entries[1], std::make_pair(std::wstring(L"English"), DWORD{9}));
  std::wstring warning = GetWindowTextOf(dlg.Item(IDC_LANGUAGE_WARNING));
  EXPECT_EQ(warning.rfind(c.warning, 0), 0u) << warning;
  EXPECT_NE(warning.find(L"Mapora UI will display as English."), std::wstring::npos);

  // The dropped-down list is 512 pixels high, the selection field included (some systems report
  // the dropped-down part without it).
  RECT dropped = {}, field = {};
  SendMessageW(dlg.Item(IDC_LANGUAGE_LIST), CB_GETDROPPEDCONTROLRECT, 0, reinterpret_cast<LPARAM>(&dropped));
  GetWindowRect(dlg.Item(IDC_LANGUAGE_LIST), &field);
  const LONG height = dropped.bottom - dropped.top;
  EXPECT_TRUE(height == 512 || height + (field.bottom - field.top) == 512) << height;
}

INSTANTIATE_TEST_SUITE_P(ByWindowsLanguage, WindowsLanguageEntry, testing::ValuesIn(kWindowsLanguageCases));

struct PackCase {
  const char* name;
  LANGID uiLang;
  bool desktop;
  std::vector<std::wstring> desktopPacks;
  bool engine;
  std::vector<std::wstring> enginePacks;
  std::vector<DWORD> listed;  // item data of the pack entries, sorted (folder order is the disk's)
  bool warning;               // with the Windows language entry selected
};

const PackCase kPackCases[] = {
    {"EnglishWindowsNeverWarns", kEnUS, true, {L"de", L"de-AT", L"en", L"en-US", L"ja"}, false, {},
     {0x0007, 0x0011, 0x0409, 0x0C07}, false},
    {"EngineScanComparesShortenedName", kEnUS, true, {L"ja"}, true, {L"de-AT"}, {0x0011, 0x0C07}, true},
    {"EnglishUSListedOncePerFolder", kEnUS, true, {L"en-US"}, true, {L"en-US", L"de"},
     {0x0007, 0x0409, 0x0409}, false},
    {"LanguageOnlyPackServesCountry", kDeDE, true, {L"de"}, false, {}, {0x0007}, false},
    {"OtherCountryDoesNotServe", kDeDE, true, {L"de-AT"}, false, {}, {0x0C07}, true},
    {"MatchUnderDesktopOnlyStillWarns", kDeDE, true, {L"de-DE"}, true, {L"ja"}, {0x0011, 0x0407}, true},
    {"SamePackUnderBothListedOnce", kDeDE, true, {L"de-DE", L"en-US"}, true, {L"de-DE"}, {0x0407, 0x0409}, false},
    {"CanadianFrenchFromLanguagePack", kFrCA, true, {L"fr", L"de"}, false, {}, {0x0007, 0x000C}, false},
    {"CanadianFrenchFromCountryPack", kFrCA, true, {L"fr-FR"}, true, {L"fr-CA"}, {0x040C, 0x0C0C}, false},
    {"FranceIsNotCanada", kFrCA, false, {}, true, {L"fr-FR", L"en-US"}, {0x0409, 0x040C}, true},
    {"NoProducts", kFrCA, false, {L"fr"}, false, {}, {}, true},
};

class LanguagePacks : public testing::TestWithParam<PackCase> {};

TEST_P(LanguagePacks, ListsPacksAndWarnsOnlyForTheWindowsEntryWithoutAMatchingPack) {
  const PackCase& c = GetParam();
  REQUIRE_UI_LANGUAGE(c.uiLang);
  Workstation ws;
  if (c.desktop) ws.InstallDesktop(c.desktopPacks);
  if (c.engine) ws.InstallEngine(c.enginePacks);
  OpenDialog dlg(ws.mainDlg);

  auto entries = dlg.Entries();
  ASSERT_GE(entries.size(), 2u);
  std::vector<DWORD> listed;
  for (size_t i = 2; i < entries.size(); ++i) listed.push_back(entries[i].second);
  std::sort(listed.begin(), listed.end());
  EXPECT_EQ(listed, c.listed);
  EXPECT_EQ(dlg.Selection(), 0);
  EXPECT_EQ(dlg.Shown(IDC_LANGUAGE_WARNING), c.warning);

  // Any other entry hides the warning; going back to the Windows entry brings it back.
  settings_tests::SelectLanguage(dlg.m_hWnd, 1);
  EXPECT_FALSE(dlg.Shown(IDC_LANGUAGE_WARNING));
  EXPECT_EQ(dlg.m_selectedLangId, 9u);
  settings_tests::SelectLanguage(dlg.m_hWnd, 0);
  EXPECT_EQ(dlg.Shown(IDC_LANGUAGE_WARNING), c.warning);
  EXPECT_EQ(dlg.m_selectedLangId, 0u);
}

INSTANTIATE_TEST_SUITE_P(ByWindowsLanguage, LanguagePacks, testing::ValuesIn(kPackCases),
                         [](const testing::TestParamInfo<PackCase>& info) { return info.param.name; });

TEST(LanguagePackEntries, ShowLanguageWithCountryOnlyForCountryPacksAndSkipEnglish) {
  Workstation ws;
  ws.InstallDesktop({L"de", L"de-AT", L"en", L"xx-YY", L"ja"});
  OpenDialog dlg(ws.mainDlg);
  auto entries = dlg.Entries();
  ASSERT_GE(entries.size(), 2u);
  std::sort(entries.begin() + 2, entries.end(),
            [](const auto& a, const auto& b) { return a.second < b.second; });
  using Entries = std::vector<std::pair<std::wstring, DWORD>>;
  const Entries packs = {
      {L"Deutsch", 0x0007}, {L"\u65e5\u672c\u8a9e", 0x0011}, {L"Deutsch (\u00d6sterreich)", 0x0C07}};
  EXPECT_EQ(Entries(entries.begin() + 2, entries.end()), packs);
}

struct SelectionCase {
  const char* name;
  DWORD stored;  // 0: no UILANGID stored
  std::vector<std::wstring> desktopPacks;
  std::vector<std::wstring> enginePacks;
  DWORD selectedData;
  bool corrected;  // the stored value is removed on opening
};

const SelectionCase kSelectionCases[] = {
    {"EnglishNeedsNoPack", 9, {}, {}, 9, false},
    {"PackLanguage", 0x0C07, {L"de", L"de-AT"}, {}, 0x0C07, false},
    {"PackGone", 0x0410, {L"de"}, {}, 0, true},
    {"EnglishUSNeedsItsPack", 0x0409, {L"en"}, {}, 0, true},
};

class StoredLanguage : public testing::TestWithParam<SelectionCase> {};

TEST_P(StoredLanguage, IsSelectedOrRemovedAtOnce) {
  const SelectionCase& c = GetParam();
  Workstation ws;
  ws.InstallDesktop(c.desktopPacks);
  ws.InstallEngine(c.enginePacks);
  if (c.stored != 0) ws.StoreLanguage(c.stored);
  OpenDialog dlg(ws.mainDlg);

  auto entries = dlg.Entries();
  ASSERT_GE(dlg.Selection(), 0);
  EXPECT_EQ(entries[static_cast<size_t>(dlg.Selection())].second, c.selectedData);
  EXPECT_EQ(dlg.m_selectedLangId, c.selectedData);
  EXPECT_EQ(ws.mainDlg.m_dwUILangID, c.selectedData);
  EXPECT_EQ(testing_support::ValueExists(HKEY_CURRENT_USER, L"SOFTWARE\\KVEL", L"UILANGID"),
            c.stored != 0 && !c.corrected);
}

INSTANTIATE_TEST_SUITE_P(Cases, StoredLanguage, testing::ValuesIn(kSelectionCases),
                         [](const testing::TestParamInfo<SelectionCase>& info) { return info.param.name; });

}  // namespace
