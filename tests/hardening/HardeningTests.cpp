// The console against what it finds on a workstation: the state the machine-settings probe meets,
// libraries planted where it must not look for them.
#include <gtest/gtest.h>

#include <iterator>

#include "settings/AdvancedSettings.h"
#include "tests/e2e/ConsoleDriver.h"
#include "tests/support/TestSupport.h"

using namespace e2e;
using namespace testing_support;

namespace {

// The probe key's path under HKEY_CLASSES_ROOT, from the class key down.
const std::wstring kClassKey = L"CLSID\\{EACA595B-B64B-4B80-91AF-DD4517EB4ABC}";
const std::wstring kProbePath[] = {kClassKey, kClassKey + L"\\Implemented Categories",
                                   kClassKey + L"\\Implemented Categories\\{40FC6ED5-2438-11CF-A3DB-080036F12502}"};

std::vector<bool> ProbePathPresent() {
  std::vector<bool> present;
  for (const std::wstring& path : kProbePath) {
    HKEY key = nullptr;
    present.push_back(RegOpenKeyExW(HKEY_CLASSES_ROOT, path.c_str(), 0, KEY_READ, &key) == ERROR_SUCCESS);
    RegCloseKey(key);
  }
  return present;
}

// None, some or all of the path's keys present at the start: the probe leaves them as it found them.
TEST(MachineSettingsProbe, LeavesTheClassKeyAsFound) {
  for (size_t present = 0; present <= std::size(kProbePath); ++present) {
    SCOPED_TRACE(testing::Message() << "the first " << present << " keys of the path present");
    ScopedRegistryKey cleanup(HKEY_CLASSES_ROOT, kClassKey);
    HKEY key = nullptr;
    if (present > 0) {
      ASSERT_EQ(RegCreateKeyW(HKEY_CLASSES_ROOT, kProbePath[present - 1].c_str(), &key), ERROR_SUCCESS);
      RegCloseKey(key);
    }
    const std::vector<bool> before = ProbePathPresent();
    EXPECT_TRUE(CanWriteMachineSettings());  // no suite application runs here
    EXPECT_EQ(ProbePathPresent(), before);
  }
}

// Planted beside a copy of the console and in its working folder, under the names of system libraries
// the console uses: none of them runs and the console opens as usual. version.dll is not among them:
// under Wine a planted copy runs before the console's first instruction, as Wine's own user32 imports
// it; CheckImports.cmake checks that the console does not.
TEST(PlantedLibrary, NeverRuns) {
  const wchar_t* const libraries[] = {L"RICHED32.DLL", L"RICHED20.DLL", L"gdiplus.dll"};
  ScopedDirectory program(ModuleFolder() + L"\\planted-program"), work(ModuleFolder() + L"\\planted-work");
  ASSERT_TRUE(CopyFileTo(ConsolePath(), program.Path() + L"\\MaporaAdmin.exe"));
  for (const ScopedDirectory* folder : {&program, &work})
    for (const std::wstring library : libraries)
      ASSERT_TRUE(CopyFileTo(WindowsPath(HARDENING_MARKERS_DIR) + L"\\" + library, folder->Path() + L"\\" + library));
  // Wine prefers its built-in libraries, Windows the first file its search finds; Wine takes its
  // overrides for a program started from a Windows process from the registry.
  ScopedRegistryKey appDefaults(HKEY_CURRENT_USER, L"Software\\Wine\\AppDefaults\\MaporaAdmin.exe");
  for (const wchar_t* name : {L"riched20", L"riched32", L"gdiplus"})
    SetRegistryString(HKEY_CURRENT_USER, L"Software\\Wine\\AppDefaults\\MaporaAdmin.exe\\DllOverrides", name,
                      L"native,builtin");
  wchar_t previous[MAX_PATH] = L"";
  GetCurrentDirectoryW(MAX_PATH, previous);
  SetCurrentDirectoryW(work.Path().c_str());
  Process console(L"", program.Path() + L"\\MaporaAdmin.exe");
  SetCurrentDirectoryW(previous);
  HWND main = console.WaitForMainWindow();
  ASSERT_NE(main, nullptr);
  // The report is a rich edit control: the system's rich edit library was loaded after all.
  EXPECT_NE(GetDlgItem(FindWindowExW(main, nullptr, L"#32770", nullptr), IDC_REPORT), nullptr);
  for (const ScopedDirectory* folder : {&program, &work})
    for (const std::wstring library : libraries)
      EXPECT_EQ(GetFileAttributesW((folder->Path() + L"\\" + library + L".ran").c_str()), INVALID_FILE_ATTRIBUTES)
          << library << " loaded from " << folder->Path();
}

}  // namespace
