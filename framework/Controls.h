// Thin typed wrappers for the common controls the console's dialogs use, so that dialogs speak
// in the controls' own terms instead of spelling out messages and casts. Like CWnd they never own
// the window; bind them with DDX_Control.
#pragma once

#include <windows.h>
#include <commctrl.h>
#include <richedit.h>

#include "framework/ScopedHandle.h"
#include "framework/Wnd.h"

class CComboBox : public CWnd {
 public:
  void ResetContent() const { SendMessage(CB_RESETCONTENT); }
  // The new entry's index, or a negative value (CB_ERR, CB_ERRSPACE) when it was not added.
  int AddString(const CString& text) const {
    return static_cast<int>(SendMessage(CB_ADDSTRING, 0, reinterpret_cast<LPARAM>(text.c_str())));
  }
  void SetItemData(int index, DWORD_PTR data) const {
    SendMessage(CB_SETITEMDATA, static_cast<WPARAM>(index), static_cast<LPARAM>(data));
  }
  DWORD_PTR GetItemData(int index) const {
    return static_cast<DWORD_PTR>(SendMessage(CB_GETITEMDATA, static_cast<WPARAM>(index)));
  }
  int GetCount() const { return static_cast<int>(SendMessage(CB_GETCOUNT)); }
  // The selected entry, or CB_ERR when none is.
  int GetCurSel() const { return static_cast<int>(SendMessage(CB_GETCURSEL)); }
  void SetCurSel(int index) const { SendMessage(CB_SETCURSEL, static_cast<WPARAM>(index)); }
  // Sets the height of the dropped-down list (the control's own height as a drop-down list),
  // keeping its width, place and z-order.
  void SetDroppedHeight(int pixels) const {
    RECT client = {};
    ::GetClientRect(m_hWnd, &client);
    ::SetWindowPos(m_hWnd, nullptr, 0, 0, client.right - client.left, pixels, SWP_NOMOVE | SWP_NOZORDER);
  }
};

class CRichEditCtrl : public CWnd {
 public:
  // Selects [start, end) in the control's own character positions; (0, 0) puts the caret first.
  void SetSel(size_t start, size_t end) const {
    SendMessage(EM_SETSEL, static_cast<WPARAM>(start), static_cast<LPARAM>(end));
  }
  void SetSelectionCharFormat(const CHARFORMAT2W& format) const {
    SendMessage(EM_SETCHARFORMAT, SCF_SELECTION, reinterpret_cast<LPARAM>(&format));
  }
};

class CTreeCtrl : public CWnd {
 public:
  HTREEITEM InsertItem(const CString& text, int image, int selectedImage, HTREEITEM parent = TVI_ROOT,
                       HTREEITEM insertAfter = TVI_LAST) const {
    CString buffer = text;  // the control takes a mutable pointer, though it only reads
    TVINSERTSTRUCTW insert = {};
    insert.hParent = parent;
    insert.hInsertAfter = insertAfter;
    insert.item.mask = TVIF_TEXT | TVIF_IMAGE | TVIF_SELECTEDIMAGE;
    insert.item.pszText = &buffer[0];
    insert.item.iImage = image;
    insert.item.iSelectedImage = selectedImage;
    return reinterpret_cast<HTREEITEM>(SendMessage(TVM_INSERTITEMW, 0, reinterpret_cast<LPARAM>(&insert)));
  }
  void DeleteAllItems() const { SendMessage(TVM_DELETEITEM, 0, reinterpret_cast<LPARAM>(TVI_ROOT)); }
  void Expand(HTREEITEM item, UINT code) const { SendMessage(TVM_EXPAND, code, reinterpret_cast<LPARAM>(item)); }
  void SelectItem(HTREEITEM item) const { SendMessage(TVM_SELECTITEM, TVGN_CARET, reinterpret_cast<LPARAM>(item)); }
  HTREEITEM GetSelectedItem() const {
    return reinterpret_cast<HTREEITEM>(SendMessage(TVM_GETNEXTITEM, TVGN_CARET, 0));
  }
  void SetImageList(HIMAGELIST images, int kind) const {
    SendMessage(TVM_SETIMAGELIST, static_cast<WPARAM>(kind), reinterpret_cast<LPARAM>(images));
  }
};
