// Libraries planted beside a copy of the console and in its working folder, under the names of
// system libraries it uses: none of them runs, and the console opens as usual.
//
// version.dll is not among them: Wine's own user32 imports it, so under Wine a planted copy runs
// before the console's first instruction, whatever the console does. That the console itself
// does not import it is checked on the built program (CheckImports.cmake).
#include <gtest/gtest.h>

#include "tests/e2e/ConsoleDriver.h"
#include "tests/support/TestSupport.h"

using namespace e2e;
using namespace testing_support;

namespace {

bool Exists(const std::wstring& path) { return GetFileAttributesW(path.c_str()) != INVALID_FILE_ATTRIBUTES; }

struct PlantedCase {
  const char* name;
  const wchar_t* file;  // as the console names it
};

void PrintTo(const PlantedCase& c, std::ostream* out) { *out << c.name; }

class PlantedLibrary : public testing::TestWithParam<PlantedCase> {};

TEST_P(PlantedLibrary, NeverRuns) {
  const PlantedCase& c = GetParam();
  ScopedDirectory program(ModuleFolder() + L"\\planted-program"), work(ModuleFolder() + L"\\planted-work");
  const std::wstring marker = WindowsPath(HARDENING_MARKERS_DIR) + L"\\" + c.file;
  ASSERT_TRUE(CopyFileTo(ConsolePath(), program.Path() + L"\\MaporaAdmin.exe"));
  const std::pair<const char*, const ScopedDirectory*> folders[] = {{"program folder", &program},
                                                                     {"working folder", &work}};
  for (const auto& folder : folders) ASSERT_TRUE(CopyFileTo(marker, folder.second->Path() + L"\\" + c.file));

  // Wine prefers its built-in libraries to files; Windows takes the first file its search finds.
  // (Wine takes its overrides from the registry here: a Windows process cannot pass WINEDLLOVERRIDES on.)
  ScopedRegistryKey appDefaults(HKEY_CURRENT_USER, L"Software\\Wine\\AppDefaults\\MaporaAdmin.exe");
  ScopedRegistryKey overrides(HKEY_CURRENT_USER, L"Software\\Wine\\AppDefaults\\MaporaAdmin.exe\\DllOverrides");
  for (const wchar_t* library : {L"riched20", L"riched32", L"gdiplus"})
    overrides.SetString(library, L"native,builtin");
  wchar_t previous[MAX_PATH] = L"";
  GetCurrentDirectoryW(MAX_PATH, previous);
  SetCurrentDirectoryW(work.Path().c_str());
  Process console(L"", program.Path() + L"\\MaporaAdmin.exe");
  SetCurrentDirectoryW(previous);

  HWND main = console.WaitForMainWindow();
  ASSERT_NE(main, nullptr);
  // The report is a rich edit control: the system's rich edit library was loaded after all.
  EXPECT_NE(GetDlgItem(FindWindowExW(main, nullptr, L"#32770", nullptr), IDC_REPORT), nullptr);
  for (const auto& folder : folders)
    EXPECT_FALSE(Exists(folder.second->Path() + L"\\" + c.file + L".ran")) << "loaded from the " << folder.first;
}

INSTANTIATE_TEST_SUITE_P(Libraries, PlantedLibrary,
                         testing::Values(PlantedCase{"riched32", L"RICHED32.DLL"},
                                         PlantedCase{"riched20", L"RICHED20.DLL"},
                                         PlantedCase{"gdiplus", L"gdiplus.dll"}),
                         [](const testing::TestParamInfo<PlantedCase>& info) { return info.param.name; });

}  // namespace
