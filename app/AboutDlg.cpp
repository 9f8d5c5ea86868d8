#include "app/AboutDlg.h"

#include "inventory/InstalledProducts.h"
#include "inventory/ProductRegistry.h"
#include "res/resource.h"

CAboutDlg::CAboutDlg() : CDialog(IDD_ABOUTBOX) {}

CAboutDlg::~CAboutDlg() = default;

void CAboutDlg::SetServicePackInfo(const CString& servicePack, const CString& build) {
  m_strServicePack = servicePack;
  m_strServicePackBuild = build;
}

void CAboutDlg::DoDataExchange(CDataExchange* pDX) {
  CDialog::DoDataExchange(pDX);
  DDX_Text(pDX, IDC_SERVICE_PACK, m_strServicePack);
  DDX_Text(pDX, IDC_SERVICE_PACK_BUILD, m_strServicePackBuild);
}

const MessageMap* CAboutDlg::GetMessageMap() const {
  static const MessageMap map = {CDialog::GetMessageMap(), nullptr, 0};
  return &map;
}

CString NormalizeServicePackBuild(const CString& build) {
  size_t dot = build.find(L'.');
  if (dot == CString::npos) return build;
  CString digits;
  for (size_t i = dot; i < build.size(); ++i)
    if (build[i] != L'.') digits += build[i];
  return digits;
}

void LoadInstalledServicePack(CAboutDlg& about) {
  const std::wstring desktopKey = ProductKey(kDesktopKeyBase, GetProductVersion());
  CString servicePack = ReadRegistryString(HKEY_LOCAL_MACHINE, desktopKey, L"SPDisplayName", L"");
  CString buildText;
  if (!servicePack.empty()) {
    CString build = ReadRegistryString(HKEY_LOCAL_MACHINE, desktopKey, L"SPBuild", L"");
    if (!build.empty()) buildText = fw::FormatMessageString(IDS_BUILD_FORMAT, {NormalizeServicePackBuild(build)});
  }
  about.SetServicePackInfo(servicePack, buildText);
}
