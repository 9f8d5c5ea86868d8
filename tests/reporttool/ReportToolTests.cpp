// MaporaReport run as an inventory job runs it, on a workstation set up in the test prefix: its
// output redirected to files, its exit code and messages, and what it leaves in the registry.
#include <gtest/gtest.h>

#include <cstring>
#include <fstream>
#include <iterator>
#include <map>
#include <nlohmann/json.hpp>

#include "tests/e2e/ConsoleDriver.h"
#include "tests/support/TestSupport.h"

using namespace e2e;
using namespace testing_support;
using Json = nlohmann::json;

namespace {

constexpr wchar_t kDesktopKey[] = L"SOFTWARE\\KVEL\\Desktop10.5", kEngineKey[] = L"SOFTWARE\\KVEL\\Engine10.5";
constexpr wchar_t kSkyloftKey[] = L"SOFTWARE\\Kvel\\Skyloft2016.1", kSuiteKey[] = L"SOFTWARE\\KVEL";
constexpr wchar_t kConnectionKey[] = L"Software\\KVEL\\Mapora Connection\\Settings";
constexpr wchar_t kDesktopMarker[] = L"KVEL_DESKTOP10.5_INSTALLED=1", kEngineMarker[] = L"KVEL_ENGINE10.5_INSTALLED=1";
constexpr DWORD kAbsent = 0xFFFFFFFF;  // a setting not stored

// Each UTF-8 byte makes at most one UTF-16 unit.
std::wstring Wide(const std::string& utf8) {
  std::wstring wide(utf8.size(), L'\0');
  wide.resize(static_cast<size_t>(MultiByteToWideChar(CP_UTF8, 0, utf8.data(), static_cast<int>(utf8.size()), &wide[0],
                                                      static_cast<int>(wide.size()))));
  return wide;
}

// Each UTF-16 unit makes at most three UTF-8 bytes.
std::string Utf8(const std::wstring& wide) {
  std::string utf8(wide.size() * 3, '\0');
  utf8.resize(static_cast<size_t>(WideCharToMultiByte(CP_UTF8, 0, wide.data(), static_cast<int>(wide.size()), &utf8[0],
                                                      static_cast<int>(utf8.size()), nullptr, nullptr)));
  return utf8;
}

std::string ReadAll(const std::wstring& path) {
  std::ifstream file(path.c_str(), std::ios::binary);
  return std::string(std::istreambuf_iterator<char>(file), std::istreambuf_iterator<char>());
}

struct Outcome {
  DWORD exitCode = 0xFFFFFFFF;
  std::string out, err;
};

// MaporaReport with its standard output and error in files; environment entries for it alone.
Outcome RunReport(const std::wstring& arguments, const std::vector<std::wstring>& environment = {}) {
  ScopedDirectory folder(ModuleFolder() + L"\\reporttool-run");
  const std::wstring outPath = folder.MakeFile(L"out"), errPath = folder.MakeFile(L"err");
  SECURITY_ATTRIBUTES inherited = {sizeof inherited, nullptr, TRUE};
  STARTUPINFOW startup{};
  startup.cb = sizeof startup;
  startup.dwFlags = STARTF_USESTDHANDLES;
  startup.hStdOutput = CreateFileW(outPath.c_str(), GENERIC_WRITE, FILE_SHARE_READ, &inherited, CREATE_ALWAYS, 0, 0);
  startup.hStdError = CreateFileW(errPath.c_str(), GENERIC_WRITE, FILE_SHARE_READ, &inherited, CREATE_ALWAYS, 0, 0);
  for (const auto& entry : environment)
    SetEnvironmentVariableW(entry.substr(0, entry.find(L'=')).c_str(), entry.substr(entry.find(L'=') + 1).c_str());
  std::wstring commandLine = L"\"" + WindowsPath(MAPORA_REPORT_EXE) + L"\" " + arguments;
  PROCESS_INFORMATION process{};
  Outcome run;
  if (CreateProcessW(nullptr, &commandLine[0], nullptr, nullptr, TRUE, 0, nullptr, nullptr, &startup, &process)) {
    WaitForSingleObject(process.hProcess, kWaitMs);
    GetExitCodeProcess(process.hProcess, &run.exitCode);
    CloseHandle(process.hProcess);
    CloseHandle(process.hThread);
  }
  for (const auto& entry : environment) SetEnvironmentVariableW(entry.substr(0, entry.find(L'=')).c_str(), nullptr);
  CloseHandle(startup.hStdOutput);
  CloseHandle(startup.hStdError);
  run.out = ReadAll(outPath);
  run.err = ReadAll(errPath);
  return run;
}

// One workstation for every test: Desktop and Engine records with text beyond ASCII, Desktop's
// core library in place, a Skyloft key in the 64-bit view, and no suite settings stored.
class Workstation : public testing::Test {
 protected:
  void SetUp() override {
    desktop_.SetString(L"InstallDir", folder_.Path());
    desktop_.SetString(L"ProductName", L"Mapora Desktop Kv\u00e9l \u5730\u56f3");
    desktop_.SetString(L"SPNumber", L"1");
    engine_.SetString(L"SourceDir", L"D:\\Abbild");
    skyloft_.SetString(L"InstallDir", L"C:\\Skyloft");
    ASSERT_TRUE(CopyFileTo(WindowsPath(MAPORA_PFCORE_DLL), folder_.Path() + L"\\bin\\pfcore.dll"));
  }

  ScopedDirectory folder_{ModuleFolder() + L"\\reporttool-desktop"};
  ScopedRegistryKey desktop_{HKEY_LOCAL_MACHINE, kDesktopKey}, engine_{HKEY_LOCAL_MACHINE, kEngineKey};
  ScopedRegistryKey skyloft_{HKEY_LOCAL_MACHINE, kSkyloftKey, KEY_WOW64_64KEY};
  ScopedRegistryKey user_{HKEY_CURRENT_USER, kSuiteKey};
  ScopedRegistryKey portalLock_{HKEY_LOCAL_MACHINE, L"SOFTWARE\\KVEL\\Mapora Connection"};
};

// The console and MaporaReport read the same workstation; the text is the console's page,
// character for character, in the language the locale library picks for both.
struct TextCase {
  const char* name;
  const wchar_t* marker;
  DWORD uiLangId;
  const wchar_t *pack, *sectionHeading;
};

void PrintTo(const TextCase& c, std::ostream* out) { *out << c.name; }

class ReportText : public Workstation, public testing::WithParamInterface<TextCase> {};

TEST_P(ReportText, IsTheConsolePage) {
  const TextCase& c = GetParam();
  ScopedDirectory pack(MaporaCommonFolder() + L"\\bin\\" + (c.pack ? c.pack : L"none"));
  if (c.pack) {
    ASSERT_TRUE(CopyFileTo(WindowsPath(MAPORA_PACKS_DIR) + L"\\" + c.pack + L"\\ResMaporaAdmin.dll",
                           pack.Path() + L"\\ResMaporaAdmin.dll"));
  }
  if (c.uiLangId != kAbsent) user_.SetDword(L"UILANGID", c.uiLangId);
  const std::vector<std::wstring> environment =
      c.marker ? std::vector<std::wstring>{c.marker} : std::vector<std::wstring>{};
  std::wstring shown;
  {
    Process console(L"", ConsolePath(), environment);
    HWND main = console.WaitForMainWindow();
    ASSERT_NE(main, nullptr);
    shown = Text(Control(FindWindowExW(main, nullptr, L"#32770", nullptr), IDC_REPORT));
  }
  const Outcome run = RunReport(L"", environment);
  EXPECT_EQ(run.exitCode, 0u);
  EXPECT_EQ(Wide(run.out), shown);
  if (c.sectionHeading) {
    EXPECT_NE(shown.find(c.sectionHeading), std::wstring::npos) << "not in the language asked for";
  }
}

INSTANTIATE_TEST_SUITE_P(
    Languages, ReportText,
    testing::Values(TextCase{"EnglishDesktopAndSkyloft", kDesktopMarker, kAbsent, nullptr, L"Installation Information"},
                    TextCase{"FrenchEngine", kEngineMarker, 0x040C, L"fr", L"Informations d'installation"},
                    TextCase{"JapaneseDesktop", kDesktopMarker, 0x0411, L"ja",
                             L"\u30a4\u30f3\u30b9\u30c8\u30fc\u30eb\u60c5\u5831"},
                    TextCase{"NothingInstalled", nullptr, kAbsent, nullptr, nullptr}),
    [](const testing::TestParamInfo<TextCase>& info) { return std::string(info.param.name); });

// Whatever the registry holds, the document parses and carries it; text that is not valid UTF-16
// arrives with U+FFFD in place of each lone surrogate. Server is never detected, but its values
// are read and reported all the same.
struct HostileCase {
  const char* field;
  const wchar_t* valueName;
  DWORD type;
  std::wstring stored, expected;
};

const std::wstring kLong = std::wstring(100000, L'M') + L"!";
const HostileCase kHostile[] = {
    {"productName", L"ProductName", REG_SZ, kLong, kLong},
    {"installer", L"Installer", REG_DWORD, {L'B', L'A'}, L"BA"},  // a REG_DWORD read as two characters
    {"spBuild", L"SPBuild", REG_DWORD, {L'\xDC00', L'\xD800'}, L"\xFFFD\xFFFD"},
    {"installDate", L"InstallDate", REG_SZ, L"\x01\x1f\t\n\r\"\\\x7f/", L"\x01\x1f\t\n\r\"\\\x7f/"},
    {"installTime", L"InstallTime", REG_SZ, L"x\xD800y", L"x\xFFFDy"},
    {"realVersion", L"RealVersion", REG_SZ, L"\xDC00", L"\xFFFD"},
    {"spDisplayName", L"SPDisplayName", REG_SZ, L"\xD83D\xDDFA Kv\u00e9l", L"\xD83D\xDDFA Kv\u00e9l"},
};

TEST_F(Workstation, JsonCarriesTheRegistryValues) {
  ScopedRegistryKey server(HKEY_LOCAL_MACHINE, L"SOFTWARE\\KVEL\\Server10.5");
  for (const HostileCase& c : kHostile)
    server.SetBinary(c.valueName, c.stored.c_str(), static_cast<DWORD>(c.stored.size() * sizeof(wchar_t)), c.type);
  const Outcome run = RunReport(L"--json", {kDesktopMarker});
  EXPECT_EQ(run.exitCode, 0u);
  ASSERT_TRUE(Json::accept(run.out)) << run.out.substr(0, 2000);
  const Json document = Json::parse(run.out);
  for (const HostileCase& c : kHostile)
    EXPECT_EQ(Wide(document["products"]["server"][c.field].get<std::string>()), c.expected) << c.field;

  wchar_t computer[MAX_COMPUTERNAME_LENGTH + 1] = L"", user[257] = L"";
  DWORD computerSize = MAX_COMPUTERNAME_LENGTH + 1, userSize = 257;
  GetComputerNameW(computer, &computerSize);
  GetUserNameW(user, &userSize);
  const std::pair<const char*, Json> expected[] = {
      {"/release", "10.5"},
      {"/computerName", Utf8(computer)},
      {"/session/user", Utf8(user)},
      {"/products/desktop/installed", true},
      {"/products/desktop/productName", "Mapora Desktop Kv\xc3\xa9l \xe5\x9c\xb0\xe5\x9b\xb3"},
      {"/products/desktop/productVersion", "10.5.0.6491"},  // from the core library
      {"/products/desktop/spNumber", "1"},
      {"/products/engine/installed", false},
      {"/products/engine/imageLocation", "D:\\Abbild"},  // Engine keeps it as SourceDir
      {"/products/engine/spBuild", "0"},                 // defaults where nothing is stored
      {"/products/engine/spInstaller", "N/A"},
      {"/products/engine/productVersion", "?"},
      {"/products/skyloft/installed", true},
      {"/products/skyloft/installDir", "C:\\Skyloft"},
      {"/products/server/installed", false},
  };
  for (const auto& [pointer, value] : expected)
    EXPECT_EQ(document.value(Json::json_pointer(pointer), Json()), value) << pointer;
}

// The suite settings as stored, each read without creating anything.
struct SettingsCase {
  const char* name;
  DWORD uiLangId, enableKuei, localPortal, portalLock;
  const char* expected;
};

void PrintTo(const SettingsCase& c, std::ostream* out) { *out << c.name; }

class ReportSettings : public Workstation, public testing::WithParamInterface<SettingsCase> {};

TEST_P(ReportSettings, AreAsStored) {
  const SettingsCase& c = GetParam();
  ScopedRegistryKey connection(HKEY_CURRENT_USER, kConnectionKey),
      kuei(HKEY_LOCAL_MACHINE, kDesktopKey + std::wstring(L"\\Settings"));
  ScopedRegistryKey lock(HKEY_LOCAL_MACHINE, L"SOFTWARE\\KVEL\\Mapora Connection\\Settings");
  if (c.uiLangId != kAbsent) user_.SetDword(L"UILANGID", c.uiLangId);
  if (c.enableKuei != kAbsent) kuei.SetDword(L"EnableKUEI", c.enableKuei);
  if (c.localPortal != kAbsent) connection.SetDword(L"Support Local Portal", c.localPortal);
  if (c.portalLock != kAbsent) lock.SetDword(L"Portal Server Set By Admin", c.portalLock);
  const Outcome run = RunReport(L"--json");
  EXPECT_EQ(run.exitCode, 0u);
  EXPECT_EQ(Json::parse(run.out, nullptr, false).value("settings", Json()), Json::parse(c.expected));
}

INSTANTIATE_TEST_SUITE_P(
    Stored, ReportSettings,
    testing::Values(SettingsCase{"NoneStored", kAbsent, kAbsent, kAbsent, kAbsent,
                                 R"({"displayLanguage": {"uiLangId": null, "followsWindows": true},)"
                                 R"("improvementProgram": {"enableKuei": 0, "on": false},)"
                                 R"("localPortalSupport": false, "portalServerSetByAdmin": false})"},
                    SettingsCase{"AllSet", 0x040C, 2, 1, 1,
                                 R"({"displayLanguage": {"uiLangId": 1036, "followsWindows": false},)"
                                 R"("improvementProgram": {"enableKuei": 2, "on": true},)"
                                 R"("localPortalSupport": true, "portalServerSetByAdmin": true})"},
                    // Only exactly 1 supports the local portal; a stored 0 follows the Windows language.
                    SettingsCase{"OddValues", 0, 0, 2, 0,
                                 R"({"displayLanguage": {"uiLangId": 0, "followsWindows": true},)"
                                 R"("improvementProgram": {"enableKuei": 0, "on": false},)"
                                 R"("localPortalSupport": false, "portalServerSetByAdmin": false})"}),
    [](const testing::TestParamInfo<SettingsCase>& info) { return std::string(info.param.name); });

// Exit codes and messages. In arguments and texts, %DIR% is a folder that exists and is empty.
struct ExitCase {
  const char* name;
  const wchar_t* arguments;
  DWORD exitCode;
  const char *outStart, *errStart;
  const wchar_t* writtenFile;
};

void PrintTo(const ExitCase& c, std::ostream* out) { *out << c.name; }

class ReportExit : public Workstation, public testing::WithParamInterface<ExitCase> {};

std::string Replace(std::string text, const std::string& from, const std::string& to) {
  for (size_t at = text.find(from); at != std::string::npos; at = text.find(from, at + to.size()))
    text.replace(at, from.size(), to);
  return text;
}

TEST_P(ReportExit, CodeAndMessages) {
  const ExitCase& c = GetParam();
  ScopedDirectory folder(ModuleFolder() + L"\\reporttool-out");
  folder.MakeDir(L".");
  const std::string dir = Utf8(folder.Path());
  const Outcome run = RunReport(Wide(Replace(Utf8(c.arguments), "%DIR%", dir)), {kDesktopMarker});
  EXPECT_EQ(run.exitCode, c.exitCode);
  EXPECT_EQ(run.out.substr(0, std::strlen(c.outStart)), c.outStart);
  EXPECT_EQ(run.err.substr(0, Replace(c.errStart, "%DIR%", dir).size()), Replace(c.errStart, "%DIR%", dir));
  if (c.writtenFile) {
    const std::string written = ReadAll(folder.Path() + L"\\" + c.writtenFile);
    EXPECT_EQ(written, RunReport(L"", {kDesktopMarker}).out);
    EXPECT_NE(written.find("Kv\xc3\xa9l \xe5\x9c\xb0\xe5\x9b\xb3"), std::string::npos) << "not UTF-8";
  }
}

INSTANTIATE_TEST_SUITE_P(
    CommandLines, ReportExit,
    testing::Values(ExitCase{"NoArguments", L"", 0, " DESKTOP\r\n", "", nullptr},
                    ExitCase{"Json", L"--json", 0, "{\n  \"release\": \"10.5\",", "", nullptr},
                    ExitCase{"Help", L"--help", 0, "Usage: MaporaReport [--json] [--out FILE]\r\n", "", nullptr},
                    ExitCase{"Bogus", L"--bogus", 2, "", "MaporaReport: unknown option --bogus\r\nUsage: MaporaReport",
                             nullptr},
                    ExitCase{"OutWithoutFile", L"--out", 2, "",
                             "MaporaReport: --out needs a file name\r\nUsage: MaporaReport", nullptr},
                    ExitCase{"OutUnwritable", L"--out \"%DIR%\\missing\\report.txt\"", 1, "",
                             "MaporaReport: cannot write %DIR%\\missing\\report.txt: ", nullptr},
                    ExitCase{"OutWritten", L"--out \"%DIR%\\report.txt\"", 0, "", "", L"report.txt"}),
    [](const testing::TestParamInfo<ExitCase>& info) { return std::string(info.param.name); });

// Every key and value of a hive, each value as its type and bytes.
using RegistrySnapshot = std::map<std::wstring, std::wstring>;

void Snapshot(HKEY root, const std::wstring& path, RegistrySnapshot& into) {
  HKEY key = nullptr;
  if (RegOpenKeyExW(root, path.c_str(), 0, KEY_READ, &key) != ERROR_SUCCESS) return;
  into[path] = L"key";
  std::vector<wchar_t> name(32768);
  std::vector<BYTE> data;
  for (DWORD index = 0;; ++index) {
    DWORD nameChars = static_cast<DWORD>(name.size()), type = 0, size = 0;
    if (RegEnumValueW(key, index, name.data(), &nameChars, nullptr, &type, nullptr, &size) != ERROR_SUCCESS) break;
    data.assign(size, 0);
    nameChars = static_cast<DWORD>(name.size());
    RegEnumValueW(key, index, name.data(), &nameChars, nullptr, &type, data.data(), &size);
    into[path + L"\\:" + name.data()] = std::to_wstring(type) + L":" + std::wstring(data.begin(), data.end());
  }
  std::vector<std::wstring> subkeys;
  for (DWORD index = 0;; ++index) {
    DWORD nameChars = static_cast<DWORD>(name.size());
    if (RegEnumKeyExW(key, index, name.data(), &nameChars, nullptr, nullptr, nullptr, nullptr) != ERROR_SUCCESS) break;
    subkeys.push_back(name.data());
  }
  RegCloseKey(key);
  for (const std::wstring& subkey : subkeys) Snapshot(root, path.empty() ? subkey : path + L"\\" + subkey, into);
}

std::vector<std::wstring> Changes(const RegistrySnapshot& before, const RegistrySnapshot& after) {
  std::vector<std::wstring> changes;
  for (const auto& [name, value] : before) {
    const auto now = after.find(name);
    if (now == after.end()) changes.push_back(L"removed " + name);
    if (now != after.end() && now->second != value) changes.push_back(L"changed " + name);
  }
  for (const auto& entry : after)
    if (before.count(entry.first) == 0) changes.push_back(L"added " + entry.first);
  return changes;
}

// Where a reader would create a key or leave a value behind, the hives show it afterwards.
TEST_F(Workstation, LeavesTheRegistryAsItWas) {
  ScopedRegistryKey connection(HKEY_CURRENT_USER, kConnectionKey);  // the console's own reader creates it
  // HKLM\SYSTEM is left out: Wine's display driver refreshes its device records there whenever a
  // process starts its graphics. HKEY_CLASSES_ROOT is in HKLM\SOFTWARE\Classes.
  RegistrySnapshot machine, user;
  Snapshot(HKEY_LOCAL_MACHINE, L"SOFTWARE", machine);
  Snapshot(HKEY_CURRENT_USER, L"", user);
  for (const wchar_t* arguments : {L"", L"--json"})
    EXPECT_EQ(RunReport(arguments, {kDesktopMarker}).exitCode, 0u) << Utf8(arguments);
  RegistrySnapshot machineAfter, userAfter;
  Snapshot(HKEY_LOCAL_MACHINE, L"SOFTWARE", machineAfter);
  Snapshot(HKEY_CURRENT_USER, L"", userAfter);
  EXPECT_EQ(Changes(machine, machineAfter), std::vector<std::wstring>());
  EXPECT_EQ(Changes(user, userAfter), std::vector<std::wstring>());
}

}  // namespace
