// Where the user locale and the UI language come from, and which language packs count.
#include <clocale>

#include "tests/locale/LocaleTestSupport.h"

using namespace KVELLocale;
using namespace locale_tests;

namespace {

const LocaleState& state = g_localeState;
const wchar_t kSettings[] = L"Software\\KVEL";

TEST(LanguageNames, FolderNamesAndIdentifiersMatchSupportedLocales) {
  const std::pair<const wchar_t*, unsigned short> names[] = {{L"fr", 0x000C},    {L"fr-CA", 0x0C0C},
                                                             {L"PT-br", 0x0416}, {L"xx", 0},
                                                             {L"fr-", 0},        {nullptr, 0}};
  for (const auto& name : names) {
    unsigned short langId = 0xFFFF;
    EXPECT_EQ(GetLangIDFromName(name.first, langId), name.second != 0) << name.second;
    EXPECT_EQ(langId, name.second);
  }
  // Any locale of the same primary language validates an identifier.
  const std::pair<unsigned short, bool> ids[] = {{0x040C, true}, {0x7C0C, true},  {0x0011, true},
                                                 {0, false},     {0x0400, false}, {0x03FF, false}};
  for (const auto& id : ids) EXPECT_EQ(IsValidLangID(id.first), id.second) << std::hex << id.first;
}

TEST(LocaleScenario, Override) {
  SKIP_UNLESS_FRESH_PROCESS_IN(0x0409);
  ScopedDirectory mapora(MaporaCommonFolder());
  mapora.MakeFile(L"bin\\ja\\ResOther.dll");
  ScopedRegistryKey settings(HKEY_CURRENT_USER, kSettings);
  settings.SetDword(L"UILANGID", 0x0407);
  EXPECT_FALSE(SetupEXEOverRide(0x0400)) << "no primary language";
  EXPECT_TRUE(SetupEXEOverRide(0x0411));
  EXPECT_FALSE(SetupEXEOverRide(0x040C)) << "one override is pending";
  EXPECT_EQ(GetUILocale(), 0x0411);
  EXPECT_EQ(std::wstring(state.uiLangDir), mapora.Path() + L"\\bin\\ja");
  EXPECT_EQ(GetLocale(), 0x0409);
}

// Only a 4-byte value naming a supported language counts, and only q4.exe reads Q4-UILANGID.
TEST(LocaleScenario, StoredLanguage) {
  SKIP_UNLESS_FRESH_PROCESS_IN(0x0409);
  ScopedDirectory mapora(MaporaCommonFolder());
  mapora.MakeFile(L"bin\\de\\ResOther.dll");
  ScopedRegistryKey settings(HKEY_CURRENT_USER, kSettings);
  if (Variant() == "dword") settings.SetDword(L"UILANGID", 0x0407);
  if (Variant() == "string") settings.SetString(L"UILANGID", L"1031");
  if (Variant() == "unknown") settings.SetDword(L"UILANGID", 0x03FF);
  if (Variant() == "q4-value") settings.SetDword(L"Q4-UILANGID", 0x0407);
  EXPECT_EQ(GetUILocale(), Variant() == "dword" ? 0x0407 : 0x0409);
}

TEST(LocaleScenario, MissingPackFallsBackToEnglish) {
  SKIP_UNLESS_FRESH_PROCESS_IN(0x0407);
  ScopedDirectory mapora(MaporaCommonFolder());
  for (const wchar_t* pack : {L"bin\\de", L"bin\\de-DE"}) {
    if (Variant() == "empty") mapora.MakeDir(pack);
    if (Variant() == "file") mapora.MakeFile(pack);
  }
  EXPECT_EQ(GetUILocale(), 0x0409);
  // The requested names stay, so that translated help is still found.
  EXPECT_EQ(std::wstring(GetUILangIDString()) + GetUICountryIDString(), L"deDE");
  EXPECT_EQ(std::wstring(state.uiLangDir) + state.uiLangCountryDir + state.langDir, L"");
  EXPECT_EQ(GetLocale(), 0x0407);
}

// With only the language-and-country pack, both folders are kept as formed.
TEST(LocaleScenario, UserAndUiPacks) {
  SKIP_UNLESS_FRESH_PROCESS_IN(0x040C);
  const bool countryOnly = Variant() == "country";
  ScopedDirectory mapora(MaporaCommonFolder());
  mapora.MakeFile(countryOnly ? L"bin\\fr-FR\\ResOther.dll" : L"bin\\fr\\ResOther.dll");
  const std::wstring langDir = mapora.Path() + L"\\bin\\fr";
  const std::wstring countryDir = countryOnly ? mapora.Path() + L"\\bin\\fr-FR" : L"";
  EXPECT_EQ(GetUILocale(), 0x040C);
  EXPECT_EQ(std::wstring(state.uiLangDir) + L"|" + state.uiLangCountryDir,
            langDir + L"|" + countryDir);
  EXPECT_EQ(std::wstring(state.langDir) + L"|" + state.langCountryDir, langDir + L"|" + countryDir);
  SetLocale(LC_ALL);
  EXPECT_EQ(std::wstring(_wsetlocale(LC_ALL, nullptr)).rfind(L"French_France.", 0), 0u);
}

// q4.exe finds its UI packs beside its own folder and reads its own stored language, while the
// user locale's packs stay in the suite folder.
TEST(LocaleScenario, Q4ProgramUsesItsOwnPacks) {
  SKIP_UNLESS_FRESH_PROCESS_IN(0x040C);
  ScopedDirectory mapora(MaporaCommonFolder()), q4(ModuleFolder() + L"\\q4-install");
  mapora.MakeFile(L"bin\\fr\\ResOther.dll");
  q4.MakeFile(L"bin\\de\\ResOther.dll");
  ScopedRegistryKey settings(HKEY_CURRENT_USER, kSettings);
  settings.SetDword(L"UILANGID", 0x0411);
  settings.SetDword(L"Q4-UILANGID", 0x0407);
  EXPECT_EQ(RunChildCopy(q4.Path() + L"\\tools\\q4.exe"), 0);
}

TEST(LocaleChild, Q4) {
  std::wstring tools = ModuleFolder();
  if (ModulePath(GetModuleHandleW(nullptr)) != tools + L"\\q4.exe") GTEST_SKIP();
  EXPECT_EQ(GetUILocale(), 0x0407);
  EXPECT_EQ(std::wstring(state.uiLangDir), tools.substr(0, tools.rfind(L'\\')) + L"\\bin\\de");
  EXPECT_EQ(std::wstring(state.langDir), MaporaCommonFolder() + L"\\bin\\fr");
}

}  // namespace
