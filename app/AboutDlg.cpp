#include "app/AboutDlg.h"

#include "inventory/InstalledProducts.h"
#include "inventory/ProductRegistry.h"
#include "res/resource.h"

CAboutDlg::CAboutDlg() : CDialog(IDD_ABOUTBOX) {}

void CAboutDlg::SetServicePackInfo(const CString& servicePack, const CString& build) {
  m_strServicePack = servicePack;
  m_strServicePackBuild = build;
}

void CAboutDlg::DoDataExchange(CDataExchange* pDX) {
  CDialog::DoDataExchange(pDX);
  DDX_Text(pDX, IDC_SERVICE_PACK, m_strServicePack);
  DDX_Text(pDX, IDC_SERVICE_PACK_BUILD, m_strServicePackBuild);
}

CString NormalizeServicePackBuild(const CString& build) {
  size_t dot = build.find(L'.');
  if (dot == CString::npos) return build;
  CString digits;
  for (size_t i = dot; i < build.size(); ++i)
    if (build[i] != L'.') digits += build[i];
  return digits;
}

ServicePackTexts ServicePackFieldTexts(const CString& name, const CString& recordedBuild, const CString& buildFormat) {
  ServicePackTexts texts;
  if (name.empty()) return texts;
  texts.servicePack = name;
  if (!recordedBuild.empty())
    texts.build = fw::FormatMessageText(buildFormat, {NormalizeServicePackBuild(recordedBuild)});
  return texts;
}

void LoadInstalledServicePack(CAboutDlg& about) {
  const std::wstring desktopKey = DesktopKey();
  const ServicePackTexts texts = ServicePackFieldTexts(
      ReadRegistryString(HKEY_LOCAL_MACHINE, desktopKey, L"SPDisplayName", L""),
      ReadRegistryString(HKEY_LOCAL_MACHINE, desktopKey, L"SPBuild", L""), fw::LoadString(IDS_BUILD_FORMAT));
  about.SetServicePackInfo(texts.servicePack, texts.build);
}
