#include "app/ClientAdminApp.h"

#include <commctrl.h>

#include "app/ClientAdminDlg.h"
#include "app/CommandLine.h"
#include "framework/StartupTrace.h"
#include "locale/KVELLocale.h"
#include "res/resource.h"

BOOL CClientAdminApp::InitInstance() {
  fw::TraceStartup("process entry, command line");
  CMDACommandLineInfo commandLine;
  ParseCommandLine(commandLine);

  fw::TraceStartup("locale override");
  unsigned short forcedLanguage = 0;
  if (commandLine.LanguageOverride(forcedLanguage)) KVELLocale::SetupEXEOverRide(forcedLanguage);

  // From here on every string, template and image comes from the localized library, if any.
  fw::TraceStartup("resource library");
  HINSTANCE localized = KVELLocale::LoadLocalizedRes(m_hInstance);
  if (localized != nullptr) fw::SetResourceHandle(localized);

  // No template hosts an ActiveX control, so dialogs need no control container.
  fw::TraceStartup("OLE");
  if (!InitOle()) {
    AfxMessageBox(IDS_OLE_INIT_FAILED, MB_OK);
    return FALSE;
  }
  fw::TraceStartup("rich edit library");
  InitRichEdit();
  fw::TraceStartup("common controls");
  // The page tree, the standard controls and the link in the advanced settings.
  InitCommonControls(ICC_TREEVIEW_CLASSES | ICC_STANDARD_CLASSES | ICC_LINK_CLASS);

  {
    fw::TraceStartup("main window constructor (icon, tree images worker)");
    CClientAdminDlg mainDlg;
    fw::TraceStartup("main window created from its template");
    m_pMainWnd = &mainDlg;
    mainDlg.DoModal();
    m_pMainWnd = nullptr;
  }
  // The main window has closed: end the program instead of entering a message loop.
  return FALSE;
}

bool CClientAdminApp::OnCmdMsg(UINT id) {
  if (id == ID_HELP) {
    OnHelp();
    return true;
  }
  return CWinApp::OnCmdMsg(id);
}
