// Dialogs built from templates of the current resource module, modal or modeless, with a message
// map that routes (message, control identifier, notification code) to member handlers. Handlers
// take the message's parts already unpacked, so no dialog casts WPARAM or LPARAM:
//
//   class CMyDlg : public CDialog {
//     void OnApply(UINT id, UINT code, HWND control);
//     const MessageMap* GetMessageMap() const override;
//   };
//   const MessageMap* CMyDlg::GetMessageMap() const {
//     static const MessageMapEntry entries[] = {fw::OnCommand<&CMyDlg::OnApply>(57000, BN_CLICKED)};
//     static const MessageMap map = {CDialog::GetMessageMap(), entries, std::size(entries)};
//     return &map;
//   }
//
//   fw::OnCommand     void (UINT id, UINT code, HWND control)   WM_COMMAND
//   fw::OnNotify      LRESULT (NMHDR* header)                   WM_NOTIFY: the notification's result
//   fw::OnCtlColor    HBRUSH (HDC dc, HWND control)             one WM_CTLCOLOR* message
//   fw::OnSysCommand  void (UINT command)                       WM_SYSCOMMAND
//   fw::OnMessage     LRESULT ()                                any message without parameters
//
// An exception that escapes a handler is reported by the application object instead of ending the
// program.
#pragma once

#include <windows.h>

#include <cstddef>

#include "framework/Wnd.h"

class CDialog;

// Unpacks the message for one kind of handler and calls it; returns the message's result.
using MessageThunk = LRESULT (*)(CDialog& dialog, WPARAM wParam, LPARAM lParam);

struct MessageMapEntry {
  UINT message;
  UINT id;    // control identifier (WM_COMMAND, WM_NOTIFY, WM_CTLCOLOR*); 0 matches any
  UINT code;  // notification code (WM_COMMAND, WM_NOTIFY); ignored for other messages
  MessageThunk thunk;
};

struct MessageMap {
  const MessageMap* base;
  const MessageMapEntry* entries;
  size_t count;
};

namespace fw {
namespace detail {

template <class Method>
struct MethodClass;
template <class T, class R, class... Args>
struct MethodClass<R (T::*)(Args...)> {
  using Type = T;
};
template <auto Method>
using Owner = typename MethodClass<decltype(Method)>::Type;

}  // namespace detail

template <auto Method>
MessageMapEntry OnCommand(UINT id, UINT code) {
  return {WM_COMMAND, id, code, [](CDialog& dialog, WPARAM wParam, LPARAM lParam) -> LRESULT {
            (static_cast<detail::Owner<Method>&>(dialog).*Method)(LOWORD(wParam), HIWORD(wParam),
                                                                  reinterpret_cast<HWND>(lParam));
            return 0;
          }};
}

template <auto Method>
MessageMapEntry OnNotify(UINT id, UINT code) {
  return {WM_NOTIFY, id, code, [](CDialog& dialog, WPARAM, LPARAM lParam) -> LRESULT {
            return (static_cast<detail::Owner<Method>&>(dialog).*Method)(reinterpret_cast<NMHDR*>(lParam));
          }};
}

// message is one of WM_CTLCOLORMSGBOX..WM_CTLCOLORSTATIC.
template <auto Method>
MessageMapEntry OnCtlColor(UINT message, UINT id) {
  return {message, id, 0, [](CDialog& dialog, WPARAM wParam, LPARAM lParam) -> LRESULT {
            return reinterpret_cast<LRESULT>((static_cast<detail::Owner<Method>&>(dialog).*Method)(
                reinterpret_cast<HDC>(wParam), reinterpret_cast<HWND>(lParam)));
          }};
}

template <auto Method>
MessageMapEntry OnSysCommand() {
  return {WM_SYSCOMMAND, 0, 0, [](CDialog& dialog, WPARAM wParam, LPARAM) -> LRESULT {
            (static_cast<detail::Owner<Method>&>(dialog).*Method)(static_cast<UINT>(wParam));
            return 0;
          }};
}

template <auto Method>
MessageMapEntry OnMessage(UINT message) {
  return {message, 0, 0, [](CDialog& dialog, WPARAM, LPARAM) -> LRESULT {
            return (static_cast<detail::Owner<Method>&>(dialog).*Method)();
          }};
}

}  // namespace fw

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
  // The system's colours and brush for a control, as a colour handler starts from them.
  HBRUSH DefaultControlColor(UINT message, HDC dc, HWND control) const;
  // Paints icon centred in the client area of a minimised window, over the icon background.
  void PaintIconic(HICON icon) const;

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
