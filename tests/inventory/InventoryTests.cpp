// Installed-product detection and installation values.
#include <gtest/gtest.h>

#include <algorithm>

#include "inventory/InstalledProducts.h"
#include "tests/support/TestSupport.h"

using namespace testing_support;

namespace {

const wchar_t kDesktopKey[] = L"SOFTWARE\\KVEL\\Desktop10.5";
const wchar_t kEngineKey[] = L"SOFTWARE\\KVEL\\Engine10.5";

TEST(DecideInstalledProducts, FromMarkersRuntimesAndTheSkyloftKey) {
  const SuiteRuntime desktop105 = {kSuiteRuntimeDesktop, L"10.5"};
  const SuiteRuntime engine105 = {kSuiteRuntimeEngine, L"10.5"};
  const struct {
    const char* name;
    DetectionEvidence evidence;  // Desktop marker, Engine marker, runtimes, Skyloft key
    bool desktop, engine, skyloft;
  } rows[] = {
      {"nothing found", {}, false, false, false},
      {"Desktop marker", {true, false, {}, false}, true, false, false},
      {"Engine marker", {false, true, {}, false}, false, true, false},
      {"both markers: Desktop wins", {true, true, {}, false}, true, false, false},
      {"an Engine runtime beside both markers", {true, true, {engine105}, false}, true, true, false},
      {"runtimes of the release", {false, false, {desktop105, engine105}, false}, true, true, false},
      {"runtimes of other releases", {false, false, {{1, L"10.50"}, {2, L"10.5a"}}, false}, false, false, false},
      {"other product codes", {false, false, {{3, L"10.5"}, {0, L"10.5"}}, false}, false, false, false},
      {"Skyloft key", {false, false, {}, true}, false, false, true},
  };
  for (const auto& row : rows) {
    SCOPED_TRACE(row.name);
    const DetectedProducts detected = DecideInstalledProducts(L"10.5", row.evidence);
    EXPECT_EQ(detected.desktop, row.desktop);
    EXPECT_EQ(detected.engine, row.engine);
    EXPECT_EQ(detected.skyloft, row.skyloft);
  }
}

// A console asked about another release finds neither that release's runtime nor its own.
TEST(DecideInstalledProducts, ARuntimeMustMatchBothTheAskedAndTheOwnRelease) {
  const DetectionEvidence evidence = {false, false, {{kSuiteRuntimeDesktop, L"10.6"}, {kSuiteRuntimeEngine, L"10.5"}}};
  const DetectedProducts detected = DecideInstalledProducts(L"10.6", evidence);
  EXPECT_FALSE(detected.desktop);
  EXPECT_FALSE(detected.engine);
}

TEST(DistinctRuntimeVersions, DesktopAndEngineVersionsOnceEachInOrder) {
  const std::vector<SuiteRuntime> runtimes = {{1, L"10.6-Beta"}, {3, L"9.0"}, {2, L"10.6-BETA"}, {1, L"10.50"},
                                              {0, L"10.4"},      {2, L"10.5a"}};
  EXPECT_EQ(DistinctRuntimeVersions(runtimes), (std::vector<std::wstring>{L"10.6-Beta", L"10.50", L"10.5a"}));
}

TEST(ReadsThe64BitView, KeysNamingSkyloftsReleaseCaseSensitively) {
  EXPECT_TRUE(ReadsThe64BitView(L"SOFTWARE\\Kvel\\Skyloft2016.1"));
  EXPECT_TRUE(ReadsThe64BitView(L"SOFTWARE\\Kvel\\Skyloft2016.1\\Settings"));
  EXPECT_FALSE(ReadsThe64BitView(L"SOFTWARE\\Skyloft"));
  EXPECT_FALSE(ReadsThe64BitView(L"SOFTWARE\\Kvel\\SKYLOFT2016.1"));
}

// Registry readers, each test in hives of its own.

TEST(ReadRegistryString, AnyValueIsTextUpToItsFirstZeroCharacter) {
  ScopedHiveOverride hives;
  const std::wstring longText(100000, L'x');
  const struct {
    const char* name;
    DWORD type;
    std::wstring text;
    DWORD bytesCut;  // from the end of the text's bytes with their terminator
    std::wstring expected;
  } rows[] = {
      {"a DWORD, as some installers write a folder", REG_DWORD, L"A", 0, L"A"},
      {"an odd last byte is half a character", REG_BINARY, L"AB", 3, L"AB"},
      {"no terminator", REG_SZ, L"abc", 2, L"abc"},
      {"empty is not the default", REG_SZ, L"", 2, L""},
      {"longer than any fixed buffer", REG_SZ, longText, 0, longText},
  };
  for (const auto& row : rows) {
    const DWORD size = static_cast<DWORD>((row.text.size() + 1) * sizeof(wchar_t)) - row.bytesCut;
    SetRegistryBytes(HKEY_LOCAL_MACHINE, kDesktopKey, L"InstallDir", row.type, row.text.c_str(), size);
    EXPECT_EQ(ReadRegistryString(HKEY_LOCAL_MACHINE, kDesktopKey, L"InstallDir", L"-"), row.expected) << row.name;
  }
  EXPECT_EQ(ReadRegistryString(HKEY_LOCAL_MACHINE, kDesktopKey, L"Missing", L"-"), L"-");
  EXPECT_EQ(ReadRegistryString(HKEY_LOCAL_MACHINE, kEngineKey, L"InstallDir", L"-"), L"-");
}

TEST(GetInstallDir, EachProductIndexReadsItsOwnKeyAndValue) {
  ScopedHiveOverride hives;
  SetRegistryString(HKEY_LOCAL_MACHINE, kEngineKey, L"InstallDir", L"engine");
  SetRegistryString(HKEY_LOCAL_MACHINE, kDesktopKey, L"InstallDir", L"desktop");
  SetRegistryString(HKEY_LOCAL_MACHINE, L"SOFTWARE\\Skyloft", L"Path", L"skyloft");
  SetRegistryString(HKEY_LOCAL_MACHINE, L"SOFTWARE\\KVEL\\Server10.5", L"InstallDir", L"server");
  const std::wstring expected[] = {L"engine", L"desktop", L"skyloft", L"server", L""};
  for (int index = 0; index < 5; ++index) {
    std::wstring installDir = L"stale";
    EXPECT_EQ(GetInstallDir(index, L"10.5", installDir), !expected[index].empty()) << index;
    EXPECT_EQ(installDir, expected[index]) << index;
  }
}

TEST(ReadProductInstallInfo, EveryFieldFromItsValueAndEnginesImageFromSourceDir) {
  ScopedHiveOverride hives;
  for (const wchar_t* name : {L"InstallDir", L"Installer", L"ProductName", L"ImageLocation", L"SourceDir",
                              L"InstallDate", L"InstallTime", L"RealVersion", L"SPNumber", L"SPBuild", L"SPInstaller",
                              L"SPInstallDate", L"SPInstallTime", L"SPStatus", L"SPDisplayName"}) {
    SetRegistryString(HKEY_LOCAL_MACHINE, kDesktopKey, name, name);
    SetRegistryString(HKEY_LOCAL_MACHINE, kEngineKey, name, name);
  }
  const struct {
    ProductKind kind;
    const wchar_t* key;
    std::wstring image;
  } rows[] = {{ProductKind::Desktop, kDesktopKey, L"ImageLocation"}, {ProductKind::Engine, kEngineKey, L"SourceDir"}};
  for (const auto& row : rows) {
    const ProductInstallInfo info = ReadProductInstallInfo(row.kind, row.key);
    std::wstring fields;
    for (const std::wstring* field :
         {&info.installDir, &info.installer, &info.productName, &info.imageLocation, &info.installDate,
          &info.installTime, &info.realVersion, &info.spNumber, &info.spBuild, &info.spInstaller, &info.spInstallDate,
          &info.spInstallTime, &info.spStatus, &info.spDisplayName, &info.productVersion})
      fields += *field + L" ";
    EXPECT_EQ(fields, L"InstallDir Installer ProductName " + row.image +
                          L" InstallDate InstallTime RealVersion SPNumber SPBuild SPInstaller SPInstallDate "
                          L"SPInstallTime SPStatus SPDisplayName ? ");
  }
}

TEST(ReadProductInstallInfo, AMissingKeyGivesTheReportDefaults) {
  ScopedHiveOverride hives;
  const ProductInstallInfo info = ReadProductInstallInfo(ProductKind::Desktop, kDesktopKey);
  EXPECT_EQ(info.productName + L"|" + info.spNumber + L"|" + info.spBuild + L"|" + info.spStatus, L"|0|0|N/A");
}

TEST(GetCoreProductVersion, OnlyFromTheUsEnglishUnicodeTable) {
  const struct {
    const char* name;
    const wchar_t* library;    // copied to <folder>\bin\pfcore.dll
    const wchar_t* separator;  // after the folder
    const wchar_t* expected;
  } rows[] = {
      {"the suite's own table", L"pfcore_us.dll", L"", L"10.5 Build 6491"},
      {"a folder ending in a backslash", L"pfcore_us.dll", L"\\", L"10.5 Build 6491"},
      {"another code page only", L"pfcore_other_table.dll", L"", L"?"},
      {"no core library", nullptr, L"", L"?"},
  };
  for (const auto& row : rows) {
    ScopedDirectory install(ModuleFolder() + L"\\core-library-install");
    if (row.library) {
      ASSERT_TRUE(CopyFileTo(ModuleFolder() + L"\\" + row.library, install.MakeDir(L"bin") + L"\\pfcore.dll"));
    }
    EXPECT_EQ(GetCoreProductVersion(install.Path() + row.separator), row.expected) << row.name;
  }
}

// What detection gathers from the environment and the real hives with their two views.

TEST(DetectionGathering, AnEmptyMarkerIsNoMarker) {
  SetEnvironmentVariableW(L"KVEL_DESKTOP10.5_INSTALLED", L"");
  SetEnvironmentVariableW(L"KVEL_ENGINE10.5_INSTALLED", L"1");
  InstalledProducts products;
  DetectInstalledProducts(products);
  EXPECT_FALSE(products.desktopInstalled);
  EXPECT_TRUE(products.engineInstalled);
  SetEnvironmentVariableW(L"KVEL_ENGINE10.5_INSTALLED", nullptr);
}

TEST(DetectionGathering, TheSkyloftKeyCountsOnlyInThe64BitView) {
  for (REGSAM view : {KEY_WOW64_32KEY, KEY_WOW64_64KEY}) {
    ScopedRegistryKey skyloft(HKEY_LOCAL_MACHINE, L"SOFTWARE\\Kvel\\Skyloft2016.1", view);
    skyloft.SetString(L"InstallDir", L"C:\\Skyloft");
    InstalledProducts products;
    DetectInstalledProducts(products);
    EXPECT_EQ(products.skyloftInstalled, view == KEY_WOW64_64KEY) << view;
  }
}

// The runtime-information component: absent, then registered for real from beside the program.
TEST(RuntimeComponent, DetectionDoesWithoutIt) {
  ASSERT_EQ(CoInitializeEx(nullptr, COINIT_APARTMENTTHREADED), S_OK);
  {
    InstalledProducts products;
    EXPECT_EQ(ListInstalledRuntimeVersions(products), std::vector<std::wstring>{});
    DetectInstalledProducts(products);
    EXPECT_FALSE(products.desktopInstalled);
  }
  CoUninitialize();
}

TEST(RuntimeComponent, EveryDetectionReadsTheListAfreshUpToADamagedEntry) {
  ASSERT_EQ(CoInitializeEx(nullptr, COINIT_APARTMENTTHREADED), S_OK);
  HMODULE server = LoadLibraryW((ModuleFolder() + L"\\SuiteRuntimeInfo.dll").c_str());
  ASSERT_NE(server, nullptr);
  auto call = [server](const char* entry) {
    return reinterpret_cast<HRESULT(STDAPICALLTYPE*)()>(reinterpret_cast<void*>(GetProcAddress(server, entry)))();
  };
  ASSERT_EQ(call("DllRegisterServer"), S_OK);
  {
    ScopedRegistryKey list(HKEY_LOCAL_MACHINE, kSuiteRuntimeListKey);
    auto setRuntimes = [&list](const std::wstring& lines) {  // each line ended by "|"
      std::wstring multiString = lines;
      std::replace(multiString.begin(), multiString.end(), L'|', L'\0');
      list.SetBinary(kSuiteRuntimeListValue, multiString.c_str(),
                     static_cast<DWORD>((multiString.size() + 1) * sizeof(wchar_t)), REG_MULTI_SZ);
    };
    InstalledProducts products;
    setRuntimes(L"1 10.5|damaged|2 10.5|");
    EXPECT_EQ(ListInstalledRuntimeVersions(products), std::vector<std::wstring>{L"10.5"});
    DetectInstalledProducts(products);
    EXPECT_TRUE(products.desktopInstalled);
    EXPECT_FALSE(products.engineInstalled);
    setRuntimes(L"2 10.5|");
    DetectInstalledProducts(products);
    EXPECT_FALSE(products.desktopInstalled);
    EXPECT_TRUE(products.engineInstalled);
  }  // the server's objects go before the server
  EXPECT_EQ(call("DllUnregisterServer"), S_OK);
  FreeLibrary(server);
  CoUninitialize();
}

}  // namespace
