// The console's command line, walked as start-up walks it, and the About box's service-pack texts.
#include <gtest/gtest.h>

#include <vector>

#include "app/AboutDlg.h"
#include "app/CommandLine.h"

namespace {

TEST(CommandLine, LangForcesTheLanguage) {
  const struct { const char* name; std::vector<const wchar_t*> argv; bool forced; unsigned short langId; } rows[] = {
      {"SlashLang", {L"/Lang", L"1036"}, true, 1036}, {"DashLangAnyCase", {L"-lang", L"1036"}, true, 1036},
      {"LangAlone", {L"/Lang"}, false, 0}, {"LastValueWins", {L"/Lang", L"1033", L"1036"}, true, 1036},
      {"NoNumberIsZero", {L"/Lang", L"abc"}, true, 0}, {"NumberBeforeText", {L"/Lang", L" +1041x"}, true, 1041},
      {"Low16Bits", {L"/Lang", L"66572"}, true, 1036}, {"DoubleMarker", {L"//Lang", L"1036"}, false, 0},
      {"LongerName", {L"/Language", L"1036"}, false, 0}, {"PlainArgumentAlone", {L"1036"}, false, 0},
      // "-1" is an option: another option drops the value to come, not one already given.
      {"OptionBefore", {L"/Lang", L"-1", L"1036"}, false, 0}, {"OptionAfter", {L"/Lang", L"1036", L"/X"}, true, 1036},
  };
  for (const auto& row : rows) {
    SCOPED_TRACE(row.name);
    std::vector<const wchar_t*> argv = {L"MaporaAdmin.exe"};
    argv.insert(argv.end(), row.argv.begin(), row.argv.end());
    CMDACommandLineInfo commandLine;
    WalkCommandLine(commandLine, static_cast<int>(argv.size()), argv.data());
    unsigned short langId = 0;
    EXPECT_EQ(commandLine.LanguageOverride(langId), row.forced);
    EXPECT_EQ(langId, row.langId);
  }
}

TEST(ServicePackFields, ShowTheNameAndTheBuildAfterItsFirstDot) {
  const struct { const char* name; const wchar_t* pack; const wchar_t* build; const wchar_t* shown; } rows[] = {
      {"NoNameNothing", L"", L"1.6491", L""}, {"NoBuild", L"SP1", L"", L""}, {"DotAlone", L"SP1", L".", L"(Build )"},
      {"Dot", L"SP1", L"1.6491", L"(Build 6491)"}, {"NoDot", L"SP1", L"6491", L"(Build 6491)"},
      {"LaterDotsGo", L"SP1", L"10.5.6491", L"(Build 56491)"}, {"InsertsStayText", L"SP1", L"x.%1", L"(Build %1)"},
  };
  for (const auto& row : rows) {
    SCOPED_TRACE(row.name);
    const ServicePackTexts texts = ServicePackFieldTexts(row.pack, row.build, L"(Build %1)");
    EXPECT_EQ(texts.servicePack, row.pack);
    EXPECT_EQ(texts.build, row.shown);
  }
}

}  // namespace
