// Reading a product's installation values: registry values of any shape, the install folders
// and the core library's version resource.
#include <gtest/gtest.h>

#include "inventory/InstalledProducts.h"
#include "tests/support/TestSupport.h"

using testing_support::ModuleFolder;
using testing_support::ScopedDirectory;
using testing_support::ScopedRegistryKey;

namespace {

const wchar_t kDesktopKey[] = L"SOFTWARE\\KVEL\\Desktop10.5";
const wchar_t kEngineKey[] = L"SOFTWARE\\KVEL\\Engine10.5";

std::vector<BYTE> Bytes(const std::wstring& text, bool terminated = true) {
  const BYTE* data = reinterpret_cast<const BYTE*>(text.c_str());
  return std::vector<BYTE>(data, data + (text.size() + (terminated ? 1 : 0)) * sizeof(wchar_t));
}

TEST(InstallValuesRegistry, AnyValueIsReadAsTextUpToItsFirstZeroCharacter) {
  const struct { const char* label; DWORD type; std::vector<BYTE> data; std::wstring expected; } cases[] = {
      {"string", REG_SZ, Bytes(L"C:\\Mapora\\"), L"C:\\Mapora\\"},
      {"dword as two characters", REG_DWORD, {'A', 0, 'B', 0}, L"AB"},
      {"dword up to its zero character", REG_DWORD, {'A', 0, 0, 0}, L"A"},
      {"odd-sized binary", REG_BINARY, {'A', 0, 'B'}, L"AB"},
      {"single byte", REG_BINARY, {'Z'}, L"Z"},
      {"string without terminator", REG_SZ, Bytes(L"abc", false), L"abc"},
      {"multi-string gives its first string", REG_MULTI_SZ, Bytes(std::wstring(L"one\0two\0", 8)), L"one"},
      {"expandable string stays unexpanded", REG_EXPAND_SZ, Bytes(L"%TEMP%\\x"), L"%TEMP%\\x"},
      {"empty value is not the default", REG_SZ, {}, L""},
      {"very long value", REG_SZ, Bytes(std::wstring(100000, L'x')), std::wstring(100000, L'x')},
  };
  ScopedRegistryKey key(HKEY_LOCAL_MACHINE, kDesktopKey);
  for (const auto& c : cases) {
    key.SetBinary(L"InstallDir", c.data.data(), static_cast<DWORD>(c.data.size()), c.type);
    EXPECT_EQ(ReadRegistryString(HKEY_LOCAL_MACHINE, kDesktopKey, L"InstallDir", L"default"), c.expected)
        << c.label;
  }
  EXPECT_EQ(ReadRegistryString(HKEY_LOCAL_MACHINE, kDesktopKey, L"Missing", L"default"), L"default");
  EXPECT_EQ(ReadRegistryString(HKEY_LOCAL_MACHINE, L"SOFTWARE\\KVEL\\NoSuchKey", L"InstallDir", L"default"),
            L"default");
}

std::vector<std::wstring> Fields(const ProductInstallInfo& i) {
  return {i.installDir,  i.installer,     i.productName,   i.imageLocation, i.installDate,
          i.installTime, i.realVersion,   i.spNumber,      i.spBuild,       i.spInstaller,
          i.spInstallDate, i.spInstallTime, i.spStatus,    i.spDisplayName, i.productVersion};
}

TEST(InstallValuesProduct, FieldsComeFromTheirValuesOrTheReportDefaults) {
  ScopedRegistryKey desktop(HKEY_LOCAL_MACHINE, kDesktopKey);
  ScopedRegistryKey engine(HKEY_LOCAL_MACHINE, kEngineKey);
  EXPECT_EQ(Fields(ReadProductInstallInfo(ProductKind::Desktop, kDesktopKey)),
            std::vector<std::wstring>({L"", L"", L"", L"", L"", L"", L"", L"0", L"0", L"N/A", L"N/A", L"N/A",
                                       L"N/A", L"", L"?"}));
  // Each value holds its own name; Engine keeps its image under "SourceDir" instead.
  std::vector<std::wstring> expected = {L"InstallDir",    L"Installer",     L"ProductName", L"ImageLocation",
                                        L"InstallDate",   L"InstallTime",   L"RealVersion", L"SPNumber",
                                        L"SPBuild",       L"SPInstaller",   L"SPInstallDate", L"SPInstallTime",
                                        L"SPStatus",      L"SPDisplayName", L"SourceDir"};
  for (ScopedRegistryKey* key : {&desktop, &engine})
    for (const std::wstring& name : expected) key->SetString(name.c_str(), name);
  expected.back() = L"?";  // no core library under that folder
  EXPECT_EQ(Fields(ReadProductInstallInfo(ProductKind::Desktop, kDesktopKey)), expected);
  expected[3] = L"SourceDir";
  EXPECT_EQ(Fields(ReadProductInstallInfo(ProductKind::Engine, kEngineKey)), expected);
}

TEST(InstallValuesProduct, InstallDirOfEachProductIndex) {
  const struct { int index; const wchar_t* key; const wchar_t* value; } cases[] = {
      {0, kEngineKey, L"InstallDir"},
      {1, kDesktopKey, L"InstallDir"},
      {2, L"SOFTWARE\\Skyloft", L"Path"},  // version-free, default view
      {3, L"SOFTWARE\\KVEL\\Server10.5", L"InstallDir"},
  };
  for (const auto& c : cases) {
    ScopedRegistryKey key(HKEY_LOCAL_MACHINE, c.key);
    std::wstring folder;
    EXPECT_FALSE(GetInstallDir(c.index, L"10.5", folder)) << c.index;
    key.SetString(c.value, L"C:\\P" + std::to_wstring(c.index));
    EXPECT_TRUE(GetInstallDir(c.index, L"10.5", folder) && folder == L"C:\\P" + std::to_wstring(c.index)) << c.index;
  }
  std::wstring folder = L"stale";
  EXPECT_FALSE(GetInstallDir(4, L"10.5", folder) || !folder.empty());
}

TEST(InstallValuesCoreLibrary, ProductVersionComesFromTheUsEnglishUnicodeTable) {
  // library is copied as bin\pfcore.dll (none when null); separator ends InstallDir.
  const struct { const wchar_t* library; const wchar_t* separator; const wchar_t* expected; } cases[] = {
      {L"pfcore_us.dll", L"", L"10.5 Build 6491"},
      {L"pfcore_us.dll", L"\\", L"10.5 Build 6491"},  // the doubled separator still finds it
      {L"pfcore_other_table.dll", L"", L"?"},
      {nullptr, L"", L"?"},
  };
  ScopedRegistryKey key(HKEY_LOCAL_MACHINE, kDesktopKey);
  EXPECT_EQ(GetProductBinFolder(kDesktopKey), L"\\bin\\");
  for (const auto& c : cases) {
    ScopedDirectory install(ModuleFolder() + L"\\core-library-install");
    install.MakeDir(L"bin");
    if (c.library) {
      std::wstring core = install.Path() + L"\\bin\\pfcore.dll";
      ASSERT_TRUE(testing_support::CopyFileTo(ModuleFolder() + L"\\" + c.library, core));
    }
    key.SetString(L"InstallDir", install.Path() + c.separator);
    EXPECT_EQ(ReadProductInstallInfo(ProductKind::Desktop, kDesktopKey).productVersion, c.expected)
        << (c.library ? c.library : L"none") << " with separator '" << c.separator << "'";
    EXPECT_EQ(GetProductBinFolder(kDesktopKey), install.Path() + c.separator + L"\\bin\\");
  }
}

}  // namespace
