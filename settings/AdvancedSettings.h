// The advanced settings the workstation page opens, and what the main window needs of them.
#pragma once

#include <windows.h>

#include <string>

class CClientAdminDlg;

// The workstation page's "Advanced..." handler: runs the Advanced Configuration dialog modally
// and writes what it chose.
void PersistAdvancedSettings(CClientAdminDlg& mainDlg);

// Whether this user may change machine-wide suite settings right now.
bool CanWriteMachineSettings();

// Registry helpers shared with the main window; each returns its default on any failure.
DWORD ReadRegistryDword(HKEY root, const std::wstring& keyPath, const std::wstring& valueName, DWORD defaultValue);
bool WriteRegistryDword(const std::wstring& keyPath, const std::wstring& valueName, DWORD value, HKEY root);
