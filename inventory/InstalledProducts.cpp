#include "inventory/InstalledProducts.h"

#include <ole2.h>
#include <winver.h>

#include <cwchar>

#include "framework/SystemLibrary.h"
#include "inventory/ProductRegistry.h"

namespace {

// Buffer size for the installation markers; a longer value still counts as set.
const DWORD kMarkerBufferChars = 256;

bool IsMarkerSet(const std::wstring& name) {
  wchar_t value[kMarkerBufferChars];
  return GetEnvironmentVariableW(name.c_str(), value, kMarkerBufferChars) != 0;
}

std::wstring TakeBstr(BSTR& text) {
  std::wstring result = text ? std::wstring(text, SysStringLen(text)) : std::wstring();
  SysFreeString(text);
  text = nullptr;
  return result;
}

// Restarts the walk and hands every item to visit; a failing Next ends the walk like the end
// of the list does.
template <class Visit>
void ForEachRuntime(ISuiteRuntimeEnumerator* enumerator, Visit visit) {
  if (enumerator == nullptr || FAILED(enumerator->Reset())) return;
  for (;;) {
    long code = 0;
    BSTR version = nullptr;
    BSTR detail = nullptr;
    HRESULT hr = enumerator->Next(&code, &version, &detail);
    std::wstring versionText = TakeBstr(version);
    TakeBstr(detail);
    if (hr != S_OK) return;
    visit(code, versionText);
  }
}

bool ContainsIgnoringCase(const std::vector<std::wstring>& list, const std::wstring& text) {
  for (const std::wstring& item : list) {
    if (CompareStringOrdinal(item.c_str(), static_cast<int>(item.size()), text.c_str(),
                             static_cast<int>(text.size()), TRUE) == CSTR_EQUAL)
      return true;
  }
  return false;
}

}  // namespace

std::wstring GetProductVersion() { return kSuiteRelease; }

std::wstring ReadRegistryString(HKEY hive, const std::wstring& subkey, const std::wstring& valueName,
                                const std::wstring& defaultText) {
  HKEY key = nullptr;
  LONG opened = subkey.find(kSkyloftRelease) != std::wstring::npos
                    ? RegOpenKeyExW(hive, subkey.c_str(), 0, KEY_READ | KEY_WOW64_64KEY, &key)
                    : RegOpenKeyW(hive, subkey.c_str(), &key);
  if (opened != ERROR_SUCCESS) return defaultText;

  std::wstring result = defaultText;
  DWORD size = 0;
  LONG status = RegQueryValueExW(key, valueName.c_str(), nullptr, nullptr, nullptr, &size);
  std::vector<wchar_t> buffer;
  // A value that keeps growing under the reader is given up on after a few tries.
  for (int attempt = 0; attempt < 4 && (status == ERROR_SUCCESS || status == ERROR_MORE_DATA); ++attempt) {
    // Whatever the type, the data is read as UTF-16. Whole zero characters after the data
    // (also after an odd last byte) end the text even when the value carries no terminator.
    buffer.assign(size / sizeof(wchar_t) + 2, L'\0');
    DWORD read = size;
    status = RegQueryValueExW(key, valueName.c_str(), nullptr, nullptr,
                              reinterpret_cast<BYTE*>(buffer.data()), &read);
    if (status == ERROR_SUCCESS) {
      result.assign(buffer.data(), wcsnlen(buffer.data(), buffer.size()));
      break;
    }
    // The value grew between the two queries: the second one reported the new size.
    size = read;
  }
  if (key != hive) RegCloseKey(key);
  return result;
}

void DetectInstalledProducts(InstalledProducts& products) {
  products.desktopInstalled = false;
  products.engineInstalled = false;
  products.skyloftInstalled = false;

  const std::wstring version = GetProductVersion();
  products.version = version;
  products.engineKey = ProductKey(kEngineKeyBase, version);
  products.desktopKey = ProductKey(kDesktopKeyBase, version);
  products.skyloftKey = kSkyloftKey;
  products.serverKey = ProductKey(kServerKeyBase, version);

  // The installers set one marker per machine; when both exist Desktop wins.
  if (IsMarkerSet(L"KVEL_DESKTOP" + version + L"_INSTALLED"))
    products.desktopInstalled = true;
  else if (IsMarkerSet(L"KVEL_ENGINE" + version + L"_INSTALLED"))
    products.engineInstalled = true;

  // A runtime of another release is not the one this console administers, whatever the
  // console's own release text says.
  ForEachRuntime(products.runtimeEnumerator.Get(), [&](long code, const std::wstring& runtimeVersion) {
    if (runtimeVersion != version || runtimeVersion != kSuiteRelease) return;
    if (code == kSuiteRuntimeDesktop) products.desktopInstalled = true;
    if (code == kSuiteRuntimeEngine) products.engineInstalled = true;
  });

  // Skyloft is a 64-bit product: its key counts only in the 64-bit view.
  HKEY key = nullptr;
  if (RegOpenKeyExW(HKEY_LOCAL_MACHINE, products.skyloftKey.c_str(), 0, KEY_QUERY_VALUE | KEY_WOW64_64KEY,
                    &key) == ERROR_SUCCESS) {
    products.skyloftInstalled = true;
    RegCloseKey(key);
  }
}

bool GetInstallDir(int productIndex, std::wstring version, std::wstring& installDir) {
  std::wstring base;
  const wchar_t* valueName = L"InstallDir";
  switch (static_cast<ProductKind>(productIndex)) {
    case ProductKind::Engine:
      base = kEngineKeyBase;
      break;
    case ProductKind::Desktop:
      base = kDesktopKeyBase;
      break;
    case ProductKind::Skyloft:
      base = kSkyloftPathKey;
      valueName = L"Path";
      version.clear();
      break;
    case ProductKind::Server:
      base = kServerKeyBase;
      break;
  }
  installDir = ReadRegistryString(HKEY_LOCAL_MACHINE, base + version, valueName, L"");
  return !installDir.empty();
}

ProductInstallInfo ReadProductInstallInfo(ProductKind kind, const std::wstring& productKey) {
  struct Field {
    std::wstring ProductInstallInfo::*member;
    const wchar_t* valueName;
  };
  // Engine keeps its installation image under another name.
  const wchar_t* imageValue = kind == ProductKind::Engine ? L"SourceDir" : L"ImageLocation";
  const Field fields[] = {
      {&ProductInstallInfo::installDir, L"InstallDir"},
      {&ProductInstallInfo::installer, L"Installer"},
      {&ProductInstallInfo::productName, L"ProductName"},
      {&ProductInstallInfo::imageLocation, imageValue},
      {&ProductInstallInfo::installDate, L"InstallDate"},
      {&ProductInstallInfo::installTime, L"InstallTime"},
      {&ProductInstallInfo::realVersion, L"RealVersion"},
      {&ProductInstallInfo::spNumber, L"SPNumber"},
      {&ProductInstallInfo::spBuild, L"SPBuild"},
      {&ProductInstallInfo::spInstaller, L"SPInstaller"},
      {&ProductInstallInfo::spInstallDate, L"SPInstallDate"},
      {&ProductInstallInfo::spInstallTime, L"SPInstallTime"},
      {&ProductInstallInfo::spStatus, L"SPStatus"},
      {&ProductInstallInfo::spDisplayName, L"SPDisplayName"},
  };
  // A default-constructed record holds each field's default.
  ProductInstallInfo info;
  for (const Field& field : fields)
    info.*field.member = ReadRegistryString(HKEY_LOCAL_MACHINE, productKey, field.valueName, info.*field.member);
  info.productVersion = GetCoreProductVersion(info.installDir);
  return info;
}

std::wstring GetProductBinFolder(const std::wstring& productKey) {
  return ReadRegistryString(HKEY_LOCAL_MACHINE, productKey, L"InstallDir", L"") + L"\\bin\\";
}

std::wstring GetCoreProductVersion(const std::wstring& installDir) {
  // The separator is always added: Windows takes a doubled one when installDir ends with "\".
  const std::wstring path = installDir + L"\\bin\\pfcore.dll";
  // Bound here rather than imported: the loader would take an imported version.dll from beside
  // the program before any of its code runs.
  const fw::SystemLibrary versionLibrary(L"version.dll");
  auto getSize = versionLibrary.Find<decltype(&GetFileVersionInfoSizeW)>("GetFileVersionInfoSizeW");
  auto getInfo = versionLibrary.Find<decltype(&GetFileVersionInfoW)>("GetFileVersionInfoW");
  auto queryValue = versionLibrary.Find<decltype(&VerQueryValueW)>("VerQueryValueW");
  if (getSize == nullptr || getInfo == nullptr || queryValue == nullptr) return L"?";
  DWORD handle = 0;
  DWORD size = getSize(path.c_str(), &handle);
  if (size == 0) return L"?";
  std::vector<BYTE> block(size);
  if (!getInfo(path.c_str(), 0, size, block.data())) return L"?";

  // Only the U.S. English Unicode table counts: that is where the suite's build writes it.
  void* value = nullptr;
  UINT length = 0;
  if (!queryValue(block.data(), L"\\StringFileInfo\\040904B0\\ProductVersion", &value, &length))
    return L"?";
  const BYTE* text = static_cast<const BYTE*>(value);
  const BYTE* end = block.data() + block.size();
  if (text == nullptr || text < block.data() || text >= end) return L"";
  // Never read past the block, whatever the resource claims.
  size_t maxChars = static_cast<size_t>(end - text) / sizeof(wchar_t);
  const wchar_t* chars = static_cast<const wchar_t*>(value);
  return std::wstring(chars, wcsnlen(chars, maxChars));
}

std::vector<std::wstring> ListInstalledRuntimeVersions(InstalledProducts& products) {
  products.runtimeEnumerator.Reset();
  products.runtimeInfo.Reset();
  std::vector<std::wstring> versions;
  if (FAILED(CoCreateInstance(CLSID_SuiteRuntimeInfo, nullptr, CLSCTX_INPROC_SERVER,
                              IID_ISuiteRuntimeInfo, products.runtimeInfo.ReceiveVoid())))
    return versions;  // not installed: detection does without it
  OleRun(products.runtimeInfo.Get());
  if (FAILED(products.runtimeInfo->GetEnumerator(products.runtimeEnumerator.Receive()))) {
    products.runtimeEnumerator.Reset();
    return versions;
  }
  ForEachRuntime(products.runtimeEnumerator.Get(), [&](long code, const std::wstring& version) {
    if ((code == kSuiteRuntimeDesktop || code == kSuiteRuntimeEngine) && !ContainsIgnoringCase(versions, version))
      versions.push_back(version);
  });
  return versions;
}
