#include "tests/e2e/ConsoleDriver.h"

#include <cstdio>
#include <cwchar>
#include <cwctype>

namespace e2e {

namespace {

constexpr DWORD kPollMs = 50;

std::wstring Widen(const std::string& text) {
  if (text.empty()) return {};
  int length = MultiByteToWideChar(CP_UTF8, 0, text.data(), static_cast<int>(text.size()), nullptr, 0);
  std::wstring wide(static_cast<size_t>(length), L'\0');
  MultiByteToWideChar(CP_UTF8, 0, text.data(), static_cast<int>(text.size()), &wide[0], length);
  return wide;
}

std::wstring EnvironmentName(const std::wstring& entry) {
  // Entries such as "=C:=C:\" name a drive's folder; their name includes the first '='.
  size_t equals = entry.find(L'=', 1);
  std::wstring name = entry.substr(0, equals);
  for (wchar_t& c : name) c = static_cast<wchar_t>(std::towupper(c));
  return name;
}

std::vector<wchar_t> EnvironmentBlock(const std::vector<std::wstring>& extra) {
  std::vector<std::wstring> entries;
  if (wchar_t* strings = GetEnvironmentStringsW()) {
    for (const wchar_t* entry = strings; *entry != L'\0'; entry += wcslen(entry) + 1) entries.emplace_back(entry);
    FreeEnvironmentStringsW(strings);
  }
  for (const std::wstring& added : extra) {
    std::wstring name = EnvironmentName(added);
    for (auto it = entries.begin(); it != entries.end();) it = EnvironmentName(*it) == name ? entries.erase(it) : it + 1;
    entries.push_back(added);
  }
  std::vector<wchar_t> block;
  for (const std::wstring& entry : entries) block.insert(block.end(), entry.c_str(), entry.c_str() + entry.size() + 1);
  block.push_back(L'\0');
  return block;
}

// Memory in another process, for control messages whose buffers Windows does not copy across.
class RemoteBuffer {
 public:
  RemoteBuffer(HWND window, size_t size) : size_(size) {
    DWORD processId = 0;
    GetWindowThreadProcessId(window, &processId);
    process_ = OpenProcess(PROCESS_VM_OPERATION | PROCESS_VM_READ | PROCESS_VM_WRITE, FALSE, processId);
    if (process_) address_ = VirtualAllocEx(process_, nullptr, size, MEM_COMMIT | MEM_RESERVE, PAGE_READWRITE);
  }
  ~RemoteBuffer() {
    if (address_) VirtualFreeEx(process_, address_, 0, MEM_RELEASE);
    if (process_) CloseHandle(process_);
  }
  RemoteBuffer(const RemoteBuffer&) = delete;
  RemoteBuffer& operator=(const RemoteBuffer&) = delete;

  bool Valid() const { return address_ != nullptr; }
  char* Address(size_t offset = 0) const { return static_cast<char*>(address_) + offset; }
  bool Write(size_t offset, const void* data, size_t size) const {
    return offset + size <= size_ && WriteProcessMemory(process_, Address(offset), data, size, nullptr);
  }
  bool Read(size_t offset, void* data, size_t size) const {
    return offset + size <= size_ && ReadProcessMemory(process_, Address(offset), data, size, nullptr);
  }

 private:
  HANDLE process_ = nullptr;
  void* address_ = nullptr;
  size_t size_;
};

struct WindowSearch {
  DWORD processId;
  std::vector<HWND> found;
};

// Enumeration callbacks are named functions: on 32-bit x86 a lambda does not convert to the
// stdcall pointer the enumerators take.
BOOL CALLBACK CollectProcessDialog(HWND window, LPARAM param) {
  auto* s = reinterpret_cast<WindowSearch*>(param);
  DWORD owner = 0;
  GetWindowThreadProcessId(window, &owner);
  if (owner == s->processId && IsWindowVisible(window) && ClassName(window) == L"#32770") s->found.push_back(window);
  return TRUE;
}

// Visible top-level dialog windows of a process, in z order (topmost first).
std::vector<HWND> ProcessDialogs(DWORD processId) {
  WindowSearch search{processId, {}};
  EnumWindows(CollectProcessDialog, reinterpret_cast<LPARAM>(&search));
  return search.found;
}

struct ControlSearch {
  int id;
  HWND found;
};

BOOL CALLBACK FindControl(HWND child, LPARAM param) {
  auto* s = reinterpret_cast<ControlSearch*>(param);
  if (GetDlgCtrlID(child) != s->id) return TRUE;
  s->found = child;
  return FALSE;
}

}  // namespace

bool WaitUntil(const std::function<bool()>& condition, DWORD timeoutMs) {
  const ULONGLONG deadline = GetTickCount64() + timeoutMs;
  for (;;) {
    if (condition()) return true;
    if (GetTickCount64() >= deadline) return false;
    Sleep(kPollMs);
  }
}

std::wstring WindowsPath(const std::string& hostPath) {
  using ToDos = wchar_t*(CDECL*)(const char*);
  auto toDos = reinterpret_cast<ToDos>(
      reinterpret_cast<void*>(GetProcAddress(GetModuleHandleW(L"kernel32.dll"), "wine_get_dos_file_name")));
  if (toDos == nullptr) return Widen(hostPath);
  wchar_t* converted = toDos(hostPath.c_str());
  if (converted == nullptr) return Widen(hostPath);
  std::wstring path = converted;
  HeapFree(GetProcessHeap(), 0, converted);
  return path;
}

ChildProcess::ChildProcess(const std::wstring& program, const std::wstring& arguments,
                           const std::vector<std::wstring>& extraEnvironment) {
  std::wstring commandLine = L"\"" + program + L"\"";
  if (!arguments.empty()) commandLine += L" " + arguments;
  std::vector<wchar_t> environment = EnvironmentBlock(extraEnvironment);
  STARTUPINFOW startup{};
  startup.cb = sizeof startup;
  PROCESS_INFORMATION info{};
  if (!CreateProcessW(nullptr, &commandLine[0], nullptr, nullptr, FALSE, CREATE_UNICODE_ENVIRONMENT,
                      environment.data(), nullptr, &startup, &info))
    return;
  CloseHandle(info.hThread);
  process_ = info.hProcess;
  id_ = info.dwProcessId;
}

ChildProcess::~ChildProcess() {
  Terminate();
  if (process_) CloseHandle(process_);
}

bool ChildProcess::Running() const { return process_ && WaitForSingleObject(process_, 0) == WAIT_TIMEOUT; }

bool ChildProcess::WaitForExit(DWORD timeoutMs) const {
  return process_ && WaitForSingleObject(process_, timeoutMs) == WAIT_OBJECT_0;
}

void ChildProcess::Terminate() {
  if (Running()) {
    TerminateProcess(process_, 1);
    WaitForSingleObject(process_, kWaitMs);
  }
}

std::wstring ConsolePath() { return WindowsPath(MAPORA_CONSOLE_EXE); }

Console::Console(const LaunchOptions& options) : Console(options, ConsolePath()) {}

Console::Console(const LaunchOptions& options, const std::wstring& program)
    : ChildProcess(program, options.arguments, options.environment) {}

HWND Console::WaitForMainWindow(DWORD timeoutMs) {
  WaitUntil(
      [this] {
        for (HWND dialog : ProcessDialogs(Id()))
          if (GetDlgItem(dialog, 3501) != nullptr) main_ = dialog;
        return main_ != nullptr || !Running();
      },
      timeoutMs);
  return main_;
}

std::vector<HWND> Console::Dialogs() const {
  std::vector<HWND> dialogs = ProcessDialogs(Id());
  for (auto it = dialogs.begin(); it != dialogs.end();) it = *it == main_ ? dialogs.erase(it) : it + 1;
  return dialogs;
}

HWND Console::WaitForDialog(const std::wstring& caption, DWORD timeoutMs) const {
  HWND found = nullptr;
  WaitUntil(
      [&] {
        for (HWND dialog : Dialogs())
          if (caption.empty() || WindowText(dialog) == caption) found = dialog;
        return found != nullptr;
      },
      timeoutMs);
  return found;
}

std::wstring WindowText(HWND window) {
  // WM_GETTEXT is carried across processes; the length comes first so that no text is cut.
  LRESULT length = SendMessageW(window, WM_GETTEXTLENGTH, 0, 0);
  std::wstring text(static_cast<size_t>(length) + 1, L'\0');
  LRESULT copied = SendMessageW(window, WM_GETTEXT, text.size(), reinterpret_cast<LPARAM>(&text[0]));
  text.resize(static_cast<size_t>(copied));
  return text;
}

std::wstring ClassName(HWND window) {
  wchar_t name[64] = L"";
  GetClassNameW(window, name, 64);
  return name;
}

HWND Control(HWND dialog, int id) { return GetDlgItem(dialog, id); }

HWND Descendant(HWND window, int id) {
  ControlSearch search{id, nullptr};
  EnumChildWindows(window, FindControl, reinterpret_cast<LPARAM>(&search));
  return search.found;
}

void Click(HWND dialog, int id) { PostMessageW(Control(dialog, id), BM_CLICK, 0, 0); }

std::vector<std::wstring> StaticTexts(HWND dialog) {
  std::vector<std::wstring> texts;
  for (HWND child = GetWindow(dialog, GW_CHILD); child != nullptr; child = GetWindow(child, GW_HWNDNEXT)) {
    if (ClassName(child) != L"Static") continue;
    std::wstring text = WindowText(child);
    if (!text.empty()) texts.push_back(text);
  }
  return texts;
}

void Close(HWND window) { PostMessageW(window, WM_CLOSE, 0, 0); }

void OpenAboutBox(HWND mainWindow) { PostMessageW(mainWindow, WM_SYSCOMMAND, 3008, 0); }

HTREEITEM TreeRoot(HWND tree) {
  return reinterpret_cast<HTREEITEM>(SendMessageW(tree, TVM_GETNEXTITEM, TVGN_ROOT, 0));
}

HTREEITEM TreeSelection(HWND tree) {
  return reinterpret_cast<HTREEITEM>(SendMessageW(tree, TVM_GETNEXTITEM, TVGN_CARET, 0));
}

std::wstring TreeItemText(HWND tree, HTREEITEM item) {
  constexpr size_t kChars = 512;
  RemoteBuffer remote(tree, sizeof(TVITEMW) + kChars * sizeof(wchar_t));
  if (!remote.Valid() || item == nullptr) return {};
  TVITEMW query{};
  query.mask = TVIF_TEXT;
  query.hItem = item;
  query.pszText = reinterpret_cast<wchar_t*>(remote.Address(sizeof query));
  query.cchTextMax = kChars;
  wchar_t text[kChars] = L"";
  if (!remote.Write(0, &query, sizeof query) || !remote.Write(sizeof query, text, sizeof(wchar_t)) ||
      !SendMessageW(tree, TVM_GETITEMW, 0, reinterpret_cast<LPARAM>(remote.Address())))
    return {};
  if (!remote.Read(sizeof query, text, sizeof text)) return {};
  text[kChars - 1] = L'\0';
  return text;
}

std::vector<std::wstring> ComboItems(HWND combo) {
  std::vector<std::wstring> items;
  LRESULT count = SendMessageW(combo, CB_GETCOUNT, 0, 0);
  for (LRESULT i = 0; i < count; ++i) {
    LRESULT length = SendMessageW(combo, CB_GETLBTEXTLEN, static_cast<WPARAM>(i), 0);
    if (length < 0) break;
    std::wstring text(static_cast<size_t>(length) + 1, L'\0');
    LRESULT copied = SendMessageW(combo, CB_GETLBTEXT, static_cast<WPARAM>(i), reinterpret_cast<LPARAM>(&text[0]));
    text.resize(copied < 0 ? 0 : static_cast<size_t>(copied));
    items.push_back(text);
  }
  return items;
}

int ComboSelection(HWND combo) { return static_cast<int>(SendMessageW(combo, CB_GETCURSEL, 0, 0)); }

void SelectComboItem(HWND combo, int index) {
  SendMessageW(combo, CB_SETCURSEL, static_cast<WPARAM>(index), 0);
  PostMessageW(GetParent(combo), WM_COMMAND, MAKEWPARAM(GetDlgCtrlID(combo), CBN_SELCHANGE),
               reinterpret_cast<LPARAM>(combo));
}

std::string SaveScreenshot(HWND window, const std::string& name) {
  RECT rect{};
  if (!GetWindowRect(window, &rect)) return {};
  const std::string folder = E2E_SCREENSHOT_DIR;
  CreateDirectoryW(WindowsPath(folder).c_str(), nullptr);
  const std::string path = folder + "/" + name + ".png";
  DeleteFileW(WindowsPath(path).c_str());
  // The window's coordinates are those of the screen that Wine draws on: the X root window, or
  // under a virtual desktop the desktop's own X window, which Wine names in this property.
  std::string source = "root";
  if (HANDLE desktop = GetPropW(GetDesktopWindow(), L"__wine_x11_whole_window")) {
    char id[32];
    std::snprintf(id, sizeof id, "0x%llx", static_cast<unsigned long long>(reinterpret_cast<ULONG_PTR>(desktop)));
    source = id;
  }
  char crop[64];
  std::snprintf(crop, sizeof crop, "%ldx%ld+%ld+%ld", rect.right - rect.left, rect.bottom - rect.top, rect.left,
                rect.top);
  // Pending paints first; the script then waits for the picture to settle. Wine starts a Linux
  // program by its path but hands back no handle to wait on: the file appears when complete.
  RedrawWindow(window, nullptr, nullptr, RDW_UPDATENOW | RDW_ALLCHILDREN);
  std::wstring commandLine =
      Widen(std::string("/bin/sh \"") + E2E_CAPTURE_SCRIPT + "\" " + source + " " + crop + " \"" + path + "\"");
  STARTUPINFOW startup{};
  startup.cb = sizeof startup;
  PROCESS_INFORMATION info{};
  if (!CreateProcessW(nullptr, &commandLine[0], nullptr, nullptr, FALSE, 0, nullptr, nullptr, &startup, &info))
    return {};
  if (info.hThread) CloseHandle(info.hThread);
  if (info.hProcess) CloseHandle(info.hProcess);
  const std::wstring picture = WindowsPath(path);
  return WaitUntil([&] { return GetFileAttributesW(picture.c_str()) != INVALID_FILE_ATTRIBUTES; }) ? path
                                                                                                     : std::string();
}

}  // namespace e2e
