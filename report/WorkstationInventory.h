// What MaporaReport reads of a workstation: the products as the console detects them, every
// installation value the console's report reads, and the suite settings as they are stored.
// Reading changes nothing: no key is created and the machine-settings probe does not run.
#pragma once

#include <windows.h>

#include <string>
#include <vector>

#include "inventory/InstallationReport.h"
#include "settings/SuiteSettings.h"

struct WorkstationInventory {
  std::wstring release;
  std::wstring computerName;
  // The products' registry keys, in kReportProducts' order.
  std::vector<std::wstring> productKeys;
  // The installed flags, the products' values and the session folders, as the report has them.
  ReportInput values;
  StoredSuiteSettings settings;
};

// Lists the runtimes and detects the products exactly as the console's main window does; COM
// must be initialised on the calling thread.
void DetectProductsAsTheConsoleDoes(InstalledProducts& products);

WorkstationInventory ReadWorkstationInventory(const InstalledProducts& products);

// One JSON document (UTF-8, ending with a line break); its schema is in the README, section
// "Fleet inventory with MaporaReport".
std::string InventoryJson(const WorkstationInventory& inventory);
