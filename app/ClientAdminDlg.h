// The console's main window: a page tree with one node per page (today the workstation node and
// its installation report), OK / Cancel / Apply / Help, and the settings the pages share.
#pragma once

#include <windows.h>
#include <commctrl.h>

#include <cstdint>

#include "framework/Dialog.h"
#include "inventory/InstalledProducts.h"

class CClientAdminDlg : public CDialog {
 public:
  explicit CClientAdminDlg(CWnd* parent = nullptr);
  ~CClientAdminDlg() override;

  // Enables the Apply button; offered to the pages.
  void EnableApply();
  // The common save of OK and Apply; true when the settings were written.
  bool Save();

  // Shared state of the run, reached by the pages through their back-pointer.
  DWORD m_dwUILangID = 0;  // chosen display language; 0 = none chosen
  InstalledProducts m_installedProducts;
  bool m_machineSettingsWritable = false;

 protected:
  void DoDataExchange(CDataExchange* pDX) override;
  BOOL OnInitDialog() override;
  void OnOK() override;
  const MessageMap* GetMessageMap() const override;

 private:
  LRESULT OnSysCommand(WPARAM wParam, LPARAM lParam);
  LRESULT OnDestroy(WPARAM wParam, LPARAM lParam);
  LRESULT OnPaint(WPARAM wParam, LPARAM lParam);
  LRESULT OnQueryDragIcon(WPARAM wParam, LPARAM lParam);
  LRESULT OnApply(WPARAM wParam, LPARAM lParam);
  LRESULT OnTreeSelChanged(WPARAM wParam, LPARAM lParam);
  LRESULT OnCommandHelp(WPARAM wParam, LPARAM lParam);

  void LoadSettings();
  void BuildPageTree();
  void LoadTreeImages();
  void ShowSelectedPage();
  void SetHelpFilePath();
  void ShowAboutBox();

  CWnd m_wndTree;
  HIMAGELIST m_imgTree = nullptr;
  HICON m_hIcon = nullptr;
  ULONG_PTR m_gdiplusToken = 0;
  HTREEITEM m_hRootItem = nullptr;
  bool m_bPagesCreated = false;
};
