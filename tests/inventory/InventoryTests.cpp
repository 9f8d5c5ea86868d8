// Installed-product detection and installation values.
#include <gtest/gtest.h>

#include "inventory/InstalledProducts.h"
#include "tests/support/TestSupport.h"

using namespace testing_support;

namespace {

const wchar_t kDesktopKey[] = L"SOFTWARE\\KVEL\\Desktop10.5";
const wchar_t kEngineKey[] = L"SOFTWARE\\KVEL\\Engine10.5";

// Detection, from what the gatherer found.

struct DetectionRow {
  const char* name;
  DetectionEvidence evidence;
  bool desktop, engine, skyloft;
};

DetectionEvidence Markers(bool desktop, bool engine) {
  DetectionEvidence evidence;
  evidence.desktopMarkerSet = desktop;
  evidence.engineMarkerSet = engine;
  return evidence;
}

DetectionEvidence Runtimes(std::vector<SuiteRuntime> runtimes) {
  DetectionEvidence evidence;
  evidence.runtimes = std::move(runtimes);
  return evidence;
}

DetectionEvidence SkyloftKey() {
  DetectionEvidence evidence;
  evidence.skyloftKeyFound = true;
  return evidence;
}

DetectionEvidence BothMarkersAndAnEngineRuntime() {
  DetectionEvidence evidence = Markers(true, true);
  evidence.runtimes = {{kSuiteRuntimeEngine, L"10.5"}};
  return evidence;
}

TEST(DecideInstalledProducts, FromMarkersRuntimesAndTheSkyloftKey) {
  const DetectionRow rows[] = {
      {"nothing found", {}, false, false, false},
      {"Desktop marker", Markers(true, false), true, false, false},
      {"Engine marker", Markers(false, true), false, true, false},
      {"both markers: Desktop wins", Markers(true, true), true, false, false},
      {"an Engine runtime still counts beside both markers", BothMarkersAndAnEngineRuntime(), true, true, false},
      {"runtimes of the release", Runtimes({{kSuiteRuntimeDesktop, L"10.5"}, {kSuiteRuntimeEngine, L"10.5"}}), true,
       true, false},
      {"runtimes of other releases", Runtimes({{kSuiteRuntimeDesktop, L"10.50"}, {kSuiteRuntimeEngine, L"10.5a"}}),
       false, false, false},
      {"other product codes", Runtimes({{3, L"10.5"}, {0, L"10.5"}}), false, false, false},
      {"Skyloft key", SkyloftKey(), false, false, true},
  };
  for (const DetectionRow& row : rows) {
    SCOPED_TRACE(row.name);
    const DetectedProducts detected = DecideInstalledProducts(L"10.5", row.evidence);
    EXPECT_EQ(detected.desktop, row.desktop);
    EXPECT_EQ(detected.engine, row.engine);
    EXPECT_EQ(detected.skyloft, row.skyloft);
  }
}

// A console asked about another release finds neither that release's runtime nor its own.
TEST(DecideInstalledProducts, ARuntimeMustMatchBothTheAskedAndTheOwnRelease) {
  const DetectionEvidence evidence = Runtimes({{kSuiteRuntimeDesktop, L"10.6"}, {kSuiteRuntimeEngine, L"10.5"}});
  const DetectedProducts detected = DecideInstalledProducts(L"10.6", evidence);
  EXPECT_FALSE(detected.desktop);
  EXPECT_FALSE(detected.engine);
}

TEST(DistinctRuntimeVersions, DesktopAndEngineVersionsOnceEachInOrder) {
  const struct {
    const char* name;
    std::vector<SuiteRuntime> runtimes;
    std::vector<std::wstring> expected;
  } rows[] = {
      {"letter case ignored",
       {{1, L"10.6-Beta"}, {2, L"10.6-BETA"}, {1, L"10.50"}, {2, L"10.5a"}},
       {L"10.6-Beta", L"10.50", L"10.5a"}},
      {"other product codes skipped", {{3, L"10.5"}, {0, L"10.4"}, {2, L"10.5"}}, {L"10.5"}},
      {"no runtime", {}, {}},
  };
  for (const auto& row : rows) EXPECT_EQ(DistinctRuntimeVersions(row.runtimes), row.expected) << row.name;
}

TEST(ReadsThe64BitView, KeysNamingSkyloftsReleaseCaseSensitively) {
  const struct {
    const wchar_t* key;
    bool expected;
  } rows[] = {
      {L"SOFTWARE\\Kvel\\Skyloft2016.1", true},
      {L"SOFTWARE\\Kvel\\Skyloft2016.1\\Settings", true},
      {L"SOFTWARE\\Skyloft", false},
      {L"SOFTWARE\\Kvel\\SKYLOFT2016.1", false},
      {kDesktopKey, false},
  };
  for (const auto& row : rows) EXPECT_EQ(ReadsThe64BitView(row.key), row.expected) << row.key;
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
}

TEST(ReadRegistryString, MissingKeyOrValueGivesTheDefault) {
  ScopedHiveOverride hives;
  SetRegistryString(HKEY_LOCAL_MACHINE, kDesktopKey, L"InstallDir", L"C:\\Mapora");
  EXPECT_EQ(ReadRegistryString(HKEY_LOCAL_MACHINE, kDesktopKey, L"Missing", L"-"), L"-");
  EXPECT_EQ(ReadRegistryString(HKEY_LOCAL_MACHINE, L"SOFTWARE\\KVEL\\Missing", L"InstallDir", L"-"), L"-");
}

TEST(GetInstallDir, EachProductIndexReadsItsOwnKeyAndValue) {
  ScopedHiveOverride hives;
  SetRegistryString(HKEY_LOCAL_MACHINE, kEngineKey, L"InstallDir", L"engine");
  SetRegistryString(HKEY_LOCAL_MACHINE, kDesktopKey, L"InstallDir", L"desktop");
  SetRegistryString(HKEY_LOCAL_MACHINE, L"SOFTWARE\\Skyloft", L"Path", L"skyloft");
  SetRegistryString(HKEY_LOCAL_MACHINE, L"SOFTWARE\\KVEL\\Server10.5", L"InstallDir", L"server");
  const struct {
    int index;
    std::wstring expected;
  } rows[] = {{0, L"engine"}, {1, L"desktop"}, {2, L"skyloft"}, {3, L"server"}, {4, L""}};
  for (const auto& row : rows) {
    std::wstring installDir = L"stale";
    EXPECT_EQ(GetInstallDir(row.index, L"10.5", installDir), !row.expected.empty()) << row.index;
    EXPECT_EQ(installDir, row.expected) << row.index;
  }
}

TEST(ReadProductInstallInfo, EveryFieldFromItsValue) {
  ScopedHiveOverride hives;
  for (const wchar_t* name : {L"InstallDir", L"Installer", L"ProductName", L"ImageLocation", L"SourceDir",
                              L"InstallDate", L"InstallTime", L"RealVersion", L"SPNumber", L"SPBuild", L"SPInstaller",
                              L"SPInstallDate", L"SPInstallTime", L"SPStatus", L"SPDisplayName"}) {
    SetRegistryString(HKEY_LOCAL_MACHINE, kDesktopKey, name, name);
    SetRegistryString(HKEY_LOCAL_MACHINE, kEngineKey, name, name);
  }
  const ProductInstallInfo desktop = ReadProductInstallInfo(ProductKind::Desktop, kDesktopKey);
  EXPECT_EQ(desktop.installDir, L"InstallDir");
  EXPECT_EQ(desktop.installer, L"Installer");
  EXPECT_EQ(desktop.productName, L"ProductName");
  EXPECT_EQ(desktop.imageLocation, L"ImageLocation");
  EXPECT_EQ(desktop.installDate, L"InstallDate");
  EXPECT_EQ(desktop.installTime, L"InstallTime");
  EXPECT_EQ(desktop.realVersion, L"RealVersion");
  EXPECT_EQ(desktop.spNumber, L"SPNumber");
  EXPECT_EQ(desktop.spBuild, L"SPBuild");
  EXPECT_EQ(desktop.spInstaller, L"SPInstaller");
  EXPECT_EQ(desktop.spInstallDate, L"SPInstallDate");
  EXPECT_EQ(desktop.spInstallTime, L"SPInstallTime");
  EXPECT_EQ(desktop.spStatus, L"SPStatus");
  EXPECT_EQ(desktop.spDisplayName, L"SPDisplayName");
  EXPECT_EQ(desktop.productVersion, L"?");  // no core library under "InstallDir"
  // Engine keeps its installation image under another name.
  EXPECT_EQ(ReadProductInstallInfo(ProductKind::Engine, kEngineKey).imageLocation, L"SourceDir");
}

TEST(ReadProductInstallInfo, AMissingKeyGivesTheReportDefaults) {
  ScopedHiveOverride hives;
  const ProductInstallInfo info = ReadProductInstallInfo(ProductKind::Desktop, kDesktopKey);
  EXPECT_EQ(info.productName, L"");
  EXPECT_EQ(info.spNumber, L"0");
  EXPECT_EQ(info.spBuild, L"0");
  EXPECT_EQ(info.spStatus, L"N/A");
  EXPECT_EQ(info.productVersion, L"?");
}

TEST(GetProductBinFolder, InstallDirWithBin) {
  ScopedHiveOverride hives;
  SetRegistryString(HKEY_LOCAL_MACHINE, kDesktopKey, L"InstallDir", L"C:\\Mapora");
  EXPECT_EQ(GetProductBinFolder(kDesktopKey), L"C:\\Mapora\\bin\\");
  EXPECT_EQ(GetProductBinFolder(kEngineKey), L"\\bin\\");
}

TEST(GetCoreProductVersion, OnlyFromTheUsEnglishUnicodeTable) {
  const struct {
    const char* name;
    const wchar_t* library;  // copied to <folder>\bin\pfcore.dll
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

// What detection gathers from the environment and the real hives, with their two views.

class DetectionGathering : public ::testing::Test {
 protected:
  void TearDown() override {
    SetEnvironmentVariableW(L"KVEL_DESKTOP10.5_INSTALLED", nullptr);
    SetEnvironmentVariableW(L"KVEL_ENGINE10.5_INSTALLED", nullptr);
  }
  InstalledProducts Detect() {
    InstalledProducts products;
    DetectInstalledProducts(products);
    return products;
  }
};

TEST_F(DetectionGathering, AnEmptyMarkerIsNoMarker) {
  SetEnvironmentVariableW(L"KVEL_DESKTOP10.5_INSTALLED", L"");
  SetEnvironmentVariableW(L"KVEL_ENGINE10.5_INSTALLED", L"1");
  const InstalledProducts products = Detect();
  EXPECT_FALSE(products.desktopInstalled);
  EXPECT_TRUE(products.engineInstalled);
}

TEST_F(DetectionGathering, TheSkyloftKeyCountsOnlyInThe64BitView) {
  const wchar_t kSkyloftKey[] = L"SOFTWARE\\Kvel\\Skyloft2016.1";
  {
    ScopedRegistryKey skyloft(HKEY_LOCAL_MACHINE, kSkyloftKey, KEY_WOW64_32KEY);
    skyloft.SetString(L"InstallDir", L"C:\\Skyloft");
    EXPECT_FALSE(Detect().skyloftInstalled);
  }
  ScopedRegistryKey skyloft(HKEY_LOCAL_MACHINE, kSkyloftKey, KEY_WOW64_64KEY);
  skyloft.SetString(L"InstallDir", L"C:\\Skyloft");
  EXPECT_TRUE(Detect().skyloftInstalled);
  EXPECT_EQ(ReadRegistryString(HKEY_LOCAL_MACHINE, kSkyloftKey, L"InstallDir", L""), L"C:\\Skyloft");
}

TEST(RuntimeComponentAbsent, DetectionDoesWithout) {
  ASSERT_EQ(CoInitializeEx(nullptr, COINIT_APARTMENTTHREADED), S_OK);
  {
    InstalledProducts products;
    EXPECT_EQ(ListInstalledRuntimeVersions(products), std::vector<std::wstring>{});
    DetectInstalledProducts(products);
    EXPECT_FALSE(products.desktopInstalled);
  }
  CoUninitialize();
}

// The runtime-information component, registered for real from beside the test program.
class RuntimeComponent : public ::testing::Test {
 protected:
  void SetUp() override {
    ASSERT_EQ(CoInitializeEx(nullptr, COINIT_APARTMENTTHREADED), S_OK);
    server_ = LoadLibraryW((ModuleFolder() + L"\\SuiteRuntimeInfo.dll").c_str());
    ASSERT_NE(server_, nullptr);
    ASSERT_EQ(Call("DllRegisterServer"), S_OK);
  }
  void TearDown() override {
    products_ = InstalledProducts();  // releases the server's objects before it goes
    if (server_) {
      EXPECT_EQ(Call("DllUnregisterServer"), S_OK);
      FreeLibrary(server_);
    }
    CoUninitialize();
  }
  HRESULT Call(const char* entry) {
    using Entry = HRESULT(STDAPICALLTYPE*)();
    return reinterpret_cast<Entry>(reinterpret_cast<void*>(GetProcAddress(server_, entry)))();
  }
  void SetRuntimes(const std::vector<std::wstring>& lines) {
    std::wstring list;
    for (const std::wstring& line : lines) list += line + L'\0';
    list_.SetBinary(kSuiteRuntimeListValue, list.c_str(), static_cast<DWORD>((list.size() + 1) * sizeof(wchar_t)),
                    REG_MULTI_SZ);
  }

  HMODULE server_ = nullptr;
  ScopedRegistryKey list_{HKEY_LOCAL_MACHINE, kSuiteRuntimeListKey};
  InstalledProducts products_;
};

TEST_F(RuntimeComponent, ADamagedEntryEndsTheList) {
  SetRuntimes({L"1 10.5", L"damaged", L"2 10.6"});
  EXPECT_EQ(ListInstalledRuntimeVersions(products_), std::vector<std::wstring>{L"10.5"});
  DetectInstalledProducts(products_);
  EXPECT_TRUE(products_.desktopInstalled);
  EXPECT_FALSE(products_.engineInstalled);
}

TEST_F(RuntimeComponent, EveryDetectionReadsTheListAfresh) {
  SetRuntimes({L"2 10.5"});
  ListInstalledRuntimeVersions(products_);
  DetectInstalledProducts(products_);
  EXPECT_TRUE(products_.engineInstalled);
  SetRuntimes({L"2 10.4"});
  DetectInstalledProducts(products_);
  EXPECT_FALSE(products_.engineInstalled);
}

}  // namespace
