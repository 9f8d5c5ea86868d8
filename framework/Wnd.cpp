#include "framework/Wnd.h"

CString GetWindowTextOf(HWND hwnd) {
  int length = GetWindowTextLengthW(hwnd);
  if (length <= 0) return CString();
  CString text(static_cast<size_t>(length) + 1, L'\0');
  int copied = ::GetWindowTextW(hwnd, &text[0], length + 1);
  text.resize(copied > 0 ? static_cast<size_t>(copied) : 0);
  return text;
}

CString CWnd::GetWindowText() const { return GetWindowTextOf(m_hWnd); }
