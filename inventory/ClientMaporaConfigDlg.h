// The workstation page: the installation report of the installed suite products, rebuilt each
// time the page is selected, and the "Advanced..." button.
#pragma once

#include <string>

#include "framework/Controls.h"
#include "framework/Dialog.h"
#include "inventory/AdminSession.h"

class CClientMaporaConfigDlg : public CDialog {
 public:
  CClientMaporaConfigDlg();

  // Rebuilds the report from the registry and the file system.
  void BuildInstallationReport();

  AdminSession* m_pAdminDlg = nullptr;  // set by the main window before the page is created

 protected:
  void DoDataExchange(CDataExchange* pDX) override;
  BOOL OnInitDialog() override;
  const MessageMap* GetMessageMap() const override;

 private:
  void OnAdvanced(UINT id, UINT code, HWND control);
  void UpdateAdvancedButton();

  CRichEditCtrl m_richEdit;
};

// The page object lives as long as the program; its window only while the main window does.
CClientMaporaConfigDlg& GetRootPage();

// Whether the page offers "Advanced...": for Desktop or Engine, to a program whose path begins
// with the 32-bit common program files folder (letter case counts). An empty path stands for one
// that could not be had, and then the offer stands.
bool OffersAdvancedSettings(bool desktopOrEngineInstalled, const std::wstring& commonFilesX86,
                            const std::wstring& programPath);
