// The advanced settings the workstation page opens, and what the main window needs of them.
#pragma once

#include <windows.h>

#include <string>

#include "locale/SuiteUserSettings.h"
#include "settings/SettingsRegistry.h"
#include "settings/SuiteSettings.h"

class AdminSession;

// The workstation page's "Advanced..." handler: runs the Advanced Configuration dialog modally
// and writes what it chose.
void PersistAdvancedSettings(AdminSession& mainDlg);

// Whether this user may change machine-wide suite settings right now: a write probe under
// HKEY_CLASSES_ROOT (left as it was found) and no suite application running.
bool CanWriteMachineSettings();

// Writes UILANGID, or deletes it when langId is 0 (a missing key or value is no error).
void StoreUILangID(DWORD langId);
// Removes UILANGID; nothing happens when the key cannot be opened.
void DeleteStoredUILangID();
