// The console's command line, walked as start-up walks it, and the About box's service-pack texts.
#include <gtest/gtest.h>

#include <ostream>
#include <vector>

#include "app/AboutDlg.h"
#include "app/CommandLine.h"
#include "tests/support/TestSupport.h"

namespace {

struct CommandLineRow {
  const char* name;
  std::vector<const wchar_t*> arguments;  // after the program's own name
  bool overridden;
  unsigned short langId;  // the forced language when overridden
};

void PrintTo(const CommandLineRow& row, std::ostream* out) { *out << row.name; }

class CommandLine : public testing::TestWithParam<CommandLineRow> {};

TEST_P(CommandLine, ForcesTheLanguageThatLangNames) {
  const CommandLineRow& row = GetParam();
  std::vector<const wchar_t*> argv = {L"MaporaAdmin.exe"};
  argv.insert(argv.end(), row.arguments.begin(), row.arguments.end());
  CMDACommandLineInfo commandLine;
  WalkCommandLine(commandLine, static_cast<int>(argv.size()), argv.data());

  unsigned short langId = 0;
  const bool overridden = commandLine.LanguageOverride(langId);

  EXPECT_EQ(overridden, row.overridden);
  EXPECT_EQ(langId, row.langId);
}

INSTANTIATE_TEST_SUITE_P(
    Arguments, CommandLine,
    testing::Values(CommandLineRow{"SlashLang", {L"/Lang", L"1036"}, true, 1036},
                    CommandLineRow{"DashLangInAnyCase", {L"-lang", L"1036"}, true, 1036},
                    CommandLineRow{"LangWithoutValue", {L"/Lang"}, false, 0},
                    CommandLineRow{"LastValueWins", {L"/Lang", L"1033", L"1036"}, true, 1036},
                    CommandLineRow{"NoNumberIsZero", {L"/Lang", L"abc"}, true, 0},
                    CommandLineRow{"NumberBeforeOtherText", {L"/Lang", L" +1041xyz"}, true, 1041},
                    CommandLineRow{"OnlyLow16Bits", {L"/Lang", L"66572"}, true, 1036},
                    CommandLineRow{"DoubleMarkerIsAnotherOption", {L"//Lang", L"1036"}, false, 0},
                    CommandLineRow{"OtherOptionDropsThePendingValue", {L"/Lang", L"/Other", L"1036"}, false, 0},
                    CommandLineRow{"ValueKeptAfterAnotherOption", {L"/Lang", L"1036", L"/Other", L"1033"}, true, 1036},
                    CommandLineRow{"NegativeNumberIsAnOption", {L"/Lang", L"-1"}, false, 0},
                    CommandLineRow{"PlainArgumentAlone", {L"1036"}, false, 0},
                    CommandLineRow{"LangWithoutMarker", {L"Lang", L"1036"}, false, 0},
                    CommandLineRow{"LongerOptionName", {L"/Language", L"1036"}, false, 0}),
    [](const testing::TestParamInfo<CommandLineRow>& info) { return std::string(info.param.name); });

struct ServicePackRow {
  const char* name;
  const wchar_t* recordedName;
  const wchar_t* recordedBuild;
  const wchar_t* buildFormat;
  const wchar_t* shownName;
  const wchar_t* shownBuild;
};

void PrintTo(const ServicePackRow& row, std::ostream* out) { *out << row.name; }

class ServicePackFields : public testing::TestWithParam<ServicePackRow> {};

TEST_P(ServicePackFields, ShowTheNameAndTheBuildAfterItsFirstDot) {
  const ServicePackRow& row = GetParam();

  const ServicePackTexts texts = ServicePackFieldTexts(row.recordedName, row.recordedBuild, row.buildFormat);

  EXPECT_EQ(texts.servicePack, row.shownName);
  EXPECT_EQ(texts.build, row.shownBuild);
}

constexpr wchar_t kBuildFormat[] = L"(Build %1)";

INSTANTIATE_TEST_SUITE_P(
    Recorded, ServicePackFields,
    testing::Values(ServicePackRow{"NothingRecorded", L"", L"", kBuildFormat, L"", L""},
                    ServicePackRow{"BuildWithoutNameShowsNothing", L"", L"1.6491", kBuildFormat, L"", L""},
                    ServicePackRow{"NameWithoutBuild", L"Service Pack 1", L"", kBuildFormat, L"Service Pack 1", L""},
                    ServicePackRow{"ServicePackDotBuild", L"Service Pack 1", L"1.6491", kBuildFormat, L"Service Pack 1",
                                   L"(Build 6491)"},
                    ServicePackRow{"EveryDotAfterTheFirstGoes", L"SP", L"10.5.6491", kBuildFormat, L"SP",
                                   L"(Build 56491)"},
                    ServicePackRow{"BuildWithoutDotKept", L"SP", L"6491", kBuildFormat, L"SP", L"(Build 6491)"},
                    ServicePackRow{"DotAloneLeavesNothing", L"SP", L".", kBuildFormat, L"SP", L"(Build )"},
                    ServicePackRow{"InsertsInTheBuildStayText", L"SP", L"x.%1%2", kBuildFormat, L"SP", L"(Build %1%2)"},
                    ServicePackRow{"NoFormatNoBuild", L"SP", L"1.6491", L"", L"SP", L""}),
    [](const testing::TestParamInfo<ServicePackRow>& info) { return std::string(info.param.name); });

TEST(AboutBox, ReadsTheDesktopServicePackFromTheRegistry) {
  testing_support::ScopedHiveOverride hives;
  testing_support::ScopedRegistryKey desktop(HKEY_LOCAL_MACHINE, L"SOFTWARE\\KVEL\\Desktop10.5");
  desktop.SetString(L"SPDisplayName", L"Service Pack 1");
  desktop.SetString(L"SPBuild", L"1.6491");
  CAboutDlg about;

  LoadInstalledServicePack(about);

  EXPECT_EQ(about.m_strServicePack, L"Service Pack 1");
  EXPECT_EQ(about.m_strServicePackBuild, L"(Build 6491)");
}

}  // namespace
