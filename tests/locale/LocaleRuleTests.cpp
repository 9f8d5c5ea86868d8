// The locale library's rules that need no process-wide state: language names, language packs,
// resource library names and help references.
#include <gtest/gtest.h>

#include <set>

#include "locale/HelpReference.h"
#include "locale/LanguagePacks.h"
#include "tests/support/TestSupport.h"

using namespace KVELLocale;

namespace {

TEST(GetLangIDFromName, PackFolderNamesMatchSupportedLocales) {
  const struct {
    const char* name;
    const wchar_t* folder;
    bool found;
    unsigned short langId;
  } rows[] = {
      {"a language names its primary language", L"fr", true, 0x000C},
      {"language and country name the whole locale", L"fr-CA", true, 0x0C0C},
      {"letter case is ignored", L"PT-br", true, 0x0416},
      {"an unknown language", L"xx", false, 0},
      {"a dangling hyphen", L"fr-", false, 0},
      {"no name", nullptr, false, 0},
  };
  for (const auto& row : rows) {
    unsigned short langId = 0xFFFF;
    EXPECT_EQ(GetLangIDFromName(row.folder, langId), row.found) << row.name;
    EXPECT_EQ(langId, row.langId) << row.name;
  }
}

TEST(ChooseLanguagePacks, KeepsThePacksThatCount) {
  const struct {
    const char* name;
    const wchar_t* base;
    const wchar_t* country;  // of the language "fr"
    std::set<std::wstring> counting;
    bool found;
    std::wstring langDir, langCountryDir;
  } rows[] = {
      {"language pack only", L"C:\\Mapora", L"FR", {L"C:\\Mapora\\bin\\fr"}, true, L"C:\\Mapora\\bin\\fr", L""},
      {"language-and-country pack only: both kept as formed", L"C:\\Mapora", L"FR", {L"C:\\Mapora\\bin\\fr-FR"},
       true, L"C:\\Mapora\\bin\\fr", L"C:\\Mapora\\bin\\fr-FR"},
      {"both packs", L"C:\\Mapora", L"FR", {L"C:\\Mapora\\bin\\fr", L"C:\\Mapora\\bin\\fr-FR"}, true,
       L"C:\\Mapora\\bin\\fr", L"C:\\Mapora\\bin\\fr-FR"},
      {"no pack", L"C:\\Mapora", L"FR", {}, false, L"", L""},
      {"no country name", L"C:\\Mapora", L"", {L"C:\\Mapora\\bin\\fr"}, true, L"C:\\Mapora\\bin\\fr", L""},
      {"unknown base: relative folders", L"", L"FR", {L"bin\\fr"}, true, L"bin\\fr", L""},
  };
  for (const auto& row : rows) {
    SCOPED_TRACE(row.name);
    wchar_t langDir[kLocalePathChars] = L"stale";
    wchar_t langCountryDir[kLocalePathChars] = L"stale";
    auto counts = [&](const wchar_t* folder) { return row.counting.count(folder) != 0; };
    EXPECT_EQ(ChooseLanguagePacks(row.base, L"fr", row.country, counts, langDir, langCountryDir), row.found);
    EXPECT_EQ(std::wstring(langDir), row.langDir);
    EXPECT_EQ(std::wstring(langCountryDir), row.langCountryDir);
  }
}

TEST(LanguagePackCounts, AnExistingFolderWithSomethingInIt) {
  testing_support::ScopedDirectory packs(testing_support::ModuleFolder() + L"\\pack-counts");
  packs.MakeDir(L"empty");
  packs.MakeFile(L"file");
  packs.MakeFile(L"withFile\\ResMaporaAdmin.dll");
  packs.MakeDir(L"withFolder\\help");
  const struct {
    const wchar_t* folder;
    bool counts;
  } rows[] = {{L"missing", false}, {L"empty", false}, {L"file", false}, {L"withFile", true}, {L"withFolder", true}};
  for (const auto& row : rows)
    EXPECT_EQ(LanguagePackCounts((packs.Path() + L"\\" + row.folder).c_str()), row.counts) << row.folder;
}

TEST(ResourceLibraryName, ResPlusTheModulesFileName) {
  const struct {
    const char* name;
    const wchar_t* module;
    std::wstring expected;
  } rows[] = {
      {"a program's .exe becomes .dll", L"C:\\Suite\\MaporaAdmin.exe", L"ResMaporaAdmin.dll"},
      {"a control's .ocx becomes .dll", L"C:\\Suite\\Viewer.ocx", L"ResViewer.dll"},
      {"letter case of the extension is ignored", L"C:\\Suite\\Setup.EXE", L"ResSetup.dll"},
      {"only the extension's first four characters are compared", L"C:\\Suite\\Old.exec", L"ResOld.dll"},
      {"a library keeps its extension", L"C:\\Suite\\Tools.dll", L"ResTools.dll"},
      {"any other extension stays", L"C:\\Suite\\Codec.ax", L"ResCodec.ax"},
      {"no extension is added", L"C:\\Suite\\Tool", L"ResTool"},
  };
  for (const auto& row : rows) EXPECT_EQ(ResourceLibraryName(row.module), row.expected) << row.name;
}

// Help references against a made-up disk: French (France) UI, suite folder C:\CF\Mapora.
const std::wstring kHelp = L"C:\\CF\\Mapora\\help\\";

struct HelpRow {
  const char* name;
  const wchar_t* reference;
  std::set<std::wstring> files;
  std::wstring expected;
};

const HelpRow kHelpRows[] = {
    {"a bare name gets the default extension and folder", L"Guide", {kHelp + L"fr\\Guide.CHM"},
     kHelp + L"fr\\Guide.CHM"},
    {"the language-and-country copy first", L"guide.chm",
     {kHelp + L"fr-FR\\guide.chm", kHelp + L"fr\\guide.chm", kHelp + L"guide.chm"}, kHelp + L"fr-FR\\guide.chm"},
    {"the language copy next", L"guide.chm", {kHelp + L"fr\\guide.chm", kHelp + L"guide.chm"},
     kHelp + L"fr\\guide.chm"},
    {"the untranslated copy last", L"guide.chm", {kHelp + L"guide.chm"}, kHelp + L"guide.chm"},
    {"another extension is kept", L"guide.htm", {kHelp + L"guide.htm", kHelp + L"guide.htm.CHM"},
     kHelp + L"guide.htm"},
    {"the reference's own folder, with its topic kept", L"D:\\Docs\\guide.chm::/html/intro.htm",
     {L"D:\\Docs\\fr-FR\\guide.chm"}, L"D:\\Docs\\fr-FR\\guide.chm::/html/intro.htm"},
    {"a window name is kept", L"guide.chm>main", {kHelp + L"guide.chm"}, kHelp + L"guide.chm>main"},
    {"a topic is split off before a window", L"guide.chm::/a.htm>main", {kHelp + L"guide.chm"},
     kHelp + L"guide.chm::/a.htm>main"},
    {"nothing found leaves the suffix", L"missing.chm::/a.htm", {}, L"::/a.htm"},
    {"nothing found", L"missing.chm", {}, L""},
    {"a folder", L"D:\\Docs", {L"D:\\Docs.CHM"}, L""},
    {"an empty reference", L"", {kHelp + L".CHM"}, L""},
    {"no reference", nullptr, {}, L""},
};

HelpLookup FrenchLookup(const std::set<std::wstring>& files) {
  HelpLookup lookup;
  lookup.suiteFolder = L"C:\\CF\\Mapora";
  lookup.uiLangName = L"fr";
  lookup.uiCountryName = L"FR";
  lookup.exists = [files](const std::wstring& path) { return files.count(path) != 0; };
  lookup.isDirectory = [](const std::wstring& path) { return path == L"D:\\Docs"; };
  return lookup;
}

TEST(ResolveHelpReference, TheMostSpecificExistingCopy) {
  for (const HelpRow& row : kHelpRows)
    EXPECT_EQ(ResolveHelpReference(row.reference, L".CHM", FrenchLookup(row.files)), row.expected) << row.name;
}

TEST(ResolveHelpReference, EnglishGoesStraightToTheUntranslatedCopy) {
  HelpLookup lookup = FrenchLookup({kHelp + L"fr\\guide.chm", kHelp + L"guide.chm"});
  lookup.uiLangName.clear();
  lookup.uiCountryName.clear();
  EXPECT_EQ(ResolveHelpReference(L"guide.chm", L".CHM", lookup), kHelp + L"guide.chm");
}

TEST(ResolveHelpReference, ALanguageWithoutCountryTriesItsLanguageCopy) {
  HelpLookup lookup = FrenchLookup({kHelp + L"fr\\guide.chm"});
  lookup.uiCountryName.clear();
  EXPECT_EQ(ResolveHelpReference(L"guide.chm", L".CHM", lookup), kHelp + L"fr\\guide.chm");
}

TEST(ResolveHelpReference, AnUnknownSuiteFolderLeavesARelativeHelpFolder) {
  HelpLookup lookup = FrenchLookup({L"help\\guide.chm"});
  lookup.suiteFolder.clear();
  EXPECT_EQ(ResolveHelpReference(L"guide.chm", L".CHM", lookup), L"help\\guide.chm");
}

}  // namespace
