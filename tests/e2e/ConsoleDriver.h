// Drives the real console from a test program in the same Wine prefix: starts MaporaAdmin.exe,
// finds its windows and controls, presses buttons, reads texts (also those of controls whose
// messages Windows does not carry across processes) and photographs windows.
//
// Buttons are pressed by posting, never by sending, because a button may open a modal box and
// the driver must stay free to look at it. Every wait polls a condition until a deadline.
#pragma once

#include <windows.h>
#include <commctrl.h>

#include <functional>
#include <string>
#include <vector>

namespace e2e {

// Generous: the first program that needs COM in a fresh prefix waits for its services to start.
constexpr DWORD kWaitMs = 30000;

// Polls condition until it holds or timeoutMs passes; true when it held.
bool WaitUntil(const std::function<bool()>& condition, DWORD timeoutMs = kWaitMs);

// A Windows path for a path of the build machine (a Unix path under Wine).
std::wstring WindowsPath(const std::string& hostPath);

// A process of the test, ended when the object goes, whatever the test's outcome.
class ChildProcess {
 public:
  // extraEnvironment: "NAME=value" entries added to (or replacing those of) the test's own.
  ChildProcess(const std::wstring& program, const std::wstring& arguments,
               const std::vector<std::wstring>& extraEnvironment = {});
  ~ChildProcess();
  ChildProcess(const ChildProcess&) = delete;
  ChildProcess& operator=(const ChildProcess&) = delete;

  bool Started() const { return process_ != nullptr; }
  DWORD Id() const { return id_; }
  bool Running() const;
  // True when the process ended within the timeout.
  bool WaitForExit(DWORD timeoutMs = kWaitMs) const;
  void Terminate();

 private:
  HANDLE process_ = nullptr;
  DWORD id_ = 0;
};

struct LaunchOptions {
  std::wstring arguments;
  std::vector<std::wstring> environment;  // "NAME=value"
};

// One run of the console under test.
class Console : public ChildProcess {
 public:
  explicit Console(const LaunchOptions& options = {});
  // A copy of the console elsewhere, such as in the suite's shared program folder.
  Console(const LaunchOptions& options, const std::wstring& program);

  // The main window (the dialog with the page tree) once it is shown; null after the timeout.
  HWND WaitForMainWindow(DWORD timeoutMs = kWaitMs);
  // The console's visible dialogs and message boxes other than the main window, topmost first.
  std::vector<HWND> Dialogs() const;
  // Waits for such a dialog with the given caption (any caption when empty).
  HWND WaitForDialog(const std::wstring& caption = L"", DWORD timeoutMs = kWaitMs) const;

 private:
  HWND main_ = nullptr;
};

// Path of the console executable under test.
std::wstring ConsolePath();

std::wstring WindowText(HWND window);
std::wstring ClassName(HWND window);
HWND Control(HWND dialog, int id);
// The first descendant with the control identifier id, such as a control of a page.
HWND Descendant(HWND window, int id);
// Presses a button of a dialog without waiting for what the press does.
void Click(HWND dialog, int id);
// The non-empty texts of a dialog's static controls, in tab order.
std::vector<std::wstring> StaticTexts(HWND dialog);
void Close(HWND window);
// The About command of the main window's system menu.
void OpenAboutBox(HWND mainWindow);

// Tree view items, read through a buffer in the console's own memory.
HTREEITEM TreeRoot(HWND tree);
HTREEITEM TreeSelection(HWND tree);
std::wstring TreeItemText(HWND tree, HTREEITEM item);

// Combo boxes.
std::vector<std::wstring> ComboItems(HWND combo);
int ComboSelection(HWND combo);
// Selects an entry and notifies the owner as a choice made with the mouse does.
void SelectComboItem(HWND combo, int index);

// Saves a PNG of the window as it is on screen as <build>/screenshots/<name>.png and returns
// that path; empty when it could not be taken.
std::string SaveScreenshot(HWND window, const std::string& name);

}  // namespace e2e
