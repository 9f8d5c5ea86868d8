#include "inventory/RunningSuiteApps.h"

#include <tlhelp32.h>

#include <cwchar>

namespace {

// Executable names of the suite applications that hold the settings open, in the order the
// refusal message lists them.
const wchar_t* const kSuiteExecutables[] = {
    L"Ledgerly.exe", L"Tessera.exe", L"Vistamo.exe", L"Spherix.exe", L"Quillon.exe", L"QuillonHost.exe",
};

}  // namespace

bool GetProcessNameList(CString& out) {
  HANDLE snapshot = CreateToolhelp32Snapshot(TH32CS_SNAPPROCESS, 0);
  if (snapshot == INVALID_HANDLE_VALUE) return false;

  PROCESSENTRY32W entry = {};
  entry.dwSize = sizeof entry;
  if (!Process32FirstW(snapshot, &entry)) {
    CloseHandle(snapshot);
    return false;
  }
  CString list;
  do {
    list.append(entry.szExeFile, wcsnlen(entry.szExeFile, MAX_PATH));
    list += L'|';
  } while (Process32NextW(snapshot, &entry));
  CloseHandle(snapshot);
  out = list;
  return true;
}

void GetRunningSuiteApps(CStringArray& found) {
  found.clear();
  CString processes;
  if (!GetProcessNameList(processes)) return;
  // A plain substring search over the joined list, on purpose: "OldTessera.exe" counts as
  // Tessera, while a name in other letter case does not.
  for (const wchar_t* name : kSuiteExecutables) {
    if (processes.find(name) != CString::npos) found.push_back(name);
  }
}

bool GetRunningSuiteAppsText(CString& text) {
  CStringArray found;
  GetRunningSuiteApps(found);
  if (found.empty()) return false;
  text.clear();
  for (const CString& name : found) text += L"  " + name + L"\r\n";
  return true;
}
