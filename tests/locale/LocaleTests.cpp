// The locale library: its rules, the binding of the help control, and its process-wide state.
#include <windows.h>
#include <htmlhelp.h>
#include <process.h>

#include <gtest/gtest.h>

#include <optional>
#include <set>

#include "framework/ScopedHandle.h"
#include "framework/Strings.h"
#include "locale/HelpReference.h"
#include "locale/LanguagePacks.h"
#include "locale/SuiteUserSettings.h"
#include "tests/support/TestSupport.h"

using namespace KVELLocale;
using namespace testing_support;

namespace {

// The scenarios show the packs a locale with a country name has under a known base.
TEST(ChooseLanguagePacks, KeepsThePacksThatCount) {
  const struct { const char* name; const wchar_t *base, *country, *pack; std::wstring kept; } rows[] = {
      {"no country name", L"C:\\Suite", L"", L"C:\\Suite\\bin\\fr", L"C:\\Suite\\bin\\fr|"},
      {"unknown base: relative folders", L"", L"FR", L"bin\\fr", L"bin\\fr|"},
  };
  for (const auto& row : rows) {
    wchar_t langDir[kLocalePathChars] = L"stale", langCountryDir[kLocalePathChars] = L"stale";
    auto counts = [&row](const wchar_t* folder) { return lstrcmpW(folder, row.pack) == 0; };
    EXPECT_EQ(ChooseLanguagePacks(row.base, L"fr", row.country, counts, langDir, langCountryDir), true) << row.name;
    EXPECT_EQ(std::wstring(langDir) + L"|" + langCountryDir, row.kept) << row.name;
  }
}

TEST(ResourceLibraryName, ResPlusTheModulesFileName) {
  const struct { const char* name; const wchar_t* module; std::wstring expected; } rows[] = {
      {"a program's .exe, in any letter case, becomes .dll", L"C:\\Suite\\Setup.EXE", L"ResSetup.dll"},
      {"only the extension's first four characters are compared", L"C:\\Suite\\Old.exec", L"ResOld.dll"},
      {"any other extension stays", L"C:\\Suite\\Codec.ax", L"ResCodec.ax"},
      {"no extension is added", L"C:\\Suite\\Tool", L"ResTool"},
  };
  for (const auto& row : rows) EXPECT_EQ(ResourceLibraryName(row.module), row.expected) << row.name;
}

// Against a made-up disk whose suite folder is C:\S, for a French (France) UI unless a row says otherwise.
TEST(ResolveHelpReference, TheMostSpecificExistingCopy) {
  const std::wstring help = L"C:\\S\\help\\";
  const struct {
    const char* name;
    const wchar_t* reference;
    std::set<std::wstring> files;
    std::wstring expected, language = L"fr", country = L"FR", suite = L"C:\\S";
  } rows[] = {
      {"the language-and-country copy first", L"guide.chm",
       {help + L"fr-FR\\guide.chm", help + L"fr\\guide.chm", help + L"guide.chm"}, help + L"fr-FR\\guide.chm"},
      {"the language copy next", L"guide.chm", {help + L"fr\\guide.chm", help + L"guide.chm"}, help + L"fr\\guide.chm"},
      {"the untranslated copy last", L"guide.chm", {help + L"guide.chm"}, help + L"guide.chm"},
      {"another extension is kept", L"guide.htm", {help + L"guide.htm", help + L"guide.htm.CHM"}, help + L"guide.htm"},
      {"the reference's own folder; a topic split off before a window", L"D:\\Docs\\guide.chm::/a.htm>main",
       {L"D:\\Docs\\fr-FR\\guide.chm"}, L"D:\\Docs\\fr-FR\\guide.chm::/a.htm>main"},
      {"a window name is kept", L"guide.chm>main", {help + L"guide.chm"}, help + L"guide.chm>main"},
      {"nothing found leaves the suffix", L"missing.chm::/a.htm", {}, L"::/a.htm"},
      {"a folder", L"D:\\Docs", {L"D:\\Docs.CHM"}, L""},
      {"an empty reference", L"", {help + L".CHM"}, L""},
      {"no reference", nullptr, {}, L""},
      {"English, with the suite folder unknown, takes the untranslated copy of a relative help folder", L"guide.chm",
       {L"help\\fr\\guide.chm", L"help\\guide.chm"}, L"help\\guide.chm", L"", L"", L""},
      {"a language without a country tries its language copy", L"guide.chm", {help + L"fr\\guide.chm"},
       help + L"fr\\guide.chm", L"fr", L""},
  };
  for (const auto& row : rows) {
    const HelpLookup lookup{row.suite, row.language, row.country,
                            [&row](const std::wstring& path) { return row.files.count(path) != 0; },
                            [](const std::wstring& path) { return path == L"D:\\Docs"; }};
    EXPECT_EQ(ResolveHelpReference(row.reference, L".CHM", lookup), row.expected) << row.name;
  }
}

// With no control registered, the system's copy, even with a file of its name first on the search path.
TEST(HtmlHelpControl, OnlyWhenNeededAndOnlyTheSystemsCopy) {
  ScopedHiveOverride hives;  // an empty HKEY_CLASSES_ROOT too
  ScopedDirectory decoy(ModuleFolder() + L"\\help-control-decoy");
  ASSERT_TRUE(CopyFileTo(ModuleFolder() + L"\\locale_test_res.dll", decoy.Path() + L"\\hhctrl.ocx"));
  SetDllDirectoryW(decoy.Path().c_str());
  KVEL_HtmlHelp(nullptr, HH_CLOSE_ALL, 0);
  EXPECT_EQ(GetModuleHandleW(L"hhctrl.ocx"), nullptr) << "loaded to close all help windows";
  DWORD cookie = 0;
  KVEL_HtmlHelp(nullptr, nullptr, HH_INITIALIZE, reinterpret_cast<DWORD_PTR>(&cookie));
  EXPECT_NE(GetModuleHandleW(L"hhctrl.ocx"), nullptr) << "no control loaded";
  EXPECT_EQ(GetModuleHandleW((decoy.Path() + L"\\hhctrl.ocx").c_str()), nullptr) << "the copy first on the search path";
}

// The state is computed once per process: each scenario is a process of its own (see CMakeLists.txt).
struct Scenario {
  const char* name;
  std::vector<std::pair<const wchar_t*, DWORD>> numbers;  // settings
  std::vector<std::pair<const wchar_t*, std::wstring>> texts;  // settings, as text
  std::vector<std::wstring> files;  // in a fresh suite folder; a trailing "\" makes an empty folder
  const wchar_t* state;  // as Describe() gives it
};

const Scenario kScenarios[] = {
    // English Windows with German stored: Arabic, with both its packs, forced (ForcedBeforeTheUILanguageIsKnown).
    {"Forced", {{kUILangIDValue, 0x0407}}, {}, {L"bin\\de\\readme", L"bin\\ar\\readme", L"bin\\ar-SA\\readme"},
     L"UI 0401 ar-SA bin\\ar|bin\\ar-SA; user 0409 - |; RTL 1110; help "},
    // English Windows with Hebrew stored, its language pack holding only a folder, and right-to-left off.
    {"Stored", {{kUILangIDValue, 0x040D}}, {{kRtlValue, L"FALSE"}, {kRtlUIValue, L"true"}, {kTableRtlValue, L"true"}},
     {L"bin\\he\\help\\readme"}, L"UI 040D he-IL bin\\he|; user 0409 - |; RTL 1000; help "},
    // German Windows: no pack but help, a stored language no locale shares, switches on for a left-to-right UI.
    {"German", {{kUILangIDValue, 0x03FF}}, {{kRtlValue, L"true"}, {kRtlUIValue, L"true"}, {kTableRtlValue, L"true"}},
     {L"bin\\de\\", L"bin\\de-DE", L"help\\de\\Guide.CHM"},
     L"UI 0409 de-DE |; user 0407 de-DE |; RTL 0000; help help\\de\\Guide.CHM"},
    // French Windows with only a language-and-country pack, and a stored text that is no choice.
    {"French", {}, {{kUILangIDValue, L"1031"}}, {L"bin\\fr-FR\\readme", L"q4\\bin\\de\\readme"},
     L"UI 040C fr-FR bin\\fr|bin\\fr-FR; user 040C fr-FR bin\\fr|bin\\fr-FR; RTL 0000; help "},
    // q4.exe, started by French from <suite>\q4\tools: its own stored language, its UI packs beside it.
    {"Q4", {{kUILangIDValue, 0x0411}, {kQ4UILangIDValue, 0x0407}}, {}, {},
     L"UI 0407 de-DE q4\\bin\\de|; user 040C fr-FR bin\\fr|bin\\fr-FR; RTL 0000; help "},
};

std::wstring InSuite(const std::wstring& path) {
  const std::wstring suite = MaporaCommonFolder() + L"\\";
  if (path.compare(0, suite.size(), suite) != 0) return path;
  return path.substr(suite.size());
}

// UI language and packs, user locale and packs, right-to-left switches, help file; paths in the suite relative.
std::wstring Describe() {
  const unsigned short uiLocale = GetUILocale();  // computes the state
  const LocaleState& state = g_localeState;
  std::wstring help;
  return fw::Format(L"UI %04X %s-%s %s|%s; user %04X %s-%s %s|%s; RTL %d%d%d%d; help %s", uiLocale,
                    GetUILangIDString(), GetUICountryIDString(), InSuite(state.uiLangDir).c_str(),
                    InSuite(state.uiLangCountryDir).c_str(), GetLocale(), GetLangIDString(), GetCountryIDString(),
                    InSuite(state.langDir).c_str(), InSuite(state.langCountryDir).c_str(), IsRightToLeftLanguage(),
                    IsRightToLeft(), IsRightToLeftUI(), IsTableRightToLeft(),
                    InSuite(GetLocaleHelpFile(L"Guide", help, L".CHM")).c_str());
}

// Where a localized resource library was loaded from; "" when none was.
std::wstring LoadedFrom(HMODULE library) {
  fw::ScopedLibrary owned(library);
  wchar_t path[MAX_PATH] = L"";
  if (owned) GetModuleFileNameW(owned.Get(), path, MAX_PATH);
  return InSuite(path);
}

class LocaleScenario : public ::testing::Test {
 protected:
  static void SetUpTestSuite() {
    char name[32] = "";
    GetEnvironmentVariableA("LOCALE_SCENARIO", name, sizeof name);
    for (const Scenario& row : kScenarios)
      if (row.name == std::string(name)) row_ = &row;
    if (!row_) return;
    hives_.emplace();
    if (!row_->files.empty()) suite_.emplace(MaporaCommonFolder());  // Q4 runs in French's
    for (const auto& [value, number] : row_->numbers) SetRegistryDword(HKEY_CURRENT_USER, kSuiteUserKey, value, number);
    for (const auto& [value, text] : row_->texts) SetRegistryString(HKEY_CURRENT_USER, kSuiteUserKey, value, text);
    for (const std::wstring& file : row_->files) {
      if (file.back() == L'\\') suite_->MakeDir(file);
      else suite_->MakeFile(file);
    }
  }
  void SetUp() override { if (!row_) GTEST_SKIP() << "runs in a process of its own, named by LOCALE_SCENARIO"; }

  // Left to the end of the process, when the scenario's world goes.
  static inline const Scenario* row_ = nullptr;
  static inline std::optional<ScopedHiveOverride> hives_;
  static inline std::optional<ScopedDirectory> suite_;
};

TEST_F(LocaleScenario, ForcedBeforeTheUILanguageIsKnown) {
  EXPECT_FALSE(SetupEXEOverRide(0x0400)) << "no primary language";
  EXPECT_TRUE(SetupEXEOverRide(0x0401));
  EXPECT_FALSE(SetupEXEOverRide(0x040C)) << "one is pending";
}

TEST_F(LocaleScenario, State) {
  EXPECT_EQ(Describe(), row_->state);
  EXPECT_FALSE(SetupEXEOverRide(0x040C)) << "the UI language is known";
}

TEST_F(LocaleScenario, ForcedReadsTheUIAndTableSwitchesOnEveryQuery) {
  ASSERT_TRUE(CopyFileTo(ModuleFolder() + L"\\locale_test_res.dll", suite_->Path() + L"\\bin\\ar\\ResRtl.dll"));
  const struct { const char* name; DWORD type; std::wstring data; bool ui, table; } rows[] = {
      {"\"false\" in any letter case turns a switch off", REG_SZ, L"FaLsE", false, false},
      {"\"0\" is not \"false\"", REG_SZ, L"0", true, true},
      {"an empty text is not \"false\"", REG_SZ, L"", true, true},
      {"a number is not \"false\"", REG_DWORD, std::wstring(2, L'\0'), true, true},
      {"too long for the buffer counts as absent", REG_SZ, L"false" + std::wstring(200, L' '), true, false},
  };
  for (const auto& row : rows) {
    const DWORD bytes = static_cast<DWORD>(row.data.size() * sizeof(wchar_t));
    for (const wchar_t* value : {kRtlUIValue, kTableRtlValue})
      SetRegistryBytes(HKEY_CURRENT_USER, kSuiteUserKey, value, row.type, row.data.c_str(), bytes);
    EXPECT_EQ(IsRightToLeftUI(), row.ui) << row.name;
    EXPECT_EQ(IsTableRightToLeft(), row.table) << row.name;
    EXPECT_EQ(!LoadedFrom(LoadLocalizedResFromFile(L"ResRtl.dll")).empty(), row.ui) << "resources: " << row.name;
  }
}

TEST_F(LocaleScenario, FrenchLoadsTheFirstLibraryThatLoadsCountryPackFirst) {
  for (const wchar_t* file : {L"bin\\fr-FR\\ResBoth.dll", L"bin\\fr\\ResBoth.dll", L"bin\\fr\\ResBroken.dll",
                              L"bin\\fr\\ResViewer.dll", L"Viewer.ocx"})
    ASSERT_TRUE(CopyFileTo(ModuleFolder() + L"\\locale_test_res.dll", suite_->Path() + L"\\" + file));
  suite_->MakeFile(L"bin\\fr-FR\\ResBroken.dll", "not a library");
  fw::ScopedLibrary viewer(LoadLibraryW((suite_->Path() + L"\\Viewer.ocx").c_str()));
  EXPECT_EQ(LoadedFrom(LoadLocalizedResFromFile(L"ResBoth.dll")), L"bin\\fr-FR\\ResBoth.dll");
  EXPECT_EQ(LoadedFrom(LoadLocalizedResFromFile(L"ResBroken.dll")), L"bin\\fr\\ResBroken.dll");
  EXPECT_EQ(LoadedFrom(LoadLocalizedRes(viewer.Get())), L"bin\\fr\\ResViewer.dll") << "named after the module";
}

// A copy of this program as q4.exe runs the Q4 scenario.
TEST_F(LocaleScenario, FrenchRunsQ4) {
  const std::wstring copy = suite_->Path() + L"\\q4\\tools\\q4.exe";
  ASSERT_TRUE(CopyFileTo(ModuleFolder() + L"\\locale_tests.exe", copy));
  SetEnvironmentVariableA("LOCALE_SCENARIO", "Q4");
  EXPECT_EQ(_wspawnl(_P_WAIT, copy.c_str(), L"q4", L"--gtest_filter=LocaleScenario.State", nullptr), 0);
}

}  // namespace
