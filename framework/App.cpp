#include "framework/App.h"

#include <commctrl.h>
#include <objbase.h>
#include <ole2.h>
#include <shellapi.h>

#include "framework/ScopedHandle.h"
#include "framework/SystemLibrary.h"

namespace {
CWinApp* g_app = nullptr;

// The description the system has for an HRESULT, in the user's language.
CString DescribeError(HRESULT hr) {
  const CString description = fw::SystemErrorText(static_cast<DWORD>(hr));
  CString code = fw::Format(L"0x%08lX", static_cast<unsigned long>(hr));
  return description.empty() ? code : description + L" (" + code + L")";
}

// Keeps outgoing COM calls patient: a rejected call is retried and a slow one waited for,
// while the user interface goes on painting.
class MessageFilter final : public IMessageFilter {
 public:
  HRESULT STDMETHODCALLTYPE QueryInterface(REFIID iid, void** out) override {
    if (out == nullptr) return E_POINTER;
    if (IsEqualIID(iid, IID_IUnknown) || IsEqualIID(iid, IID_IMessageFilter)) {
      *out = static_cast<IMessageFilter*>(this);
      return S_OK;
    }
    *out = nullptr;
    return E_NOINTERFACE;
  }
  // Owned by the OLE session, which revokes the registration before it goes.
  ULONG STDMETHODCALLTYPE AddRef() override { return 1; }
  ULONG STDMETHODCALLTYPE Release() override { return 1; }

  DWORD STDMETHODCALLTYPE HandleInComingCall(DWORD, HTASK, DWORD, LPINTERFACEINFO) override {
    return SERVERCALL_ISHANDLED;
  }
  DWORD STDMETHODCALLTYPE RetryRejectedCall(HTASK, DWORD, DWORD rejectType) override {
    // "Retry later" is retried after a short pause; a plain rejection is final.
    return rejectType == SERVERCALL_RETRYLATER ? 100 : static_cast<DWORD>(-1);
  }
  DWORD STDMETHODCALLTYPE MessagePending(HTASK, DWORD, DWORD) override { return PENDINGMSG_WAITDEFPROCESS; }
};

}  // namespace

// OLE for the application's thread, with its message filter registered; both undone, in the
// right order, when the session goes.
class CWinApp::OleSession {
 public:
  bool Start() {
    if (FAILED(OleInitialize(nullptr))) return false;
    initialized_ = true;
    CoRegisterMessageFilter(&filter_, nullptr);
    return true;
  }
  ~OleSession() {
    if (!initialized_) return;
    CoRegisterMessageFilter(nullptr, nullptr);
    OleUninitialize();
  }

 private:
  MessageFilter filter_;
  bool initialized_ = false;
};

void CCommandLineInfo::ParseParam(const wchar_t*, BOOL, BOOL) {}

CWinApp::CWinApp() { g_app = this; }

CWinApp::~CWinApp() {
  if (g_app == this) g_app = nullptr;
}

CWinApp* AfxGetApp() { return g_app; }

BOOL CWinApp::InitInstance() { return TRUE; }

int CWinApp::ExitInstance() {
  m_ole.reset();
  return 0;
}

int CWinApp::Run() {
  MSG msg;
  while (GetMessageW(&msg, nullptr, 0, 0) > 0) {
    TranslateMessage(&msg);
    DispatchMessageW(&msg);
  }
  ExitInstance();
  return static_cast<int>(msg.wParam);
}

bool CWinApp::OnCmdMsg(UINT) { return false; }

void CWinApp::ProcessWndProcException(std::exception_ptr error) {
  CString detail;
  try {
    std::rethrow_exception(error);
  } catch (const ComError& e) {
    detail = DescribeError(e.Error());
  } catch (...) {
    detail = DescribeError(E_UNEXPECTED);
  }
  CString text = fw::FormatString(IDS_FRAMEWORK_OPERATION_FAILED, detail.c_str());
  AfxMessageBox(text.empty() ? detail : text, MB_OK | MB_ICONERROR);
}

void CWinApp::ParseCommandLine(CCommandLineInfo& info) {
  int argc = 0;
  fw::ScopedLocalMemory<LPWSTR> argv(CommandLineToArgvW(GetCommandLineW(), &argc));
  if (!argv) return;
  WalkCommandLine(info, argc, argv.Get());
}

void WalkCommandLine(CCommandLineInfo& info, int argc, const wchar_t* const* argv) {
  for (int i = 1; i < argc; ++i) {
    const wchar_t* param = argv[i] != nullptr ? argv[i] : L"";
    BOOL isFlag = (param[0] == L'-' || param[0] == L'/') ? TRUE : FALSE;
    info.ParseParam(isFlag ? param + 1 : param, isFlag, i == argc - 1 ? TRUE : FALSE);
  }
}

bool CWinApp::InitOle() {
  auto session = std::make_unique<OleSession>();
  if (!session->Start()) return false;
  m_ole = std::move(session);
  return true;
}

void CWinApp::InitCommonControls(DWORD classes) {
  // Registering a class twice costs a round trip through the control library; once is enough.
  DWORD missing = classes & ~m_commonControls;
  if (missing == 0) return;
  INITCOMMONCONTROLSEX init = {sizeof init, missing};
  if (InitCommonControlsEx(&init)) m_commonControls |= missing;
}

bool CWinApp::InitRichEdit() {
  // RICHED32 is the classic entry point; the templates use RichEdit20W, which RICHED20 registers.
  // Both stay loaded for the run: their window classes live as long as they do.
  HMODULE classic = fw::LoadSystemLibrary(L"RICHED32.DLL");
  HMODULE current = fw::LoadSystemLibrary(L"RICHED20.DLL");
  return classic != nullptr || current != nullptr;
}

void CWinApp::OnHelp() {
  HWND active = GetActiveWindow();
  if (active != nullptr && SendMessageW(active, WM_COMMANDHELP, 0, 0)) return;
  if (m_pMainWnd != nullptr && m_pMainWnd->m_hWnd != active && m_pMainWnd->m_hWnd != nullptr)
    SendMessageW(m_pMainWnd->m_hWnd, WM_COMMANDHELP, 0, 0);
}

CString CWinApp::GetAppName() const {
  CString name = fw::LoadString(IDS_FRAMEWORK_APP_TITLE);
  if (!name.empty()) return name;
  wchar_t path[MAX_PATH] = L"";
  GetModuleFileNameW(nullptr, path, MAX_PATH);
  CString file = path;
  size_t slash = file.find_last_of(L"\\/");
  if (slash != CString::npos) file.erase(0, slash + 1);
  size_t dot = file.rfind(L'.');
  if (dot != CString::npos) file.erase(dot);
  return file;
}

int AfxMessageBox(const CString& text, UINT type) {
  HWND owner = nullptr;
  if (g_app != nullptr && g_app->m_pMainWnd != nullptr) owner = g_app->m_pMainWnd->m_hWnd;
  CString caption = g_app ? g_app->GetAppName() : CString();
  return MessageBoxW(owner, text.c_str(), caption.c_str(), type);
}

int AfxMessageBox(UINT stringId, UINT type) { return AfxMessageBox(fw::LoadString(stringId), type); }

int AfxWinMain(HINSTANCE instance) {
  // Before anything else is loaded by name, the system's own loads included.
  fw::RestrictLibrarySearch();
  CWinApp* app = AfxGetApp();
  if (app == nullptr) return 1;
  app->m_hInstance = instance;
  if (!app->InitInstance()) return app->ExitInstance();
  return app->Run();
}
