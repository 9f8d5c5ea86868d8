#include "settings/ClientMaporaAdvancedConfigDlg.h"

#include <shellapi.h>

#include <iterator>

#include "inventory/AdminSession.h"
#include "framework/StartupTrace.h"
#include "inventory/InstalledProducts.h"
#include "res/resource.h"
#include "settings/AdvancedSettings.h"
#include "settings/DisplayLanguageList.h"
#include "settings/LanguagePackFolders.h"
#include "settings/PortalConnectionManager.h"
#include "settings/URLTokenManager.h"

namespace {

// Height of the list's dropped-down part, in pixels.
constexpr int kDroppedListHeight = 512;

}  // namespace

CClientMaporaAdvancedConfigDlg::CClientMaporaAdvancedConfigDlg(CWnd* parent) : CDialog(IDD_ADVANCED_CONFIG, parent) {}

CString CClientMaporaAdvancedConfigDlg::LearnMoreAddress() {
  CString host = ReadRegistryString(HKEY_LOCAL_MACHINE, kAdministratorMachineKey, kSupportSiteValue, L"");
  if (host.empty()) host = kDefaultSupportSite;
  return host + kLearnMorePath;
}

void CClientMaporaAdvancedConfigDlg::DoDataExchange(CDataExchange* pDX) {
  CDialog::DoDataExchange(pDX);
  DDX_Control(pDX, IDC_LANGUAGE_LIST, m_languageList);
}

const MessageMap* CClientMaporaAdvancedConfigDlg::GetMessageMap() const {
  using Self = CClientMaporaAdvancedConfigDlg;
  static const MessageMapEntry entries[] = {
      fw::OnCommand<&Self::OnLanguageSelChange>(IDC_LANGUAGE_LIST, CBN_SELCHANGE),
      fw::OnCommand<&Self::OnKueiClicked>(IDC_KUEI_CHECK, BN_CLICKED),
      fw::OnCommand<&Self::OnLocalPortalClicked>(IDC_LOCAL_PORTAL, BN_CLICKED),
      fw::OnCommand<&Self::OnManagePortals>(IDC_MANAGE_PORTALS, BN_CLICKED),
      fw::OnNotify<&Self::OnLearnMore>(IDC_KUEI_LINK, NM_CLICK),
      fw::OnNotify<&Self::OnLearnMore>(IDC_KUEI_LINK, NM_RETURN),
      fw::OnCtlColor<&Self::OnCtlColorWarning>(WM_CTLCOLORSTATIC, IDC_LANGUAGE_WARNING),
  };
  static const MessageMap map = {CDialog::GetMessageMap(), entries, std::size(entries)};
  return &map;
}

BOOL CClientMaporaAdvancedConfigDlg::OnInitDialog() {
  fw::TraceStartup("advanced: OnInitDialog");
  CDialog::OnInitDialog();
  // Everything here reads the main window's state; without it there is nothing to show.
  if (m_pMainDlg == nullptr) {
    EndDialog(IDCANCEL);
    return TRUE;
  }
  BuildLanguageList();
  fw::TraceStartup("advanced: token manager, settings read");

  // The suite's token manager lives until initialisation is over, as the suite expects.
  CURLTokenManager tokens;
  EnableItem(IDC_MANAGE_PORTALS, !tokens.PortalServerSetByAdmin());
  EnableItem(IDC_LOCAL_PORTAL, !tokens.PortalServerSetByAdmin());

  const InstalledProducts& products = m_pMainDlg->m_installedProducts;
  EnableItem(IDC_KUEI_CHECK, m_pMainDlg->m_machineSettingsWritable);
  if (!products.desktopInstalled) {
    for (int id : {IDC_KUEI_CHECK, IDC_KUEI_GROUP, IDC_KUEI_LINK}) ShowItem(id, false);
  }

  m_enableKuei = ReadEnableKuei(products);
  CheckItem(IDC_KUEI_CHECK, m_enableKuei != 0);
  m_supportLocalPortal = ReadSupportLocalPortal(ConnectionKeyAccess::CreateMissing);
  CheckItem(IDC_LOCAL_PORTAL, m_supportLocalPortal != 0);
  fw::TraceStartup("advanced: OnInitDialog done, shown");
  return TRUE;
}

void CClientMaporaAdvancedConfigDlg::BuildLanguageList() {
  DisplayLanguageInput input;
  input.storedLangId = m_pMainDlg->m_dwUILangID;
  const LANGID uiLang = GetUserDefaultUILanguage();
  CString languageName;
  if (ReadNativeLanguageName(uiLang, languageName)) {
    CString name = languageName;
    CString country;
    if (ReadNativeCountryName(uiLang, country)) name += L" - " + country;
    input.windowsEntryText = fw::FormatString(IDS_DISPLAY_LANGUAGE_FORMAT, name.c_str());
    SetItemText(IDC_LANGUAGE_WARNING, fw::FormatString(IDS_LANGUAGE_PACK_MISSING, languageName.c_str()));
  } else {
    // The warning keeps its template text.
    input.windowsEntryText = fw::LoadString(IDS_DISPLAY_LANGUAGE);
  }
  input.uiLocaleName = UILocaleName(uiLang);
  fw::TraceStartup("advanced: language pack scans");
  input.products = FindLanguagePackFolders(m_pMainDlg->m_installedProducts);
  fw::TraceStartup("advanced: language list built");

  const DisplayLanguageList list = BuildDisplayLanguageList(input);
  if (list.forgetStoredLanguage) {
    // The stored language's pack has gone: forget the choice at once, whatever button ends this.
    DeleteStoredUILangID();
    m_pMainDlg->m_dwUILangID = 0;
  }
  m_selectedLangId = list.selectedLangId;
  m_languagePackFound = list.windowsLanguagePackFound;

  m_languageList.ResetContent();
  for (const DisplayLanguageEntry& entry : list.entries) {
    const int index = m_languageList.AddString(entry.text);
    if (index >= 0) m_languageList.SetItemData(index, entry.langId);
  }
  m_languageList.SetDroppedHeight(kDroppedListHeight);
  m_languageList.SetCurSel(list.selection);
  UpdateLanguageWarning();
}

void CClientMaporaAdvancedConfigDlg::UpdateLanguageWarning() {
  ShowItem(IDC_LANGUAGE_WARNING, ShowsLanguagePackWarning(m_languagePackFound, m_languageList.GetCurSel()));
}

void CClientMaporaAdvancedConfigDlg::OnLanguageSelChange(UINT, UINT, HWND) {
  const int index = m_languageList.GetCurSel();
  if (index != CB_ERR) m_selectedLangId = static_cast<DWORD>(m_languageList.GetItemData(index));
  UpdateLanguageWarning();
}

void CClientMaporaAdvancedConfigDlg::OnKueiClicked(UINT, UINT, HWND) {
  m_enableKuei = IsItemChecked(IDC_KUEI_CHECK) ? 1 : 0;
}

void CClientMaporaAdvancedConfigDlg::OnLocalPortalClicked(UINT, UINT, HWND) {
  m_supportLocalPortal = IsItemChecked(IDC_LOCAL_PORTAL) ? 1 : 0;
}

LRESULT CClientMaporaAdvancedConfigDlg::OnLearnMore(NMHDR*) {
  ShellExecuteW(m_hWnd, L"open", LearnMoreAddress().c_str(), nullptr, nullptr, SW_SHOWNORMAL);
  return 0;
}

void CClientMaporaAdvancedConfigDlg::OnManagePortals(UINT, UINT, HWND) { OpenPortalConnectionManager(); }

HBRUSH CClientMaporaAdvancedConfigDlg::OnCtlColorWarning(HDC dc, HWND control) {
  // The system's colours and brush first, then only the text turns red.
  HBRUSH brush = DefaultControlColor(WM_CTLCOLORSTATIC, dc, control);
  SetTextColor(dc, RGB(255, 0, 0));
  return brush;
}
