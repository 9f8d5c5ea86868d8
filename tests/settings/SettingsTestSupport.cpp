#include "tests/settings/SettingsTestSupport.h"

#include <commctrl.h>

#include "res/resource.h"

namespace settings_tests {

namespace {
std::function<bool()> g_modalAction;
}

Workstation::Workstation() : folders(testing_support::ModuleFolder() + L"\\settings-products") {
  INITCOMMONCONTROLSEX controls = {sizeof controls, ICC_LINK_CLASS | ICC_STANDARD_CLASSES};
  InitCommonControlsEx(&controls);
  mainDlg.m_installedProducts.desktopKey = kDesktopKey;
  mainDlg.m_installedProducts.engineKey = kEngineKey;
  mainDlg.m_machineSettingsWritable = true;
}

void Workstation::Install(const wchar_t* product, testing_support::ScopedRegistryKey& key,
                          const std::vector<std::wstring>& packs) {
  std::wstring installDir = folders.MakeDir(product);
  folders.MakeFile(std::wstring(product) + L"\\bin\\it");
  for (const std::wstring& pack : packs) folders.MakeDir(std::wstring(product) + L"\\bin\\" + pack);
  key.SetString(L"InstallDir", installDir);
}

void Workstation::InstallDesktop(const std::vector<std::wstring>& packs) {
  Install(L"desktop", desktopKey, packs);
  mainDlg.m_installedProducts.desktopInstalled = true;
}

void Workstation::InstallEngine(const std::vector<std::wstring>& packs) {
  Install(L"engine", engineKey, packs);
  mainDlg.m_installedProducts.engineInstalled = true;
}

void Workstation::StoreLanguage(DWORD langId) {
  userKey.SetDword(L"UILANGID", langId);
  mainDlg.m_dwUILangID = langId;
}

OpenDialog::OpenDialog(CClientAdminDlg& mainDlg) {
  m_pMainDlg = &mainDlg;
  Create(IDD_ADVANCED_CONFIG, nullptr);
}

bool OpenDialog::Shown(int id) const { return (GetWindowLongW(Item(id), GWL_STYLE) & WS_VISIBLE) != 0; }

int OpenDialog::Selection() const {
  return static_cast<int>(SendDlgItemMessageW(m_hWnd, IDC_LANGUAGE_LIST, CB_GETCURSEL, 0, 0));
}

std::vector<std::pair<std::wstring, DWORD>> OpenDialog::Entries() const {
  std::vector<std::pair<std::wstring, DWORD>> entries;
  HWND list = Item(IDC_LANGUAGE_LIST);
  LRESULT count = ::SendMessageW(list, CB_GETCOUNT, 0, 0);
  for (LRESULT i = 0; i < count; ++i) {
    std::wstring text(static_cast<size_t>(::SendMessageW(list, CB_GETLBTEXTLEN, i, 0)) + 1, L'\0');
    text.resize(static_cast<size_t>(::SendMessageW(list, CB_GETLBTEXT, i, reinterpret_cast<LPARAM>(&text[0]))));
    entries.emplace_back(text, static_cast<DWORD>(::SendMessageW(list, CB_GETITEMDATA, i, 0)));
  }
  return entries;
}

void SelectLanguage(HWND dialog, int index) {
  HWND list = GetDlgItem(dialog, IDC_LANGUAGE_LIST);
  ::SendMessageW(list, CB_SETCURSEL, static_cast<WPARAM>(index), 0);
  SendMessageW(dialog, WM_COMMAND, MAKEWPARAM(IDC_LANGUAGE_LIST, CBN_SELCHANGE), reinterpret_cast<LPARAM>(list));
}

void Click(HWND dialog, int id) { SendMessageW(GetDlgItem(dialog, id), BM_CLICK, 0, 0); }

WhileModal::WhileModal(std::function<bool()> action) {
  g_modalAction = std::move(action);
  timer_ = SetTimer(nullptr, 0, 50, Tick);
}

WhileModal::~WhileModal() {
  if (timer_ != 0) KillTimer(nullptr, timer_);
  g_modalAction = nullptr;
}

void CALLBACK WhileModal::Tick(HWND, UINT, UINT_PTR id, DWORD) {
  // The action may itself run a modal loop; ticks arriving meanwhile are not re-entered.
  static bool running = false;
  if (running || !g_modalAction) return;
  running = true;
  bool done = g_modalAction();
  running = false;
  if (done) {
    KillTimer(nullptr, id);
    g_modalAction = nullptr;
  }
}

HWND FindOwnWindow(const std::wstring& caption) {
  struct Search {
    const std::wstring* caption;
    HWND found;
  } search = {&caption, nullptr};
  EnumThreadWindows(
      GetCurrentThreadId(),
      [](HWND window, LPARAM param) -> BOOL {
        auto* s = reinterpret_cast<Search*>(param);
        if (!IsWindowVisible(window) || GetWindowTextOf(window) != *s->caption) return TRUE;
        s->found = window;
        return FALSE;
      },
      reinterpret_cast<LPARAM>(&search));
  return search.found;
}

std::wstring ChildTexts(HWND window) {
  std::wstring texts;
  EnumChildWindows(
      window,
      [](HWND child, LPARAM param) -> BOOL {
        *reinterpret_cast<std::wstring*>(param) += GetWindowTextOf(child) + L"\n";
        return TRUE;
      },
      reinterpret_cast<LPARAM>(&texts));
  return texts;
}

}  // namespace settings_tests
