// The locale library's process-wide state in the worlds a process can start in: the stored
// choice, the language packs present and the right-to-left switches. The state is computed once
// per process, so every suite here is a scenario that runs as a process of its own, started in
// the Windows language it names (see CMakeLists.txt); in any other process its tests skip.
#include <gtest/gtest.h>
#include <process.h>

#include <memory>

#include "framework/ScopedHandle.h"
#include "locale/LocaleInternals.h"
#include "locale/SuiteUserSettings.h"
#include "tests/support/TestSupport.h"

using namespace KVELLocale;
using namespace testing_support;

namespace {

const LocaleState& state = g_localeState;

std::wstring ProgramPath() {
  wchar_t path[MAX_PATH] = L"";
  GetModuleFileNameW(nullptr, path, MAX_PATH);
  return path;
}

// A resource library where the test puts it: a copy of the test's own resource library.
void PutResourceLibrary(const std::wstring& path) {
  ASSERT_TRUE(CopyFileTo(ModuleFolder() + L"\\locale_test_res.dll", path));
}

// The file a localized resource library was loaded from; "" when none was.
std::wstring LoadedFrom(HMODULE library) {
  fw::ScopedLibrary owned(library);
  wchar_t path[MAX_PATH] = L"";
  if (owned) GetModuleFileNameW(owned.Get(), path, MAX_PATH);
  return path;
}

void SetSetting(const wchar_t* name, const std::wstring& text) {
  SetRegistryString(HKEY_CURRENT_USER, kSuiteUserKey, name, text);
}

void SetSetting(const wchar_t* name, DWORD value) { SetRegistryDword(HKEY_CURRENT_USER, kSuiteUserKey, name, value); }

void RemoveSetting(const wchar_t* name) { RegDeleteKeyValueW(HKEY_CURRENT_USER, kSuiteUserKey, name); }

// The world of one scenario: hives of its own and a fresh suite folder (<Common Files>\Mapora).
class LocaleScenario : public ::testing::Test {
 protected:
  static void Begin(LANGID windowsLanguage) {
    fresh_ = state.langId == 0 && state.uiLangId == 0 && GetUserDefaultUILanguage() == windowsLanguage;
    hives_ = std::make_unique<ScopedHiveOverride>();
    suite_ = std::make_unique<ScopedDirectory>(MaporaCommonFolder());
  }
  static void TearDownTestSuite() {
    suite_.reset();
    hives_.reset();
  }
  void SetUp() override {
    if (!fresh_) GTEST_SKIP() << "needs a process of its own, started in its Windows language";
  }

  static std::wstring Bin(const std::wstring& folder) { return suite_->Path() + L"\\bin\\" + folder; }
  // A language pack that counts: a folder with something in it.
  static void AddPack(const std::wstring& folder) { suite_->MakeFile(L"bin\\" + folder + L"\\readme.txt"); }

  static inline bool fresh_ = false;
  static inline std::unique_ptr<ScopedHiveOverride> hives_;
  static inline std::unique_ptr<ScopedDirectory> suite_;
};

// English Windows, German stored, Japanese forced.
class EnglishOverride : public LocaleScenario {
 protected:
  static void SetUpTestSuite() {
    Begin(0x0409);
    SetSetting(kUILangIDValue, 0x0407);
    AddPack(L"de");
    AddPack(L"ja");
  }
};

TEST_F(EnglishOverride, ForcesTheUILanguageOnceAndOnlyBeforeItIsKnown) {
  EXPECT_FALSE(SetupEXEOverRide(0x0400));  // no primary language
  EXPECT_TRUE(SetupEXEOverRide(0x0411));
  EXPECT_FALSE(SetupEXEOverRide(0x040C));  // one is pending
  EXPECT_EQ(GetUILocale(), 0x0411);
  EXPECT_EQ(std::wstring(state.uiLangDir), Bin(L"ja"));
  EXPECT_FALSE(SetupEXEOverRide(0x040C));  // known now
  EXPECT_EQ(GetUILocale(), 0x0411);
}

// English Windows with German stored and installed, and right-to-left switches on.
class EnglishStoredGerman : public LocaleScenario {
 protected:
  static void SetUpTestSuite() {
    Begin(0x0409);
    SetSetting(kUILangIDValue, 0x0407);
    for (const wchar_t* name : {kRtlValue, kRtlUIValue, kTableRtlValue}) SetSetting(name, std::wstring(L"true"));
    AddPack(L"de");
  }
};

TEST_F(EnglishStoredGerman, TheStoredLanguageIsTheUILanguage) {
  EXPECT_EQ(GetUILocale(), 0x0407);
  EXPECT_EQ(std::wstring(GetUILangIDString()) + L"-" + GetUICountryIDString(), L"de-DE");
  EXPECT_EQ(std::wstring(state.uiLangDir) + L"|" + state.uiLangCountryDir, Bin(L"de") + L"|");
}

TEST_F(EnglishStoredGerman, TheEnglishUserLocaleHasNoNamesOrFolders) {
  EXPECT_EQ(GetLocale(), 0x0409);
  EXPECT_EQ(std::wstring(GetLangIDString()) + GetCountryIDString() + state.langDir, L"");
}

TEST_F(EnglishStoredGerman, RightToLeftSwitchesOnlyApplyToRightToLeftLanguages) {
  EXPECT_FALSE(IsRightToLeftLanguage());
  EXPECT_FALSE(IsRightToLeft());
  EXPECT_FALSE(IsRightToLeftUI());
  EXPECT_FALSE(IsTableRightToLeft());
}

// German Windows without a German pack, and a stored language no locale shares.
class GermanWithoutPack : public LocaleScenario {
 protected:
  static void SetUpTestSuite() {
    Begin(0x0407);
    SetSetting(kUILangIDValue, 0x03FF);
    suite_->MakeDir(L"bin\\de");  // empty: does not count
    suite_->MakeFile(L"bin\\de-DE");  // a file, not a folder
    suite_->MakeFile(L"help\\de\\Guide.CHM");
  }
};

TEST_F(GermanWithoutPack, AStoredLanguageNoLocaleSharesIsIgnored) {
  EXPECT_EQ(std::wstring(GetUILangIDString()), L"de");
}

TEST_F(GermanWithoutPack, ShowsEnglishButKeepsTheRequestedNames) {
  EXPECT_EQ(GetUILocale(), 0x0409);
  EXPECT_EQ(std::wstring(GetUILangIDString()) + L"-" + GetUICountryIDString(), L"de-DE");
  EXPECT_EQ(std::wstring(state.uiLangDir) + state.uiLangCountryDir, L"");
}

TEST_F(GermanWithoutPack, TheUserLocaleKeepsItsNamesWithoutFolders) {
  EXPECT_EQ(GetLocale(), 0x0407);
  EXPECT_EQ(std::wstring(GetLangIDString()), L"de");
  EXPECT_EQ(std::wstring(state.langDir) + state.langCountryDir, L"");
}

TEST_F(GermanWithoutPack, TranslatedHelpIsStillFound) {
  std::wstring result;
  EXPECT_EQ(std::wstring(GetLocaleHelpFile(L"Guide", result, L".CHM")), suite_->Path() + L"\\help\\de\\Guide.CHM");
}

// French Windows with only a French (France) pack, and a stored choice that is text, not a
// 4-byte value, and so no choice. The state is fixed before any test adds files, so that the
// French folder the tests fill never counted.
class FrenchCountryPack : public LocaleScenario {
 protected:
  static void SetUpTestSuite() {
    Begin(0x040C);
    SetSetting(kUILangIDValue, std::wstring(L"1031"));
    AddPack(L"fr-FR");
    if (fresh_) GetUILocale();
  }
};

TEST_F(FrenchCountryPack, BothFoldersAreKeptAsFormed) {
  EXPECT_EQ(GetUILocale(), 0x040C);
  EXPECT_EQ(std::wstring(state.uiLangDir) + L"|" + state.uiLangCountryDir, Bin(L"fr") + L"|" + Bin(L"fr-FR"));
  EXPECT_EQ(std::wstring(state.langDir) + L"|" + state.langCountryDir, Bin(L"fr") + L"|" + Bin(L"fr-FR"));
}

TEST_F(FrenchCountryPack, TheCountryPackIsTriedFirst) {
  PutResourceLibrary(Bin(L"fr-FR\\ResBoth.dll"));
  PutResourceLibrary(Bin(L"fr\\ResBoth.dll"));
  EXPECT_EQ(LoadedFrom(LoadLocalizedResFromFile(L"ResBoth.dll")), Bin(L"fr-FR\\ResBoth.dll"));
}

TEST_F(FrenchCountryPack, ALibraryThatDoesNotLoadFallsThroughToTheLanguagePack) {
  suite_->MakeFile(L"bin\\fr-FR\\ResBroken.dll", "not a library");
  PutResourceLibrary(Bin(L"fr\\ResBroken.dll"));
  EXPECT_EQ(LoadedFrom(LoadLocalizedResFromFile(L"ResBroken.dll")), Bin(L"fr\\ResBroken.dll"));
}

TEST_F(FrenchCountryPack, AModuleFindsItsResourceLibraryByItsName) {
  ScopedDirectory controls(ModuleFolder() + L"\\locale-controls");
  PutResourceLibrary(controls.Path() + L"\\Viewer.ocx");
  PutResourceLibrary(Bin(L"fr\\ResViewer.dll"));
  fw::ScopedLibrary viewer(LoadLibraryW((controls.Path() + L"\\Viewer.ocx").c_str()));
  ASSERT_TRUE(viewer);
  EXPECT_EQ(LoadedFrom(LoadLocalizedRes(viewer.Get())), Bin(L"fr\\ResViewer.dll"));
}

// q4.exe: a copy of this program under that name, started from <suite>\q4\tools on French
// Windows. It checks itself in Q4Child.
class FrenchQ4 : public LocaleScenario {
 protected:
  static void SetUpTestSuite() {
    Begin(0x040C);
    AddPack(L"fr");
    suite_->MakeFile(L"q4\\bin\\de\\readme.txt");
  }
};

TEST_F(FrenchQ4, ReadsItsOwnStoredLanguageAndPacks) {
  const std::wstring copy = suite_->Path() + L"\\q4\\tools\\q4.exe";
  ASSERT_TRUE(CopyFileTo(ProgramPath(), copy));
  EXPECT_EQ(_wspawnl(_P_WAIT, copy.c_str(), L"q4", L"--gtest_filter=Q4Child.*", nullptr), 0);
}

// q4.exe takes its UI packs from beside its own folder and its own stored value; the user
// locale's packs stay in the suite folder.
TEST(Q4Child, ReadsItsOwnStoredLanguageAndPacks) {
  const std::wstring tools = ModuleFolder();
  if (ProgramPath() != tools + L"\\q4.exe") GTEST_SKIP() << "run as q4.exe by FrenchQ4";
  ScopedHiveOverride hives;
  SetSetting(kUILangIDValue, 0x0411);
  SetSetting(kQ4UILangIDValue, 0x0407);
  EXPECT_EQ(GetUILocale(), 0x0407);
  EXPECT_EQ(std::wstring(state.uiLangDir), tools.substr(0, tools.rfind(L'\\')) + L"\\bin\\de");
  EXPECT_EQ(std::wstring(state.langDir), MaporaCommonFolder() + L"\\bin\\fr");
}

// Arabic Windows with an Arabic pack holding a resource library.
class ArabicUI : public LocaleScenario {
 protected:
  static void SetUpTestSuite() {
    Begin(0x0401);
    AddPack(L"ar");
  }
};

TEST_F(ArabicUI, LayoutIsRightToLeft) {
  EXPECT_TRUE(IsRightToLeftLanguage());
  EXPECT_TRUE(IsRightToLeft());
}

TEST_F(ArabicUI, UIAndTableSwitchesAreReadOnEveryQuery) {
  const struct {
    const char* name;
    std::wstring text;  // of both RTLUI and TABLERTL
    bool ui, table;
  } rows[] = {
      {"\"false\" in any letter case turns a switch off", L"FaLsE", false, false},
      {"\"0\" is not \"false\"", L"0", true, true},
      {"an empty text is not \"false\"", L"", true, true},
      {"too long for the buffer counts as absent", L"false" + std::wstring(200, L' '), true, false},
  };
  for (const auto& row : rows) {
    SetSetting(kRtlUIValue, row.text);
    SetSetting(kTableRtlValue, row.text);
    EXPECT_EQ(IsRightToLeftUI(), row.ui) << row.name;
    EXPECT_EQ(IsTableRightToLeft(), row.table) << row.name;
  }
  RemoveSetting(kRtlUIValue);
  RemoveSetting(kTableRtlValue);
  EXPECT_TRUE(IsRightToLeftUI()) << "absent";
  EXPECT_FALSE(IsTableRightToLeft()) << "absent";
  SetSetting(kTableRtlValue, DWORD{0});
  EXPECT_TRUE(IsTableRightToLeft()) << "a number is not \"false\"";
}

TEST_F(ArabicUI, ResourcesLoadOnlyWithTheMirroredUI) {
  PutResourceLibrary(Bin(L"ar\\ResRtl.dll"));
  SetSetting(kRtlUIValue, std::wstring(L"false"));
  EXPECT_EQ(LoadedFrom(LoadLocalizedResFromFile(L"ResRtl.dll")), L"");
  RemoveSetting(kRtlUIValue);
  EXPECT_EQ(LoadedFrom(LoadLocalizedResFromFile(L"ResRtl.dll")), Bin(L"ar\\ResRtl.dll"));
}

// Hebrew Windows with right-to-left layout switched off.
class HebrewRtlOff : public LocaleScenario {
 protected:
  static void SetUpTestSuite() {
    Begin(0x040D);
    AddPack(L"he");
    SetSetting(kRtlValue, std::wstring(L"FALSE"));
    SetSetting(kRtlUIValue, std::wstring(L"true"));
    SetSetting(kTableRtlValue, std::wstring(L"true"));
  }
};

TEST_F(HebrewRtlOff, EverySwitchIsOff) {
  EXPECT_TRUE(IsRightToLeftLanguage());
  EXPECT_FALSE(IsRightToLeft());
  EXPECT_FALSE(IsRightToLeftUI());
  EXPECT_FALSE(IsTableRightToLeft());
}

}  // namespace
