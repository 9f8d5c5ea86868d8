#include "settings/ClientMaporaAdvancedConfigDlg.h"

#include <commctrl.h>
#include <shellapi.h>

#include <iterator>

#include "app/ClientAdminDlg.h"
#include "framework/StartupTrace.h"
#include "inventory/InstalledProducts.h"
#include "locale/LocaleInternals.h"
#include "res/resource.h"
#include "settings/AdvancedSettings.h"
#include "settings/PortalConnectionManager.h"
#include "settings/URLTokenManager.h"

namespace {

constexpr int kLocaleTextChars = 256;
constexpr DWORD kEnglishEntryLangId = 9;
// Height of the list's dropped-down part, in pixels.
constexpr int kDroppedListHeight = 512;
// Every en-US pack is listed, even when another product already brought one.
constexpr wchar_t kEnglishUSEntry[] = L"English (United States)";

bool SameTextIgnoringCase(const CString& a, const CString& b) {
  return CompareStringOrdinal(a.c_str(), static_cast<int>(a.size()), b.c_str(), static_cast<int>(b.size()), TRUE) ==
         CSTR_EQUAL;
}

bool GetLocaleText(LCID locale, LCTYPE type, CString& text) {
  wchar_t buffer[kLocaleTextChars] = L"";
  if (GetLocaleInfoW(locale, type, buffer, kLocaleTextChars) <= 0) return false;
  text = buffer;
  return true;
}

// The native country name, only for a locale the system supports as a whole. A language without
// a country (sub-language 0, as a "de" pack names it) is never one, although some systems'
// IsValidLocale accept it and then report the language's main country.
bool GetNativeCountry(LANGID langId, CString& country) {
  return SUBLANGID(langId) != SUBLANG_NEUTRAL && IsValidLocale(langId, LCID_SUPPORTED) &&
         GetLocaleText(langId, LOCALE_SNATIVECTRYNAME, country);
}

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
      {WM_COMMAND, IDC_LANGUAGE_LIST, CBN_SELCHANGE, Handler(&Self::OnLanguageSelChange)},
      {WM_COMMAND, IDC_KUEI_CHECK, BN_CLICKED, Handler(&Self::OnKueiClicked)},
      {WM_COMMAND, IDC_LOCAL_PORTAL, BN_CLICKED, Handler(&Self::OnLocalPortalClicked)},
      {WM_COMMAND, IDC_MANAGE_PORTALS, BN_CLICKED, Handler(&Self::OnManagePortals)},
      {WM_NOTIFY, IDC_KUEI_LINK, NM_CLICK, Handler(&Self::OnLearnMore)},
      {WM_NOTIFY, IDC_KUEI_LINK, NM_RETURN, Handler(&Self::OnLearnMore)},
      {WM_CTLCOLORSTATIC, IDC_LANGUAGE_WARNING, 0, Handler(&Self::OnCtlColorWarning)},
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
  ::EnableWindow(GetDlgItem(IDC_MANAGE_PORTALS), tokens.PortalServerSetByAdmin() ? FALSE : TRUE);
  ::EnableWindow(GetDlgItem(IDC_LOCAL_PORTAL), tokens.PortalServerSetByAdmin() ? FALSE : TRUE);

  const InstalledProducts& products = m_pMainDlg->m_installedProducts;
  ::EnableWindow(GetDlgItem(IDC_KUEI_CHECK), m_pMainDlg->m_machineSettingsWritable ? TRUE : FALSE);
  if (!products.desktopInstalled) {
    for (int id : {IDC_KUEI_CHECK, IDC_KUEI_GROUP, IDC_KUEI_LINK}) ::ShowWindow(GetDlgItem(id), SW_HIDE);
  }

  m_enableKuei = ReadEnableKuei(products);
  CheckDlgButton(m_hWnd, IDC_KUEI_CHECK, m_enableKuei != 0 ? BST_CHECKED : BST_UNCHECKED);
  m_supportLocalPortal = ReadSupportLocalPortal();
  CheckDlgButton(m_hWnd, IDC_LOCAL_PORTAL, m_supportLocalPortal != 0 ? BST_CHECKED : BST_UNCHECKED);
  fw::TraceStartup("advanced: OnInitDialog done, shown");
  return TRUE;
}

void CClientMaporaAdvancedConfigDlg::BuildLanguageList() {
  fw::TraceStartup("advanced: language list, Windows language entry");
  m_languagesListed = false;
  m_languageList.SendMessage(CB_RESETCONTENT);
  m_selectedLangId = m_pMainDlg->m_dwUILangID;

  const LANGID uiLang = GetUserDefaultUILanguage();
  CString languageName;
  CString windowsEntry;
  if (GetLocaleText(uiLang, LOCALE_SNATIVELANGNAME, languageName)) {
    CString name = languageName;
    CString country;
    if (GetNativeCountry(uiLang, country)) name += L" - " + country;
    windowsEntry = fw::FormatString(IDS_DISPLAY_LANGUAGE_FORMAT, name.c_str());
    SetDlgItemTextW(m_hWnd, IDC_LANGUAGE_WARNING,
                    fw::FormatString(IDS_LANGUAGE_PACK_MISSING, languageName.c_str()).c_str());
  } else {
    // The warning keeps its template text.
    windowsEntry = fw::LoadString(IDS_DISPLAY_LANGUAGE);
  }
  AppendLanguage(windowsEntry, 0);
  AppendLanguage(L"English", kEnglishEntryLangId);

  RECT client = {};
  GetClientRect(m_languageList.m_hWnd, &client);
  SetWindowPos(m_languageList.m_hWnd, nullptr, 0, 0, client.right - client.left, kDroppedListHeight,
               SWP_NOMOVE | SWP_NOZORDER);

  if (!m_languagesListed) {
    CString language;
    m_uiLocaleName.clear();
    if (GetLocaleText(uiLang, LOCALE_SISO639LANGNAME, language)) {
      m_uiLocaleName = language;
      CString country;
      if (GetLocaleText(uiLang, LOCALE_SISO3166CTRYNAME, country)) m_uiLocaleName += L"-" + country;
    }
    fw::TraceStartup("advanced: language pack scans");
    CollectLanguagePacks();
    m_languagesListed = true;
  }

  fw::TraceStartup("advanced: current language selected");
  SelectCurrentLanguage();
  UpdateLanguageWarning();
}

void CClientMaporaAdvancedConfigDlg::CollectLanguagePacks() {
  const InstalledProducts& products = m_pMainDlg->m_installedProducts;
  const std::wstring* keys[] = {products.desktopInstalled ? &products.desktopKey : nullptr,
                                products.engineInstalled ? &products.engineKey : nullptr};
  for (const std::wstring* key : keys) {
    if (key == nullptr) continue;
    // Plain concatenation: an InstallDir ending in a backslash gives a doubled one, which the
    // file system accepts.
    ScanLanguagePackFolder(GetProductBinFolder(*key) + L"*");
  }
}

void CClientMaporaAdvancedConfigDlg::ScanLanguagePackFolder(const CString& pattern) {
  // Each product's scan starts afresh, so only the last scanned product decides the warning.
  m_languagePackFound = SameTextIgnoringCase(m_uiLocaleName, L"en-US");

  WIN32_FIND_DATAW entry;
  HANDLE find = FindFirstFileW(pattern.c_str(), &entry);
  if (find == INVALID_HANDLE_VALUE) return;
  do {
    if ((entry.dwFileAttributes & FILE_ATTRIBUTE_DIRECTORY) == 0) continue;
    unsigned short langId = 0;
    fw::TraceStartup("advanced: pack folder, locale enumeration");
    if (!KVELLocale::GetLangIDFromName(entry.cFileName, langId)) continue;
    fw::TraceStartup("advanced: pack folder, list entry");
    const CString folder = entry.cFileName;
    if (folder.find(L'-') == CString::npos) {
      // A language-only pack serves every country of its language.
      size_t dash = m_uiLocaleName.find(L'-');
      if (dash != CString::npos && dash > 0) m_uiLocaleName.resize(dash);
    }
    if (SameTextIgnoringCase(m_uiLocaleName, folder)) m_languagePackFound = true;
    AddLanguageEntry(langId);
  } while (FindNextFileW(find, &entry));
  FindClose(find);
}

void CClientMaporaAdvancedConfigDlg::AddLanguageEntry(DWORD langId) {
  const LANGID id = LOWORD(langId);
  CString text;
  if (!GetLocaleText(id, LOCALE_SNATIVELANGNAME, text)) return;
  CString country;
  if (GetNativeCountry(id, country)) text += L" (" + country + L")";
  LRESULT found = m_languageList.SendMessage(CB_FINDSTRINGEXACT, static_cast<WPARAM>(-1),
                                             reinterpret_cast<LPARAM>(text.c_str()));
  if (found == CB_ERR || SameTextIgnoringCase(text, kEnglishUSEntry)) AppendLanguage(text, id);
}

int CClientMaporaAdvancedConfigDlg::AppendLanguage(const CString& text, DWORD langId) {
  LRESULT index = m_languageList.SendMessage(CB_ADDSTRING, 0, reinterpret_cast<LPARAM>(text.c_str()));
  if (index >= 0) m_languageList.SendMessage(CB_SETITEMDATA, static_cast<WPARAM>(index), static_cast<LPARAM>(langId));
  return static_cast<int>(index);
}

void CClientMaporaAdvancedConfigDlg::SelectCurrentLanguage() {
  const DWORD current = m_pMainDlg->m_dwUILangID;
  if (current == kEnglishEntryLangId) {
    m_languageList.SendMessage(CB_SETCURSEL, 1);
    return;
  }
  bool matched = false;
  const LRESULT count = m_languageList.SendMessage(CB_GETCOUNT);
  for (LRESULT i = 0; i < count; ++i) {
    if (static_cast<DWORD>(m_languageList.SendMessage(CB_GETITEMDATA, static_cast<WPARAM>(i))) != current) continue;
    m_languageList.SendMessage(CB_SETCURSEL, static_cast<WPARAM>(i));
    matched = true;
  }
  if (matched) return;
  // The stored language's pack has gone: forget the choice at once, whatever button ends this.
  DeleteStoredUILangID();
  m_selectedLangId = 0;
  m_pMainDlg->m_dwUILangID = 0;
  m_languageList.SendMessage(CB_SETCURSEL, 0);
}

void CClientMaporaAdvancedConfigDlg::UpdateLanguageWarning() {
  const bool show = !m_languagePackFound && m_languageList.SendMessage(CB_GETCURSEL) == 0;
  ::ShowWindow(GetDlgItem(IDC_LANGUAGE_WARNING), show ? SW_SHOW : SW_HIDE);
}

LRESULT CClientMaporaAdvancedConfigDlg::OnLanguageSelChange(WPARAM, LPARAM) {
  LRESULT index = m_languageList.SendMessage(CB_GETCURSEL);
  if (index != CB_ERR)
    m_selectedLangId = static_cast<DWORD>(m_languageList.SendMessage(CB_GETITEMDATA, static_cast<WPARAM>(index)));
  UpdateLanguageWarning();
  return 0;
}

LRESULT CClientMaporaAdvancedConfigDlg::OnKueiClicked(WPARAM, LPARAM) {
  m_enableKuei = IsDlgButtonChecked(m_hWnd, IDC_KUEI_CHECK) == BST_CHECKED ? 1 : 0;
  return 0;
}

LRESULT CClientMaporaAdvancedConfigDlg::OnLocalPortalClicked(WPARAM, LPARAM) {
  m_supportLocalPortal = IsDlgButtonChecked(m_hWnd, IDC_LOCAL_PORTAL) == BST_CHECKED ? 1 : 0;
  return 0;
}

LRESULT CClientMaporaAdvancedConfigDlg::OnLearnMore(WPARAM, LPARAM) {
  ShellExecuteW(m_hWnd, L"open", LearnMoreAddress().c_str(), nullptr, nullptr, SW_SHOWNORMAL);
  return 0;
}

LRESULT CClientMaporaAdvancedConfigDlg::OnManagePortals(WPARAM, LPARAM) {
  OpenPortalConnectionManager();
  return 0;
}

LRESULT CClientMaporaAdvancedConfigDlg::OnCtlColorWarning(WPARAM wParam, LPARAM lParam) {
  // The system's colours and brush first, then only the text turns red.
  LRESULT brush = DefWindowProcW(m_hWnd, WM_CTLCOLORSTATIC, wParam, lParam);
  SetTextColor(reinterpret_cast<HDC>(wParam), RGB(255, 0, 0));
  return brush;
}
