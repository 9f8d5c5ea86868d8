// Binding the HTML Help control. It is bound once per process, so each test runs as a process of
// its own (see CMakeLists.txt).
#include <windows.h>
#include <htmlhelp.h>

#include <gtest/gtest.h>

#include <cwctype>

#include "locale/KVELLocale.h"
#include "tests/support/TestSupport.h"

using namespace testing_support;

namespace {

std::wstring Lower(std::wstring text) {
  for (wchar_t& c : text) c = static_cast<wchar_t>(std::towlower(c));
  return text;
}

// For the life of the object HKEY_CLASSES_ROOT of this process is an empty key: no class is
// registered.
class ScopedEmptyClassesRoot {
 public:
  ScopedEmptyClassesRoot() {
    RegCreateKeyExW(HKEY_CURRENT_USER, scratch_.c_str(), 0, nullptr, 0, KEY_ALL_ACCESS, nullptr, &classes_, nullptr);
    RegOverridePredefKey(HKEY_CLASSES_ROOT, classes_);
  }
  ~ScopedEmptyClassesRoot() {
    RegOverridePredefKey(HKEY_CLASSES_ROOT, nullptr);
    RegCloseKey(classes_);
    RegDeleteKeyW(HKEY_CURRENT_USER, scratch_.c_str());
  }

 private:
  std::wstring scratch_ = L"Software\\MaporaTestClasses" + std::to_wstring(GetCurrentProcessId());
  HKEY classes_ = nullptr;
};

TEST(HtmlHelpControl, ClosingAllHelpWindowsLoadsNoControl) {
  ScopedHiveOverride hives;
  ASSERT_EQ(GetModuleHandleW(L"hhctrl.ocx"), nullptr);
  KVELLocale::KVEL_HtmlHelp(nullptr, HH_CLOSE_ALL, 0);
  EXPECT_EQ(GetModuleHandleW(L"hhctrl.ocx"), nullptr);
}

// Without a registered control the system's copy is loaded, even when a file of that name comes
// first on the search path.
TEST(HtmlHelpControl, TheSystemsCopyWhenNoneIsRegistered) {
  ScopedHiveOverride hives;
  ScopedEmptyClassesRoot noClasses;
  ScopedDirectory decoy(ModuleFolder() + L"\\help-control-decoy");
  ASSERT_TRUE(CopyFileTo(ModuleFolder() + L"\\locale_test_res.dll", decoy.Path() + L"\\hhctrl.ocx"));
  SetDllDirectoryW(decoy.Path().c_str());
  DWORD cookie = 0;
  KVELLocale::KVEL_HtmlHelp(nullptr, nullptr, HH_INITIALIZE, reinterpret_cast<DWORD_PTR>(&cookie));
  SetDllDirectoryW(nullptr);

  wchar_t loaded[MAX_PATH] = L"";
  ASSERT_NE(GetModuleFileNameW(GetModuleHandleW(L"hhctrl.ocx"), loaded, MAX_PATH), 0u);
  wchar_t system[MAX_PATH] = L"";
  GetSystemDirectoryW(system, MAX_PATH);
  EXPECT_EQ(Lower(loaded), Lower(std::wstring(system) + L"\\hhctrl.ocx"));
  KVELLocale::KVEL_HtmlHelp(nullptr, nullptr, HH_UNINITIALIZE, cookie);
}

}  // namespace
