// Installed-product detection and installation values, read from the test prefix's registry.
#include <gtest/gtest.h>

#include "inventory/InstalledProducts.h"
#include "tests/support/TestSupport.h"

using namespace testing_support;

namespace {

const wchar_t kDesktopKey[] = L"SOFTWARE\\KVEL\\Desktop10.5";

TEST(InstallValues, AnyValueIsReadAsTextUpToItsFirstZeroCharacter) {
  const std::wstring longText(100000, L'x');
  // Written are the text's bytes with its terminator, less the last `cut` ones.
  const struct { DWORD type; std::wstring text; DWORD cut; std::wstring expected; } cases[] = {
      {REG_DWORD, L"A", 0, L"A"},  // an InstallDir some installers write as a DWORD
      {REG_BINARY, L"AB", 3, L"AB"},  // the odd last byte is half a character
      {REG_SZ, L"abc", 2, L"abc"},  // no terminator
      {REG_SZ, L"", 2, L""},  // empty, not the default
      {REG_SZ, longText, 0, longText},
  };
  ScopedRegistryKey key(HKEY_LOCAL_MACHINE, kDesktopKey);
  for (const auto& c : cases) {
    key.SetBinary(L"InstallDir", c.text.c_str(), static_cast<DWORD>(c.text.size() + 1) * 2 - c.cut, c.type);
    EXPECT_EQ(ReadRegistryString(HKEY_LOCAL_MACHINE, kDesktopKey, L"InstallDir", L"-"), c.expected) << c.type;
  }
  EXPECT_EQ(ReadRegistryString(HKEY_LOCAL_MACHINE, kDesktopKey, L"Missing", L"-"), L"-");
}

TEST(InstallValues, CoreVersionOnlyFromTheUsEnglishUnicodeTable) {
  const struct { const wchar_t* library; const wchar_t* separator; const wchar_t* expected; } cases[] = {
      {L"pfcore_us.dll", L"", L"10.5 Build 6491"},
      {L"pfcore_us.dll", L"\\", L"10.5 Build 6491"},
      {L"pfcore_other_table.dll", L"", L"?"},
  };
  ScopedRegistryKey key(HKEY_LOCAL_MACHINE, kDesktopKey);
  for (const auto& c : cases) {
    ScopedDirectory install(ModuleFolder() + L"\\core-library-install");
    ASSERT_TRUE(CopyFileTo(ModuleFolder() + L"\\" + c.library, install.MakeDir(L"bin") + L"\\pfcore.dll"));
    key.SetString(L"InstallDir", install.Path() + c.separator);
    EXPECT_EQ(ReadProductInstallInfo(ProductKind::Desktop, kDesktopKey).productVersion, c.expected) << c.library;
  }
}

TEST(Detection, EnvironmentMarkersAndTheSkyloftKeyIn64BitViewOnly) {
  const struct { const wchar_t *desktop, *engine; REGSAM skyloftView; bool desktopFound, engineFound; } cases[] = {
      {L"", L"1", KEY_WOW64_64KEY, false, true},  // an empty variable is no marker
      {L"1", L"1", KEY_WOW64_32KEY, true, false},  // Desktop wins
      {nullptr, nullptr, KEY_WOW64_32KEY, false, false},  // last, so that no marker stays set
  };
  for (const auto& c : cases) {
    SetEnvironmentVariableW(L"KVEL_DESKTOP10.5_INSTALLED", c.desktop);
    SetEnvironmentVariableW(L"KVEL_ENGINE10.5_INSTALLED", c.engine);
    ScopedRegistryKey skyloft(HKEY_LOCAL_MACHINE, L"SOFTWARE\\Kvel\\Skyloft2016.1", c.skyloftView);
    skyloft.SetString(L"InstallDir", L"C:\\Skyloft");
    InstalledProducts products;
    products.desktopInstalled = products.engineInstalled = products.skyloftInstalled = true;
    DetectInstalledProducts(products);
    EXPECT_EQ(products.desktopInstalled, c.desktopFound);
    EXPECT_EQ(products.engineInstalled, c.engineFound);
    EXPECT_EQ(products.skyloftInstalled, c.skyloftView == KEY_WOW64_64KEY);
  }
}

TEST(RuntimeInfo, VersionsAndDetectionFollowTheInstalledRuntimes) {
  ASSERT_EQ(CoInitializeEx(nullptr, COINIT_APARTMENTTHREADED), S_OK);
  InstalledProducts products;
  EXPECT_TRUE(ListInstalledRuntimeVersions(products).empty());  // the component is optional
  HMODULE server = LoadLibraryW((ModuleFolder() + L"\\SuiteRuntimeInfo.dll").c_str());
  auto call = [&](const char* name) {
    return reinterpret_cast<HRESULT(STDAPICALLTYPE*)()>(reinterpret_cast<void*>(GetProcAddress(server, name)))();
  };
  ASSERT_TRUE(server && call("DllRegisterServer") == S_OK);
  const struct { std::vector<std::wstring> runtimes, versions; bool desktop, engine; } cases[] = {
      {{}, {}, false, false},
      {{L"3 10.5", L"0 10.4", L"2 10.5 Engine runtime"}, {L"10.5"}, false, true},
      {{L"1 10.6-Beta", L"2 10.6-BETA", L"1 10.50", L"2 10.5a"}, {L"10.6-Beta", L"10.50", L"10.5a"}, false, false},
      {{L"1 10.5", L"damaged", L"2 10.5"}, {L"10.5"}, true, false},  // a failing entry ends the walk
  };
  for (const auto& c : cases) {
    std::wstring list;
    for (const std::wstring& line : c.runtimes) list += line + L'\0';
    ScopedRegistryKey key(HKEY_LOCAL_MACHINE, kSuiteRuntimeListKey);
    key.SetBinary(kSuiteRuntimeListValue, list.c_str(), static_cast<DWORD>((list.size() + 1) * 2), REG_MULTI_SZ);
    EXPECT_EQ(ListInstalledRuntimeVersions(products), c.versions);
    for (int run = 0; run < 2; ++run) {  // the kept enumerator starts over on every detection
      DetectInstalledProducts(products);
      EXPECT_EQ(products.desktopInstalled, c.desktop);
      EXPECT_EQ(products.engineInstalled, c.engine);
    }
  }
  products = InstalledProducts();  // releases the server's objects before it goes
  EXPECT_EQ(call("DllUnregisterServer"), S_OK);
  FreeLibrary(server);
  CoUninitialize();
}

}  // namespace
