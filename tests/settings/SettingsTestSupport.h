// A workstation for the Advanced Configuration tests: the Desktop and Engine product records
// with language-pack folders under their bin folders, the user's and the machine's suite
// settings keys (all removed again afterwards), and a main window object holding the state the
// dialog reads.
#pragma once

#include <windows.h>

#include <functional>
#include <string>
#include <utility>
#include <vector>

#include "app/ClientAdminDlg.h"
#include "settings/AdvancedSettings.h"
#include "settings/ClientMaporaAdvancedConfigDlg.h"
#include "settings/URLTokenManager.h"
#include "tests/support/TestSupport.h"

namespace settings_tests {

inline constexpr wchar_t kDesktopKey[] = L"SOFTWARE\\KVEL\\Desktop10.5";
inline constexpr wchar_t kEngineKey[] = L"SOFTWARE\\KVEL\\Engine10.5";
inline constexpr wchar_t kDesktopSettingsKey[] = L"SOFTWARE\\KVEL\\Desktop10.5\\Settings";

class Workstation {
 public:
  Workstation();

  // Marks the product installed, with InstallDir pointing at a test folder whose bin folder
  // holds the given pack folders (and a plain file named like a pack, which must be ignored).
  void InstallDesktop(const std::vector<std::wstring>& packs);
  void InstallEngine(const std::vector<std::wstring>& packs);
  // The stored display language, both in the registry and in the main window's copy.
  void StoreLanguage(DWORD langId);

  testing_support::ScopedRegistryKey desktopKey{HKEY_LOCAL_MACHINE, kDesktopKey};
  testing_support::ScopedRegistryKey engineKey{HKEY_LOCAL_MACHINE, kEngineKey};
  testing_support::ScopedRegistryKey desktopSettingsKey{HKEY_LOCAL_MACHINE, kDesktopSettingsKey};
  testing_support::ScopedRegistryKey userKey{HKEY_CURRENT_USER, L"SOFTWARE\\KVEL"};
  testing_support::ScopedRegistryKey portalUserKey{HKEY_CURRENT_USER, kConnectionSettingsKey};
  testing_support::ScopedRegistryKey connectionMachineKey{HKEY_LOCAL_MACHINE, L"SOFTWARE\\KVEL\\Mapora Connection"};
  testing_support::ScopedRegistryKey portalMachineKey{HKEY_LOCAL_MACHINE, kPortalMachineSettingsKey};
  testing_support::ScopedDirectory folders;
  CClientAdminDlg mainDlg;

 private:
  void Install(const wchar_t* product, testing_support::ScopedRegistryKey& key, const std::vector<std::wstring>& packs);
};

// The dialog created modeless (its initialisation runs, nothing is shown).
class OpenDialog : public CClientMaporaAdvancedConfigDlg {
 public:
  explicit OpenDialog(CClientAdminDlg& mainDlg);
  HWND Item(int id) const { return GetDlgItem(id); }
  // The WS_VISIBLE style: the hidden dialog makes every control invisible on screen.
  bool Shown(int id) const;
  bool Enabled(int id) const { return IsWindowEnabled(Item(id)) != FALSE; }
  bool Checked(int id) const { return IsDlgButtonChecked(m_hWnd, id) == BST_CHECKED; }
  int Selection() const;
  // Text and item data of every entry, in list order.
  std::vector<std::pair<std::wstring, DWORD>> Entries() const;
};

// Selects a list entry the way the user does: the selection, then the change notification.
void SelectLanguage(HWND dialog, int index);
void Click(HWND dialog, int id);

// Runs action on this thread's timer until it returns true, while the caller sits in a modal
// loop (a dialog or a message box); the timer ends with the scope.
class WhileModal {
 public:
  explicit WhileModal(std::function<bool()> action);
  ~WhileModal();
  WhileModal(const WhileModal&) = delete;
  WhileModal& operator=(const WhileModal&) = delete;

 private:
  static void CALLBACK Tick(HWND, UINT, UINT_PTR id, DWORD);
  UINT_PTR timer_ = 0;
};

// A visible top-level window of this process with the given caption; null when there is none.
HWND FindOwnWindow(const std::wstring& caption);
// The texts of a window's children, joined by newlines.
std::wstring ChildTexts(HWND window);

}  // namespace settings_tests
