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
  for (const ULONGLONG deadline = GetTickCount64() + kWaitMs; !condition(); Sleep(50))
    if (GetTickCount64() >= deadline) return false;
  return true;
}

// Wine's drive Z: is the root of the build machine's file system.
inline std::wstring WindowsPath(const std::string& hostPath) {
  std::wstring path = L"Z:" + std::wstring(hostPath.begin(), hostPath.end());
  for (wchar_t& c : path) c = c == L'/' ? L'\\' : c;
  return path;
}

inline std::wstring ConsolePath() { return WindowsPath(MAPORA_CONSOLE_EXE); }

inline HANDLE Start(std::wstring commandLine) {
  STARTUPINFOW startup{};
  startup.cb = sizeof startup;
  PROCESS_INFORMATION info{};
  CreateProcessW(nullptr, &commandLine[0], nullptr, nullptr, FALSE, 0, nullptr, nullptr, &startup, &info);
  CloseHandle(info.hThread);  // both stay null when it failed
  return info.hProcess;
}

// WM_GETTEXT is carried across processes; the length comes first so that no text is cut.
inline std::wstring Text(HWND window) {
  std::wstring text(static_cast<size_t>(SendMessageW(window, WM_GETTEXTLENGTH, 0, 0)) + 1, L'\0');
  text.resize(static_cast<size_t>(SendMessageW(window, WM_GETTEXT, text.size(), reinterpret_cast<LPARAM>(&text[0]))));
  return text;
}

using Search = std::pair<std::function<bool(HWND)>, HWND>;

// A named callback: on 32-bit x86 a lambda does not convert to the stdcall pointer needed here.
inline BOOL CALLBACK Match(HWND window, LPARAM search) {
  auto* s = reinterpret_cast<Search*>(search);
  if (s->first(window)) s->second = window;
  return s->second == nullptr;
}

// The first control with that identifier, also one nested in a page.
inline HWND Control(HWND window, int id) {
  Search search{[id](HWND w) { return GetDlgCtrlID(w) == id; }, nullptr};
  EnumChildWindows(window, Match, reinterpret_cast<LPARAM>(&search));
  return search.second;
}

inline void Click(HWND window, int id) { PostMessageW(Control(window, id), BM_CLICK, 0, 0); }

// A child process (by default the console), terminated when the object goes.
class Process {
 public:
  // environment: "NAME=value" entries for the child only; the test's own has none of these names.
  explicit Process(const std::wstring& arguments = L"", const std::wstring& program = ConsolePath(),
                   const std::vector<std::wstring>& environment = {}) {
    for (const auto& entry : environment)
      SetEnvironmentVariableW(entry.substr(0, entry.find(L'=')).c_str(), entry.substr(entry.find(L'=') + 1).c_str());
    process_ = Start(L"\"" + program + L"\" " + arguments);
    for (const auto& entry : environment) SetEnvironmentVariableW(entry.substr(0, entry.find(L'=')).c_str(), nullptr);
  }
  ~Process() {
    if (TerminateProcess(process_, 1)) WaitForSingleObject(process_, kWaitMs);
    CloseHandle(process_);
  }
  Process(const Process&) = delete;
  Process& operator=(const Process&) = delete;
  bool Running() const { return process_ && WaitForSingleObject(process_, 0) == WAIT_TIMEOUT; }
  bool Shows(HWND window) const {
    DWORD owner = 0;
    GetWindowThreadProcessId(window, &owner);
    return owner == GetProcessId(process_) && IsWindowVisible(window);
  }
  // A visible top-level window of the process: the main window (the one with the page tree) or
  // one with that caption, such as a message box or the help viewer.
  HWND WaitForWindow(const wchar_t* caption = nullptr) const {
    Search search{
        [&](HWND w) { return Shows(w) && (GetDlgItem(w, IDC_PAGE_TREE) ? !caption : caption && Text(w) == caption); },
        nullptr};
    WaitUntil([&] { return (EnumWindows(Match, reinterpret_cast<LPARAM>(&search)), search.second) || !Running(); });
    return search.second;
  }

 private:
  HANDLE process_ = nullptr;
};

// TVM_GETITEMW is not carried across processes: the item goes through the console's own memory.
inline std::wstring TreeRootText(HWND tree) {
  struct {
    TVITEMW item;
    wchar_t text[256];
  } local{}, *remote = nullptr;
  DWORD processId = 0;
  GetWindowThreadProcessId(tree, &processId);
  HANDLE process = OpenProcess(PROCESS_VM_OPERATION | PROCESS_VM_READ | PROCESS_VM_WRITE, FALSE, processId);
  remote = static_cast<decltype(remote)>(VirtualAllocEx(process, nullptr, sizeof local, MEM_COMMIT, PAGE_READWRITE));
  local.item = {TVIF_TEXT, TreeView_GetRoot(tree), 0, 0, remote ? remote->text : nullptr, 255, 0, 0, 0, 0};
  if (remote && WriteProcessMemory(process, remote, &local, sizeof local, nullptr) &&
      SendMessageW(tree, TVM_GETITEMW, 0, reinterpret_cast<LPARAM>(remote)))
    ReadProcessMemory(process, remote, &local, sizeof local, nullptr);
  VirtualFreeEx(process, remote, 0, MEM_RELEASE);
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
  RECT r{};
  GetWindowRect(window, &r);
  const std::string path = std::string(E2E_SCREENSHOT_DIR) + "/" + name + ".png";
  CreateDirectoryW(WindowsPath(E2E_SCREENSHOT_DIR).c_str(), nullptr);
  DeleteFileW(WindowsPath(path).c_str());
  // The coordinates are those of the screen Wine draws on: the X root window, or under a
  // virtual desktop the desktop's own X window, which Wine names in this property.
  char source[32] = "root", command[1024];
  if (HANDLE desktop = GetPropW(GetDesktopWindow(), L"__wine_x11_whole_window"))
    std::snprintf(source, sizeof source, "0x%lx", static_cast<unsigned long>(reinterpret_cast<ULONG_PTR>(desktop)));
  std::snprintf(command, sizeof command, "/bin/sh \"%s\" %s %ldx%ld+%ld+%ld \"%s\"", E2E_CAPTURE_SCRIPT, source,
                r.right - r.left, r.bottom - r.top, r.left, r.top, path.c_str());
  RedrawWindow(window, nullptr, nullptr, RDW_UPDATENOW | RDW_ALLCHILDREN);
  // Wine hands back no handle to wait on for a Linux program: the picture appears when complete.
  CloseHandle(Start(std::wstring(command, command + std::strlen(command))));
  return WaitUntil([&] { return GetFileAttributesW(WindowsPath(path).c_str()) != INVALID_FILE_ATTRIBUTES; });
}

}  // namespace e2e
