#include "inventory/RunningSuiteApps.h"

#include <tlhelp32.h>

#include <cwchar>

#include "framework/ScopedHandle.h"

namespace {

// Executable names of the suite applications that hold the settings open, in the order the
// refusal message lists them.
const wchar_t* const kSuiteExecutables[] = {
    L"Ledgerly.exe", L"Tessera.exe", L"Vistamo.exe", L"Spherix.exe", L"Quillon.exe", L"QuillonHost.exe",
};

}  // namespace

CStringArray FindSuiteApps(const CString& processList) {
  // A plain substring search over the joined list, on purpose: "OldTessera.exe" counts as
  // Tessera, while a name in other letter case does not.
  CStringArray found;
  for (const wchar_t* name : kSuiteExecutables) {
    if (processList.find(name) != CString::npos) found.push_back(name);
  }
  return found;
}

CString RunningAppsText(const CStringArray& names) {
  CString text;
  for (const CString& name : names) text += L"  " + name + L"\r\n";
  return text;
}

bool GetProcessNameList(CString& out) {
  fw::ScopedHandle snapshot(CreateToolhelp32Snapshot(TH32CS_SNAPPROCESS, 0));
  if (!snapshot) return false;

  PROCESSENTRY32W entry = {};
  entry.dwSize = sizeof entry;
  if (!Process32FirstW(snapshot.Get(), &entry)) return false;
  CString list;
  do {
    list.append(entry.szExeFile, wcsnlen(entry.szExeFile, MAX_PATH));
    list += L'|';
  } while (Process32NextW(snapshot.Get(), &entry));
  out = list;
  return true;
}

void GetRunningSuiteApps(CStringArray& found) {
  found.clear();
  CString processes;
  if (GetProcessNameList(processes)) found = FindSuiteApps(processes);
}

bool GetRunningSuiteAppsText(CString& text) {
  CStringArray found;
  GetRunningSuiteApps(found);
  if (found.empty()) return false;
  text = RunningAppsText(found);
  return true;
}
