// What the console's pages and dialogs share for one run. The main window implements it; a page
// or dialog reaches it through its back-pointer and never needs to know the main window itself.
#pragma once

#include <windows.h>

#include "inventory/InstalledProducts.h"

class AdminSession {
 public:
  // The installed products, detected when the main window loads its settings.
  InstalledProducts m_installedProducts;
  // The chosen display language; 0 = none chosen. Saved to the registry only by the main
  // window's save and by the advanced settings.
  DWORD m_dwUILangID = 0;
  // Whether machine-wide settings may be changed in this run.
  bool m_machineSettingsWritable = false;

  // Runs the advanced settings (the workstation page's "Advanced..." button).
  virtual void OpenAdvancedSettings() = 0;

 protected:
  AdminSession() = default;
  ~AdminSession() = default;
  AdminSession(const AdminSession&) = delete;
  AdminSession& operator=(const AdminSession&) = delete;
};
