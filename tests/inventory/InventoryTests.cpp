// Installed-product detection, installation values and the running-application guard.
#include <gtest/gtest.h>

#include <cstdlib>
#include <tuple>
#include <vector>

#include "framework/RegistryKey.h"
#include "inventory/InstalledProducts.h"
#include "inventory/RunningSuiteApps.h"
#include "tests/support/TestSupport.h"

using namespace testing_support;
using namespace std::string_literals;
using Found = std::tuple<bool, bool, bool>;  // Desktop, Engine, Skyloft

namespace {

const wchar_t kDesktopKey[] = L"SOFTWARE\\KVEL\\Desktop10.5", kEngineKey[] = L"SOFTWARE\\KVEL\\Engine10.5";

// Evidence: Desktop marker, Engine marker, runtimes, Skyloft key.
TEST(DecideInstalledProducts, FromMarkersAndRuntimesOfTheConsolesOwnRelease) {
  const struct { const char* name; const wchar_t* asked; DetectionEvidence evidence; Found found; } rows[] = {
      {"Engine marker", L"10.5", {false, true, {}, false}, {false, true, false}},
      {"both markers: Desktop wins", L"10.5", {true, true, {}, false}, {true, false, false}},
      {"runtimes beside both markers", L"10.5", {true, true, {{1, L"10.5"}, {2, L"10.5"}}, false}, {true, true, false}},
      {"other releases and product codes", L"10.5", {false, false, {{1, L"10.50"}, {2, L"10.5a"}, {3, L"10.5"}}, false},
       {false, false, false}},
      {"another release asked", L"10.6", {false, false, {{1, L"10.6"}, {2, L"10.5"}}, false}, {false, false, false}},
  };
  for (const auto& row : rows) {
    const DetectedProducts detected = DecideInstalledProducts(row.asked, row.evidence);
    EXPECT_EQ(Found(detected.desktop, detected.engine, detected.skyloft), row.found) << row.name;
  }
}

// Typed reads take only their own type and size and leave the preset alone otherwise; the lenient
// reads take any type, as the console's rules do (an installer may write a folder as a DWORD).
TEST(RegistryKey, TypedReadsRefuseOtherTypesLenientOnesDoNot) {
  ScopedHiveOverride hives;
  const DWORD kPreset = 0xAAAAAAAA;
  const std::wstring kUntouched = L"preset";
  const struct {
    const char* name;
    DWORD type;
    std::vector<BYTE> data;
    DWORD dword;           // ReadDword: the value, or kPreset when it fails
    std::wstring text;     // ReadString: the text, or kUntouched when it fails
    DWORD shortValue;      // ReadUpTo4BytesOverDword
    std::wstring anyText;  // ReadAnyValueAsText
  } rows[] = {
      {"a REG_DWORD", REG_DWORD, {'A', 0, 0, 0}, 0x41, kUntouched, 0x41, L"A"},
      {"2 bytes of REG_DWORD", REG_DWORD, {'A', 0}, kPreset, kUntouched, 0xAAAA0041, L"A"},
      {"REG_BINARY with an odd last byte", REG_BINARY, {'A', 0, 'B'}, kPreset, kUntouched, 0xAA420041, L"AB"},
      {"REG_SZ", REG_SZ, {'A', 0, 0, 0}, kPreset, L"A", 0x41, L"A"},
      {"an empty REG_SZ", REG_SZ, {}, kPreset, L"", kPreset, L""},
      {"REG_EXPAND_SZ of 6 bytes", REG_EXPAND_SZ, {'%', 0, 'A', 0, 0, 0}, kPreset, L"%A", kPreset, L"%A"},
  };
  for (const auto& row : rows) {
    SetRegistryBytes(HKEY_LOCAL_MACHINE, L"Typed", L"Value", row.type, row.data.data(),
                     static_cast<DWORD>(row.data.size()));
    fw::RegistryKey key;
    ASSERT_EQ(key.Open(HKEY_LOCAL_MACHINE, L"Typed"), ERROR_SUCCESS);
    DWORD dword = kPreset, shortValue = kPreset;
    std::wstring text = kUntouched, anyText = kUntouched;
    EXPECT_EQ(key.ReadDword(L"Value", dword) == ERROR_SUCCESS, row.dword != kPreset) << row.name;
    EXPECT_EQ(dword, row.dword) << row.name;
    EXPECT_EQ(key.ReadString(L"Value", text) == ERROR_SUCCESS, row.text != kUntouched) << row.name;
    EXPECT_EQ(text, row.text) << row.name;
    key.ReadUpTo4BytesOverDword(L"Value", shortValue);
    EXPECT_EQ(shortValue, row.shortValue) << row.name;
    EXPECT_EQ(key.ReadAnyValueAsText(L"Value", anyText), ERROR_SUCCESS) << row.name;
    EXPECT_EQ(anyText, row.anyText) << row.name;
  }
}

// Every value holds its own name: Engine's key has them all, Desktop reads its image elsewhere. The help
// path's folder lookup reads the same key.
TEST(ReadProductInstallInfo, EachFieldFromItsValueOrTheReportsDefault) {
  ScopedHiveOverride hives;
  for (const wchar_t* name : {L"InstallDir", L"Installer", L"ProductName", L"ImageLocation", L"SourceDir",
                              L"InstallDate", L"InstallTime", L"RealVersion", L"SPNumber", L"SPBuild", L"SPInstaller",
                              L"SPInstallDate", L"SPInstallTime", L"SPStatus", L"SPDisplayName"})
    SetRegistryString(HKEY_LOCAL_MACHINE, kEngineKey, name, name);
  auto fields = [](ProductKind kind, const wchar_t* key) {
    const ProductInstallInfo info = ReadProductInstallInfo(kind, key);
    std::wstring text;
    for (const std::wstring* field : {&info.installDir, &info.installer, &info.productName, &info.imageLocation,
                                      &info.installDate, &info.installTime, &info.realVersion, &info.spNumber,
                                      &info.spBuild, &info.spInstaller, &info.spInstallDate, &info.spInstallTime,
                                      &info.spStatus, &info.spDisplayName, &info.productVersion})
      text += *field + L"|";
    return text;
  };
  EXPECT_EQ(fields(ProductKind::Engine, kEngineKey),
            L"InstallDir|Installer|ProductName|SourceDir|InstallDate|InstallTime|RealVersion|SPNumber|SPBuild|"
            L"SPInstaller|SPInstallDate|SPInstallTime|SPStatus|SPDisplayName|?|");
  EXPECT_EQ(ReadProductInstallInfo(ProductKind::Desktop, kEngineKey).imageLocation, L"ImageLocation");
  EXPECT_EQ(fields(ProductKind::Desktop, kDesktopKey), L"|||||||0|0|N/A|N/A|N/A|N/A||?|") << "no key";
  std::wstring installDir;
  EXPECT_EQ(GetInstallDir(static_cast<int>(ProductKind::Engine), L"10.5", installDir), true);
  EXPECT_EQ(installDir, L"InstallDir");
}

TEST(GetCoreProductVersion, OnlyFromTheUsEnglishUnicodeTable) {
  const struct { const char* name; const wchar_t *library, *separator, *expected; } rows[] = {
      {"a folder ending in a backslash", L"pfcore.dll", L"\\", L"10.5.0.6491"},
      {"another code page only", L"pfcore_other_table.dll", L"", L"?"},
  };
  for (const auto& row : rows) {
    ScopedDirectory install(ModuleFolder() + L"\\core-library-install");
    CopyFileTo(ModuleFolder() + L"\\" + row.library, install.MakeDir(L"bin") + L"\\pfcore.dll");
    EXPECT_EQ(GetCoreProductVersion(install.Path() + row.separator), row.expected) << row.name;
  }
}

TEST(RunningAppsText, WatchedNamesAsCaseSensitiveSubstringsOneLineEachInTableOrder) {
  const struct { const char* name; CString processes, text; } rows[] = {
      {"table order, once each; a name ending in a watched one counts",
       L"System|QuillonHost.exe|Vistamo.exe|OldTessera.exe|OldTessera.exe|",
       L"  Tessera.exe\r\n  Vistamo.exe\r\n  QuillonHost.exe\r\n"},
      {"another letter case does not count", L"tessera.exe|TESSERA.EXE|", L""},
  };
  for (const auto& row : rows) EXPECT_EQ(RunningAppsText(FindSuiteApps(row.processes)), row.text) << row.name;
}

TEST(DetectionGathering, EveryDetectionReadsItsEvidenceAfresh) {
  const struct { const char* name; std::wstring runtimes; REGSAM skyloftView; Found found; } rows[] = {
      {"runtimes up to a damaged entry; Skyloft's key in the 32-bit view", L"1 10.5\0damaged\0" L"2 10.5\0"s,
       KEY_WOW64_32KEY, {true, false, false}},
      {"the runtimes read again, the empty Desktop marker is none; Skyloft's key in the 64-bit view", L"2 10.5\0"s,
       KEY_WOW64_64KEY, {false, true, true}},
  };
  ASSERT_EQ(CoInitializeEx(nullptr, COINIT_APARTMENTTHREADED), S_OK);
  ASSERT_EQ(_wsystem((L"regsvr32 /s \"" + ModuleFolder() + L"\\SuiteRuntimeInfo.dll\"").c_str()), 0);
  SetEnvironmentVariableW(L"KVEL_DESKTOP10.5_INSTALLED", L"");
  InstalledProducts products;
  ScopedRegistryKey list(HKEY_LOCAL_MACHINE, kSuiteRuntimeListKey);
  ListInstalledRuntimeVersions(products);
  for (const auto& row : rows) {
    list.SetString(kSuiteRuntimeListValue, row.runtimes, REG_MULTI_SZ);
    ScopedRegistryKey skyloft(HKEY_LOCAL_MACHINE, L"SOFTWARE\\Kvel\\Skyloft2016.1", row.skyloftView);
    skyloft.SetString(L"InstallDir", L"C:\\Skyloft");
    DetectInstalledProducts(products);
    EXPECT_EQ(Found(products.desktopInstalled, products.engineInstalled, products.skyloftInstalled), row.found)
        << row.name;
  }
  EXPECT_EQ(_wsystem((L"regsvr32 /s /u \"" + ModuleFolder() + L"\\SuiteRuntimeInfo.dll\"").c_str()), 0);
}

}  // namespace
