// The machine-settings probe writes under the real HKEY_CLASSES_ROOT and must leave it as found.
#include <gtest/gtest.h>

#include "framework/RegistryKey.h"
#include "settings/AdvancedSettings.h"
#include "tests/support/TestSupport.h"

namespace {

const std::wstring kProbeClassKey = L"CLSID\\{EACA595B-B64B-4B80-91AF-DD4517EB4ABC}";
const std::wstring kProbeKey = kProbeClassKey + L"\\Implemented Categories\\{40FC6ED5-2438-11CF-A3DB-080036F12502}";

bool ClassesKeyExists(const std::wstring& path) {
  fw::RegistryKey key;
  return key.Open(HKEY_CLASSES_ROOT, path.c_str()) == ERROR_SUCCESS;
}

TEST(MachineSettingsProbe, LeavesAMissingClassMissing) {
  testing_support::ScopedRegistryKey cleanup(HKEY_CLASSES_ROOT, kProbeClassKey);

  EXPECT_TRUE(CanWriteMachineSettings());

  EXPECT_FALSE(ClassesKeyExists(kProbeClassKey));
}

TEST(MachineSettingsProbe, LeavesAnExistingProbeKeyInPlace) {
  testing_support::ScopedRegistryKey cleanup(HKEY_CLASSES_ROOT, kProbeClassKey);
  WriteRegistryDword(kProbeKey, L"test", 1, HKEY_CLASSES_ROOT);

  EXPECT_TRUE(CanWriteMachineSettings());

  EXPECT_TRUE(ClassesKeyExists(kProbeKey));
}

}  // namespace
