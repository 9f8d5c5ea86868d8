// "Advanced Configuration": display language, the user experience improvement programme and
// local-portal support. The dialog only gathers the choices; PersistAdvancedSettings writes them
// after it closes. While it is open it only removes a stored display language whose language pack
// has gone, and creates the per-user portal settings key if it is missing.
//
// The "Learn More" link opens <host>/en/knowledgebase/techarticles/detail/38987, where <host> is
// the REG_SZ value
//   HKEY_LOCAL_MACHINE\SOFTWARE\KVEL\Mapora Administrator  "Support Site"
// (scheme and host, no trailing slash), https://support.kvel.example when it is missing or empty.
#pragma once

#include <windows.h>

#include "framework/Controls.h"
#include "framework/Dialog.h"
#include "settings/SettingsRegistry.h"

class AdminSession;

class CClientMaporaAdvancedConfigDlg : public CDialog {
 public:
  explicit CClientMaporaAdvancedConfigDlg(CWnd* parent = nullptr);

  // The address behind "Learn More".
  static CString LearnMoreAddress();

  AdminSession* m_pMainDlg = nullptr;  // set by the creator before the dialog is shown
  DWORD m_selectedLangId = 0;          // item data of the selected language entry
  DWORD m_enableKuei = 0;              // raw EnableKUEI until the box is clicked, then 0 or 1
  DWORD m_supportLocalPortal = 0;      // 0 or 1
  bool m_languagePackFound = false;    // a pack serves the Windows UI language

 protected:
  void DoDataExchange(CDataExchange* pDX) override;
  BOOL OnInitDialog() override;
  const MessageMap* GetMessageMap() const override;

 private:
  void BuildLanguageList();
  void UpdateLanguageWarning();

  void OnLanguageSelChange(UINT id, UINT code, HWND control);
  void OnKueiClicked(UINT id, UINT code, HWND control);
  void OnLocalPortalClicked(UINT id, UINT code, HWND control);
  LRESULT OnLearnMore(NMHDR* header);
  void OnManagePortals(UINT id, UINT code, HWND control);
  HBRUSH OnCtlColorWarning(HDC dc, HWND control);

  CComboBox m_languageList;
};
