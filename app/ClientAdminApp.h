// The console's application object: start-up runs the main window modally and then ends the
// program, so there is no message loop of its own.
#pragma once

#include "framework/App.h"

class CClientAdminApp : public CWinApp {
 public:
  BOOL InitInstance() override;
  // The Help command goes to the framework's default help handler.
  bool OnCmdMsg(UINT id) override;
};
