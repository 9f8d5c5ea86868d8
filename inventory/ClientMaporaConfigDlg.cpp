#include "inventory/ClientMaporaConfigDlg.h"

#include <iterator>

#include "app/ClientAdminDlg.h"
#include "res/resource.h"
#include "settings/AdvancedSettings.h"

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
  if (m_pAdminDlg != nullptr) PersistAdvancedSettings(*m_pAdminDlg);
  return 0;
}

// TODO(report): the report itself and the button's visibility rule.
void CClientMaporaConfigDlg::BuildInstallationReport() {}

void CClientMaporaConfigDlg::UpdateAdvancedButton() {}
