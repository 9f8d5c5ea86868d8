// A window handle with the few conveniences the console's dialogs use. It never owns the window.
#pragma once

#include <windows.h>

#include "framework/Strings.h"

class CWnd {
 public:
  CWnd() = default;
  explicit CWnd(HWND hwnd) : m_hWnd(hwnd) {}
  virtual ~CWnd() = default;

  HWND GetSafeHwnd() const { return m_hWnd; }
  bool IsWindow() const { return m_hWnd != nullptr && ::IsWindow(m_hWnd) != FALSE; }

  HWND GetDlgItem(int id) const { return ::GetDlgItem(m_hWnd, id); }
  LRESULT SendMessage(UINT message, WPARAM wParam = 0, LPARAM lParam = 0) const {
    return ::SendMessageW(m_hWnd, message, wParam, lParam);
  }
  void ShowWindow(int command) const { ::ShowWindow(m_hWnd, command); }
  void EnableWindow(bool enable) const { ::EnableWindow(m_hWnd, enable ? TRUE : FALSE); }
  void SetWindowText(const CString& text) const { ::SetWindowTextW(m_hWnd, text.c_str()); }
  // The icon of the caption (small) or of the task switcher (big); the window does not own it.
  void SetIcon(HICON icon, bool big) const {
    SendMessage(WM_SETICON, big ? ICON_BIG : ICON_SMALL, reinterpret_cast<LPARAM>(icon));
  }
  CString GetWindowText() const;

  HWND m_hWnd = nullptr;
};

// Text of any window, however long.
CString GetWindowTextOf(HWND hwnd);
