// The console's main window: a page tree with one node per page (today the workstation node and
// its installation report), OK / Cancel / Apply / Help, and the settings the pages share.
#pragma once

#include <windows.h>
#include <commctrl.h>

#include <cstdint>
#include <vector>

#include "framework/Controls.h"
#include "framework/Dialog.h"
#include "framework/PngResource.h"
#include "inventory/AdminSession.h"

// The shared state of the run (installed products, display language, whether machine settings
// may be written) is the AdminSession part, which the pages reach through their back-pointer.
class CClientAdminDlg : public CDialog, public AdminSession {
 public:
  explicit CClientAdminDlg(CWnd* parent = nullptr);

  void OpenAdvancedSettings() override;
  // The common save of OK and Apply; true when the settings were written.
  bool Save();

 protected:
  void DoDataExchange(CDataExchange* pDX) override;
  BOOL OnInitDialog() override;
  void OnOK() override;
  const MessageMap* GetMessageMap() const override;

 private:
  void OnSysCommand(UINT command);
  LRESULT OnDestroy();
  LRESULT OnPaint();
  LRESULT OnQueryDragIcon();
  void OnApply(UINT id, UINT code, HWND control);
  LRESULT OnTreeSelChanged(NMHDR* header);
  LRESULT OnCommandHelp();

  void LoadSettings();
  void BuildPageTree();
  void SetTreeImages(const std::vector<fw::ScopedBitmap>& bitmaps);
  void ShowSelectedPage();
  void SetHelpFilePath();
  void ShowAboutBox();

  CTreeCtrl m_wndTree;
  fw::ScopedImageList m_imgTree;
  // Started with the window, so that GDI+ loads its codecs while the window's template is built.
  fw::PngPreload m_treeImages;
  HICON m_hIcon = nullptr;  // a shared icon: the system frees it with the module
  HTREEITEM m_hRootItem = nullptr;
  bool m_bPagesCreated = false;
};
