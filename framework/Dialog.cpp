#include "framework/Dialog.h"

#include "framework/App.h"

namespace {

// Messages whose result a dialog procedure returns directly instead of through DWLP_MSGRESULT.
bool ReturnsResultDirectly(UINT message) {
  switch (message) {
    case WM_CTLCOLORMSGBOX:
    case WM_CTLCOLOREDIT:
    case WM_CTLCOLORLISTBOX:
    case WM_CTLCOLORBTN:
    case WM_CTLCOLORDLG:
    case WM_CTLCOLORSCROLLBAR:
    case WM_CTLCOLORSTATIC:
    case WM_COMPAREITEM:
    case WM_VKEYTOITEM:
    case WM_CHARTOITEM:
    case WM_QUERYDRAGICON:
    case WM_INITDIALOG:
      return true;
    default:
      return false;
  }
}

bool IsControlColorMessage(UINT message) { return message >= WM_CTLCOLORMSGBOX && message <= WM_CTLCOLORSTATIC; }

}  // namespace

void DDX_Control(CDataExchange* pDX, int id, CWnd& control) {
  // Page objects outlive their windows: a control member still holds the handle from the
  // window before, so it is bound afresh every time.
  control.m_hWnd = pDX->m_pDlgWnd->GetDlgItem(id);
}

void DDX_Text(CDataExchange* pDX, int id, CString& value) {
  HWND item = pDX->m_pDlgWnd->GetDlgItem(id);
  if (pDX->m_bSaveAndValidate)
    value = GetWindowTextOf(item);
  else
    SetWindowTextW(item, value.c_str());
}

CDialog::CDialog(UINT templateId, CWnd* parent)
    : m_nIDTemplate(templateId), m_pParentWnd(parent), m_nIDHelp(templateId) {}

CDialog::~CDialog() {
  // The derived parts are gone already: the window must not reach them while it is destroyed.
  if (m_hWnd != nullptr) SetWindowLongPtrW(m_hWnd, DWLP_USER, 0);
  DestroyWindow();
}

INT_PTR CDialog::DoModal() {
  m_bModal = true;
  HWND owner = m_pParentWnd ? m_pParentWnd->m_hWnd : nullptr;
  // Like any Windows program, a box opened without an owner still belongs to the main window,
  // so that the main window stays disabled while it is up.
  if (owner == nullptr && AfxGetApp() && AfxGetApp()->m_pMainWnd && AfxGetApp()->m_pMainWnd != this)
    owner = AfxGetApp()->m_pMainWnd->m_hWnd;
  INT_PTR result = -1;
  do {
    m_bWindowCreated = false;
    result = DialogBoxParamW(fw::GetResourceHandle(), MAKEINTRESOURCEW(m_nIDTemplate), owner, DialogProc,
                             reinterpret_cast<LPARAM>(this));
  } while (!m_bWindowCreated && fw::RevertToBuiltInResources());
  m_hWnd = nullptr;
  return result;
}

bool CDialog::Create(UINT templateId, CWnd* parent) {
  m_bModal = false;
  m_nIDTemplate = templateId;
  m_pParentWnd = parent;
  HWND hwnd = nullptr;
  do {
    m_bWindowCreated = false;
    hwnd = CreateDialogParamW(fw::GetResourceHandle(), MAKEINTRESOURCEW(templateId), parent ? parent->m_hWnd : nullptr,
                              DialogProc, reinterpret_cast<LPARAM>(this));
  } while (!m_bWindowCreated && fw::RevertToBuiltInResources());
  return hwnd != nullptr;
}

void CDialog::DestroyWindow() {
  if (!m_bModal && m_hWnd != nullptr) ::DestroyWindow(m_hWnd);
}

void CDialog::EndDialog(int result) {
  if (m_bModal && m_hWnd != nullptr) ::EndDialog(m_hWnd, result);
}

bool CDialog::UpdateData(bool saveAndValidate) {
  if (m_hWnd == nullptr) return false;
  CDataExchange dx(this, saveAndValidate);
  DoDataExchange(&dx);
  return true;
}

BOOL CDialog::OnInitDialog() {
  UpdateData(false);
  return TRUE;
}

void CDialog::OnOK() {
  // A page inside another window is never closed by Enter or Esc.
  if (!m_bModal) return;
  UpdateData(true);
  EndDialog(IDOK);
}

void CDialog::OnCancel() {
  if (m_bModal) EndDialog(IDCANCEL);
}

void CDialog::DoDataExchange(CDataExchange*) {}

const MessageMap* CDialog::GetMessageMap() const {
  static const MessageMap map = {nullptr, nullptr, 0};
  return &map;
}

bool CDialog::OnUnhandledMessage(UINT message, WPARAM wParam, LPARAM, LRESULT& result) {
  if (message == WM_COMMAND && HIWORD(wParam) == BN_CLICKED) {
    switch (LOWORD(wParam)) {
      case IDOK:
        OnOK();
        return true;
      case IDCANCEL:
        OnCancel();
        return true;
      default:
        break;
    }
  }
  // Commands nobody here handles (Help among them) go to the application, as do F1 presses.
  if (message == WM_COMMAND && AfxGetApp()) return AfxGetApp()->OnCmdMsg(LOWORD(wParam));
  if (message == WM_HELP && AfxGetApp()) {
    result = TRUE;
    return AfxGetApp()->OnCmdMsg(ID_HELP);
  }
  return false;
}

HBRUSH CDialog::DefaultControlColor(UINT message, HDC dc, HWND control) const {
  return reinterpret_cast<HBRUSH>(
      DefWindowProcW(m_hWnd, message, reinterpret_cast<WPARAM>(dc), reinterpret_cast<LPARAM>(control)));
}

void CDialog::PaintIconic(HICON icon) const {
  PAINTSTRUCT paint;
  HDC dc = BeginPaint(m_hWnd, &paint);
  SendMessage(WM_ICONERASEBKGND, reinterpret_cast<WPARAM>(dc), 0);
  RECT client;
  GetClientRect(m_hWnd, &client);
  int x = (client.right - client.left - GetSystemMetrics(SM_CXICON) + 1) / 2;
  int y = (client.bottom - client.top - GetSystemMetrics(SM_CYICON) + 1) / 2;
  DrawIcon(dc, x, y, icon);
  EndPaint(m_hWnd, &paint);
}

bool CDialog::Dispatch(UINT message, WPARAM wParam, LPARAM lParam, LRESULT& result) {
  UINT id = 0, code = 0;
  if (message == WM_COMMAND) {
    id = LOWORD(wParam);
    code = HIWORD(wParam);
  } else if (message == WM_NOTIFY) {
    const NMHDR* header = reinterpret_cast<const NMHDR*>(lParam);
    id = static_cast<UINT>(header->idFrom);
    code = header->code;
  } else if (IsControlColorMessage(message)) {
    id = static_cast<UINT>(GetDlgCtrlID(reinterpret_cast<HWND>(lParam)));
  }
  bool matchCode = message == WM_COMMAND || message == WM_NOTIFY;
  for (const MessageMap* map = GetMessageMap(); map != nullptr; map = map->base) {
    for (size_t i = 0; i < map->count; ++i) {
      const MessageMapEntry& entry = map->entries[i];
      if (entry.message != message) continue;
      if (entry.id != 0 && entry.id != id) continue;
      if (matchCode && entry.code != code) continue;
      m_bDefaultRequested = false;
      result = entry.thunk(*this, wParam, lParam);
      return !m_bDefaultRequested;
    }
  }
  return false;
}

INT_PTR CDialog::HandleMessage(UINT message, WPARAM wParam, LPARAM lParam) {
  if (message == WM_INITDIALOG) return OnInitDialog();
  LRESULT result = 0;
  if (!Dispatch(message, wParam, lParam, result) && !OnUnhandledMessage(message, wParam, lParam, result))
    return FALSE;
  if (ReturnsResultDirectly(message)) return static_cast<INT_PTR>(result);
  SetWindowLongPtrW(m_hWnd, DWLP_MSGRESULT, static_cast<LONG_PTR>(result));
  return TRUE;
}

INT_PTR CALLBACK CDialog::DialogProc(HWND hwnd, UINT message, WPARAM wParam, LPARAM lParam) {
  CDialog* self = nullptr;
  if (message == WM_INITDIALOG) {
    self = reinterpret_cast<CDialog*>(lParam);
    SetWindowLongPtrW(hwnd, DWLP_USER, reinterpret_cast<LONG_PTR>(self));
    self->m_hWnd = hwnd;
    self->m_bWindowCreated = true;
  } else {
    self = reinterpret_cast<CDialog*>(GetWindowLongPtrW(hwnd, DWLP_USER));
  }
  if (self == nullptr) return FALSE;

  INT_PTR handled = FALSE;
  try {
    handled = self->HandleMessage(message, wParam, lParam);
  } catch (...) {
    if (AfxGetApp()) AfxGetApp()->ProcessWndProcException(std::current_exception());
  }
  if (message == WM_NCDESTROY) {
    SetWindowLongPtrW(hwnd, DWLP_USER, 0);
    self->m_hWnd = nullptr;
  }
  return handled;
}
