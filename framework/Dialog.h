// Dialogs built from templates of the current resource module, modal or modeless, with a message
// map that routes (message, control identifier, notification code) to member handlers.
//
//   class CMyDlg : public CDialog {
//     LRESULT OnApply(WPARAM, LPARAM);
//     const MessageMap* GetMessageMap() const override;
//   };
//   const MessageMap* CMyDlg::GetMessageMap() const {
//     static const MessageMapEntry entries[] = {
//         {WM_COMMAND, 57000, BN_CLICKED, Handler(&CMyDlg::OnApply)}};
//     static const MessageMap map = {CDialog::GetMessageMap(), entries, std::size(entries)};
//     return &map;
//   }
//
// A handler's result is the message's result (for WM_NOTIFY: the notification's result). An
// exception that escapes a handler is reported by the application object instead of ending the
// program.
#pragma once

#include <windows.h>

#include <cstddef>

#include "framework/Wnd.h"

class CDialog;
using MessageHandler = LRESULT (CDialog::*)(WPARAM, LPARAM);

struct MessageMapEntry {
  UINT message;
  UINT id;    // control identifier (WM_COMMAND, WM_NOTIFY, WM_CTLCOLOR*); 0 matches any
  UINT code;  // notification code (WM_COMMAND, WM_NOTIFY); ignored for other messages
  MessageHandler handler;
};

struct MessageMap {
  const MessageMap* base;
  const MessageMapEntry* entries;
  size_t count;
};

template <class T>
MessageHandler Handler(LRESULT (T::*handler)(WPARAM, LPARAM)) {
  return static_cast<MessageHandler>(handler);
}

// Moves data between a dialog's controls and its members.
class CDataExchange {
 public:
  CDataExchange(CDialog* dialog, bool saveAndValidate) : m_pDlgWnd(dialog), m_bSaveAndValidate(saveAndValidate) {}
  CDialog* m_pDlgWnd;
  bool m_bSaveAndValidate;  // true: controls to members
};

void DDX_Control(CDataExchange* pDX, int id, CWnd& control);
void DDX_Text(CDataExchange* pDX, int id, CString& value);

class CDialog : public CWnd {
 public:
  explicit CDialog(UINT templateId, CWnd* parent = nullptr);
  ~CDialog() override;
  CDialog(const CDialog&) = delete;
  CDialog& operator=(const CDialog&) = delete;

  // Runs the dialog modally; returns the code given to EndDialog, or -1 when it cannot be shown.
  // A template the localized library cannot build is built from the program's own resources,
  // which serve from then on (as do Create's).
  INT_PTR DoModal();
  // Creates the dialog modeless (a page inside another window); false when it cannot be created.
  bool Create(UINT templateId, CWnd* parent);
  void DestroyWindow();
  void EndDialog(int result);

  bool UpdateData(bool saveAndValidate = true);

  UINT GetHelpID() const { return m_nIDHelp; }
  void SetHelpID(UINT id) { m_nIDHelp = id; }

  // The dialog's own controls by identifier; a missing control is ignored.
  void EnableItem(int id, bool enable) const { ::EnableWindow(GetDlgItem(id), enable ? TRUE : FALSE); }
  void ShowItem(int id, bool show) const { ::ShowWindow(GetDlgItem(id), show ? SW_SHOW : SW_HIDE); }
  void CheckItem(int id, bool checked) const { ::CheckDlgButton(m_hWnd, id, checked ? BST_CHECKED : BST_UNCHECKED); }
  bool IsItemChecked(int id) const { return ::IsDlgButtonChecked(m_hWnd, id) == BST_CHECKED; }
  void SetItemText(int id, const CString& text) const { ::SetDlgItemTextW(m_hWnd, id, text.c_str()); }

 protected:
  virtual BOOL OnInitDialog();
  virtual void OnOK();
  virtual void OnCancel();
  virtual void DoDataExchange(CDataExchange* pDX);
  virtual const MessageMap* GetMessageMap() const;
  // Messages no map entry handled.
  virtual bool OnUnhandledMessage(UINT message, WPARAM wParam, LPARAM lParam, LRESULT& result);
  // Called by a handler that wants the system's default processing of its message as well.
  void Default() { m_bDefaultRequested = true; }

  UINT m_nIDTemplate;
  CWnd* m_pParentWnd;
  UINT m_nIDHelp;
  bool m_bModal = false;
  bool m_bDefaultRequested = false;

 private:
  // Set when the window got as far as WM_INITDIALOG: its template and controls were built.
  bool m_bWindowCreated = false;

  static INT_PTR CALLBACK DialogProc(HWND hwnd, UINT message, WPARAM wParam, LPARAM lParam);
  bool Dispatch(UINT message, WPARAM wParam, LPARAM lParam, LRESULT& result);
  INT_PTR HandleMessage(UINT message, WPARAM wParam, LPARAM lParam);
};
