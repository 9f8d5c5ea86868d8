// The console's command line, walked exactly as start-up walks the process's arguments.
#include <gtest/gtest.h>

#include <vector>

#include "app/CommandLine.h"

namespace {

TEST(CommandLine, GivesTheLanguageOverride) {
  const struct {
    std::vector<const wchar_t*> args;  // after the program name
    const wchar_t* lang;               // start-up applies it when not empty
    unsigned short langId;             // what start-up passes on
  } cases[] = {
      {{L"/Lang", L"1036"}, L"1036", 1036},
      {{L"-lang", L"1036"}, L"1036", 1036},
      {{L"/LANG", L"1031"}, L"1031", 1031},
      {{L"/Lang"}, L"", 0},
      {{L"/Lang", L"1033", L"1036"}, L"1036", 1036},  // the last value wins
      {{L"/Lang", L"abc"}, L"abc", 0},
      {{L"/Lang", L"66572"}, L"66572", 1036},  // low 16 bits
      {{L"/Lang", L" +1041xyz"}, L" +1041xyz", 1041},
      {{L"/Lang", L"-1"}, L"", 0},  // "-1" is a flag of its own
      {{L"//Lang", L"1036"}, L"", 0},
      {{L"/Lang", L"/Other", L"1036"}, L"", 0},
      {{L"/Lang", L"1036", L"/Other", L"1033"}, L"1036", 1036},
      {{L"1036"}, L"", 0},
      {{L"Lang", L"1036"}, L"", 0},
      {{L"/Language", L"1036"}, L"", 0},
      {{}, L"", 0},
  };
  for (const auto& c : cases) {
    std::vector<const wchar_t*> argv = {L"MaporaAdmin.exe"};
    argv.insert(argv.end(), c.args.begin(), c.args.end());
    CMDACommandLineInfo info;
    WalkCommandLine(info, static_cast<int>(argv.size()), argv.data());
    std::wstring line;
    for (const wchar_t* arg : c.args) line += std::wstring(arg) + L" ";
    EXPECT_EQ(info.m_strLang, c.lang) << line;
    EXPECT_EQ(LangIdFromText(info.m_strLang), c.langId) << line;
  }
}

}  // namespace
