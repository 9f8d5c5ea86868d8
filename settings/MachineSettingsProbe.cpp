// Whether this user may change machine-wide suite settings: a write probe under
// HKEY_CLASSES_ROOT, where only an administrator may create keys, and no suite application
// running.
#include "settings/AdvancedSettings.h"

#include <string>
#include <vector>

#include "framework/RegistryKey.h"
#include "inventory/RunningSuiteApps.h"

namespace {

// The class is one of the suite's own, registered under the standard "controls" category.
const std::wstring kMachineWriteProbeKey =
    L"CLSID\\{EACA595B-B64B-4B80-91AF-DD4517EB4ABC}\\Implemented Categories\\{40FC6ED5-2438-11CF-A3DB-080036F12502}";

// ERROR_SUCCESS when the key opens; ERROR_FILE_NOT_FOUND only when it is really missing.
LONG ClassesKeyStatus(const std::wstring& path) {
  fw::RegistryKey key;
  return key.Open(HKEY_CLASSES_ROOT, path.c_str());
}

// Deletes a key under HKEY_CLASSES_ROOT that has no subkeys.
LONG DeleteClassesKey(const std::wstring& path) {
  fw::RegistryKey root;
  root.Open(HKEY_CLASSES_ROOT, L"");
  return root.DeleteSubKey(path.c_str());
}

// Two rounds of create-or-delete leave the probe key as they found it.
bool ProbeMachineWrite() {
  for (int round = 0; round < 2; ++round) {
    if (ClassesKeyStatus(kMachineWriteProbeKey) == ERROR_SUCCESS) {
      if (DeleteClassesKey(kMachineWriteProbeKey) != ERROR_SUCCESS) return false;
    } else {
      fw::RegistryKey created;
      if (created.Create(HKEY_CLASSES_ROOT, kMachineWriteProbeKey.c_str()) != ERROR_SUCCESS) return false;
    }
  }
  return true;
}

// The probe key and each of its parents below the root, deepest first.
std::vector<std::wstring> ProbeKeyChain() {
  std::vector<std::wstring> chain;
  for (std::wstring path = kMachineWriteProbeKey;; path.erase(path.rfind(L'\\'))) {
    chain.push_back(path);
    if (path.find(L'\\') == std::wstring::npos) return chain;
  }
}

// Removes the key when it holds neither subkeys nor values: whatever was put there meanwhile stays.
void DeleteEmptyClassesKey(const std::wstring& path) {
  fw::RegistryKey key;
  if (key.Open(HKEY_CLASSES_ROOT, path.c_str(), KEY_QUERY_VALUE) != ERROR_SUCCESS) return;
  DWORD subkeys = 0;
  DWORD values = 0;
  const LONG status = key.CountChildren(subkeys, values);
  key.Close();
  if (status == ERROR_SUCCESS && subkeys == 0 && values == 0) DeleteClassesKey(path);
}

}  // namespace

bool CanWriteMachineSettings() {
  // Creating the probe key creates whichever of its parents are missing too (the class key where
  // the suite has not registered its class, its categories key where it lists none); those go
  // again, so that looking leaves the workstation as it was.
  const std::vector<std::wstring> chain = ProbeKeyChain();
  std::vector<bool> missing;
  for (const std::wstring& path : chain) missing.push_back(ClassesKeyStatus(path) == ERROR_FILE_NOT_FOUND);
  const bool writable = ProbeMachineWrite();
  for (size_t i = 0; i < chain.size(); ++i)
    if (missing[i]) DeleteEmptyClassesKey(chain[i]);
  if (!writable) return false;
  CStringArray running;
  GetRunningSuiteApps(running);
  return running.empty();
}
