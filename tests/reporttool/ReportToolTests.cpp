// MaporaReport run as an inventory job runs it, on a workstation set up in the test prefix.
#include <gtest/gtest.h>

#include <array>
#include <fstream>
#include <iterator>
#include <nlohmann/json.hpp>

#include "MaporaVersion.h"
#include "framework/RegistryKey.h"
#include "framework/ScopedHandle.h"
#include "tests/e2e/ConsoleDriver.h"
#include "tests/support/TestSupport.h"

using namespace e2e;
using namespace testing_support;
using Json = nlohmann::json;

namespace {

constexpr wchar_t kDesktop[] = L"KVEL_DESKTOP10.5_INSTALLED=1";
constexpr char kTextStart[] = " DESKTOP\r\n\r\n    Installation Information\r\n    Product Name: Kv\xc3\xa9l";

struct Outcome {
  DWORD exitCode = 0xFFFFFFFF;
  std::string standardOutput;
  std::string standardError;
  std::string reportFile;  // what "--out report.txt" wrote
};

std::string FileContent(const std::wstring& path) {
  std::ifstream file(path.c_str(), std::ios::binary);
  return std::string(std::istreambuf_iterator<char>(file), std::istreambuf_iterator<char>());
}

// MaporaReport run by cmd in a scratch folder with the marker ("NAME=value") set. No run may change HKLM\SOFTWARE
// or HKCU (Wine's display driver refreshes HKLM\SYSTEM for every process; the test runs alone, see CMakeLists).
Outcome RunReport(const std::wstring& arguments, const std::wstring& marker = kDesktop) {
  // A folder of its own for every run: Wine may close a file of the run before only after the next has started.
  static int runs = 0;
  ScopedDirectory folder(ModuleFolder() + L"\\reporttool-run-" + std::to_wstring(++runs));
  folder.MakeDir(L".");
  const std::string command = "MaporaReport " + std::string(arguments.begin(), arguments.end());
  // A watch that could not be set up would let any write pass unseen.
  fw::ScopedHandle changed(CreateEventW(nullptr, TRUE, FALSE, nullptr));
  fw::RegistryKey software, user;
  CheckStatus(software.Open(HKEY_LOCAL_MACHINE, L"SOFTWARE", KEY_NOTIFY), "opening HKLM\\SOFTWARE to watch it");
  CheckStatus(user.Open(HKEY_CURRENT_USER, L"", KEY_NOTIFY), "opening HKCU to watch it");
  for (const fw::RegistryKey* key : {&software, &user})
    CheckStatus(RegNotifyChangeKeyValue(key->Get(), TRUE, REG_NOTIFY_CHANGE_NAME | REG_NOTIFY_CHANGE_LAST_SET,
                                        changed.Get(), TRUE),
                "watching the registry");
  fw::ScopedHandle process(Start(L"cmd /c \"cd /d \"" + folder.Path() + L"\" && set \"" + marker + L"\" && \"" +
                                 WindowsPath(MAPORA_REPORT_EXE) + L"\" " + arguments + L" >out 2>err\""));
  Outcome run;
  if (!CheckCall(process.IsValid(), "starting " + command)) return run;
  const DWORD waited = WaitForSingleObject(process.Get(), kWaitMs);
  const DWORD waitError = GetLastError();
  GetExitCodeProcess(process.Get(), &run.exitCode);
  EXPECT_EQ(waited, WAIT_OBJECT_0) << command << " did not end: exit code " << run.exitCode << ", last error "
                                   << Win32ErrorText(waitError);
  EXPECT_EQ(WaitForSingleObject(changed.Get(), 0), static_cast<DWORD>(WAIT_TIMEOUT)) << "registry changed by " << command;
  run.standardOutput = FileContent(folder.Path() + L"\\out");
  run.standardError = FileContent(folder.Path() + L"\\err");
  run.reportFile = FileContent(folder.Path() + L"\\report.txt");
  return run;
}

// Desktop (text beyond ASCII) and Skyloft installed, no suite settings stored.
struct Workstation : testing::Test {
  Workstation() {
    SetRegistryString(HKEY_LOCAL_MACHINE, L"SOFTWARE\\KVEL\\Desktop10.5", L"InstallDir", L"C:\\Mapora");
    SetRegistryString(HKEY_LOCAL_MACHINE, L"SOFTWARE\\KVEL\\Desktop10.5", L"ProductName", L"Kv\u00e9l \u5730\u56f3");
    SetRegistryString(HKEY_LOCAL_MACHINE, L"SOFTWARE\\Kvel\\Skyloft2016.1", L"InstallDir", L"C:\\Skyloft");
  }

  ScopedDirectory packs_{MaporaCommonFolder() + L"\\bin"};
  ScopedRegistryKey machine_{HKEY_LOCAL_MACHINE, L"SOFTWARE\\KVEL"}, user_{HKEY_CURRENT_USER, L"SOFTWARE\\KVEL"};
};

// The console's page, character for character, in the language the locale library picks for both (here
// one beyond Latin script, with Engine's block and Skyloft's).
TEST_F(Workstation, TextIsTheConsolePage) {
  const std::wstring pack = L"\\ja\\ResMaporaAdmin.dll", engine = L"KVEL_ENGINE10.5_INSTALLED=1";
  ASSERT_TRUE(CopyFileTo(WindowsPath(MAPORA_PACKS_DIR) + pack, packs_.Path() + pack));
  user_.SetDword(L"UILANGID", 0x0411);
  const Outcome run = RunReport(L"", engine);
  Process console(L"", ConsolePath(), {engine});
  HWND main = console.WaitForMainWindow();
  ASSERT_NE(main, nullptr);
  const std::wstring shown = Text(Control(FindWindowExW(main, nullptr, L"#32770", nullptr), IDC_REPORT));
  EXPECT_EQ(run.exitCode, 0u);
  std::string page(shown.size() * 3, '\0');
  page.resize(static_cast<size_t>(WideCharToMultiByte(CP_UTF8, 0, shown.data(), static_cast<int>(shown.size()),
                                                      &page[0], static_cast<int>(page.size()), nullptr, nullptr)));
  EXPECT_EQ(run.standardOutput, page);
  EXPECT_NE(shown.find(L"\u30a4\u30f3\u30b9\u30c8\u30fc\u30eb"), std::wstring::npos) << "not in Japanese";
}

// Values no installer writes, in the Server key (never detected, its values reported all the same):
// each lone surrogate arrives as U+FFFD. The suite settings as stored, first with none stored.
TEST_F(Workstation, JsonCarriesTheRegistryValues) {
  EXPECT_EQ(Json::parse(RunReport(L"--json").standardOutput)["settings"],
            Json::parse(R"({"displayLanguage":{"uiLangId":null,"followsWindows":true},"localPortalSupport":false,
                            "improvementProgram":{"enableKuei":0,"on":false},"portalServerSetByAdmin":false})"));
  const std::tuple<const wchar_t*, DWORD, std::wstring, const char*, Json> kRows[] = {  // stored, then expected
      {L"ProductName", REG_SZ, std::wstring(100000, L'M'), "/products/server/productName", std::string(100000, 'M')},
      {L"Installer", REG_DWORD, {L'B', L'A'}, "/products/server/installer", "BA"},  // a REG_DWORD read as text
      {L"SPBuild", REG_DWORD, {L'\xDC00', L'\xD800'}, "/products/server/spBuild", "\xEF\xBF\xBD\xEF\xBF\xBD"},
      {L"InstallDate", REG_SZ, L"\x01\x1f\t\n\r\"\\\x7f/", "/products/server/installDate", "\x01\x1f\t\n\r\"\\\x7f/"},
      {L"InstallTime", REG_SZ, L"x\xD800y", "/products/server/installTime", "x\xEF\xBF\xBDy"},
      {L"SPDisplayName", REG_SZ, L"\xD83D\xDDFA", "/products/server/spDisplayName", "\xF0\x9F\x97\xBA"},  // a pair
      {nullptr, 0, L"", "/products/desktop/installDir", "C:\\Mapora"},
      {nullptr, 0, L"", "/products/skyloft/installDir", "C:\\Skyloft"},
      {nullptr, 0, L"", "/settings", Json::parse(R"({"displayLanguage":{"uiLangId":0,"followsWindows":true},
      "improvementProgram":{"enableKuei":2,"on":true},"localPortalSupport":false,"portalServerSetByAdmin":true})")}};
  for (const auto& [valueName, type, stored, pointer, expected] : kRows)
    if (valueName) SetRegistryBytes(HKEY_LOCAL_MACHINE, L"SOFTWARE\\KVEL\\Server10.5", valueName, type, stored.c_str(),
                                    static_cast<DWORD>(stored.size() * sizeof(wchar_t)));
  user_.SetDword(L"UILANGID", 0);
  SetRegistryDword(HKEY_LOCAL_MACHINE, L"SOFTWARE\\KVEL\\Desktop10.5\\Settings", L"EnableKUEI", 2);
  const std::wstring connection = L"SOFTWARE\\KVEL\\Mapora Connection\\Settings";
  SetRegistryDword(HKEY_CURRENT_USER, connection, L"Support Local Portal", 2);
  SetRegistryDword(HKEY_LOCAL_MACHINE, connection, L"Portal Server Set By Admin", 1);
  const Json document = Json::parse(RunReport(L"--json").standardOutput);
  for (const auto& [valueName, type, stored, pointer, expected] : kRows)
    EXPECT_EQ(document.value(Json::json_pointer(pointer), Json()), expected) << pointer;
}

// Exit codes, and how each output starts: standard output, standard error, and report.txt.
TEST_F(Workstation, ExitCodesAndMessages) {
  const struct {
    const wchar_t* arguments;
    DWORD exitCode;
    const char* outputStart;
    const char* errorStart;
    const char* fileStart;
  } kRows[] = {{L"--json", 0, "{\n  \"release\": \"10.5\",", "", ""},
               {L"--help", 0, "Usage: MaporaReport [--json] [--out FILE]\r\n", "", ""},
               {L"--version", 0, "MaporaReport " MAPORA_FILE_VERSION_TEXT "\r\n", "", ""},
               {L"--bogus", 2, "", "MaporaReport: unknown option --bogus\r\nUsage: ", ""},
               {L"--out", 2, "", "MaporaReport: --out needs a file name\r\nUsage: ", ""},
               {L"--out no\\r.txt", 1, "", "MaporaReport: cannot write no\\r.txt: ", ""},
               {L"--out report.txt", 0, "", "", kTextStart}};
  auto start = [](const std::string& text, const char* expected) { return text.substr(0, std::strlen(expected)); };
  for (const auto& row : kRows) {
    const Outcome run = RunReport(row.arguments);
    EXPECT_EQ(run.exitCode, row.exitCode) << row.arguments;
    EXPECT_EQ(start(run.standardOutput, row.outputStart), row.outputStart) << row.arguments;
    EXPECT_EQ(start(run.standardError, row.errorStart), row.errorStart) << row.arguments;
    EXPECT_EQ(start(run.reportFile, row.fileStart), row.fileStart) << row.arguments;
  }
}

}  // namespace
