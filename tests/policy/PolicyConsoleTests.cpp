// The real console under Wine, after the registry state that a policy's "enabled" state stands for
// has been written as the Group Policy client writes it, keys and values taken from the template.
#include <gtest/gtest.h>

#include <algorithm>
#include <list>

#include "inventory/ProductRegistry.h"
#include "locale/LocaleInternals.h"
#include "locale/SuiteUserSettings.h"
#include "res/resource.h"
#include "tests/policy/PolicyTests.h"
#include "tests/support/TestSupport.h"

using namespace e2e;
using namespace policy_template;
using namespace policy_tests;
using namespace testing_support;

namespace {

constexpr DWORD kAbsent = 0xFFFFFFFF;
constexpr wchar_t kPackFile[] = L"\\ResMaporaAdmin.dll";

HKEY Root(const RegistryWrite& write) { return write.machine ? HKEY_LOCAL_MACHINE : HKEY_CURRENT_USER; }

DWORD Read(HKEY root, const std::wstring& path, const std::wstring& name, REGSAM view = 0) {
  HKEY key = nullptr;
  DWORD value = kAbsent, size = sizeof value;
  if (RegOpenKeyExW(root, path.c_str(), 0, KEY_QUERY_VALUE | view, &key) != ERROR_SUCCESS) return kAbsent;
  if (RegQueryValueExW(key, name.c_str(), nullptr, nullptr, reinterpret_cast<BYTE*>(&value), &size) != ERROR_SUCCESS)
    value = kAbsent;
  RegCloseKey(key);
  return value;
}

// Removed before and after the test, together with the parents the test had to create for it.
class WrittenKey {
 public:
  WrittenKey(HKEY root, const std::wstring& path) : scope_(root, FirstMissing(root, path)) {}

 private:
  static std::wstring FirstMissing(HKEY root, const std::wstring& path) {
    for (size_t end = path.find(L'\\');; end = path.find(L'\\', end + 1)) {
      const std::wstring prefix = path.substr(0, end);
      HKEY key = nullptr;
      if (RegOpenKeyExW(root, prefix.c_str(), 0, KEY_READ, &key) != ERROR_SUCCESS) return prefix;
      RegCloseKey(key);
      if (end == std::wstring::npos) return path;
    }
  }
  ScopedRegistryKey scope_;
};

void Apply(const RegistryWrite& write) {
  if (write.type == REG_NONE) {
    RegDeleteKeyValueW(Root(write), write.key.c_str(), write.valueName.c_str());
    return;
  }
  ASSERT_EQ(write.type, static_cast<DWORD>(REG_DWORD)) << write.valueName;
  const DWORD value = std::stoul(write.data);
  RegSetKeyValueW(Root(write), write.key.c_str(), write.valueName.c_str(), REG_DWORD, &value, sizeof value);
}

// A display-language choice as stored: a LANGID, or nothing for the Windows language.
std::wstring Choice(DWORD langId) {
  if (langId == 0 || langId == kAbsent) return L"(none)";
  return std::to_wstring(langId);
}
std::wstring Choice(const RegistryWrite& write) {
  if (write.type == REG_NONE) return L"(none)";
  return write.data;
}

std::wstring AppCaption(const std::wstring& module) {
  wchar_t text[256] = L"";
  HMODULE resources = LoadLibraryExW(module.c_str(), nullptr, LOAD_LIBRARY_AS_DATAFILE);
  LoadStringW(resources, IDS_APP_CAPTION, text, 256);
  FreeLibrary(resources);
  return text;
}

std::wstring Env(const wchar_t* name) {
  wchar_t value[MAX_PATH] = L"";
  GetEnvironmentVariableW(name, value, MAX_PATH);
  return value;
}

// Desktop installed with every pack, the packs where the console loads them, and the console in
// the shared 32-bit program folder, where it offers "Advanced...". The user starts with no settings.
class PolicyWorkstation {
 public:
  PolicyWorkstation() {
    desktop_.SetString(L"InstallDir", desktopFolder_.Path());
    for (const std::wstring& tag : PackTags()) {
      desktopFolder_.MakeDir(L"bin\\" + tag);
      const ScopedDirectory& pack = packs_.emplace_back(MaporaCommonFolder() + L"\\bin\\" + tag);
      CopyFileTo(WindowsPath(MAPORA_PACKS_DIR) + L"\\" + tag + kPackFile, pack.Path() + kPackFile);
    }
    CopyFileTo(ConsolePath(), Console());
  }
  // Writes the policy state; the keys it writes go again with the workstation. A deletion shows
  // only where there was a value, so English is stored first.
  void Write(const std::vector<RegistryWrite>& writes) {
    for (const RegistryWrite& write : writes) keys_.emplace_back(Root(write), write.key);
    for (const RegistryWrite& write : writes) {
      if (write.type == REG_NONE) Apply({write.machine, write.key, write.valueName, REG_DWORD, L"9"});
      Apply(write);
    }
  }
  std::wstring Console() const { return shared_.Path() + L"\\MaporaAdmin.exe"; }

 private:
  WrittenKey productsParent_{HKEY_LOCAL_MACHINE, DesktopKey()};
  ScopedRegistryKey user_{HKEY_CURRENT_USER, kSuiteUserKey}, desktop_{HKEY_LOCAL_MACHINE, DesktopKey()};
  ScopedDirectory desktopFolder_{ModuleFolder() + L"\\policy-desktop"};
  ScopedDirectory shared_{Env(L"CommonProgramFiles(x86)") + L"\\e2e-policy"};
  std::list<ScopedDirectory> packs_;
  std::list<WrittenKey> keys_;
};

// The console started on the workstation, with its Advanced Configuration dialog open.
struct OpenConsole {
  explicit OpenConsole(const PolicyWorkstation& workstation)
      : process(L"", workstation.Console(), {L"KVEL_DESKTOP10.5_INSTALLED=1"}) {
    main = process.WaitForMainWindow();
    if (!main || !WaitUntil([&] { return IsWindowVisible(Control(main, IDC_ADVANCED)) != FALSE; })) return;
    title = Text(main);
    Click(main, IDC_ADVANCED);
    WindowSearch search{[&](HWND w) { return process.Shows(w) && GetDlgItem(w, IDC_LANGUAGE_LIST); }};
    WaitUntil([&] {
      EnumWindows(MatchWindow, reinterpret_cast<LPARAM>(&search));
      return search.found != nullptr || !process.Running();
    });
    dialog = search.found;
  }
  Process process;
  HWND main = nullptr, dialog = nullptr;
  std::wstring title;
};

// One row per pack, English, and "" for the Windows language: the console shows that language and
// Advanced Configuration finds it in its list, so the stored choice stays.
class PolicyConsoleLanguage : public testing::TestWithParam<std::wstring> {};

TEST_P(PolicyConsoleLanguage, ShowsTheLanguageChosen) {
  const std::wstring language = GetParam();
  unsigned short langId = 0;  // the Windows language: stored as no value at all
  if (!language.empty()) {
    ASSERT_TRUE(KVELLocale::GetLangIDFromName(language.c_str(), langId));
  }
  const Element admx = LoadAdmx();
  const Element* policy = Policy(admx, kDisplayLanguagePolicy);
  ASSERT_NE(policy, nullptr);
  std::vector<RegistryWrite> writes;
  for (const Element* item : EnumItems(*policy)) {
    const std::vector<RegistryWrite> itemWrites = EnabledWrites(*policy, item);
    if (Choice(itemWrites.back()) == Choice(langId)) writes = itemWrites;
  }
  ASSERT_FALSE(writes.empty()) << "no item for " << language;
  PolicyWorkstation workstation;
  const std::wstring pack = WindowsPath(MAPORA_PACKS_DIR) + L"\\" + language + kPackFile;
  const bool packed = !language.empty() && GetFileAttributesW(pack.c_str()) != INVALID_FILE_ATTRIBUTES;
  workstation.Write(writes);
  const DWORD stored = Read(HKEY_CURRENT_USER, kSuiteUserKey, kUILangIDValue);
  EXPECT_EQ(Choice(stored), Choice(langId));
  OpenConsole console(workstation);
  ASSERT_NE(console.dialog, nullptr);
  EXPECT_EQ(console.title, AppCaption(packed ? pack : ConsolePath()));
  HWND list = Control(console.dialog, IDC_LANGUAGE_LIST);
  EXPECT_EQ(SendMessageW(list, CB_GETITEMDATA, SendMessageW(list, CB_GETCURSEL, 0, 0), 0), LRESULT{langId});
  // A choice the dialog finds no entry for is deleted while it opens.
  EXPECT_EQ(Read(HKEY_CURRENT_USER, kSuiteUserKey, kUILangIDValue), stored);
}

std::vector<std::wstring> Languages() {
  std::vector<std::wstring> languages{L"", L"en"};
  for (const std::wstring& tag : PackTags()) languages.push_back(tag);
  return languages;
}

std::string RowName(const testing::TestParamInfo<std::wstring>& info) {
  std::string name(info.param.begin(), info.param.end());
  std::replace(name.begin(), name.end(), '-', '_');
  return name.empty() ? "Windows" : name;
}

INSTANTIATE_TEST_SUITE_P(Languages, PolicyConsoleLanguage, testing::ValuesIn(Languages()), RowName);

struct ControlState {
  int id;
  LRESULT checked;
  bool enabled;
};

struct SwitchCase {
  const wchar_t* policy;
  std::vector<ControlState> controls;
};

class PolicyConsoleSwitch : public testing::TestWithParam<SwitchCase> {};

// A machine value must reach a 32-bit console on 64-bit Windows too: the copy under WOW6432Node
// is what it reads as the same key.
TEST_P(PolicyConsoleSwitch, ShowsTheSetting) {
  const SwitchCase& c = GetParam();
  const Element admx = LoadAdmx();
  const Element* policy = Policy(admx, c.policy);
  ASSERT_NE(policy, nullptr);
  PolicyWorkstation workstation;
  const std::vector<RegistryWrite> writes = EnabledWrites(*policy);
  workstation.Write(writes);
  for (const RegistryWrite& write : writes) {
    const DWORD native = Read(Root(write), NativeKey(write), write.valueName, KEY_WOW64_64KEY);
    EXPECT_NE(native, kAbsent) << write.key;
    if (write.machine) {
      EXPECT_EQ(Read(Root(write), NativeKey(write), write.valueName, KEY_WOW64_32KEY), native) << write.key;
    }
  }
  OpenConsole console(workstation);
  ASSERT_NE(console.dialog, nullptr);
  for (const ControlState& control : c.controls) {
    HWND window = Control(console.dialog, control.id);
    EXPECT_EQ(SendMessageW(window, BM_GETCHECK, 0, 0), control.checked) << control.id;
    EXPECT_EQ(IsWindowEnabled(window) != FALSE, control.enabled) << control.id;
  }
}

std::string Name(const wchar_t* ascii) { return std::string(ascii, ascii + std::wcslen(ascii)); }
void PrintTo(const SwitchCase& c, std::ostream* os) { *os << Name(c.policy); }

INSTANTIATE_TEST_SUITE_P(
    Policies, PolicyConsoleSwitch,
    testing::Values(SwitchCase{L"ImprovementProgram", {{IDC_KUEI_CHECK, BST_CHECKED, true}}},
                    SwitchCase{L"SupportLocalPortal", {{IDC_LOCAL_PORTAL, BST_CHECKED, true}}},
                    SwitchCase{L"PortalServerSetByAdmin",
                               {{IDC_LOCAL_PORTAL, BST_UNCHECKED, false}, {IDC_MANAGE_PORTALS, BST_UNCHECKED, false}}}),
    [](const testing::TestParamInfo<SwitchCase>& info) { return Name(info.param.policy); });

}  // namespace
