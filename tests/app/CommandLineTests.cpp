// The console's command line, walked exactly as start-up walks the process's arguments.
#include <gtest/gtest.h>

#include <vector>

#include "app/CommandLine.h"

namespace {

struct CommandLineCase {
  const char* name;
  std::vector<const wchar_t*> args;  // after the program name
  const wchar_t* lang;               // m_strLang afterwards; start-up applies it when non-empty
  unsigned short langId;             // what start-up passes on
};

const CommandLineCase kCases[] = {
    {"SlashLang", {L"/Lang", L"1036"}, L"1036", 1036},
    {"DashLowerCase", {L"-lang", L"1036"}, L"1036", 1036},
    {"UpperCase", {L"/LANG", L"1031"}, L"1031", 1031},
    {"LangWithoutValue", {L"/Lang"}, L"", 0},
    {"LastValueWins", {L"/Lang", L"1033", L"1036"}, L"1036", 1036},
    {"NotANumber", {L"/Lang", L"abc"}, L"abc", 0},
    {"LowSixteenBits", {L"/Lang", L"66572"}, L"66572", 1036},
    {"BlanksAndTrailingText", {L"/Lang", L"  1041xyz"}, L"  1041xyz", 1041},
    {"Negative", {L"/Lang", L"-1"}, L"", 0},  // "-1" is a flag of its own
    {"DoubleMarkerNotRecognised", {L"//Lang", L"1036"}, L"", 0},
    {"OtherFlagResets", {L"/Lang", L"/Other", L"1036"}, L"", 0},
    {"OtherFlagKeepsEarlierValue", {L"/Lang", L"1036", L"/Other", L"1033"}, L"1036", 1036},
    {"PlainArgumentAlone", {L"1036"}, L"", 0},
    {"LangNameAsPlainArgument", {L"Lang", L"1036"}, L"", 0},
    {"LongerFlagName", {L"/Language", L"1036"}, L"", 0},
    {"EmptyArgument", {L"/Lang", L""}, L"", 0},
    {"NoArguments", {}, L"", 0},
};

class CommandLine : public testing::TestWithParam<CommandLineCase> {};

TEST_P(CommandLine, GivesTheLanguageOverride) {
  const CommandLineCase& c = GetParam();
  std::vector<const wchar_t*> argv = {L"MaporaAdmin.exe"};
  argv.insert(argv.end(), c.args.begin(), c.args.end());
  CMDACommandLineInfo info;
  WalkCommandLine(info, static_cast<int>(argv.size()), argv.data());
  EXPECT_EQ(info.m_strLang, c.lang);
  EXPECT_EQ(LangIdFromText(info.m_strLang), c.langId);
}

INSTANTIATE_TEST_SUITE_P(Cases, CommandLine, testing::ValuesIn(kCases),
                         [](const testing::TestParamInfo<CommandLineCase>& info) { return info.param.name; });

TEST(LangIdFromText, ConvertsLikeTheRuntimesDecimalConversion) {
  EXPECT_EQ(LangIdFromText(L"+1036"), 1036);
  EXPECT_EQ(LangIdFromText(L"-1"), 0xFFFF);
  EXPECT_EQ(LangIdFromText(L"\t 2052"), 2052);
  EXPECT_EQ(LangIdFromText(L"0x409"), 0);
  EXPECT_EQ(LangIdFromText(L""), 0);
}

}  // namespace
