#include "app/ClientAdminDlg.h"

#include <htmlhelp.h>

#include <iterator>
#include <vector>

#include "app/AboutDlg.h"
#include "framework/App.h"
#include "framework/PngResource.h"
#include "framework/StartupTrace.h"
#include "inventory/ClientMaporaConfigDlg.h"
#include "inventory/RunningSuiteApps.h"
#include "locale/KVELLocale.h"
#include "res/resource.h"
#include "settings/AdvancedSettings.h"

namespace {

const wchar_t kHelpFileName[] = L"administering_mapora_desktop.chm";
const wchar_t kHelpTopic[] = L"00030000000r000000.htm";

// Tree images come with white behind their transparent parts; pure blue marks what the image
// list treats as transparent.
constexpr COLORREF kPngBackground = RGB(255, 255, 255);
constexpr COLORREF kTreeMaskColor = RGB(0, 0, 255);

}  // namespace

CClientAdminDlg::CClientAdminDlg(CWnd* parent)
    : CDialog(IDD_MAPORAADMIN_DIALOG, parent),
      m_treeImages(fw::GetResourceHandle(), {IDB_TREE_WORKSTATION, IDB_TREE_FOLDER, IDB_TREE_PAGE}, kPngBackground) {
  m_hIcon = LoadIconW(fw::GetResourceHandle(), MAKEINTRESOURCEW(IDR_MAINFRAME));
}

void CClientAdminDlg::DoDataExchange(CDataExchange* pDX) {
  CDialog::DoDataExchange(pDX);
  DDX_Control(pDX, IDC_PAGE_TREE, m_wndTree);
}

const MessageMap* CClientAdminDlg::GetMessageMap() const {
  using Self = CClientAdminDlg;
  static const MessageMapEntry entries[] = {
      fw::OnSysCommand<&Self::OnSysCommand>(),
      fw::OnMessage<&Self::OnDestroy>(WM_DESTROY),
      fw::OnMessage<&Self::OnPaint>(WM_PAINT),
      fw::OnMessage<&Self::OnQueryDragIcon>(WM_QUERYDRAGICON),
      fw::OnCommand<&Self::OnApply>(IDC_APPLY_NOW, BN_CLICKED),
      fw::OnNotify<&Self::OnTreeSelChanged>(IDC_PAGE_TREE, static_cast<UINT>(TVN_SELCHANGEDW)),
      fw::OnMessage<&Self::OnCommandHelp>(WM_COMMANDHELP),
  };
  static const MessageMap map = {CDialog::GetMessageMap(), entries, std::size(entries)};
  return &map;
}

BOOL CClientAdminDlg::OnInitDialog() {
  fw::TraceStartup("OnInitDialog: system menu, icon");
  CDialog::OnInitDialog();

  CString aboutText = fw::LoadString(IDS_ABOUTBOX);
  HMENU systemMenu = GetSystemMenu(m_hWnd, FALSE);
  if (!aboutText.empty() && systemMenu != nullptr) {
    AppendMenuW(systemMenu, MF_SEPARATOR, 0, nullptr);
    AppendMenuW(systemMenu, MF_STRING, IDM_ABOUTBOX, aboutText.c_str());
  }
  // The program icon in the caption and the task bar.
  SetIcon(m_hIcon, true);
  SetIcon(m_hIcon, false);

  // Only the enumerator it keeps matters here: detection asks it which runtimes are present.
  fw::TraceStartup("OnInitDialog: runtime list");
  ListInstalledRuntimeVersions(m_installedProducts);
  LoadSettings();
  fw::TraceStartup("OnInitDialog: page tree");
  BuildPageTree();
  // The tree's images have been decoding on a worker since the window was constructed: the first
  // one loads GDI+'s codecs, which takes about as long as building the window. The tree gets them
  // before the window is shown, from the resources in use now.
  fw::TraceStartup("OnInitDialog: tree images");
  SetTreeImages(m_treeImages.Take(fw::GetResourceHandle()));
  fw::TraceStartup("OnInitDialog done: window shown");
  return TRUE;
}

void CClientAdminDlg::SetTreeImages(const std::vector<fw::ScopedBitmap>& bitmaps) {
  m_imgTree.Reset(ImageList_Create(16, 16, ILC_COLOR32 | ILC_MASK, 0, 0));
  if (!m_imgTree) return;
  // A missing image is skipped, so the ones after it move up.
  for (const fw::ScopedBitmap& bitmap : bitmaps) {
    if (bitmap) ImageList_AddMasked(m_imgTree.Get(), bitmap.Get(), kTreeMaskColor);
  }
  m_wndTree.SetImageList(m_imgTree.Get(), TVSIL_NORMAL);
}

void CClientAdminDlg::LoadSettings() {
  fw::TraceStartup("OnInitDialog: product detection");
  DetectInstalledProducts(m_installedProducts);
  fw::TraceStartup("OnInitDialog: UILANGID");
  if (const std::optional<DWORD> stored = ReadStoredUILangID()) m_dwUILangID = *stored;
  fw::TraceStartup("OnInitDialog: machine-settings probe");
  m_machineSettingsWritable = CanWriteMachineSettings();
}

void CClientAdminDlg::BuildPageTree() {
  CClientMaporaConfigDlg& rootPage = GetRootPage();
  if (m_bPagesCreated) rootPage.DestroyWindow();
  m_wndTree.DeleteAllItems();
  m_hRootItem = m_wndTree.InsertItem(fw::FormatString(IDS_WORKSTATION_NODE, fw::ComputerName().c_str()), 0, 0);

  // The page places itself beside the tree: its template carries its position.
  rootPage.m_pAdminDlg = this;
  fw::TraceStartup("page tree: root page created");
  rootPage.Create(IDD_MAPORA_CONFIG, this);
  m_bPagesCreated = true;

  m_wndTree.Expand(m_hRootItem, TVE_EXPAND);
  HTREEITEM selectedBefore = m_wndTree.GetSelectedItem();
  m_wndTree.SelectItem(m_hRootItem);
  // A tree that selected its first item on its own sends no change for it.
  if (selectedBefore == m_hRootItem && m_hRootItem != nullptr) ShowSelectedPage();

  EnableItem(IDC_APPLY_NOW, false);
  SetHelpFilePath();
}

void CClientAdminDlg::SetHelpFilePath() {
  CWinApp* app = AfxGetApp();
  if (app == nullptr) return;
  const std::wstring release = GetProductVersion();
  std::wstring installDir;
  CString helpPath;
  if (GetInstallDir(static_cast<int>(ProductKind::Desktop), release, installDir) ||
      GetInstallDir(static_cast<int>(ProductKind::Engine), release, installDir))
    helpPath = installDir + L"\\help\\" + kHelpFileName;
  app->SetHelpFilePath(helpPath);
}

void CClientAdminDlg::ShowSelectedPage() {
  HTREEITEM selected = m_wndTree.GetSelectedItem();
  const bool rootSelected = selected != nullptr && selected == m_hRootItem;
  CClientMaporaConfigDlg& rootPage = GetRootPage();
  if (rootPage.m_hWnd != nullptr) rootPage.ShowWindow(rootSelected ? SW_SHOW : SW_HIDE);
  if (rootSelected) {
    rootPage.BuildInstallationReport();
    SetHelpID(IDH_WORKSTATION_PAGE);
  }
}

LRESULT CClientAdminDlg::OnTreeSelChanged(NMHDR*) {
  ShowSelectedPage();
  return 0;
}

void CClientAdminDlg::OpenAdvancedSettings() { PersistAdvancedSettings(*this); }

LRESULT CClientAdminDlg::OnCommandHelp() {
  UINT helpId = GetHelpID();
  // The About command's number lies in the help range but has no topic.
  if (helpId >= IDH_FIRST && helpId <= IDH_LAST && helpId != IDM_ABOUTBOX) {
    CString helpPath = AfxGetApp() ? AfxGetApp()->GetHelpFilePath() : CString();
    KVELLocale::KVEL_HtmlHelp(m_hWnd, helpPath.c_str(), HH_DISPLAY_TOPIC, reinterpret_cast<DWORD_PTR>(kHelpTopic));
  }
  return TRUE;
}

void CClientAdminDlg::OnSysCommand(UINT command) {
  if ((command & 0xFFF0) == IDM_ABOUTBOX)
    ShowAboutBox();
  else
    Default();
}

void CClientAdminDlg::ShowAboutBox() {
  // The build text is formatted before the box opens; a pack without the box's template must not
  // leave it in the pack's language inside a box built from the program's own template.
  fw::RevertUnlessDialogTemplateFound(IDD_ABOUTBOX);
  CAboutDlg about;
  LoadInstalledServicePack(about);
  about.DoModal();
}

bool CClientAdminDlg::Save() {
  UpdateData(true);

  CString running;
  if (GetRunningSuiteAppsText(running)) {
    CString message = fw::FormatString(IDS_APPS_RUNNING_SAVE, running.c_str());
    CString caption = fw::LoadString(IDS_APP_CAPTION);
    MessageBoxW(nullptr, message.c_str(), caption.c_str(), MB_OK);
    return false;
  }

  // Write failures are not reported: the suite falls back to the user's own language.
  StoreUILangID(m_dwUILangID);
  return true;
}

void CClientAdminDlg::OnOK() {
  if (Save()) CDialog::OnOK();
}

void CClientAdminDlg::OnApply(UINT, UINT, HWND) {
  if (Save()) EnableItem(IDC_APPLY_NOW, false);
}

LRESULT CClientAdminDlg::OnDestroy() {
  fw::TraceStartup("shutdown: help windows closed");
  KVELLocale::KVEL_HtmlHelp(nullptr, HH_CLOSE_ALL, 0);
  fw::TraceStartup("shutdown: main window destroyed");
  if (AfxGetApp() != nullptr) AfxGetApp()->SetHelpFilePath(CString());
  Default();
  return 0;
}

LRESULT CClientAdminDlg::OnPaint() {
  fw::TraceStartup("main window painted");
  if (IsIconic(m_hWnd))
    PaintIconic(m_hIcon);
  else
    Default();
  return 0;
}

LRESULT CClientAdminDlg::OnQueryDragIcon() { return reinterpret_cast<LRESULT>(m_hIcon); }
