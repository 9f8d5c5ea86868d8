// Drives the real console under Wine from a test in the same prefix. Buttons are posted, never
// sent: a press may open a modal box that the driver must then be free to look at.
#pragma once

#include <windows.h>

#include <commctrl.h>

#include <algorithm>
#include <cstdio>
#include <functional>
#include <string>
#include <vector>

#include "res/resource.h"

namespace e2e {

// Generous: the first program that needs COM in a fresh prefix waits for its services to start.
constexpr DWORD kWaitMs = 30000;

inline bool WaitUntil(const std::function<bool()>& condition) {
  for (const ULONGLONG deadline = GetTickCount64() + kWaitMs; !condition(); Sleep(50)) {
    if (GetTickCount64() >= deadline) return false;
  }
  return true;
}

// Wine's drive Z: is the root of the build machine's file system.
inline std::wstring WindowsPath(const std::string& hostPath) {
  std::wstring path = L"Z:" + std::wstring(hostPath.begin(), hostPath.end());
  std::replace(path.begin(), path.end(), L'/', L'\\');
  return path;
}

inline std::wstring ConsolePath() { return WindowsPath(MAPORA_CONSOLE_EXE); }

// The new process, or null (with the reason on standard error) when it could not be started.
inline HANDLE Start(std::wstring commandLine) {
  STARTUPINFOW startup{};
  startup.cb = sizeof startup;
  PROCESS_INFORMATION info{};
  if (!CreateProcessW(nullptr, &commandLine[0], nullptr, nullptr, FALSE, 0, nullptr, nullptr, &startup, &info)) {
    std::fprintf(stderr, "cannot start %ls: error %lu\n", commandLine.c_str(), GetLastError());
    return nullptr;
  }
  CloseHandle(info.hThread);
  return info.hProcess;
}

// WM_GETTEXT is carried across processes; the length comes first so that no text is cut.
inline std::wstring Text(HWND window) {
  std::wstring text(static_cast<size_t>(SendMessageW(window, WM_GETTEXTLENGTH, 0, 0)) + 1, L'\0');
  text.resize(static_cast<size_t>(SendMessageW(window, WM_GETTEXT, text.size(), reinterpret_cast<LPARAM>(&text[0]))));
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
  return SendMessageTimeoutW(window, WM_NULL, 0, 0, SMTO_NORMAL, kWaitMs, nullptr) != 0;
}

// A child process (by default the console), terminated when the object goes. environment:
// "NAME=value" entries for the child only; the test's own has none of these names.
class Process {
 public:
  explicit Process(const std::wstring& arguments = L"", const std::wstring& program = ConsolePath(),
                   const std::vector<std::wstring>& environment = {}) {
    for (const std::wstring& entry : environment)
      SetEnvironmentVariableW(entry.substr(0, entry.find(L'=')).c_str(), entry.substr(entry.find(L'=') + 1).c_str());
    m_process = Start(L"\"" + program + L"\" " + arguments);
    for (const std::wstring& entry : environment)
      SetEnvironmentVariableW(entry.substr(0, entry.find(L'=')).c_str(), nullptr);
  }
  ~Process() {
    if (m_process != nullptr && TerminateProcess(m_process, 1)) WaitForSingleObject(m_process, kWaitMs);
    if (m_process != nullptr) CloseHandle(m_process);
  }
  Process(const Process&) = delete;
  Process& operator=(const Process&) = delete;

  bool Running() const { return m_process != nullptr && WaitForSingleObject(m_process, 0) == WAIT_TIMEOUT; }

  bool Shows(HWND window) const {
    DWORD owner = 0;
    GetWindowThreadProcessId(window, &owner);
    return owner == GetProcessId(m_process) && IsWindowVisible(window);
  }

  // The visible top-level window with the page tree.
  HWND WaitForMainWindow() const { return WaitForTopLevel(nullptr); }
  // Another visible top-level window with that caption: a dialog, a message box (captioned as the
  // main window is), the help viewer.
  HWND WaitForWindow(const std::wstring& caption) const { return WaitForTopLevel(&caption); }

 private:
  HWND WaitForTopLevel(const std::wstring* caption) const {
    WindowSearch search{[&](HWND window) {
      if (!Shows(window)) return false;
      if (caption == nullptr) return GetDlgItem(window, IDC_PAGE_TREE) != nullptr;
      return GetDlgItem(window, IDC_PAGE_TREE) == nullptr && Text(window) == *caption;
    }};
    // EnumWindows answers false once the search stops at a match.
    WaitUntil([&] { return !EnumWindows(MatchWindow, reinterpret_cast<LPARAM>(&search)) || !Running(); });
    DWORD exitCode = 0;
    if (search.found == nullptr && GetExitCodeProcess(m_process, &exitCode))
      std::fprintf(stderr, "no window %ls within %lu ms: exit code %lu (%lu: still running)\n",
                   caption ? caption->c_str() : L"with the page tree", kWaitMs, exitCode,
                   static_cast<unsigned long>(STILL_ACTIVE));
    return search.found;
  }

  HANDLE m_process = nullptr;
};

// TVM_GETITEMW is not carried across processes: the item goes through the console's own memory.
inline std::wstring TreeRootText(HWND tree) {
  struct Item {
    TVITEMW item;
    wchar_t text[256];
  } local{};
  DWORD processId = 0;
  GetWindowThreadProcessId(tree, &processId);
  HANDLE process = OpenProcess(PROCESS_VM_OPERATION | PROCESS_VM_READ | PROCESS_VM_WRITE, FALSE, processId);
  auto* remote = static_cast<Item*>(VirtualAllocEx(process, nullptr, sizeof(Item), MEM_COMMIT, PAGE_READWRITE));
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
  if (process != nullptr) CloseHandle(process);
  return local.text;
}

inline std::wstring ComboText(HWND combo, int index) {
  wchar_t text[256] = L"";
  SendMessageW(combo, CB_GETLBTEXT, static_cast<WPARAM>(index), reinterpret_cast<LPARAM>(text));
  return text;
}

// Selects an entry and tells the owner as a choice made with the mouse does.
inline void SelectCombo(HWND combo, int index) {
  SendMessageW(combo, CB_SETCURSEL, static_cast<WPARAM>(index), 0);
  PostMessageW(GetParent(combo), WM_COMMAND, MAKEWPARAM(GetDlgCtrlID(combo), CBN_SELCHANGE),
               reinterpret_cast<LPARAM>(combo));
}

// Saves <build>/screenshots/<name>.png of the window as it is on the screen Wine draws on: under a
// virtual desktop, the X window Wine names in a property. The picture appears when complete.
inline bool Screenshot(HWND window, const std::string& name) {
  RECT bounds{};
  GetWindowRect(window, &bounds);
  const std::string path = E2E_SCREENSHOT_DIR "/" + name + ".png";
  DeleteFileW(WindowsPath(path).c_str());
  RedrawWindow(window, nullptr, nullptr, RDW_UPDATENOW | RDW_ALLCHILDREN);
  const auto desktop = reinterpret_cast<ULONG_PTR>(GetPropW(GetDesktopWindow(), L"__wine_x11_whole_window"));
  std::string command = "/bin/sh \"" E2E_CAPTURE_SCRIPT "\" \"" + path + "\" " + std::to_string(desktop);
  for (const LONG edge : {bounds.left, bounds.top, bounds.right, bounds.bottom}) command += " " + std::to_string(edge);
  if (HANDLE capture = Start(std::wstring(command.begin(), command.end()))) CloseHandle(capture);
  return WaitUntil([&] { return GetFileAttributesW(WindowsPath(path).c_str()) != INVALID_FILE_ATTRIBUTES; });
}

}  // namespace e2e
