// The floor of the start-up benchmark: the least a dialog program with the console's kinds of
// controls (a tree, a rich edit with text, four buttons) does to show its window, built with the
// console's compiler flags and runtime. tools/bench.sh compares the console's start-up with this.
#include <windows.h>
#include <commctrl.h>

#include <string>

#include "bench/BenchDialog.h"
#include "framework/StartupTrace.h"

namespace {

constexpr int kTextChars = 4096;
constexpr DWORD kComputerNameChars = MAX_COMPUTERNAME_LENGTH + 1;

std::wstring LoadText(UINT id) {
  wchar_t text[kTextChars] = L"";
  int length = LoadStringW(GetModuleHandleW(nullptr), id, text, kTextChars);
  return std::wstring(text, length > 0 ? static_cast<size_t>(length) : 0);
}

void FillDialog(HWND dialog) {
  wchar_t computer[kComputerNameChars] = L"";
  DWORD size = kComputerNameChars;
  if (!GetComputerNameW(computer, &size)) computer[0] = L'\0';
  wchar_t root[kTextChars] = L"";
  wsprintfW(root, LoadText(IDS_BENCH_ROOT).c_str(), computer);
  TVINSERTSTRUCTW insert = {};
  insert.hParent = TVI_ROOT;
  insert.hInsertAfter = TVI_LAST;
  insert.item.mask = TVIF_TEXT;
  insert.item.pszText = root;
  HWND tree = GetDlgItem(dialog, IDC_BENCH_TREE);
  HTREEITEM item = TreeView_InsertItem(tree, &insert);
  TreeView_SelectItem(tree, item);
  SetDlgItemTextW(dialog, IDC_BENCH_REPORT, LoadText(IDS_BENCH_REPORT).c_str());
}

INT_PTR CALLBACK DialogProc(HWND dialog, UINT message, WPARAM wParam, LPARAM) {
  switch (message) {
    case WM_INITDIALOG:
      fw::TraceStartup("floor: dialog initialised");
      FillDialog(dialog);
      fw::TraceStartup("floor: window shown");
      return TRUE;
    case WM_COMMAND:
      if (LOWORD(wParam) == IDOK || LOWORD(wParam) == IDCANCEL) {
        EndDialog(dialog, LOWORD(wParam));
        return TRUE;
      }
      return FALSE;
    default:
      return FALSE;
  }
}

}  // namespace

int WINAPI wWinMain(HINSTANCE instance, HINSTANCE, LPWSTR, int) {
  fw::TraceStartup("floor: process entry");
  LoadLibraryW(L"RICHED20.DLL");
  INITCOMMONCONTROLSEX classes = {};
  classes.dwSize = sizeof classes;
  classes.dwICC = ICC_TREEVIEW_CLASSES | ICC_STANDARD_CLASSES;
  InitCommonControlsEx(&classes);
  fw::TraceStartup("floor: dialog created from its template");
  DialogBoxParamW(instance, MAKEINTRESOURCEW(IDD_BENCH_DIALOG), nullptr, DialogProc, 0);
  return 0;
}
