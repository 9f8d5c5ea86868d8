// The console's command line, walked as start-up walks it, and the About box's build text.
#include <gtest/gtest.h>

#include "app/AboutDlg.h"
#include "app/CommandLine.h"
#include "tests/support/TestSupport.h"

namespace {

TEST(CommandLine, GivesTheLanguageOverride) {
  const struct { std::vector<const wchar_t*> args; const wchar_t* lang; unsigned short langId; } cases[] = {
      {{L"/Lang", L"1036"}, L"1036", 1036},          {{L"-LANG", L"1031"}, L"1031", 1031},
      {{L"/Lang"}, L"", 0},                          {{L"/Lang", L"1033", L"1036"}, L"1036", 1036},
      {{L"/Lang", L"abc"}, L"abc", 0},               {{L"/Lang", L"66572"}, L"66572", 1036},  // low 16 bits
      {{L"/Lang", L" +1041xyz"}, L" +1041xyz", 1041}, {{L"/Lang", L"-1"}, L"", 0},  // "-1" is a flag
      {{L"//Lang", L"1036"}, L"", 0},                {{L"/Lang", L"/Other", L"1036"}, L"", 0},
      {{L"/Lang", L"1036", L"/Other", L"1033"}, L"1036", 1036},
      {{L"Lang", L"1036"}, L"", 0},                  {{L"/Language", L"1036"}, L"", 0},
  };
  for (const auto& c : cases) {
    std::vector<const wchar_t*> argv = {L"MaporaAdmin.exe"};
    argv.insert(argv.end(), c.args.begin(), c.args.end());
    CMDACommandLineInfo info;
    WalkCommandLine(info, static_cast<int>(argv.size()), argv.data());
    EXPECT_EQ(info.m_strLang, c.lang) << c.args.size() << " arguments ending in " << argv.back();
    EXPECT_EQ(LangIdFromText(info.m_strLang), c.langId) << c.lang;
  }
}

TEST(AboutBox, BuildKeepsTheCharactersAfterTheFirstDotWithoutDots) {
  const struct { const wchar_t* recorded; const wchar_t* shown; } cases[] = {
      {L"1.6491", L"(Build 6491)"}, {L"10.5.6491", L"(Build 56491)"}, {L"6491", L"(Build 6491)"},
      {L"6491.", L"(Build )"},      {L"x.%1%2", L"(Build %1%2)"},  // inserts in the value stay text
  };
  testing_support::ScopedRegistryKey desktop(HKEY_LOCAL_MACHINE, L"SOFTWARE\\KVEL\\Desktop10.5");
  desktop.SetString(L"SPDisplayName", L"Service Pack 1");
  for (const auto& c : cases) {
    desktop.SetString(L"SPBuild", c.recorded);
    CAboutDlg about;
    LoadInstalledServicePack(about);
    EXPECT_EQ(about.m_strServicePackBuild, c.shown) << c.recorded;
  }
}

}  // namespace
