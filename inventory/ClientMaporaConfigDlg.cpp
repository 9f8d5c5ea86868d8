#include "inventory/ClientMaporaConfigDlg.h"

#include <commdlg.h>  // the find options of the rich edit
#include <richedit.h>
#include <shlobj.h>

#include <cwchar>
#include <initializer_list>
#include <iterator>

#include "app/ClientAdminDlg.h"
#include "framework/ComRef.h"
#include "framework/StartupTrace.h"
#include "res/resource.h"
#include "settings/AdvancedSettings.h"

namespace {

// GetUserNameW's limit for a user name plus its terminator.
const DWORD kUserNameChars = 257;
const DWORD kPathChars = MAX_PATH;

// Who runs the console and where its per-user and temporary files go; the same in every
// product block of one report.
struct SessionFolders {
  CString user;
  CString appData;
  CString temp;
};

CString CurrentUserName() {
  wchar_t name[kUserNameChars] = L"";
  DWORD size = kUserNameChars;
  if (!GetUserNameW(name, &size)) return CString();
  return name;
}

CString RoamingAppDataFolder() {
  LPITEMIDLIST itemList = nullptr;
  if (FAILED(SHGetSpecialFolderLocation(nullptr, CSIDL_APPDATA, &itemList)) || itemList == nullptr)
    return CString();
  wchar_t path[kPathChars] = L"";
  if (!SHGetPathFromIDListW(itemList, path)) path[0] = L'\0';
  // The item list belongs to the shell's allocator.
  ComRef<IMalloc> shellAllocator;
  if (SUCCEEDED(SHGetMalloc(shellAllocator.Receive())) && shellAllocator) shellAllocator->Free(itemList);
  return path;
}

CString TemporaryFolder() {
  wchar_t path[kPathChars] = L"";
  DWORD length = GetTempPathW(kPathChars, path);
  // A result of kPathChars or more is the size the path would need: nothing was written.
  if (length == 0 || length >= kPathChars) return CString();
  return CString(path, length);
}

SessionFolders ReadSessionFolders() { return {CurrentUserName(), RoamingAppDataFolder(), TemporaryFolder()}; }

struct ReportHeadings {
  CString desktop;  // product headings, upper case
  CString engine;
  CString skyloft;
  CString server;
  CString installationInformation;
  CString servicePackInformation;
};

ReportHeadings LoadReportHeadings() {
  return {fw::ToUpper(fw::LoadString(IDS_DESKTOP)),         fw::ToUpper(fw::LoadString(IDS_ENGINE)),
          fw::ToUpper(fw::LoadString(IDS_SKYLOFT)),         fw::ToUpper(fw::LoadString(IDS_SERVER)),
          fw::LoadString(IDS_INSTALLATION_INFORMATION), fw::LoadString(IDS_SERVICE_PACK_INFORMATION)};
}

// Every block is formatted from what the registry holds now; only the installed products'
// blocks make up the report, always in the same order.
CString ComposeReport(const InstalledProducts& products, const ReportHeadings& headings) {
  const ProductInstallInfo desktop = ReadProductInstallInfo(ProductKind::Desktop, products.desktopKey);
  const ProductInstallInfo engine = ReadProductInstallInfo(ProductKind::Engine, products.engineKey);
  const ProductInstallInfo server = ReadProductInstallInfo(ProductKind::Server, products.serverKey);
  const CString skyloftInstallDir = ReadRegistryString(HKEY_LOCAL_MACHINE, products.skyloftKey, L"InstallDir", L"");
  const SessionFolders session = ReadSessionFolders();

  auto productBlock = [&](const CString& heading, const ProductInstallInfo& info) {
    return fw::FormatString(IDS_PRODUCT_REPORT, heading.c_str(), headings.installationInformation.c_str(),
                            info.productName.c_str(), info.realVersion.c_str(), info.productVersion.c_str(),
                            info.installDir.c_str(), info.installer.c_str(), info.installDate.c_str(),
                            info.installTime.c_str(), info.imageLocation.c_str(), session.user.c_str(),
                            session.appData.c_str(), session.temp.c_str(),
                            headings.servicePackInformation.c_str(), info.spNumber.c_str(),
                            info.spBuild.c_str());
  };
  const CString desktopBlock = productBlock(headings.desktop, desktop);
  const CString engineBlock = productBlock(headings.engine, engine);
  const CString serverBlock = productBlock(headings.server, server);
  const CString skyloftBlock = fw::FormatString(IDS_SKYLOFT_REPORT, headings.skyloft.c_str(),
                                                headings.installationInformation.c_str(),
                                                skyloftInstallDir.c_str());

  CString report;
  if (products.desktopInstalled) report += desktopBlock;
  if (products.engineInstalled) report += engineBlock;
  if (products.skyloftInstalled) report += skyloftBlock;
  if (products.serverInstalled) report += serverBlock;
  return report;
}

// Finds whole, case-exact words in a rich edit and marks them the way the report does.
class ReportEmphasis {
 public:
  explicit ReportEmphasis(const CWnd& richEdit) : m_richEdit(richEdit) {
    m_format.cbSize = sizeof(m_format);
    m_format.dwMask = CFM_BOLD | CFM_UNDERLINE | CFM_STRIKEOUT | CFM_COLOR;
    m_format.dwEffects = CFE_BOLD;
    m_format.crTextColor = GetSysColor(COLOR_HIGHLIGHT);
  }

  void First(const CString& word) {
    CHARRANGE match;
    if (Find(word, 0, match)) Apply(match);
  }

  void Every(const CString& word) {
    CHARRANGE match;
    for (LONG from = 0; Find(word, from, match); from = match.cpMin + 1) Apply(match);
  }

 private:
  bool Find(const CString& word, LONG from, CHARRANGE& match) const {
    // An empty word (a string missing from a resource library) would match everywhere.
    if (word.empty()) return false;
    FINDTEXTEXW find = {};
    find.chrg.cpMin = from;
    find.chrg.cpMax = -1;  // to the end of the text
    find.lpstrText = word.c_str();
    LRESULT found = m_richEdit.SendMessage(EM_FINDTEXTEXW, FR_DOWN | FR_WHOLEWORD | FR_MATCHCASE,
                                           reinterpret_cast<LPARAM>(&find));
    if (found < 0) return false;
    match = find.chrgText;
    return true;
  }

  void Apply(const CHARRANGE& range) {
    m_richEdit.SendMessage(EM_SETSEL, static_cast<WPARAM>(range.cpMin), static_cast<LPARAM>(range.cpMax));
    m_richEdit.SendMessage(EM_SETCHARFORMAT, SCF_SELECTION, reinterpret_cast<LPARAM>(&m_format));
  }

  const CWnd& m_richEdit;
  CHARFORMAT2W m_format = {};
};

// The console only offers the advanced settings to a copy started from the suite's shared
// 32-bit program folder; when either path cannot be determined it keeps the offer.
bool StartedFromCommonFilesX86() {
  wchar_t commonFiles[kPathChars] = L"";
  if (FAILED(SHGetFolderPathW(nullptr, CSIDL_PROGRAM_FILES_COMMONX86, nullptr, SHGFP_TYPE_CURRENT, commonFiles)))
    return true;
  wchar_t modulePath[kPathChars] = L"";
  if (GetModuleFileNameW(nullptr, modulePath, kPathChars) == 0) return true;
  modulePath[kPathChars - 1] = L'\0';
  return std::wcsncmp(modulePath, commonFiles, std::wcslen(commonFiles)) == 0;
}

}  // namespace

CClientMaporaConfigDlg& GetRootPage() {
  static CClientMaporaConfigDlg page;
  return page;
}

CClientMaporaConfigDlg::CClientMaporaConfigDlg() : CDialog(IDD_MAPORA_CONFIG) {}

void CClientMaporaConfigDlg::DoDataExchange(CDataExchange* pDX) {
  CDialog::DoDataExchange(pDX);
  DDX_Control(pDX, IDC_REPORT, m_richEdit);
}

BOOL CClientMaporaConfigDlg::OnInitDialog() {
  fw::TraceStartup("page tree: root page advanced button");
  CDialog::OnInitDialog();
  UpdateAdvancedButton();
  return TRUE;
}

const MessageMap* CClientMaporaConfigDlg::GetMessageMap() const {
  static const MessageMapEntry entries[] = {
      {WM_COMMAND, IDC_ADVANCED, BN_CLICKED, Handler(&CClientMaporaConfigDlg::OnAdvanced)},
  };
  static const MessageMap map = {CDialog::GetMessageMap(), entries, std::size(entries)};
  return &map;
}

LRESULT CClientMaporaConfigDlg::OnAdvanced(WPARAM, LPARAM) {
  fw::TraceStartup("advanced: clicked, link class, dialog created");
  if (m_pAdminDlg != nullptr) PersistAdvancedSettings(*m_pAdminDlg);
  return 0;
}

void CClientMaporaConfigDlg::BuildInstallationReport() {
  fw::TraceStartup("report: composed from the registry");
  const ReportHeadings headings = LoadReportHeadings();
  const CString report =
      m_pAdminDlg != nullptr ? ComposeReport(m_pAdminDlg->m_installedProducts, headings) : CString();
  fw::TraceStartup("report: text set");
  m_richEdit.SendMessage(WM_SETTEXT, 0, reinterpret_cast<LPARAM>(report.c_str()));
  fw::TraceStartup("report: headings emphasised");

  // Only the first occurrence of a product heading is its heading; section headings repeat
  // once per block.
  ReportEmphasis emphasis(m_richEdit);
  for (const CString* product : {&headings.desktop, &headings.engine, &headings.skyloft, &headings.server})
    emphasis.First(*product);
  emphasis.Every(headings.installationInformation);
  emphasis.Every(headings.servicePackInformation);

  m_richEdit.SendMessage(EM_SETSEL, 0, 0);
  fw::TraceStartup("report built");
}

void CClientMaporaConfigDlg::UpdateAdvancedButton() {
  bool desktopOrEngine = m_pAdminDlg != nullptr && (m_pAdminDlg->m_installedProducts.desktopInstalled ||
                                                    m_pAdminDlg->m_installedProducts.engineInstalled);
  bool visible = desktopOrEngine && StartedFromCommonFilesX86();
  ::ShowWindow(GetDlgItem(IDC_ADVANCED), visible ? SW_SHOW : SW_HIDE);
}
