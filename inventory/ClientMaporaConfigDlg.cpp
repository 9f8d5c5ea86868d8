#include "inventory/ClientMaporaConfigDlg.h"

#include <richedit.h>
#include <shlobj.h>

#include <iterator>

#include "inventory/InstallationReport.h"
#include "framework/StartupTrace.h"
#include "res/resource.h"

namespace {

const DWORD kPathChars = MAX_PATH;

// Marks runs of a rich edit the way the report emphasises its headings: bold, in the highlight
// colour, with no underline or strike-out.
void EmphasiseRanges(const CRichEditCtrl& richEdit, const InstallationReport& report) {
  CHARFORMAT2W format = {};
  format.cbSize = sizeof(format);
  format.dwMask = CFM_BOLD | CFM_UNDERLINE | CFM_STRIKEOUT | CFM_COLOR;
  format.dwEffects = CFE_BOLD;
  format.crTextColor = GetSysColor(COLOR_HIGHLIGHT);
  for (const TextRange& range : report.emphasis) {
    const size_t start = RichEditOffset(report.text, range.start);
    const size_t end = RichEditOffset(report.text, range.start + range.length);
    richEdit.SetSel(start, end);
    richEdit.SetSelectionCharFormat(format);
  }
}

// The program's path and the 32-bit common program files folder; empty where unknown.
std::wstring ProgramPath() {
  wchar_t path[kPathChars] = L"";
  if (GetModuleFileNameW(nullptr, path, kPathChars) == 0) return std::wstring();
  path[kPathChars - 1] = L'\0';
  return path;
}

std::wstring CommonFilesX86() {
  wchar_t folder[kPathChars] = L"";
  if (FAILED(SHGetFolderPathW(nullptr, CSIDL_PROGRAM_FILES_COMMONX86, nullptr, SHGFP_TYPE_CURRENT, folder)))
    return std::wstring();
  return folder;
}

}  // namespace

bool OffersAdvancedSettings(bool desktopOrEngineInstalled, const std::wstring& commonFilesX86,
                            const std::wstring& programPath) {
  if (!desktopOrEngineInstalled) return false;
  // The console only offers the advanced settings to a copy started from the suite's shared
  // 32-bit program folder; when either path cannot be determined it keeps the offer.
  if (commonFilesX86.empty() || programPath.empty()) return true;
  return programPath.compare(0, commonFilesX86.size(), commonFilesX86) == 0;
}

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
      fw::OnCommand<&CClientMaporaConfigDlg::OnAdvanced>(IDC_ADVANCED, BN_CLICKED),
  };
  static const MessageMap map = {CDialog::GetMessageMap(), entries, std::size(entries)};
  return &map;
}

void CClientMaporaConfigDlg::OnAdvanced(UINT, UINT, HWND) {
  fw::TraceStartup("advanced: clicked");
  if (m_pAdminDlg != nullptr) m_pAdminDlg->OpenAdvancedSettings();
}

void CClientMaporaConfigDlg::BuildInstallationReport() {
  fw::TraceStartup("report: composed from the registry");
  InstallationReport report;
  if (m_pAdminDlg != nullptr)
    report = ComposeInstallationReport(ReadReportInput(m_pAdminDlg->m_installedProducts), LoadReportTexts());
  fw::TraceStartup("report: text set");
  m_richEdit.SetWindowText(report.text);
  fw::TraceStartup("report: headings emphasised");
  EmphasiseRanges(m_richEdit, report);
  m_richEdit.SetSel(0, 0);
  fw::TraceStartup("report built");
}

void CClientMaporaConfigDlg::UpdateAdvancedButton() {
  bool desktopOrEngine = m_pAdminDlg != nullptr && (m_pAdminDlg->m_installedProducts.desktopInstalled ||
                                                    m_pAdminDlg->m_installedProducts.engineInstalled);
  ShowItem(IDC_ADVANCED, OffersAdvancedSettings(desktopOrEngine, CommonFilesX86(), ProgramPath()));
}
