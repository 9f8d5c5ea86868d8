// The real console with a built language pack: started with /Lang, it shows the pack's texts, lays
// them out as the language reads, and opens the help file of that language (or the English one
// when the language has none).
#include <windows.h>

#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "res/resource.h"
#include "tests/e2e/ConsoleDriver.h"
#include "tests/support/TestSupport.h"

using namespace e2e;
using namespace testing_support;

namespace {

constexpr wchar_t kHelpFile[] = L"administering_mapora_desktop.chm";

// Sets one registry value for the test's lifetime and then puts back what was there.
class ScopedRegistryValue {
 public:
  ScopedRegistryValue(HKEY root, const wchar_t* path, const wchar_t* name, DWORD type, const std::wstring& data)
      : name_(name) {
    if (RegCreateKeyExW(root, path, 0, nullptr, 0, KEY_QUERY_VALUE | KEY_SET_VALUE, nullptr, &key_, nullptr) !=
        ERROR_SUCCESS)
      return;
    DWORD size = 0;
    if (RegQueryValueExW(key_, name, nullptr, &oldType_, nullptr, &size) == ERROR_SUCCESS) {
      old_.resize(size);
      hadValue_ = RegQueryValueExW(key_, name, nullptr, &oldType_, old_.data(), &size) == ERROR_SUCCESS;
    }
    RegSetValueExW(key_, name, 0, type, reinterpret_cast<const BYTE*>(data.c_str()),
                   static_cast<DWORD>((data.size() + 1) * sizeof(wchar_t)));
  }
  ~ScopedRegistryValue() {
    if (!key_) return;
    if (hadValue_)
      RegSetValueExW(key_, name_, 0, oldType_, old_.data(), static_cast<DWORD>(old_.size()));
    else
      RegDeleteValueW(key_, name_);
    RegCloseKey(key_);
  }
  ScopedRegistryValue(const ScopedRegistryValue&) = delete;
  ScopedRegistryValue& operator=(const ScopedRegistryValue&) = delete;

 private:
  HKEY key_ = nullptr;
  const wchar_t* name_;
  bool hadValue_ = false;
  DWORD oldType_ = 0;
  std::vector<BYTE> old_;
};

// Wine has none of the faces the Japanese and Chinese dialogs ask for, nor CJK glyphs behind the
// bold caption font: the workstation maps them to the installed CJK fonts in the same way.
class CjkFonts {
  static constexpr wchar_t kReplacements[] = L"Software\\Wine\\Fonts\\Replacements";
  static constexpr wchar_t kSystemLink[] = L"Software\\Microsoft\\Windows NT\\CurrentVersion\\FontLink\\SystemLink";

  ScopedRegistryValue japanese_{HKEY_CURRENT_USER, kReplacements, L"Meiryo UI", REG_SZ, L"VL PGothic"};
  ScopedRegistryValue chinese_{HKEY_CURRENT_USER, kReplacements, L"SimSun", REG_SZ, L"WenQuanYi Micro Hei"};
  ScopedRegistryValue captions_{HKEY_LOCAL_MACHINE, kSystemLink, L"Tahoma Bold", REG_MULTI_SZ,
                                std::wstring(L"wqy-microhei.ttc,WenQuanYi Micro Hei") + L'\0'};
};

std::wstring PackPath(const wchar_t* tag) {
  return WindowsPath(MAPORA_PACKS_DIR) + L"\\" + tag + L"\\ResMaporaAdmin.dll";
}

HWND WorkstationPage(HWND mainWindow) { return FindWindowExW(mainWindow, nullptr, L"#32770", nullptr); }

struct HelpSearch {
  DWORD processId;
  HWND found;
};

// The HTML Help viewer's frame window that the console opened.
HWND HelpWindow(DWORD processId) {
  HelpSearch search{processId, nullptr};
  EnumWindows(
      [](HWND window, LPARAM data) -> BOOL {
        auto* s = reinterpret_cast<HelpSearch*>(data);
        DWORD owner = 0;
        GetWindowThreadProcessId(window, &owner);
        if (owner == s->processId && IsWindowVisible(window) && ClassName(window) == L"HH Parent") s->found = window;
        return s->found == nullptr;
      },
      reinterpret_cast<LPARAM>(&search));
  return search.found;
}

struct ConsoleCase {
  const wchar_t* tag;  // the pack folder that /Lang must lead to
  const wchar_t* arguments;
  const wchar_t* title;
  const wchar_t* reportLabel;
  const wchar_t* installationHeading;
  bool rightToLeft;
  const wchar_t* helpTitle;  // French has its own help file; the others fall back to English
  const char* screenshot;    // null: none taken
};

void PrintTo(const ConsoleCase& c, std::ostream* out) { *out << testing::PrintToString(std::wstring(c.tag)); }

class TranslatedConsole : public testing::TestWithParam<ConsoleCase> {
 protected:
  void SetUp() override {
    ASSERT_TRUE(CopyFileTo(PackPath(GetParam().tag), pack_.Path() + L"\\ResMaporaAdmin.dll"));
    const std::wstring help = WindowsPath(MAPORA_HELP_DIR);
    ASSERT_TRUE(CopyFileTo(help + L"\\" + kHelpFile, desktop_.Path() + L"\\help\\" + kHelpFile));
    ASSERT_TRUE(CopyFileTo(help + L"\\fr\\" + kHelpFile, desktop_.Path() + L"\\help\\fr\\" + kHelpFile));
    desktopKey_.SetString(L"InstallDir", desktop_.Path() + L"\\");
  }

  ScopedDirectory pack_{MaporaCommonFolder() + L"\\bin\\" + GetParam().tag};
  ScopedDirectory desktop_{ModuleFolder() + L"\\translated-console-desktop"};
  ScopedRegistryKey desktopKey_{HKEY_LOCAL_MACHINE, L"SOFTWARE\\KVEL\\Desktop10.5"};
  CjkFonts fonts_;
};

TEST_P(TranslatedConsole, ShowsThePackAndOpensItsHelp) {
  const ConsoleCase& c = GetParam();
  LaunchOptions options;
  options.arguments = c.arguments;
  options.environment = {L"KVEL_DESKTOP10.5_INSTALLED=1"};
  Console console(options);
  HWND mainWindow = console.WaitForMainWindow();
  ASSERT_NE(mainWindow, nullptr);

  EXPECT_EQ(WindowText(mainWindow), c.title);
  HWND page = WorkstationPage(mainWindow);
  ASSERT_NE(page, nullptr);
  EXPECT_EQ(WindowText(Control(page, IDC_REPORT_LABEL)), c.reportLabel);
  EXPECT_NE(WindowText(Control(page, IDC_REPORT)).find(c.installationHeading), std::wstring::npos);
  EXPECT_EQ((GetWindowLongPtrW(mainWindow, GWL_EXSTYLE) & WS_EX_LAYOUTRTL) != 0, c.rightToLeft);
  EXPECT_EQ((GetWindowLongPtrW(page, GWL_EXSTYLE) & WS_EX_LAYOUTRTL) != 0, c.rightToLeft);
  if (c.screenshot) {
    EXPECT_FALSE(SaveScreenshot(mainWindow, c.screenshot).empty());
  }

  // Wine has no HTML engine here, so the viewer's pages stay blank; its title names the file.
  Click(mainWindow, IDC_HELP_BUTTON);
  HWND help = nullptr;
  ASSERT_TRUE(WaitUntil([&] { return (help = HelpWindow(console.Id())) != nullptr; }));
  EXPECT_EQ(WindowText(help), c.helpTitle);
}

constexpr wchar_t kEnglishHelp[] = L"Administering Mapora Desktop";

INSTANTIATE_TEST_SUITE_P(
    Packs, TranslatedConsole,
    testing::Values(
        ConsoleCase{L"fr", L"/Lang 1036", L"Administrateur Mapora", L"Informations de configuration de Mapora :",
                    L"Informations d'installation", false, L"Administration de Mapora Desktop", "console-fr"},
        ConsoleCase{L"de", L"/Lang 1031", L"Mapora-Administrator", L"Mapora-Konfigurationsinformationen:",
                    L"Installationsinformationen", false, kEnglishHelp, nullptr},
        ConsoleCase{L"es", L"/Lang 1034", L"Administrador de Mapora", L"Información de configuración de Mapora:",
                    L"Información de instalación", false, kEnglishHelp, nullptr},
        ConsoleCase{L"ja", L"/Lang 1041", L"Mapora 管理ツール", L"Mapora の構成情報:", L"インストール情報", false,
                    kEnglishHelp, "console-ja"},
        // Chinese (PRC) finds its pack in the language-and-country folder.
        ConsoleCase{L"zh-CN", L"/Lang 2052", L"Mapora 管理器", L"Mapora 配置信息：", L"安装信息", false,
                    kEnglishHelp, "console-zh-CN"},
        // Arabic (Saudi Arabia) has no ar-SA folder and falls back to the language folder.
        ConsoleCase{L"ar", L"/Lang 1025", L"أداة إدارة Mapora", L"معلومات تكوين Mapora:", L"معلومات التثبيت", true,
                    kEnglishHelp, "console-ar"}),
    [](const testing::TestParamInfo<ConsoleCase>& info) {
      std::string name;
      for (const wchar_t* c = info.param.tag; *c; ++c) name.push_back(*c == L'-' ? '_' : static_cast<char>(*c));
      return name;
    });

}  // namespace
