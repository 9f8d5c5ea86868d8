// Which suite applications are running: the main window refuses to save while any of them runs.
#pragma once

#include "framework/Strings.h"

// Every process's executable name followed by "|", in snapshot order; false when no snapshot.
bool GetProcessNameList(CString& out);
// The watched names found in the process list, in the watched table's order.
void GetRunningSuiteApps(CStringArray& found);
// "  name\r\n" per running application; false (text untouched) when none runs.
bool GetRunningSuiteAppsText(CString& text);

// The rules behind them, free of the process snapshot.
// The watched names that occur in processList (as GetProcessNameList writes it), in table order.
CStringArray FindSuiteApps(const CString& processList);
// One line "  name\r\n" per name, in the given order.
CString RunningAppsText(const CStringArray& names);
