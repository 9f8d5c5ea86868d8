// The application object and the services the console's start-up needs: command-line walk,
// OLE with its message filter, rich edit, help, message boxes and the last-resort report of an
// exception that escaped a window's handler.
#pragma once

#include <windows.h>

#include <exception>
#include <memory>

#include "framework/FrameworkIds.h"
#include "framework/Strings.h"
#include "framework/Wnd.h"

// Asks a window to show help for its current context.
constexpr UINT WM_COMMANDHELP = 0x0365;

// Receives each command-line argument in turn from CWinApp::ParseCommandLine.
class CCommandLineInfo {
 public:
  virtual ~CCommandLineInfo() = default;
  // isFlag: the argument began with '-' or '/', which has been removed.
  // Plain arguments are never taken as a document to open.
  virtual void ParseParam(const wchar_t* param, BOOL isFlag, BOOL isLast);
};

// Hands arguments 1..argc-1 of argv to info in order. An argument that starts with '-' or '/' is
// a flag and loses that one character; isLast is set for the last argument only.
void WalkCommandLine(CCommandLineInfo& info, int argc, const wchar_t* const* argv);

// A failed COM call, raised where a caller cannot go on without its object.
class ComError : public std::exception {
 public:
  explicit ComError(HRESULT hr) : m_hr(hr) {}
  HRESULT Error() const { return m_hr; }
  const char* what() const noexcept override { return "COM error"; }

 private:
  HRESULT m_hr;
};

class CWinApp {
 public:
  CWinApp();
  virtual ~CWinApp();
  CWinApp(const CWinApp&) = delete;
  CWinApp& operator=(const CWinApp&) = delete;

  // Start-up; returning FALSE ends the program without entering the message loop.
  virtual BOOL InitInstance();
  virtual int ExitInstance();
  virtual int Run();
  // Commands no window handled; true when handled.
  virtual bool OnCmdMsg(UINT id);
  // Reports an exception that escaped a window's handler; the program goes on.
  virtual void ProcessWndProcException(std::exception_ptr error);

  // Walks arguments 1..n of the process command line into info.
  void ParseCommandLine(CCommandLineInfo& info);
  // Initialises OLE and installs the application's message filter; false on failure.
  bool InitOle();
  // Registers the common-control classes (ICC_* flags) that are not registered yet.
  void InitCommonControls(DWORD classes);
  // Loads the rich edit library; false when it cannot be loaded.
  bool InitRichEdit();

  // Help: the default handler asks the main window to show help for its context.
  void OnHelp();
  const CString& GetHelpFilePath() const { return m_helpFilePath; }
  void SetHelpFilePath(const CString& path) { m_helpFilePath = path; }

  CString GetAppName() const;

  HINSTANCE m_hInstance = nullptr;
  CWnd* m_pMainWnd = nullptr;

 private:
  CString m_helpFilePath;
  class OleSession;
  std::unique_ptr<OleSession> m_ole;
  DWORD m_commonControls = 0;
};

CWinApp* AfxGetApp();

// Message box with the program name as its caption.
int AfxMessageBox(const CString& text, UINT type = MB_OK);
int AfxMessageBox(UINT stringId, UINT type = MB_OK);

// The framework's program entry: runs the application object's start-up and, when that
// succeeds, its message loop.
int AfxWinMain(HINSTANCE instance);
