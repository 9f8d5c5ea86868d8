#include <windows.h>
#include <richedit.h>
#include <shlobj.h>

#include <gtest/gtest.h>

#include <fstream>
#include <iterator>
#include <string>
#include <vector>

#include "app/ClientAdminDlg.h"
#include "inventory/ClientMaporaConfigDlg.h"
#include "res/resource.h"
#include "tests/support/TestSupport.h"

using testing_support::ScopedDirectory;
using testing_support::ScopedRegistryKey;

namespace {

// Private product keys: the page reads whatever keys the main window hands it.
const wchar_t kTestRoot[] = L"SOFTWARE\\KVEL\\ReportTests";
const wchar_t kDesktopKey[] = L"SOFTWARE\\KVEL\\ReportTests\\Desktop10.5";
const wchar_t kEngineKey[] = L"SOFTWARE\\KVEL\\ReportTests\\Engine10.5";
const wchar_t kServerKey[] = L"SOFTWARE\\KVEL\\ReportTests\\Server10.5";
const wchar_t kSkyloftKey[] = L"SOFTWARE\\Kvel\\ReportTests\\Skyloft2016.1";

// One product's registry record; every field distinct so that a value in the wrong line shows.
struct ProductRecord {
  std::wstring productName, realVersion, installDir, installer, installDate, installTime, image;
  std::wstring spNumber, spBuild;
};

const ProductRecord kDesktop = {L"Mapora Desktop", L"10.5.0.6491", L"C:\\Mapora\\Desktop", L"desk-admin",
                                L"2024-03-01", L"09:15:00", L"D:\\images\\desktop", L"2", L"6500"};
const ProductRecord kEngine = {L"Mapora Engine", L"10.5.0.6492", L"C:\\Mapora\\Engine", L"engine-admin",
                               L"2024-03-02", L"10:20:00", L"D:\\images\\engine", L"1", L"6501"};
const ProductRecord kServer = {L"Mapora Server", L"10.5.0.6493", L"C:\\Mapora\\Server", L"server-admin",
                               L"2024-03-03", L"11:25:00", L"D:\\images\\server", L"3", L"6502"};
// Nothing in the registry: the report's defaults.
const ProductRecord kMissing = {L"", L"", L"", L"", L"", L"", L"", L"0", L"0"};
const wchar_t kSkyloftDir[] = L"C:\\Mapora\\Skyloft";

void WriteRecord(ScopedRegistryKey& key, const ProductRecord& record, const wchar_t* imageValue) {
  key.SetString(L"ProductName", record.productName);
  key.SetString(L"RealVersion", record.realVersion);
  key.SetString(L"InstallDir", record.installDir);
  key.SetString(L"Installer", record.installer);
  key.SetString(L"InstallDate", record.installDate);
  key.SetString(L"InstallTime", record.installTime);
  key.SetString(imageValue, record.image);
  key.SetString(L"SPNumber", record.spNumber);
  key.SetString(L"SPBuild", record.spBuild);
}

std::wstring UserName() {
  wchar_t name[257] = L"";
  DWORD size = 257;
  GetUserNameW(name, &size);
  return name;
}

std::wstring FolderPath(int csidl) {
  wchar_t path[MAX_PATH] = L"";
  SHGetFolderPathW(nullptr, csidl, nullptr, SHGFP_TYPE_CURRENT, path);
  return path;
}

std::wstring TempFolder() {
  wchar_t path[MAX_PATH] = L"";
  GetTempPathW(MAX_PATH, path);
  return path;
}

// The block of one product as the user reads it, line by line. The pfcore library is never
// found under the test folders, so the product version is always unknown.
std::wstring ProductBlock(const std::wstring& heading, const ProductRecord& r) {
  const std::vector<std::wstring> lines = {
      L" " + heading,
      L"",
      L"    Installation Information",
      L"    Product Name: " + r.productName,
      L"    Release Version: " + r.realVersion,
      L"    Product Version: ?",
      L"    Installation Folder: " + r.installDir,
      L"    Installed By: " + r.installer,
      L"    Install Date: " + r.installDate,
      L"    Install Time: " + r.installTime,
      L"    Install Image: " + r.image,
      L"    Current User: " + UserName(),
      L"    Application Data Folder: " + FolderPath(CSIDL_APPDATA),
      L"    System Temporary Folder: " + TempFolder(),
      L"",
      L"    Service Pack Information",
      L"    Mapora Service Pack: " + r.spNumber + L" (build " + r.spBuild + L")",
      L"",
  };
  std::wstring block;
  for (const std::wstring& line : lines) block += line + L"\r\n";
  return block;
}

std::wstring SkyloftBlock() {
  return L" SKYLOFT\r\n\r\n    Installation Information\r\n    Installation Folder: " + std::wstring(kSkyloftDir) +
         L"\r\n ";
}

// The rich edit keeps a paragraph break as a single "\r"; character positions count that way.
std::wstring AsRichEditText(std::wstring text) {
  for (size_t at = text.find(L"\r\n"); at != std::wstring::npos; at = text.find(L"\r\n", at + 1))
    text.erase(at + 1, 1);
  return text;
}

struct InstalledFlags {
  bool desktop, engine, skyloft, server;
};

// A hidden top-level window holds the page; the main window object is never shown.
class ReportPageTest : public ::testing::Test {
 protected:
  static void SetUpTestSuite() { LoadLibraryW(L"RICHED20.DLL"); }

  void SetUp() override {
    parent_ = CreateWindowExW(0, L"STATIC", L"", WS_OVERLAPPEDWINDOW, 0, 0, 640, 640, nullptr, nullptr,
                              GetModuleHandleW(nullptr), nullptr);
    InstalledProducts& products = admin_.m_installedProducts;
    products.desktopKey = kDesktopKey;
    products.engineKey = kEngineKey;
    products.serverKey = kServerKey;
    products.skyloftKey = kSkyloftKey;
    page_.m_pAdminDlg = &admin_;
  }

  void TearDown() override {
    page_.DestroyWindow();
    ::DestroyWindow(parent_);
  }

  void SetInstalled(const InstalledFlags& flags) {
    InstalledProducts& products = admin_.m_installedProducts;
    products.desktopInstalled = flags.desktop;
    products.engineInstalled = flags.engine;
    products.skyloftInstalled = flags.skyloft;
    products.serverInstalled = flags.server;
  }

  void CreatePage() {
    CWnd parent(parent_);
    ASSERT_TRUE(page_.Create(IDD_MAPORA_CONFIG, &parent));
  }

  HWND RichEdit() const { return page_.GetDlgItem(IDC_REPORT); }

  // The text as the rich edit counts characters (paragraph breaks as "\r").
  std::wstring StoredText() const {
    GETTEXTLENGTHEX length = {GTL_NUMCHARS, 1200};
    LRESULT chars = SendMessageW(RichEdit(), EM_GETTEXTLENGTHEX, reinterpret_cast<WPARAM>(&length), 0);
    std::vector<wchar_t> buffer(static_cast<size_t>(chars) + 1);
    GETTEXTEX get = {static_cast<DWORD>(buffer.size() * sizeof(wchar_t)), GT_DEFAULT, 1200, nullptr, nullptr};
    SendMessageW(RichEdit(), EM_GETTEXTEX, reinterpret_cast<WPARAM>(&get), reinterpret_cast<LPARAM>(buffer.data()));
    return buffer.data();
  }

  ScopedRegistryKey root_{HKEY_LOCAL_MACHINE, kTestRoot};
  ScopedRegistryKey desktopKey_{HKEY_LOCAL_MACHINE, kDesktopKey};
  ScopedRegistryKey engineKey_{HKEY_LOCAL_MACHINE, kEngineKey};
  ScopedRegistryKey serverKey_{HKEY_LOCAL_MACHINE, kServerKey};
  ScopedRegistryKey skyloftKey_{HKEY_LOCAL_MACHINE, kSkyloftKey, KEY_WOW64_64KEY};
  CClientAdminDlg admin_;
  CClientMaporaConfigDlg page_;
  HWND parent_ = nullptr;
};

// ---------------------------------------------------------------------------------------------
// The report: its text and which words of it are emphasised

struct Word {
  const wchar_t* text;
  int occurrence;  // counted as plain substrings: 0 is the first anywhere in the text
};

struct ReportCase {
  const char* name;
  InstalledFlags installed;
  ProductRecord desktop;
  bool engineRecorded;  // false: the Engine key holds no values
  std::wstring expected;
  std::vector<Word> emphasised;  // every other character must stay plain
};

void PrintTo(const ReportCase& c, std::ostream* os) { *os << c.name; }

ProductRecord Named(ProductRecord record, const wchar_t* productName) {
  record.productName = productName;
  return record;
}

const wchar_t kInstall[] = L"Installation Information";
const wchar_t kServicePack[] = L"Service Pack Information";

class Report : public ReportPageTest, public ::testing::WithParamInterface<ReportCase> {
 protected:
  // The attributes that [from, to) has throughout (dwMask) and their values.
  CHARFORMAT2W FormatOf(size_t from, size_t to) const {
    CHARRANGE range = {static_cast<LONG>(from), static_cast<LONG>(to)};
    SendMessageW(RichEdit(), EM_EXSETSEL, 0, reinterpret_cast<LPARAM>(&range));
    CHARFORMAT2W format = {};
    format.cbSize = sizeof(format);
    SendMessageW(RichEdit(), EM_GETCHARFORMAT, SCF_SELECTION, reinterpret_cast<LPARAM>(&format));
    return format;
  }

  // Checks every character of the text against the expected emphasised words: those bold
  // only, in the highlight colour; everything else not bold.
  void ExpectEmphasis(const std::vector<Word>& words) const {
    const std::wstring text = StoredText();
    std::vector<bool> emphasised(text.size(), false);
    for (const Word& word : words) {
      size_t at = text.find(word.text);
      for (int n = 0; n < word.occurrence && at != std::wstring::npos; ++n) at = text.find(word.text, at + 1);
      ASSERT_NE(at, std::wstring::npos) << testing::PrintToString(word.text);
      const size_t end = at + std::wcslen(word.text);
      const CHARFORMAT2W format = FormatOf(at, end);
      const DWORD uniform = CFM_BOLD | CFM_UNDERLINE | CFM_STRIKEOUT | CFM_COLOR;
      EXPECT_EQ(format.dwMask & uniform, uniform) << "mixed formats at " << at;
      EXPECT_EQ(format.dwEffects & (CFE_BOLD | CFE_UNDERLINE | CFE_STRIKEOUT | CFE_AUTOCOLOR), DWORD{CFE_BOLD})
          << testing::PrintToString(word.text) << " #" << word.occurrence;
      EXPECT_EQ(format.crTextColor, GetSysColor(COLOR_HIGHLIGHT));
      for (size_t i = at; i < end; ++i) emphasised[i] = true;
    }
    for (size_t i = 0; i < text.size(); ++i) {
      if (emphasised[i] || text[i] == L'\r' || text[i] == L' ') continue;
      EXPECT_EQ(FormatOf(i, i + 1).dwEffects & CFE_BOLD, 0u)
          << "bold at " << i << ": " << testing::PrintToString(text.substr(i, 20));
    }
  }
};

TEST_P(Report, ShowsTheInstalledProductsInFixedOrder) {
  const ReportCase& c = GetParam();
  WriteRecord(desktopKey_, c.desktop, L"ImageLocation");
  if (c.engineRecorded) {
    WriteRecord(engineKey_, kEngine, L"SourceDir");
    engineKey_.SetString(L"ImageLocation", L"not the Engine's image");
  }
  WriteRecord(serverKey_, kServer, L"ImageLocation");
  skyloftKey_.SetString(L"InstallDir", kSkyloftDir);
  SetInstalled(c.installed);
  CreatePage();

  page_.BuildInstallationReport();

  // What the user copies out of the page comes back with "\r\n" breaks.
  EXPECT_EQ(GetWindowTextOf(RichEdit()), c.expected);
  EXPECT_EQ(StoredText(), AsRichEditText(c.expected));
  ExpectEmphasis(c.emphasised);
  // The checks above moved the selection; a build puts the caret back at the start.
  CHARRANGE caret = {-1, -1};
  page_.BuildInstallationReport();
  SendMessageW(RichEdit(), EM_EXGETSEL, 0, reinterpret_cast<LPARAM>(&caret));
  EXPECT_EQ(caret.cpMin, 0);
  EXPECT_EQ(caret.cpMax, 0);
}

const std::wstring kDesktopBlock = ProductBlock(L"DESKTOP", kDesktop);

INSTANTIATE_TEST_SUITE_P(
    Cases, Report,
    ::testing::Values(
        ReportCase{"DesktopOnly", {true, false, false, false}, kDesktop, true, kDesktopBlock,
                   {{L"DESKTOP", 0}, {kInstall, 0}, {kServicePack, 0}}},
        ReportCase{"DesktopThenEngine", {true, true, false, false}, kDesktop, true,
                   kDesktopBlock + ProductBlock(L"ENGINE", kEngine),
                   {{L"DESKTOP", 0}, {L"ENGINE", 0}, {kInstall, 0}, {kInstall, 1}, {kServicePack, 0}, {kServicePack, 1}}},
        ReportCase{"SkyloftAfterDesktop", {true, false, true, false}, kDesktop, true, kDesktopBlock + SkyloftBlock(),
                   {{L"DESKTOP", 0}, {L"SKYLOFT", 0}, {kInstall, 0}, {kInstall, 1}, {kServicePack, 0}}},
        // A complete Server record alone makes no block: detection never marks a Server.
        ReportCase{"NothingInstalled", {false, false, false, false}, kDesktop, true, L"", {}},
        // The block after Skyloft continues on Skyloft's last line.
        ReportCase{"ServerFollowsSkyloftOnItsLine", {false, false, true, true}, kDesktop, true,
                   SkyloftBlock() + ProductBlock(L"SERVER", kServer),
                   {{L"SKYLOFT", 0}, {L"SERVER", 0}, {kInstall, 0}, {kInstall, 1}, {kServicePack, 0}}},
        ReportCase{"EngineWithoutValues", {false, true, false, false}, kDesktop, false,
                   ProductBlock(L"ENGINE", kMissing), {{L"ENGINE", 0}, {kInstall, 0}, {kServicePack, 0}}},
        // Mixed case and a longer word are no match: the Engine heading is found.
        ReportCase{"WholeWordsOfTheExactCase", {true, true, false, false}, Named(kDesktop, L"Engine ENGINES"), true,
                   ProductBlock(L"DESKTOP", Named(kDesktop, L"Engine ENGINES")) + ProductBlock(L"ENGINE", kEngine),
                   {{L"DESKTOP", 0}, {L"ENGINE", 1}, {kInstall, 0}, {kInstall, 1}, {kServicePack, 0}, {kServicePack, 1}}},
        // An earlier capital ENGINE takes the emphasis; the Engine heading itself stays plain.
        ReportCase{"FirstEngineWordOnly", {true, true, false, false}, Named(kDesktop, L"MAPORA ENGINE TOOLS"), true,
                   ProductBlock(L"DESKTOP", Named(kDesktop, L"MAPORA ENGINE TOOLS")) + ProductBlock(L"ENGINE", kEngine),
                   {{L"DESKTOP", 0}, {L"ENGINE", 0}, {kInstall, 0}, {kInstall, 1}, {kServicePack, 0}, {kServicePack, 1}}},
        ReportCase{"SectionWordsInAValue", {true, false, false, false}, Named(kDesktop, L"Installation Information Kit"),
                   true, ProductBlock(L"DESKTOP", Named(kDesktop, L"Installation Information Kit")),
                   {{L"DESKTOP", 0}, {kInstall, 0}, {kInstall, 1}, {kServicePack, 0}}}),
    [](const ::testing::TestParamInfo<ReportCase>& info) { return std::string(info.param.name); });

// Every build reads the registry afresh and starts from plain text.
TEST_F(Report, RebuildShowsTheRegistryOfNow) {
  WriteRecord(desktopKey_, kDesktop, L"ImageLocation");
  WriteRecord(engineKey_, kEngine, L"SourceDir");
  SetInstalled({true, true, false, false});
  CreatePage();
  page_.BuildInstallationReport();
  const std::wstring first = GetWindowTextOf(RichEdit());
  page_.BuildInstallationReport();
  EXPECT_EQ(GetWindowTextOf(RichEdit()), first);

  admin_.m_installedProducts.desktopInstalled = false;
  engineKey_.DeleteValue(L"SPNumber");
  engineKey_.SetString(L"ProductName", L"Mapora Engine Advanced");
  page_.BuildInstallationReport();

  ProductRecord changed = Named(kEngine, L"Mapora Engine Advanced");
  changed.spNumber = L"0";
  EXPECT_EQ(GetWindowTextOf(RichEdit()), ProductBlock(L"ENGINE", changed));
  ExpectEmphasis({{L"ENGINE", 0}, {kInstall, 0}, {kServicePack, 0}});
}

// ---------------------------------------------------------------------------------------------
// The Advanced button

// Set for a copy of this program started from the shared 32-bit program folder.
const wchar_t kCopyMarker[] = L"REPORT_TESTS_RUN_AS_COPY";

bool RunningAsCopy() { return GetEnvironmentVariableW(kCopyMarker, nullptr, 0) != 0; }

struct ButtonCase {
  const char* name;
  InstalledFlags installed;
  bool visibleFromBuildFolder;
  bool visibleFromCommonFiles;
};

void PrintTo(const ButtonCase& c, std::ostream* os) { *os << c.name; }

class AdvancedButton : public ReportPageTest, public ::testing::WithParamInterface<ButtonCase> {};

TEST_P(AdvancedButton, ShownOnlyToACopyInTheSharedProgramFolder) {
  const ButtonCase& c = GetParam();
  SetInstalled(c.installed);
  CreatePage();

  LONG style = GetWindowLongW(page_.GetDlgItem(IDC_ADVANCED), GWL_STYLE);
  bool expected = RunningAsCopy() ? c.visibleFromCommonFiles : c.visibleFromBuildFolder;
  EXPECT_EQ((style & WS_VISIBLE) != 0, expected);
}

INSTANTIATE_TEST_SUITE_P(Cases, AdvancedButton,
                         ::testing::Values(ButtonCase{"NothingInstalled", {false, false, false, false}, false, false},
                                           ButtonCase{"SkyloftAndServerOnly", {false, false, true, true}, false, false},
                                           ButtonCase{"Desktop", {true, false, false, false}, false, true},
                                           ButtonCase{"Engine", {false, true, false, false}, false, true}),
                         [](const ::testing::TestParamInfo<ButtonCase>& info) { return std::string(info.param.name); });

// Runs the cases above once more from a copy of this program under the folder.
TEST(AdvancedButtonFromCommonFiles, CopyPassesTheSameCases) {
  if (RunningAsCopy()) GTEST_SKIP() << "already the copy";
  ScopedDirectory folder(FolderPath(CSIDL_PROGRAM_FILES_COMMONX86) + L"\\MaporaReportTests");
  wchar_t self[MAX_PATH] = L"";
  GetModuleFileNameW(nullptr, self, MAX_PATH);
  const std::wstring copy = folder.MakeDir(L"bin") + L"\\report_tests.exe";
  ASSERT_TRUE(testing_support::CopyFileTo(self, copy));

  // The result file proves the copy ran the cases: a filter that matches nothing also exits 0.
  const std::wstring results = folder.Path() + L"\\results.xml";
  std::wstring commandLine =
      L"\"" + copy + L"\" --gtest_filter=Cases/AdvancedButton.* \"--gtest_output=xml:" + results + L"\"";
  SetEnvironmentVariableW(kCopyMarker, L"1");
  STARTUPINFOW startup = {};
  startup.cb = sizeof(startup);
  PROCESS_INFORMATION process = {};
  BOOL started = CreateProcessW(copy.c_str(), &commandLine[0], nullptr, nullptr, FALSE, 0, nullptr, nullptr,
                                &startup, &process);
  SetEnvironmentVariableW(kCopyMarker, nullptr);
  ASSERT_TRUE(started);
  WaitForSingleObject(process.hProcess, 120000);
  DWORD exitCode = 1;
  GetExitCodeProcess(process.hProcess, &exitCode);
  CloseHandle(process.hThread);
  CloseHandle(process.hProcess);
  EXPECT_EQ(exitCode, 0u);
  std::ifstream xml(results.c_str());
  const std::string report((std::istreambuf_iterator<char>(xml)), std::istreambuf_iterator<char>());
  EXPECT_NE(report.find("tests=\"4\" failures=\"0\""), std::string::npos) << report;
}

}  // namespace
