// A French pack that loads but lacks one of the console's templates: the console still opens,
// in French as long as the pack serves, in English from the first window the pack cannot build.
#include <gtest/gtest.h>

#include "tests/e2e/ConsoleDriver.h"
#include "tests/support/TestSupport.h"

using namespace e2e;
using namespace testing_support;

namespace {

std::wstring Env(const wchar_t* name) {
  wchar_t value[MAX_PATH] = L"";
  GetEnvironmentVariableW(name, value, MAX_PATH);
  return value;
}

constexpr wchar_t kPackFile[] = L"\\ResMaporaAdmin.dll";
constexpr wchar_t kMainFr[] = L"Administrateur Mapora", kMainEn[] = L"Mapora Administrator";
constexpr wchar_t kLabelFr[] = L"Informations de configuration de Mapora :";
constexpr wchar_t kLabelEn[] = L"Mapora Configuration Information:";
constexpr wchar_t kAboutFr[] = L"\u00c0 propos de l'Administrateur Mapora", kAboutEn[] = L"About Mapora Administrator";
constexpr wchar_t kAdvancedFr[] = L"Configuration avanc\u00e9e", kAdvancedEn[] = L"Advanced Configuration";

struct BrokenPackCase {
  const char* name;
  const wchar_t* without;  // the template the pack lacks; null: the shipped pack
  const wchar_t *mainTitle, *reportLabel, *aboutTitle, *advancedTitle;
};

void PrintTo(const BrokenPackCase& c, std::ostream* out) { *out << c.name; }

class BrokenPack : public testing::TestWithParam<BrokenPackCase> {};

// Main window, page, About box, then Advanced Configuration, in the order a user meets them.
TEST_P(BrokenPack, ConsoleOpensEveryWindow) {
  const BrokenPackCase& c = GetParam();
  const std::wstring pack = c.without ? WindowsPath(HARDENING_PACKS_DIR) + L"\\" + c.without
                                      : WindowsPath(MAPORA_PACKS_DIR) + L"\\fr";
  ScopedDirectory packFolder(MaporaCommonFolder() + L"\\bin\\fr"), desktop(ModuleFolder() + L"\\broken-pack-desktop");
  ScopedDirectory shared(Env(L"CommonProgramFiles(x86)") + L"\\broken-pack");
  ScopedRegistryKey desktopKey(HKEY_LOCAL_MACHINE, L"SOFTWARE\\KVEL\\Desktop10.5");
  ScopedRegistryKey user(HKEY_CURRENT_USER, L"SOFTWARE\\KVEL");
  desktopKey.SetString(L"InstallDir", desktop.Path());
  ASSERT_TRUE(CopyFileTo(pack + kPackFile, packFolder.Path() + kPackFile));
  // "Advanced..." is offered only to a console installed in the shared program folder.
  ASSERT_TRUE(CopyFileTo(ConsolePath(), shared.Path() + L"\\MaporaAdmin.exe"));
  Process console(L"/Lang 1036", shared.Path() + L"\\MaporaAdmin.exe", {L"KVEL_DESKTOP10.5_INSTALLED=1"});

  HWND main = console.WaitForMainWindow();
  ASSERT_NE(main, nullptr);
  EXPECT_EQ(Text(main), c.mainTitle);
  HWND page = FindWindowExW(main, nullptr, L"#32770", nullptr);
  ASSERT_NE(page, nullptr);
  EXPECT_EQ(Text(Control(page, IDC_REPORT_LABEL)), c.reportLabel);

  PostMessageW(main, WM_SYSCOMMAND, IDM_ABOUTBOX, 0);
  HWND about = console.WaitForWindow(c.aboutTitle);
  ASSERT_NE(about, nullptr);
  Click(about, IDOK);
  ASSERT_TRUE(WaitUntil([&] { return !IsWindow(about); }));

  ASSERT_TRUE(WaitUntil([&] { return IsWindowVisible(Control(page, IDC_ADVANCED)) != FALSE; }));
  Click(page, IDC_ADVANCED);
  EXPECT_NE(console.WaitForWindow(c.advancedTitle), nullptr);
}

INSTANTIATE_TEST_SUITE_P(
    Templates, BrokenPack,
    testing::Values(
        BrokenPackCase{"Complete", nullptr, kMainFr, kLabelFr, kAboutFr, kAdvancedFr},
        BrokenPackCase{"NoMainWindow", L"IDD_MAPORAADMIN_DIALOG", kMainEn, kLabelEn, kAboutEn, kAdvancedEn},
        BrokenPackCase{"NoRootPage", L"IDD_MAPORA_CONFIG", kMainFr, kLabelEn, kAboutEn, kAdvancedEn},
        BrokenPackCase{"NoAboutBox", L"IDD_ABOUTBOX", kMainFr, kLabelFr, kAboutEn, kAdvancedEn},
        BrokenPackCase{"NoAdvancedConfig", L"IDD_ADVANCED_CONFIG", kMainFr, kLabelFr, kAboutFr, kAdvancedEn}),
    [](const testing::TestParamInfo<BrokenPackCase>& info) { return info.param.name; });

}  // namespace
