// Which products count as installed: environment markers, the Skyloft key's registry view, and
// the installed runtimes reported by the runtime-information component (our stand-in server).
#include <gtest/gtest.h>

#include <string>

#include "inventory/InstalledProducts.h"
#include "tests/support/TestSupport.h"

using testing_support::ModuleFolder;
using testing_support::ScopedRegistryKey;

namespace {

const wchar_t kDesktopMarker[] = L"KVEL_DESKTOP10.5_INSTALLED";
const wchar_t kEngineMarker[] = L"KVEL_ENGINE10.5_INSTALLED";
const wchar_t kSkyloftKey[] = L"SOFTWARE\\Kvel\\Skyloft2016.1";

// Sets (or, with null, removes) a variable of the test process and removes it again.
class ScopedVariable {
 public:
  ScopedVariable(const wchar_t* name, const wchar_t* value) : name_(name) { SetEnvironmentVariableW(name, value); }
  ~ScopedVariable() { SetEnvironmentVariableW(name_, nullptr); }
  ScopedVariable(const ScopedVariable&) = delete;
  ScopedVariable& operator=(const ScopedVariable&) = delete;

 private:
  const wchar_t* name_;
};

TEST(Detection, NothingInstalledButAServerKeyWithAllValues) {
  ScopedRegistryKey server(HKEY_LOCAL_MACHINE, L"SOFTWARE\\KVEL\\Server10.5");
  server.SetString(L"InstallDir", L"C:\\Server");
  server.SetString(L"ProductName", L"Mapora Server");
  InstalledProducts products;
  DetectInstalledProducts(products);
  EXPECT_FALSE(products.desktopInstalled || products.engineInstalled || products.skyloftInstalled ||
               products.serverInstalled);
  EXPECT_EQ(products.serverKey, L"SOFTWARE\\KVEL\\Server10.5");
}

TEST(Detection, EnvironmentMarkersSetAtMostOneProductAndDesktopWins) {
  const std::wstring longValue(300, L'x');  // longer than the marker buffer
  // A null value leaves the variable undefined.
  const struct { const wchar_t* desktop; const wchar_t* engine; bool desktopInstalled, engineInstalled; } cases[] = {
      {nullptr, nullptr, false, false}, {L"1", nullptr, true, false},  {L"", L"1", false, true},
      {L"1", L"1", true, false},        {nullptr, L"", false, false}, {longValue.c_str(), nullptr, true, false},
  };
  for (const auto& c : cases) {
    ScopedVariable desktop(kDesktopMarker, c.desktop);
    ScopedVariable engine(kEngineMarker, c.engine);
    InstalledProducts products;
    products.desktopInstalled = products.engineInstalled = true;  // every run starts from scratch
    DetectInstalledProducts(products);
    EXPECT_EQ(products.desktopInstalled, c.desktopInstalled) << (c.desktop ? c.desktop : L"(none)");
    EXPECT_EQ(products.engineInstalled, c.engineInstalled) << (c.engine ? c.engine : L"(none)");
  }
}

TEST(Detection, SkyloftCountsOnlyInThe64BitView) {
  const struct { REGSAM view; bool installed; } cases[] = {{KEY_WOW64_32KEY, false}, {KEY_WOW64_64KEY, true}};
  for (const auto& c : cases) {
    ScopedRegistryKey other(HKEY_LOCAL_MACHINE, kSkyloftKey, c.view ^ (KEY_WOW64_32KEY | KEY_WOW64_64KEY));
    ScopedRegistryKey key(HKEY_LOCAL_MACHINE, kSkyloftKey, c.view);
    key.SetString(L"InstallDir", L"C:\\Skyloft");
    InstalledProducts products;
    DetectInstalledProducts(products);
    EXPECT_EQ(products.skyloftInstalled, c.installed) << c.view;
    EXPECT_EQ(ReadRegistryString(HKEY_LOCAL_MACHINE, kSkyloftKey, L"InstallDir", L"-"),
              c.installed ? L"C:\\Skyloft" : L"-");
  }
}

// Writes the stand-in's list of installed runtimes for one test.
class RuntimeList {
 public:
  explicit RuntimeList(const std::vector<std::wstring>& lines) : key_(HKEY_LOCAL_MACHINE, kSuiteRuntimeListKey) {
    std::wstring data;
    for (const std::wstring& line : lines) data += line + L'\0';
    data += L'\0';
    key_.SetBinary(kSuiteRuntimeListValue, data.data(), static_cast<DWORD>(data.size() * sizeof(wchar_t)),
                   REG_MULTI_SZ);
  }

 private:
  ScopedRegistryKey key_;
};

TEST(RuntimeInfoAbsent, DetectionDoesWithoutTheComponent) {
  ASSERT_TRUE(SUCCEEDED(CoInitializeEx(nullptr, COINIT_APARTMENTTHREADED)));
  {
    RuntimeList list({L"1 10.5"});
    InstalledProducts products;
    EXPECT_TRUE(ListInstalledRuntimeVersions(products).empty());
    EXPECT_FALSE(products.runtimeInfo || products.runtimeEnumerator);
    DetectInstalledProducts(products);
    EXPECT_FALSE(products.desktopInstalled);
  }
  CoUninitialize();
}

// Registers the stand-in server in the test prefix for the suite's tests and removes it after.
class RuntimeInfoComponent : public testing::Test {
 protected:
  using ServerCall = HRESULT(STDAPICALLTYPE*)();

  static ServerCall Export(const char* name) {
    return reinterpret_cast<ServerCall>(reinterpret_cast<void*>(GetProcAddress(server_, name)));
  }
  static void SetUpTestSuite() {
    CoInitializeEx(nullptr, COINIT_APARTMENTTHREADED);
    server_ = LoadLibraryW((ModuleFolder() + L"\\SuiteRuntimeInfo.dll").c_str());
    ASSERT_NE(server_, nullptr);
    ASSERT_EQ(Export("DllRegisterServer")(), S_OK);
  }
  static void TearDownTestSuite() {
    if (server_) {
      EXPECT_EQ(Export("DllUnregisterServer")(), S_OK);
      FreeLibrary(server_);
    }
    CoUninitialize();
  }
  static HMODULE server_;
};
HMODULE RuntimeInfoComponent::server_ = nullptr;

TEST_F(RuntimeInfoComponent, VersionsAndDetectionFollowTheInstalledRuntimes) {
  const struct { const char* label; std::vector<std::wstring> runtimes, versions; bool desktop, engine; } cases[] = {
      {"no runtime", {}, {}, false, false},
      {"desktop runtime", {L"1 10.5 Desktop runtime"}, {L"10.5"}, true, false},
      {"engine runtime", {L"2 10.5"}, {L"10.5"}, false, true},
      {"other product codes", {L"3 10.5", L"0 10.5"}, {}, false, false},
      {"other releases", {L"1 10.6", L"2 10.50", L"1 10.5a"}, {L"10.6", L"10.50", L"10.5a"}, false, false},
      {"duplicates compared ignoring case", {L"1 10.6-Beta", L"2 10.6-BETA", L"1 10.5", L"2 10.5"},
       {L"10.6-Beta", L"10.5"}, true, true},
      {"a failing entry ends the walk", {L"2 10.5", L"damaged", L"1 10.5"}, {L"10.5"}, false, true},
  };
  for (const auto& c : cases) {
    RuntimeList list(c.runtimes);
    InstalledProducts products;
    EXPECT_EQ(ListInstalledRuntimeVersions(products), c.versions) << c.label;
    ASSERT_TRUE(products.runtimeEnumerator) << c.label;
    // The kept enumerator is walked again from its start on every detection.
    for (int run = 0; run < 2; ++run) {
      DetectInstalledProducts(products);
      EXPECT_EQ(products.desktopInstalled, c.desktop) << c.label;
      EXPECT_EQ(products.engineInstalled, c.engine) << c.label;
    }
  }
}

}  // namespace
