// The installation report: its text and emphasis, and the workstation page that shows it.
#include <windows.h>
#include <richedit.h>
#include <shlobj.h>

#include <gtest/gtest.h>

#include <cstdlib>
#include <ostream>

#include "inventory/ClientMaporaConfigDlg.h"
#include "inventory/InstallationReport.h"
#include "res/resource.h"
#include "tests/support/TestSupport.h"

void PrintTo(const TextRange& range, std::ostream* out) { *out << "{" << range.start << ", " << range.length << "}"; }

namespace {

using namespace testing_support;

const wchar_t* const kFields[] = {L"name", L"release", L"version", L"folder", L"by", L"date", L"time", L"image"};

// A short template with the real one's arguments, one line per section; its translation.
const ReportTexts kTexts = {L"DESKTOP", L"ENGINE", L"SKYLOFT", L"SERVER", L"Installation Information",
                            L"Service Pack Information", L" %s\r\n %s|%s|%s|%s|%s|%s|%s|%s|%s|%s|%s|%s\r\n %s|%s|%s\r\n",
                            L" %s\r\n %s|%s\r\n "};
ReportTexts Translated() {
  ReportTexts texts = kTexts;
  texts.installationInformation = L"Installationsinformationen";
  texts.servicePackInformation = L"Service Pack-Informationen";
  return texts;
}

// Every value names its product and field, so that a value in the wrong place shows.
ProductInstallInfo Values(const std::wstring& product, const std::wstring& name = L"") {
  ProductInstallInfo info;
  std::wstring* fields[] = {&info.productName, &info.realVersion, &info.productVersion, &info.installDir,
                            &info.installer,   &info.installDate, &info.installTime,    &info.imageLocation};
  for (size_t i = 0; i < std::size(fields); ++i) *fields[i] = product + L"-" + kFields[i];
  if (!name.empty()) info.productName = name;
  info.spNumber = product + L"-sp";
  info.spBuild = product + L"-build";
  return info;
}

std::wstring Block(const std::wstring& heading, const ProductInstallInfo& info,
                   const ReportTexts& texts = kTexts) {
  return L" " + heading + L"\r\n " + texts.installationInformation + L"|" + info.productName + L"|" +
         info.realVersion + L"|" + info.productVersion + L"|" + info.installDir + L"|" + info.installer + L"|" +
         info.installDate + L"|" + info.installTime + L"|" + info.imageLocation + L"|ann|appdata|temp\r\n " +
         texts.servicePackInformation + L"|" + info.spNumber + L"|" + info.spBuild + L"\r\n";
}
const std::wstring kSkyloftBlock = L" SKYLOFT\r\n Installation Information|D:\\Skyloft\r\n ";

ReportInput Installed(bool desktop, bool engine, bool skyloft, bool server,
                      const ProductInstallInfo& desktopValues = Values(L"desktop")) {
  ReportInput input;
  input.desktopInstalled = desktop;
  input.engineInstalled = engine;
  input.skyloftInstalled = skyloft;
  input.serverInstalled = server;
  input.desktop = desktopValues;
  input.engine = Values(L"engine");
  input.server = Values(L"server");
  input.skyloftInstallDir = L"D:\\Skyloft";
  input.session = {L"ann", L"appdata", L"temp"};
  return input;
}

// The emphasised words, each as its nth occurrence (from 0) in the expected text.
std::vector<TextRange> RangesOf(const std::wstring& text, const std::vector<std::pair<std::wstring, int>>& words) {
  std::vector<TextRange> ranges;
  for (const auto& [word, nth] : words) {
    size_t at = text.find(word);
    for (int skipped = 0; skipped < nth; ++skipped) at = text.find(word, at + 1);
    ranges.push_back({at, word.size()});
  }
  return ranges;
}

TEST(ComposeInstallationReport, InstalledProductsInFixedOrderWithTheirHeadingsEmphasised) {
  const std::wstring kInstall = L"Installation Information";
  const std::wstring kServicePack = L"Service Pack Information";
  const ProductInstallInfo capitalEngine = Values(L"desktop", L"MAPORA ENGINE EDITION");
  const ProductInstallInfo notTheHeading = Values(L"desktop", L"ENGINES Engine");
  const ProductInstallInfo sectionInName = Values(L"desktop", L"Installation Information Kit");
  const struct {
    const char* name;
    ReportInput input;
    ReportTexts texts;
    std::wstring text;
    std::vector<std::pair<std::wstring, int>> emphasis;  // product headings first, then sections
  } rows[] = {
      {"only Desktop", Installed(true, false, false, false), kTexts, Block(L"DESKTOP", Values(L"desktop")),
       {{L"DESKTOP", 0}, {kInstall, 0}, {kServicePack, 0}}},
      {"Desktop and Engine, Desktop first", Installed(true, true, false, false), kTexts,
       Block(L"DESKTOP", Values(L"desktop")) + Block(L"ENGINE", Values(L"engine")),
       {{L"DESKTOP", 0}, {L"ENGINE", 0}, {kInstall, 0}, {kInstall, 1}, {kServicePack, 0}, {kServicePack, 1}}},
      {"Skyloft after Desktop, ending in a line break and a blank", Installed(true, false, true, false), kTexts,
       Block(L"DESKTOP", Values(L"desktop")) + kSkyloftBlock,
       {{L"DESKTOP", 0}, {L"SKYLOFT", 0}, {kInstall, 0}, {kInstall, 1}, {kServicePack, 0}}},
      {"an upper-case ENGINE in a Desktop value takes the heading's emphasis",
       Installed(true, true, false, false, capitalEngine), kTexts,
       Block(L"DESKTOP", capitalEngine) + Block(L"ENGINE", Values(L"engine")),
       {{L"DESKTOP", 0}, {L"ENGINE", 0}, {kInstall, 0}, {kInstall, 1}, {kServicePack, 0}, {kServicePack, 1}}},
      {"only a whole, case-exact word is the heading", Installed(true, true, false, false, notTheHeading), kTexts,
       Block(L"DESKTOP", notTheHeading) + Block(L"ENGINE", Values(L"engine")),
       {{L"DESKTOP", 0}, {L"ENGINE", 1}, {kInstall, 0}, {kInstall, 1}, {kServicePack, 0}, {kServicePack, 1}}},
      {"a section heading inside a product name", Installed(true, false, false, false, sectionInName), kTexts,
       Block(L"DESKTOP", sectionInName), {{L"DESKTOP", 0}, {kInstall, 0}, {kInstall, 1}, {kServicePack, 0}}},
      {"no product", Installed(false, false, false, false), kTexts, L"", {}},
      {"translated section headings", Installed(true, false, false, false), Translated(),
       Block(L"DESKTOP", Values(L"desktop"), Translated()),
       {{L"DESKTOP", 0}, {L"Installationsinformationen", 0}, {L"Service Pack-Informationen", 0}}},
  };
  for (const auto& row : rows) {
    SCOPED_TRACE(row.name);
    const InstallationReport report = ComposeInstallationReport(row.input, row.texts);
    EXPECT_EQ(report.text, row.text);
    EXPECT_EQ(report.emphasis, RangesOf(row.text, row.emphasis));
  }
}

TEST(OffersAdvancedSettings, ForDesktopOrEngineInsideTheSharedProgramFolder) {
  const std::wstring common = L"C:\\Program Files (x86)\\Common Files";
  const std::wstring inside = common + L"\\Mapora\\bin\\MaporaAdmin.exe";
  const struct {
    const char* name;
    bool desktopOrEngine;
    std::wstring commonFiles, program;
    bool expected;
  } rows[] = {
      {"inside the folder", true, common, inside, true},
      {"neither Desktop nor Engine", false, common, inside, false},
      {"outside the folder", true, common, L"D:\\Tools\\MaporaAdmin.exe", false},
      {"letter case counts", true, common, L"c:\\program files (x86)\\common files\\MaporaAdmin.exe", false},
      {"unknown folder", true, L"", L"D:\\Tools\\MaporaAdmin.exe", true},
      {"unknown program path", true, common, L"", true},
  };
  for (const auto& row : rows)
    EXPECT_EQ(OffersAdvancedSettings(row.desktopOrEngine, row.commonFiles, row.program), row.expected) << row.name;
}

// The page in a window of its own, with a stand-in for the main window.
class WorkstationPage : public ::testing::Test, public AdminSession {
 protected:
  void SetUp() override {
    LoadLibraryW(L"RICHED20.DLL");
    page_.m_pAdminDlg = this;
  }
  void TearDown() override {
    page_.DestroyWindow();
    ::DestroyWindow(parent_);
  }
  void EnableApply() override {}
  void OpenAdvancedSettings() override {}
  bool Open() {
    CWnd parent(parent_);
    return page_.Create(IDD_MAPORA_CONFIG, &parent);
  }
  CHARFORMAT2W FormatOf(size_t from, size_t to) const {
    CHARRANGE range = {static_cast<LONG>(from), static_cast<LONG>(to)};
    CHARFORMAT2W format = {};
    format.cbSize = sizeof(format);
    SendMessageW(page_.GetDlgItem(IDC_REPORT), EM_EXSETSEL, 0, reinterpret_cast<LPARAM>(&range));
    SendMessageW(page_.GetDlgItem(IDC_REPORT), EM_GETCHARFORMAT, SCF_SELECTION, reinterpret_cast<LPARAM>(&format));
    return format;
  }

  HWND parent_ = CreateWindowExW(0, L"STATIC", L"", WS_OVERLAPPEDWINDOW, 0, 0, 640, 640, 0, 0, 0, 0);
  CClientMaporaConfigDlg page_;
};

TEST_F(WorkstationPage, ShowsTheReportWithItsRangesBoldInTheHighlightColour) {
  ScopedHiveOverride hives;
  m_installedProducts.desktopKey = L"SOFTWARE\\KVEL\\Desktop10.5";
  m_installedProducts.engineKey = L"SOFTWARE\\KVEL\\Engine10.5";
  m_installedProducts.desktopInstalled = true;
  m_installedProducts.engineInstalled = true;
  SetRegistryString(HKEY_LOCAL_MACHINE, m_installedProducts.engineKey, L"ProductName", L"Mapora Engine");
  ASSERT_TRUE(Open());
  page_.BuildInstallationReport();

  const InstallationReport report = ComposeInstallationReport(ReadReportInput(m_installedProducts), LoadReportTexts());
  ASSERT_NE(report.text.find(L"Mapora Engine"), std::wstring::npos);
  EXPECT_EQ(GetWindowTextOf(page_.GetDlgItem(IDC_REPORT)), report.text);
  for (const TextRange& range : report.emphasis) {
    const size_t start = RichEditOffset(report.text, range.start);
    const size_t end = RichEditOffset(report.text, range.start + range.length);
    const CHARFORMAT2W emphasised = FormatOf(start, end);
    EXPECT_EQ(emphasised.dwMask & CFM_BOLD, static_cast<DWORD>(CFM_BOLD)) << "partly bold at " << start;
    EXPECT_EQ(emphasised.dwEffects & CFE_BOLD, static_cast<DWORD>(CFE_BOLD)) << "not bold at " << start;
    EXPECT_EQ(emphasised.crTextColor, GetSysColor(COLOR_HIGHLIGHT)) << start;
    EXPECT_EQ(FormatOf(end, end + 1).dwEffects & CFE_BOLD, 0u) << "bold after " << start;
  }
}

// With Desktop installed "Advanced..." is hidden in the build folder; the test then runs a copy
// of itself from the shared 32-bit program folder, where it is shown.
TEST_F(WorkstationPage, AdvancedButtonOnlyInTheSharedProgramFolder) {
  const bool copy = GetEnvironmentVariableW(L"REPORT_TESTS_RUN_AS_COPY", nullptr, 0) != 0;
  m_installedProducts.desktopInstalled = true;
  ASSERT_TRUE(Open());
  EXPECT_EQ((GetWindowLongW(page_.GetDlgItem(IDC_ADVANCED), GWL_STYLE) & WS_VISIBLE) != 0, copy);
  if (copy) return;

  wchar_t common[MAX_PATH] = L"";
  SHGetFolderPathW(nullptr, CSIDL_PROGRAM_FILES_COMMONX86, nullptr, SHGFP_TYPE_CURRENT, common);
  ScopedDirectory folder(std::wstring(common) + L"\\MaporaReportTests");
  const std::wstring exe = folder.Path() + L"\\report_tests.exe";
  ASSERT_TRUE(CopyFileTo(ModuleFolder() + L"\\report_tests.exe", exe));
  SetEnvironmentVariableW(L"REPORT_TESTS_RUN_AS_COPY", L"1");
  EXPECT_EQ(_wsystem((L"\"\"" + exe + L"\" --gtest_filter=WorkstationPage.AdvancedButton*\"").c_str()), 0);
  SetEnvironmentVariableW(L"REPORT_TESTS_RUN_AS_COPY", nullptr);
}

}  // namespace
