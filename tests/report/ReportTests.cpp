#include <windows.h>
#include <richedit.h>
#include <shlobj.h>

#include <gtest/gtest.h>

#include <cstdlib>
#include <string>

#include "app/ClientAdminDlg.h"
#include "inventory/ClientMaporaConfigDlg.h"
#include "res/resource.h"
#include "tests/support/TestSupport.h"

using testing_support::ScopedRegistryKey;

namespace {

const std::wstring kRoot = L"SOFTWARE\\KVEL\\ReportTests\\";
const wchar_t kCopyMarker[] = L"REPORT_TESTS_RUN_AS_COPY";

// Every value names its product (tag) and field, so that a value on the wrong line shows.
void Write(ScopedRegistryKey& key, const std::wstring& tag, const wchar_t* imageValue) {
  if (tag.empty()) return;
  for (const wchar_t* name : {L"ProductName", L"RealVersion", L"InstallDir", L"Installer", L"InstallDate",
                              L"InstallTime", L"SPNumber", L"SPBuild"})
    key.SetString(name, tag + L" " + name);
  key.SetString(imageValue, tag + L" Image");
}

// Emphasised words are between asterisks. An empty tag: nothing recorded, the defaults. pfcore.dll
// is never found, so the product version is always unknown.
std::wstring Block(const std::wstring& heading, const std::wstring& tag) {
  auto v = [&](const wchar_t* name, const wchar_t* def = L"") { return tag.empty() ? def : tag + L" " + name; };
  wchar_t user[257] = L"", appData[MAX_PATH] = L"", temp[MAX_PATH] = L"";
  DWORD size = 257;
  GetUserNameW(user, &size), GetTempPathW(MAX_PATH, temp);
  SHGetFolderPathW(nullptr, CSIDL_APPDATA, nullptr, SHGFP_TYPE_CURRENT, appData);
  return L" " + heading + L"\r\n\r\n    *Installation Information*\r\n    Product Name: " + v(L"ProductName") +
         L"\r\n    Release Version: " + v(L"RealVersion") + L"\r\n    Product Version: ?\r\n    Installation Folder: " +
         v(L"InstallDir") + L"\r\n    Installed By: " + v(L"Installer") + L"\r\n    Install Date: " +
         v(L"InstallDate") + L"\r\n    Install Time: " + v(L"InstallTime") + L"\r\n    Install Image: " + v(L"Image") +
         L"\r\n    Current User: " + user + L"\r\n    Application Data Folder: " + appData +
         L"\r\n    System Temporary Folder: " + temp + L"\r\n\r\n    *Service Pack Information*" +
         L"\r\n    Mapora Service Pack: " + v(L"SPNumber", L"0") + L" (build " + v(L"SPBuild", L"0") + L")\r\n\r\n";
}

class Report : public ::testing::Test {
 protected:
  void SetUp() override { LoadLibraryW(L"RICHED20.DLL"), page_.m_pAdminDlg = &admin_; }
  void TearDown() override { page_.DestroyWindow(), ::DestroyWindow(parent_); }

  // installed: D(esktop), E(ngine), K (Skyloft), S(erver).
  void Open(const std::string& installed) {
    auto has = [&](char product) { return installed.find(product) != std::string::npos; };
    InstalledProducts& p = admin_.m_installedProducts;
    p.desktopKey = kRoot + L"Desktop", p.engineKey = kRoot + L"Engine", p.serverKey = kRoot + L"Server";
    p.skyloftKey = kRoot + L"Skyloft", p.desktopInstalled = has('D'), p.engineInstalled = has('E');
    p.skyloftInstalled = has('K'), p.serverInstalled = has('S');
    CWnd parent(parent_);
    ASSERT_TRUE(page_.GetSafeHwnd() || page_.Create(IDD_MAPORA_CONFIG, &parent));
  }

  // [from, to) is either bold in the highlight colour throughout or not bold throughout.
  void ExpectFormat(size_t from, size_t to, bool emphasised) const {
    CHARRANGE range = {static_cast<LONG>(from), static_cast<LONG>(to)};
    CHARFORMAT2W format = {};
    format.cbSize = sizeof(format);
    SendMessageW(page_.GetDlgItem(IDC_REPORT), EM_EXSETSEL, 0, reinterpret_cast<LPARAM>(&range));
    SendMessageW(page_.GetDlgItem(IDC_REPORT), EM_GETCHARFORMAT, SCF_SELECTION, reinterpret_cast<LPARAM>(&format));
    const bool highlighted = (format.dwMask & CFM_COLOR) && format.crTextColor == GetSysColor(COLOR_HIGHLIGHT);
    EXPECT_TRUE(from == to || ((format.dwMask & CFM_BOLD) && ((format.dwEffects & CFE_BOLD) != 0) == emphasised &&
                               (highlighted || !emphasised)))
        << (emphasised ? "not emphasised " : "bold ") << from << "-" << to;
  }

  ScopedRegistryKey root_{HKEY_LOCAL_MACHINE, kRoot};
  HWND parent_ = CreateWindowExW(0, L"STATIC", L"", WS_OVERLAPPEDWINDOW, 0, 0, 640, 640, 0, 0, 0, 0);
  CClientAdminDlg admin_;
  CClientMaporaConfigDlg page_;
};

// One page rebuilt for each case: every build reads the registry afresh and starts from plain text.
TEST_F(Report, TextOfTheInstalledProductsInFixedOrderWithHeadingsEmphasised) {
  const std::wstring kEngines = L"Engine ENGINES ENGINE";
  const std::wstring kSkyloft = L" *SKYLOFT*\r\n\r\n    *Installation Information*\r\n    Installation Folder: K\r\n ";
  // Only the first whole "ENGINE" of that case is emphasised: the one in a Desktop value, not the heading.
  std::wstring firstEngine = Block(L"*DESKTOP*", kEngines);
  firstEngine.replace(firstEngine.find(L" ENGINE "), 8, L" *ENGINE* ");
  const struct {
    const char* installed;
    std::wstring desktopTag, engineTag, expected;
  } cases[] = {
      {"D", L"D", L"E", Block(L"*DESKTOP*", L"D")},
      {"DE", kEngines, L"E", firstEngine + Block(L"ENGINE", L"E")},
      {"DKS", L"D", L"E", Block(L"*DESKTOP*", L"D") + kSkyloft + Block(L"*SERVER*", L"S")},  // on Skyloft's last line
      {"E", L"D", L"", Block(L"*ENGINE*", L"")},
      {"", L"D", L"E", L""},
  };
  for (const auto& c : cases) {
    SCOPED_TRACE(c.installed);
    ScopedRegistryKey desktop(HKEY_LOCAL_MACHINE, kRoot + L"Desktop"), engine(HKEY_LOCAL_MACHINE, kRoot + L"Engine"),
        server(HKEY_LOCAL_MACHINE, kRoot + L"Server"), skyloft(HKEY_LOCAL_MACHINE, kRoot + L"Skyloft");
    Write(desktop, c.desktopTag, L"ImageLocation"), Write(engine, c.engineTag, L"SourceDir");
    Write(server, L"S", L"ImageLocation"), skyloft.SetString(L"InstallDir", L"K");
    Open(c.installed);
    page_.BuildInstallationReport();

    CHARRANGE caret = {-1, -1};
    SendMessageW(page_.GetDlgItem(IDC_REPORT), EM_EXGETSEL, 0, reinterpret_cast<LPARAM>(&caret));
    EXPECT_TRUE(caret.cpMin == 0 && caret.cpMax == 0);
    // The rich edit counts "\r\n" as one character.
    std::wstring shown;
    size_t from = 0, at = 0;
    bool emphasised = false;
    for (wchar_t ch : c.expected) {
      if (ch == L'*') ExpectFormat(from, at, emphasised), from = at, emphasised = !emphasised;
      else shown += ch, at += ch == L'\n' ? 0 : 1;
    }
    ExpectFormat(from, at, false);
    EXPECT_EQ(GetWindowTextOf(page_.GetDlgItem(IDC_REPORT)), shown);
  }
}

// Desktop or Engine, and only to a copy in the shared 32-bit program folder: the test runs from
// the build folder and again from such a copy, which it starts.
TEST_F(Report, AdvancedButtonOnlyForDesktopOrEngineInTheSharedProgramFolder) {
  const bool copy = GetEnvironmentVariableW(kCopyMarker, nullptr, 0) != 0;
  for (const auto& [installed, offer] : {std::pair{"", false}, {"KS", false}, {"D", true}, {"E", true}}) {
    Open(installed);
    EXPECT_EQ(bool(GetWindowLongW(page_.GetDlgItem(IDC_ADVANCED), GWL_STYLE) & WS_VISIBLE), copy && offer) << installed;
    page_.DestroyWindow();
  }
  if (copy) return;
  wchar_t common[MAX_PATH] = L"";
  SHGetFolderPathW(nullptr, CSIDL_PROGRAM_FILES_COMMONX86, nullptr, SHGFP_TYPE_CURRENT, common);
  testing_support::ScopedDirectory folder(std::wstring(common) + L"\\MaporaReportTests");
  const std::wstring exe = folder.Path() + L"\\report_tests.exe";
  ASSERT_TRUE(testing_support::CopyFileTo(testing_support::ModuleFolder() + L"\\report_tests.exe", exe));
  SetEnvironmentVariableW(kCopyMarker, L"1");
  EXPECT_EQ(_wsystem((L"\"\"" + exe + L"\" --gtest_filter=Report.AdvancedButton*\"").c_str()), 0);
  SetEnvironmentVariableW(kCopyMarker, nullptr);
}

}  // namespace
