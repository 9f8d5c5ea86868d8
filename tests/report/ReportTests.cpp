// The installation report: its text and emphasis, and the workstation page that shows it.
#include <windows.h>
#include <richedit.h>

#include <gtest/gtest.h>

#include <algorithm>

#include "inventory/ClientMaporaConfigDlg.h"
#include "inventory/InstallationReport.h"
#include "res/resource.h"

namespace {

// A short template with the real one's arguments, one line per section, and translated sections.
const ReportTexts kTexts = {L"DESKTOP", L"ENGINE", L"SKYLOFT", L"SERVER", L"Einrichtung", L"Wartung",
                            L" %s\r\n %s|%s|%s|%s|%s|%s|%s|%s|%s|%s|%s|%s\r\n %s|%s|%s\r\n", L" %s\r\n %s|%s\r\n "};

// Each value names its field (the product name its product), so that a value out of place shows.
ReportInput Installed(bool desktop, bool engine, bool skyloft, bool server, std::wstring desktopName = L"Desktop") {
  auto values = [](const std::wstring& name) {
    return ProductInstallInfo{L"folder", L"by", name, L"image", L"date", L"time", L"release",
                              L"sp",     L"build", L"", L"",    L"",     L"",     L"",     L"version"};
  };
  return {desktop,           engine,        skyloft,     server, values(desktopName), values(L"Engine"),
          values(L"Server"), L"D:\\Skyloft", {L"ann", L"appdata", L"temp"}};
}

std::wstring Block(const std::wstring& heading, const std::wstring& name) {
  return L" " + heading + L"\r\n *Einrichtung*|" + name +
         L"|release|version|folder|by|date|time|image|ann|appdata|temp\r\n *Wartung*|sp|build\r\n";
}

// The report's text with every emphasised run between asterisks.
std::wstring Marked(InstallationReport report) {
  std::sort(report.emphasis.begin(), report.emphasis.end(), [](TextRange first, TextRange second) { return first.start > second.start; });
  for (const auto& run : report.emphasis) report.text.insert(run.start + run.length, L"*").insert(run.start, L"*");
  return report.text;
}

// Each product is left out once and meets every other once: no block can follow another's switch or place.
TEST(ComposeInstallationReport, InstalledProductsInFixedOrderWithTheirHeadingsEmphasised) {
  const std::wstring skyloft = L" *SKYLOFT*\r\n *Einrichtung*|D:\\Skyloft\r\n ";
  const struct { const char* name; ReportInput input; std::wstring marked; } rows[] = {
      {"the first whole, case-exact ENGINE is the heading; every section heading counts",
       Installed(true, true, false, false, L"Engine ENGINES ENGINE Einrichtung"),
       Block(L"*DESKTOP*", L"Engine ENGINES *ENGINE* *Einrichtung*") + Block(L"ENGINE", L"Engine")},
      {"Desktop before Skyloft", Installed(true, false, true, false), Block(L"*DESKTOP*", L"Desktop") + skyloft},
      {"Engine, Skyloft, Server", Installed(false, true, true, true),
       Block(L"*ENGINE*", L"Engine") + skyloft + Block(L"*SERVER*", L"Server")},
  };
  for (const auto& row : rows) EXPECT_EQ(Marked(ComposeInstallationReport(row.input, kTexts)), row.marked) << row.name;
}

TEST(OffersAdvancedSettings, ForDesktopOrEngineInsideTheSharedProgramFolder) {
  const std::wstring common = L"C:\\Program Files (x86)\\Common Files", inside = common + L"\\Mapora\\Admin.exe";
  const struct { const char* name; bool desktopOrEngine; std::wstring commonFiles, program; bool offered; } rows[] = {
      {"inside the folder", true, common, inside, true},
      {"neither Desktop nor Engine", false, common, inside, false},
      {"outside the folder", true, common, L"D:\\Tools\\Admin.exe", false},
      {"letter case counts", true, common, L"c:\\program files (x86)\\common files\\Admin.exe", false},
      {"unknown folder", true, L"", L"D:\\Tools\\Admin.exe", true},
      {"unknown program path", true, common, L"", true},
  };
  for (const auto& row : rows)
    EXPECT_EQ(OffersAdvancedSettings(row.desktopOrEngine, row.commonFiles, row.program), row.offered) << row.name;
}

// The page in a window of its own, with Engine installed, run from the build folder.
TEST(WorkstationPage, ShowsTheReportWithItsHeadingsBoldInTheHighlightColour) {
  struct : AdminSession {
    void OpenAdvancedSettings() override {}
  } admin;
  admin.m_installedProducts.engineInstalled = true;
  LoadLibraryW(L"RICHED20.DLL");
  CWnd parent(CreateWindowExW(0, L"STATIC", L"", WS_OVERLAPPEDWINDOW, 0, 0, 640, 640, 0, 0, 0, 0));
  CClientMaporaConfigDlg page;
  page.m_pAdminDlg = &admin;
  ASSERT_TRUE(page.Create(IDD_MAPORA_CONFIG, &parent));
  page.BuildInstallationReport();
  EXPECT_EQ(GetWindowLongW(page.GetDlgItem(IDC_ADVANCED), GWL_STYLE) & WS_VISIBLE, 0) << "Advanced... offered";

  const InstallationReport report =
      ComposeInstallationReport(ReadReportInput(admin.m_installedProducts), LoadReportTexts());
  const HWND edit = page.GetDlgItem(IDC_REPORT);
  auto select = [edit](size_t from, size_t to) {  // the selection's format
    CHARRANGE range = {static_cast<LONG>(from), static_cast<LONG>(to)};
    CHARFORMAT2W format = {};
    format.cbSize = sizeof format;
    SendMessageW(edit, EM_EXSETSEL, 0, reinterpret_cast<LPARAM>(&range));
    SendMessageW(edit, EM_GETCHARFORMAT, SCF_SELECTION, reinterpret_cast<LPARAM>(&format));
    return format;
  };
  for (const TextRange& range : report.emphasis) {
    const size_t start = RichEditOffset(report.text, range.start), end = start + range.length;
    const CHARFORMAT2W format = select(start, end);
    wchar_t selected[256] = L"";
    SendMessageW(edit, EM_GETSELTEXT, 0, reinterpret_cast<LPARAM>(selected));
    EXPECT_EQ(std::wstring(selected), report.text.substr(range.start, range.length)) << "emphasis at " << start;
    EXPECT_EQ(format.dwMask & CFM_BOLD, static_cast<DWORD>(CFM_BOLD)) << "partly bold at " << start;
    EXPECT_EQ(format.dwEffects & CFE_BOLD, static_cast<DWORD>(CFE_BOLD)) << "not bold at " << start;
    EXPECT_EQ(format.crTextColor, GetSysColor(COLOR_HIGHLIGHT)) << start;
    EXPECT_EQ(select(end, end + 1).dwEffects & CFE_BOLD, 0u) << "bold after " << start;
  }
}

}  // namespace
