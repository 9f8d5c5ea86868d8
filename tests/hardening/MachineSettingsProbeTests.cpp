// The machine-settings probe, run in this process: whatever part of the probe key's path existed
// before, the registry under the class key looks the same afterwards.
#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "settings/AdvancedSettings.h"
#include "tests/support/TestSupport.h"

namespace {

const std::wstring kClassKey = L"CLSID\\{EACA595B-B64B-4B80-91AF-DD4517EB4ABC}";
const std::wstring kCategoriesKey = kClassKey + L"\\Implemented Categories";
const std::wstring kProbeKey = kCategoriesKey + L"\\{40FC6ED5-2438-11CF-A3DB-080036F12502}";

// Every key of the tree at path under HKEY_CLASSES_ROOT, the root included; empty when missing.
void ListTree(const std::wstring& path, std::vector<std::wstring>& keys) {
  HKEY key = nullptr;
  if (RegOpenKeyExW(HKEY_CLASSES_ROOT, path.c_str(), 0, KEY_READ, &key) != ERROR_SUCCESS) return;
  keys.push_back(path);
  std::vector<std::wstring> children;
  wchar_t name[256];
  for (DWORD index = 0;; ++index) {
    DWORD length = 256;
    if (RegEnumKeyExW(key, index, name, &length, nullptr, nullptr, nullptr, nullptr) != ERROR_SUCCESS) break;
    children.push_back(path + L"\\" + name);
  }
  RegCloseKey(key);
  for (const std::wstring& child : children) ListTree(child, keys);
}

std::vector<std::wstring> ClassTree() {
  std::vector<std::wstring> keys;
  ListTree(kClassKey, keys);
  return keys;
}

struct ProbeCase {
  const char* name;
  const std::wstring* existing;  // the deepest key present at the start (its parents with it), or none
};

void PrintTo(const ProbeCase& c, std::ostream* out) { *out << c.name; }

class MachineSettingsProbe : public testing::TestWithParam<ProbeCase> {};

TEST_P(MachineSettingsProbe, LeavesTheClassKeyAsFound) {
  testing_support::ScopedRegistryKey cleanup(HKEY_CLASSES_ROOT, kClassKey);
  HKEY key = nullptr;
  if (GetParam().existing != nullptr) {
    ASSERT_EQ(RegCreateKeyW(HKEY_CLASSES_ROOT, GetParam().existing->c_str(), &key), ERROR_SUCCESS);
    RegCloseKey(key);
  }
  const std::vector<std::wstring> before = ClassTree();
  EXPECT_TRUE(CanWriteMachineSettings());  // no suite application runs here
  EXPECT_EQ(ClassTree(), before);
}

INSTANTIATE_TEST_SUITE_P(StartingStates, MachineSettingsProbe,
                         testing::Values(ProbeCase{"Nothing", nullptr}, ProbeCase{"ClassKeyOnly", &kClassKey},
                                         ProbeCase{"WithCategories", &kCategoriesKey},
                                         ProbeCase{"FullProbeKey", &kProbeKey}),
                         [](const testing::TestParamInfo<ProbeCase>& info) { return info.param.name; });

}  // namespace
