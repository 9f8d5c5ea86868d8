// The installation report: the text and emphasis it is composed of, and the workstation page
// that shows it with its "Advanced..." button.
#include <windows.h>
#include <richedit.h>
#include <shlobj.h>

#include <gtest/gtest.h>

#include <cstdlib>
#include <ostream>
#include <string>

#include "inventory/ClientMaporaConfigDlg.h"
#include "inventory/InstallationReport.h"
#include "res/resource.h"
#include "tests/support/TestSupport.h"

void PrintTo(const TextRange& range, std::ostream* out) { *out << "{" << range.start << ", " << range.length << "}"; }

namespace {

using namespace testing_support;

// The built-in English texts, as the page loads them.
const ReportTexts kEnglish = {
    L"DESKTOP",
    L"ENGINE",
    L"SKYLOFT",
    L"SERVER",
    L"Installation Information",
    L"Service Pack Information",
    L" %s\r\n\r\n    %s\r\n    Product Name: %s\r\n    Release Version: %s\r\n    Product Version: %s\r\n"
    L"    Installation Folder: %s\r\n    Installed By: %s\r\n    Install Date: %s\r\n    Install Time: %s\r\n"
    L"    Install Image: %s\r\n    Current User: %s\r\n    Application Data Folder: %s\r\n"
    L"    System Temporary Folder: %s\r\n\r\n    %s\r\n    Mapora Service Pack: %s (build %s)\r\n\r\n",
    L" %s\r\n\r\n    %s\r\n    Installation Folder: %s\r\n ",
};

const SessionFolders kSession = {L"ann", L"C:\\Users\\ann\\AppData", L"C:\\Temp\\"};

// Every value names its product and field, so that a value on the wrong line shows.
ProductInstallInfo Values(const std::wstring& product) {
  ProductInstallInfo info;
  info.productName = product + L" name";
  info.realVersion = product + L" release";
  info.productVersion = product + L" version";
  info.installDir = product + L" folder";
  info.installer = product + L" installer";
  info.installDate = product + L" date";
  info.installTime = product + L" time";
  info.imageLocation = product + L" image";
  info.spNumber = product + L" sp";
  info.spBuild = product + L" build";
  return info;
}

// A product's block of the English report, line by line.
std::wstring EnglishBlock(const std::wstring& heading, const ProductInstallInfo& info) {
  return L" " + heading + L"\r\n" + L"\r\n" +
         L"    Installation Information\r\n" +
         L"    Product Name: " + info.productName + L"\r\n" +
         L"    Release Version: " + info.realVersion + L"\r\n" +
         L"    Product Version: " + info.productVersion + L"\r\n" +
         L"    Installation Folder: " + info.installDir + L"\r\n" +
         L"    Installed By: " + info.installer + L"\r\n" +
         L"    Install Date: " + info.installDate + L"\r\n" +
         L"    Install Time: " + info.installTime + L"\r\n" +
         L"    Install Image: " + info.imageLocation + L"\r\n" +
         L"    Current User: ann\r\n" +
         L"    Application Data Folder: C:\\Users\\ann\\AppData\r\n" +
         L"    System Temporary Folder: C:\\Temp\\\r\n" + L"\r\n" +
         L"    Service Pack Information\r\n" +
         L"    Mapora Service Pack: " + info.spNumber + L" (build " + info.spBuild + L")\r\n" + L"\r\n";
}

const std::wstring kSkyloftBlock =
    L" SKYLOFT\r\n\r\n    Installation Information\r\n    Installation Folder: D:\\Skyloft\r\n ";

// The nth occurrence (from 0) of word in text.
struct Occurrence {
  std::wstring word;
  int nth;
};

std::vector<TextRange> RangesOf(const std::wstring& text, const std::vector<Occurrence>& occurrences) {
  std::vector<TextRange> ranges;
  for (const Occurrence& occurrence : occurrences) {
    size_t at = text.find(occurrence.word);
    for (int skipped = 0; skipped < occurrence.nth; ++skipped) at = text.find(occurrence.word, at + 1);
    ranges.push_back({at, occurrence.word.size()});
  }
  return ranges;
}

ProductInstallInfo Named(const std::wstring& product, const std::wstring& name) {
  ProductInstallInfo info = Values(product);
  info.productName = name;
  return info;
}

ReportInput Installed(bool desktop, bool engine, bool skyloft, bool server,
                      const ProductInstallInfo& desktopValues = Values(L"Desktop")) {
  ReportInput input;
  input.desktopInstalled = desktop;
  input.engineInstalled = engine;
  input.skyloftInstalled = skyloft;
  input.serverInstalled = server;
  input.desktop = desktopValues;
  input.engine = Values(L"Engine");
  input.server = Values(L"Server");
  input.skyloftInstallDir = L"D:\\Skyloft";
  input.session = kSession;
  return input;
}

struct ReportRow {
  const char* name;
  ReportInput input;
  std::wstring text;
  std::vector<Occurrence> emphasis;  // product headings first, then the section headings
};

const Occurrence kInstallation0 = {L"Installation Information", 0};
const Occurrence kInstallation1 = {L"Installation Information", 1};
const Occurrence kServicePack0 = {L"Service Pack Information", 0};
const Occurrence kServicePack1 = {L"Service Pack Information", 1};

TEST(ComposeInstallationReport, InstalledProductsInFixedOrderWithTheirHeadingsEmphasised) {
  const ProductInstallInfo capitalEngine = Named(L"Desktop", L"MAPORA ENGINE EDITION");
  const ProductInstallInfo sectionInName = Named(L"Desktop", L"Installation Information Kit");
  const ReportRow rows[] = {
      {"only Desktop", Installed(true, false, false, false), EnglishBlock(L"DESKTOP", Values(L"Desktop")),
       {{L"DESKTOP", 0}, kInstallation0, kServicePack0}},
      {"Desktop and Engine, Desktop first", Installed(true, true, false, false),
       EnglishBlock(L"DESKTOP", Values(L"Desktop")) + EnglishBlock(L"ENGINE", Values(L"Engine")),
       {{L"DESKTOP", 0}, {L"ENGINE", 0}, kInstallation0, kInstallation1, kServicePack0, kServicePack1}},
      {"Skyloft after Desktop, ending in a line break and a blank", Installed(true, false, true, false),
       EnglishBlock(L"DESKTOP", Values(L"Desktop")) + kSkyloftBlock,
       {{L"DESKTOP", 0}, {L"SKYLOFT", 0}, kInstallation0, kInstallation1, kServicePack0}},
      {"a block after Skyloft starts on its last line", Installed(false, false, true, true),
       kSkyloftBlock + EnglishBlock(L"SERVER", Values(L"Server")),
       {{L"SKYLOFT", 0}, {L"SERVER", 0}, kInstallation0, kInstallation1, kServicePack0}},
      {"an upper-case ENGINE in a Desktop value takes the Engine heading's emphasis",
       Installed(true, true, false, false, capitalEngine),
       EnglishBlock(L"DESKTOP", capitalEngine) + EnglishBlock(L"ENGINE", Values(L"Engine")),
       {{L"DESKTOP", 0}, {L"ENGINE", 0}, kInstallation0, kInstallation1, kServicePack0, kServicePack1}},
      {"a section heading inside a product name is emphasised too",
       Installed(true, false, false, false, sectionInName),
       EnglishBlock(L"DESKTOP", sectionInName),
       {{L"DESKTOP", 0}, kInstallation0, kInstallation1, kServicePack0}},
      {"no product", Installed(false, false, false, false), L"", {}},
  };
  for (const ReportRow& row : rows) {
    SCOPED_TRACE(row.name);
    const InstallationReport report = ComposeInstallationReport(row.input, kEnglish);
    EXPECT_EQ(report.text, row.text);
    EXPECT_EQ(report.emphasis, RangesOf(row.text, row.emphasis));
  }
}

// Only whole, case-exact words are emphasised: "ENGINES" and "Engine" are not the heading.
TEST(ComposeInstallationReport, AHeadingInsideAWordOrInOtherCaseIsNotEmphasised) {
  const ReportInput input = Installed(true, true, false, false, Named(L"Desktop", L"ENGINES Engine"));
  const InstallationReport report = ComposeInstallationReport(input, kEnglish);
  const size_t engineHeading = report.text.find(L" ENGINE\r\n") + 1;
  EXPECT_EQ(report.emphasis.at(1), (TextRange{engineHeading, 6}));
}

TEST(ComposeInstallationReport, ATranslatedTemplateAndHeadingsAreUsedAsGiven) {
  ReportTexts german = kEnglish;
  german.installationInformation = L"Installationsinformationen";
  german.servicePackInformation = L"Service Pack-Informationen";
  german.productTemplate =
      L" %s\r\n\r\n    %s\r\n    Produktname: %s\r\n    Release-Version: %s\r\n    Produktversion: %s\r\n"
      L"    Installationsordner: %s\r\n    Installiert von: %s\r\n    Installationsdatum: %s\r\n"
      L"    Installationszeit: %s\r\n    Installationsabbild: %s\r\n    Aktueller Benutzer: %s\r\n"
      L"    Anwendungsdatenordner: %s\r\n    Tempor\u00e4rer Systemordner: %s\r\n\r\n    %s\r\n"
      L"    Mapora Service Pack: %s (Build %s)\r\n\r\n";
  ReportInput input;  // nothing recorded: every value its default
  input.desktopInstalled = true;
  const std::wstring expected =
      L" DESKTOP\r\n\r\n    Installationsinformationen\r\n    Produktname: \r\n    Release-Version: \r\n"
      L"    Produktversion: ?\r\n    Installationsordner: \r\n    Installiert von: \r\n    Installationsdatum: \r\n"
      L"    Installationszeit: \r\n    Installationsabbild: \r\n    Aktueller Benutzer: \r\n"
      L"    Anwendungsdatenordner: \r\n    Tempor\u00e4rer Systemordner: \r\n\r\n    Service Pack-Informationen\r\n"
      L"    Mapora Service Pack: 0 (Build 0)\r\n\r\n";
  const InstallationReport report = ComposeInstallationReport(input, german);
  EXPECT_EQ(report.text, expected);
  EXPECT_EQ(report.emphasis, RangesOf(expected, {{L"DESKTOP", 0},
                                                 {L"Installationsinformationen", 0},
                                                 {L"Service Pack-Informationen", 0}}));
}

TEST(LoadReportTexts, TheBuiltInTextsAreTheEnglishOnes) {
  const ReportTexts texts = LoadReportTexts();
  EXPECT_EQ(texts.desktop, kEnglish.desktop);
  EXPECT_EQ(texts.engine, kEnglish.engine);
  EXPECT_EQ(texts.skyloft, kEnglish.skyloft);
  EXPECT_EQ(texts.server, kEnglish.server);
  EXPECT_EQ(texts.installationInformation, kEnglish.installationInformation);
  EXPECT_EQ(texts.servicePackInformation, kEnglish.servicePackInformation);
  EXPECT_EQ(texts.productTemplate, kEnglish.productTemplate);
  EXPECT_EQ(texts.skyloftTemplate, kEnglish.skyloftTemplate);
}

TEST(RichEditOffset, EachLineBreakBeforeTheOffsetCountsAsOneCharacter) {
  const std::wstring text = L"ab\r\ncd\r\n\r\nef";
  EXPECT_EQ(RichEditOffset(text, 2), 2u);   // before the first break
  EXPECT_EQ(RichEditOffset(text, 4), 3u);   // "c"
  EXPECT_EQ(RichEditOffset(text, 10), 7u);  // "e", after three breaks
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
      {"a folder beginning with its name counts", true, common, common + L" Extra\\MaporaAdmin.exe", true},
      {"unknown folder", true, L"", L"D:\\Tools\\MaporaAdmin.exe", true},
      {"unknown program path", true, common, L"", true},
  };
  for (const auto& row : rows)
    EXPECT_EQ(OffersAdvancedSettings(row.desktopOrEngine, row.commonFiles, row.program), row.expected) << row.name;
}

// The page, in a window of its own, reaching the session through a stand-in for the main window.
class TestSession : public AdminSession {
 public:
  void EnableApply() override {}
  void OpenAdvancedSettings() override {}
};

class WorkstationPage : public ::testing::Test {
 protected:
  void SetUp() override {
    LoadLibraryW(L"RICHED20.DLL");
    page_.m_pAdminDlg = &session_;
  }
  void TearDown() override {
    page_.DestroyWindow();
    ::DestroyWindow(parent_);
  }
  bool Open() {
    CWnd parent(parent_);
    return page_.Create(IDD_MAPORA_CONFIG, &parent);
  }
  HWND Report() const { return page_.GetDlgItem(IDC_REPORT); }
  bool AdvancedVisible() const { return (GetWindowLongW(page_.GetDlgItem(IDC_ADVANCED), GWL_STYLE) & WS_VISIBLE) != 0; }
  CHARFORMAT2W FormatOf(size_t from, size_t to) const {
    CHARRANGE range = {static_cast<LONG>(from), static_cast<LONG>(to)};
    CHARFORMAT2W format = {};
    format.cbSize = sizeof(format);
    SendMessageW(Report(), EM_EXSETSEL, 0, reinterpret_cast<LPARAM>(&range));
    SendMessageW(Report(), EM_GETCHARFORMAT, SCF_SELECTION, reinterpret_cast<LPARAM>(&format));
    return format;
  }

  HWND parent_ = CreateWindowExW(0, L"STATIC", L"", WS_OVERLAPPEDWINDOW, 0, 0, 640, 640, 0, 0, 0, 0);
  TestSession session_;
  CClientMaporaConfigDlg page_;
};

TEST_F(WorkstationPage, ShowsTheReportWithItsRangesBoldInTheHighlightColour) {
  ScopedHiveOverride hives;
  InstalledProducts& products = session_.m_installedProducts;
  products.desktopKey = L"SOFTWARE\\KVEL\\Desktop10.5";
  products.engineKey = L"SOFTWARE\\KVEL\\Engine10.5";
  products.desktopInstalled = true;
  products.engineInstalled = true;
  SetRegistryString(HKEY_LOCAL_MACHINE, products.desktopKey, L"ProductName", L"Mapora Desktop");
  SetRegistryString(HKEY_LOCAL_MACHINE, products.engineKey, L"ProductName", L"Mapora Engine");
  ASSERT_TRUE(Open());
  page_.BuildInstallationReport();

  const InstallationReport report = ComposeInstallationReport(ReadReportInput(products), LoadReportTexts());
  ASSERT_NE(report.text.find(L"Mapora Engine"), std::wstring::npos);
  EXPECT_EQ(GetWindowTextOf(Report()), report.text);
  CHARRANGE caret = {-1, -1};
  SendMessageW(Report(), EM_EXGETSEL, 0, reinterpret_cast<LPARAM>(&caret));
  EXPECT_EQ(caret.cpMin, 0);
  EXPECT_EQ(caret.cpMax, 0);
  for (const TextRange& range : report.emphasis) {
    const size_t start = RichEditOffset(report.text, range.start);
    const size_t end = RichEditOffset(report.text, range.start + range.length);
    const CHARFORMAT2W emphasised = FormatOf(start, end);
    EXPECT_EQ(emphasised.dwMask & CFM_BOLD, static_cast<DWORD>(CFM_BOLD)) << "mixed " << start;
    EXPECT_EQ(emphasised.dwEffects & CFE_BOLD, static_cast<DWORD>(CFE_BOLD)) << "not bold " << start;
    EXPECT_EQ(emphasised.crTextColor, GetSysColor(COLOR_HIGHLIGHT)) << start;
    EXPECT_EQ(FormatOf(end, end + 1).dwEffects & CFE_BOLD, 0u) << "bold after " << start;
  }
}

// "Advanced..." with Desktop installed: hidden in the build folder; the test then starts a copy
// of itself from the shared 32-bit program folder, where it is shown.
TEST_F(WorkstationPage, AdvancedButtonOnlyInTheSharedProgramFolder) {
  const wchar_t kCopyMarker[] = L"REPORT_TESTS_RUN_AS_COPY";
  const bool copy = GetEnvironmentVariableW(kCopyMarker, nullptr, 0) != 0;
  session_.m_installedProducts.desktopInstalled = true;
  ASSERT_TRUE(Open());
  EXPECT_EQ(AdvancedVisible(), copy);
  if (copy) return;

  wchar_t common[MAX_PATH] = L"";
  SHGetFolderPathW(nullptr, CSIDL_PROGRAM_FILES_COMMONX86, nullptr, SHGFP_TYPE_CURRENT, common);
  ScopedDirectory folder(std::wstring(common) + L"\\MaporaReportTests");
  const std::wstring exe = folder.Path() + L"\\report_tests.exe";
  ASSERT_TRUE(CopyFileTo(ModuleFolder() + L"\\report_tests.exe", exe));
  SetEnvironmentVariableW(kCopyMarker, L"1");
  EXPECT_EQ(_wsystem((L"\"\"" + exe + L"\" --gtest_filter=WorkstationPage.AdvancedButton*\"").c_str()), 0);
  SetEnvironmentVariableW(kCopyMarker, nullptr);
}

}  // namespace
