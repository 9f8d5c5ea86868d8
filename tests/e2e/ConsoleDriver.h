// Drives the real console under Wine from a test in the same prefix. Buttons are posted, never
// sent: a press may open a modal box that the driver must then be free to look at.
#pragma once

#include <windows.h>

#include <commctrl.h>

#include <cstdio>
#include <cstring>
#include <functional>
#include <string>
#include <vector>

#include "res/resource.h"

namespace e2e {

// Generous: the first program that needs COM in a fresh prefix waits for its services to start.
constexpr DWORD kWaitMs = 30000;

inline bool WaitUntil(const std::function<bool()>& condition) {
  const ULONGLONG deadline = GetTickCount64() + kWaitMs;
  while (!condition()) {
    if (GetTickCount64() >= deadline) return false;
    Sleep(50);
  }
  return true;
}

// Wine's drive Z: is the root of the build machine's file system.
inline std::wstring WindowsPath(const std::string& hostPath) {
  std::wstring path = L"Z:" + std::wstring(hostPath.begin(), hostPath.end());
  for (wchar_t& character : path) {
    if (character == L'/') character = L'\\';
  }
  return path;
}

inline std::wstring ConsolePath() { return WindowsPath(MAPORA_CONSOLE_EXE); }

// The new process, or null when it could not be started.
inline HANDLE Start(std::wstring commandLine) {
  STARTUPINFOW startup{};
  startup.cb = sizeof startup;
  PROCESS_INFORMATION info{};
  if (!CreateProcessW(nullptr, &commandLine[0], nullptr, nullptr, FALSE, 0, nullptr, nullptr, &startup, &info))
    return nullptr;
  CloseHandle(info.hThread);
  return info.hProcess;
}

// WM_GETTEXT is carried across processes; the length comes first so that no text is cut.
inline std::wstring Text(HWND window) {
  std::wstring text(static_cast<size_t>(SendMessageW(window, WM_GETTEXTLENGTH, 0, 0)) + 1, L'\0');
  const LRESULT length = SendMessageW(window, WM_GETTEXT, text.size(), reinterpret_cast<LPARAM>(&text[0]));
  text.resize(static_cast<size_t>(length));
  return text;
}

struct WindowSearch {
  std::function<bool(HWND)> matches;
  HWND found = nullptr;
};

// A named callback: on 32-bit x86 a lambda does not convert to the stdcall pointer needed here.
inline BOOL CALLBACK MatchWindow(HWND window, LPARAM param) {
  auto* search = reinterpret_cast<WindowSearch*>(param);
  if (search->matches(window)) search->found = window;
  return search->found == nullptr;
}

// The first control with that identifier, also one nested in a page.
inline HWND Control(HWND window, int id) {
  WindowSearch search{[id](HWND child) { return GetDlgCtrlID(child) == id; }};
  EnumChildWindows(window, MatchWindow, reinterpret_cast<LPARAM>(&search));
  return search.found;
}

inline void Click(HWND window, int id) { PostMessageW(Control(window, id), BM_CLICK, 0, 0); }

// The console handles one message at a time on its one thread: once it answers this, everything
// posted before (a click and the writes it makes) is done.
inline bool WaitForIdle(HWND window) {
  DWORD_PTR ignored = 0;
  return SendMessageTimeoutW(window, WM_NULL, 0, 0, SMTO_NORMAL, kWaitMs, &ignored) != 0;
}

// A child process (by default the console), terminated when the object goes.
class Process {
 public:
  // environment: "NAME=value" entries for the child only; the test's own has none of these names.
  explicit Process(const std::wstring& arguments = L"", const std::wstring& program = ConsolePath(),
                   const std::vector<std::wstring>& environment = {}) {
    for (const std::wstring& entry : environment) SetVariable(entry, true);
    m_process = Start(L"\"" + program + L"\" " + arguments);
    for (const std::wstring& entry : environment) SetVariable(entry, false);
  }
  ~Process() {
    if (m_process == nullptr) return;
    if (TerminateProcess(m_process, 1)) WaitForSingleObject(m_process, kWaitMs);
    CloseHandle(m_process);
  }
  Process(const Process&) = delete;
  Process& operator=(const Process&) = delete;

  bool Running() const { return m_process != nullptr && WaitForSingleObject(m_process, 0) == WAIT_TIMEOUT; }

  bool Shows(HWND window) const {
    DWORD owner = 0;
    GetWindowThreadProcessId(window, &owner);
    return owner == GetProcessId(m_process) && IsWindowVisible(window);
  }

  // The process's main window: the visible top-level window with the page tree.
  HWND WaitForMainWindow() const {
    return WaitForTopLevel(
        [this](HWND window) { return Shows(window) && GetDlgItem(window, IDC_PAGE_TREE) != nullptr; });
  }

  // A visible top-level window of the process other than the main window, with that caption: a
  // dialog, a message box (captioned as the main window is), the help viewer.
  HWND WaitForWindow(const std::wstring& caption) const {
    return WaitForTopLevel([this, &caption](HWND window) {
      return Shows(window) && GetDlgItem(window, IDC_PAGE_TREE) == nullptr && Text(window) == caption;
    });
  }

 private:
  static void SetVariable(const std::wstring& entry, bool set) {
    const size_t equals = entry.find(L'=');
    const std::wstring name = entry.substr(0, equals);
    if (set)
      SetEnvironmentVariableW(name.c_str(), entry.substr(equals + 1).c_str());
    else
      SetEnvironmentVariableW(name.c_str(), nullptr);
  }

  HWND WaitForTopLevel(const std::function<bool(HWND)>& matches) const {
    WindowSearch search{matches};
    WaitUntil([&] {
      EnumWindows(MatchWindow, reinterpret_cast<LPARAM>(&search));
      return search.found != nullptr || !Running();
    });
    return search.found;
  }

  HANDLE m_process = nullptr;
};

// TVM_GETITEMW is not carried across processes: the item goes through the console's own memory.
inline std::wstring TreeRootText(HWND tree) {
  struct RemoteItem {
    TVITEMW item;
    wchar_t text[256];
  };
  DWORD processId = 0;
  GetWindowThreadProcessId(tree, &processId);
  HANDLE process = OpenProcess(PROCESS_VM_OPERATION | PROCESS_VM_READ | PROCESS_VM_WRITE, FALSE, processId);
  if (process == nullptr) return L"";
  auto* remote =
      static_cast<RemoteItem*>(VirtualAllocEx(process, nullptr, sizeof(RemoteItem), MEM_COMMIT, PAGE_READWRITE));
  RemoteItem local{};
  if (remote != nullptr) {
    local.item.mask = TVIF_TEXT;
    local.item.hItem = TreeView_GetRoot(tree);
    local.item.pszText = remote->text;
    local.item.cchTextMax = 255;
    if (WriteProcessMemory(process, remote, &local, sizeof local, nullptr) &&
        SendMessageW(tree, TVM_GETITEMW, 0, reinterpret_cast<LPARAM>(remote)))
      ReadProcessMemory(process, remote, &local, sizeof local, nullptr);
    VirtualFreeEx(process, remote, 0, MEM_RELEASE);
  }
  CloseHandle(process);
  return local.text;
}

inline std::wstring ComboText(HWND combo, int index) {
  wchar_t text[256] = L"";
  SendMessageW(combo, CB_GETLBTEXT, static_cast<WPARAM>(index), reinterpret_cast<LPARAM>(text));
  return text;
}

// Selects an entry and notifies the owner as a choice made with the mouse does.
inline void SelectCombo(HWND combo, int index) {
  SendMessageW(combo, CB_SETCURSEL, static_cast<WPARAM>(index), 0);
  PostMessageW(GetParent(combo), WM_COMMAND, MAKEWPARAM(GetDlgCtrlID(combo), CBN_SELCHANGE),
               reinterpret_cast<LPARAM>(combo));
}

// Saves <build>/screenshots/<name>.png of the window as it is on screen.
inline bool Screenshot(HWND window, const std::string& name) {
  RECT bounds{};
  GetWindowRect(window, &bounds);
  const std::string path = std::string(E2E_SCREENSHOT_DIR) + "/" + name + ".png";
  CreateDirectoryW(WindowsPath(E2E_SCREENSHOT_DIR).c_str(), nullptr);
  DeleteFileW(WindowsPath(path).c_str());
  // The coordinates are those of the screen Wine draws on: the X root window, or under a
  // virtual desktop the desktop's own X window, which Wine names in this property.
  char source[32] = "root";
  if (HANDLE desktop = GetPropW(GetDesktopWindow(), L"__wine_x11_whole_window"))
    std::snprintf(source, sizeof source, "0x%lx", static_cast<unsigned long>(reinterpret_cast<ULONG_PTR>(desktop)));
  char command[1024];
  std::snprintf(command, sizeof command, "/bin/sh \"%s\" %s %ldx%ld+%ld+%ld \"%s\"", E2E_CAPTURE_SCRIPT, source,
                bounds.right - bounds.left, bounds.bottom - bounds.top, bounds.left, bounds.top, path.c_str());
  RedrawWindow(window, nullptr, nullptr, RDW_UPDATENOW | RDW_ALLCHILDREN);
  // Wine hands back no handle to wait on for a Linux program: the picture appears when complete.
  HANDLE capture = Start(std::wstring(command, command + std::strlen(command)));
  if (capture != nullptr) CloseHandle(capture);
  return WaitUntil([&] { return GetFileAttributesW(WindowsPath(path).c_str()) != INVALID_FILE_ATTRIBUTES; });
}

}  // namespace e2e
