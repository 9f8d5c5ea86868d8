#include "inventory/InstalledProducts.h"

#include <ole2.h>
#include <winver.h>

#include <cwchar>

#include "framework/RegistryKey.h"
#include "framework/ScopedHandle.h"
#include "framework/SystemLibrary.h"
#include "inventory/ProductRegistry.h"

namespace {

// Buffer size for the installation markers; a longer value still counts as set.
const DWORD kMarkerBufferChars = 256;

bool IsMarkerSet(const std::wstring& name) {
  wchar_t value[kMarkerBufferChars];
  return GetEnvironmentVariableW(name.c_str(), value, kMarkerBufferChars) != 0;
}

std::wstring BstrText(const fw::ScopedBstr& text) {
  return text ? std::wstring(text.Get(), SysStringLen(text.Get())) : std::wstring();
}

// Every item from the start of the list; a failing Next ends the list like its end does.
std::vector<SuiteRuntime> ReadRuntimes(ISuiteRuntimeEnumerator* enumerator) {
  std::vector<SuiteRuntime> runtimes;
  if (enumerator == nullptr || FAILED(enumerator->Reset())) return runtimes;
  for (;;) {
    long code = 0;
    fw::ScopedBstr version;
    fw::ScopedBstr detail;
    HRESULT hr = enumerator->Next(&code, version.Receive(), detail.Receive());
    if (hr != S_OK) return runtimes;
    runtimes.push_back({code, BstrText(version)});
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

bool IsDesktopOrEngine(long productCode) {
  return productCode == kSuiteRuntimeDesktop || productCode == kSuiteRuntimeEngine;
}

// Opens a product's key for reading in the view its values live in.
LONG OpenProductKey(fw::RegistryKey& key, HKEY hive, const std::wstring& subkey) {
  if (ReadsThe64BitView(subkey)) return key.Open(hive, subkey.c_str(), KEY_READ | KEY_WOW64_64KEY);
  return key.Open(hive, subkey.c_str());
}

}  // namespace

std::wstring GetProductVersion() { return kSuiteRelease; }

bool ReadsThe64BitView(const std::wstring& subkey) { return subkey.find(kSkyloftRelease) != std::wstring::npos; }

std::wstring ReadRegistryString(HKEY hive, const std::wstring& subkey, const std::wstring& valueName,
                                const std::wstring& defaultText) {
  fw::RegistryKey key;
  std::wstring result = defaultText;
  if (OpenProductKey(key, hive, subkey) == ERROR_SUCCESS) key.ReadAnyValueAsText(valueName.c_str(), result);
  return result;
}

DetectedProducts DecideInstalledProducts(const std::wstring& version, const DetectionEvidence& evidence) {
  DetectedProducts detected;
  // The installers set one marker per machine; when both exist Desktop wins.
  detected.desktop = evidence.desktopMarkerSet;
  detected.engine = !evidence.desktopMarkerSet && evidence.engineMarkerSet;
  // A runtime of another release is not the one this console administers, whatever the
  // console's own release text says.
  for (const SuiteRuntime& runtime : evidence.runtimes) {
    if (runtime.version != version || runtime.version != kSuiteRelease) continue;
    if (runtime.productCode == kSuiteRuntimeDesktop) detected.desktop = true;
    if (runtime.productCode == kSuiteRuntimeEngine) detected.engine = true;
  }
  detected.skyloft = evidence.skyloftKeyFound;
  return detected;
}

std::vector<std::wstring> DistinctRuntimeVersions(const std::vector<SuiteRuntime>& runtimes) {
  std::vector<std::wstring> versions;
  for (const SuiteRuntime& runtime : runtimes) {
    if (IsDesktopOrEngine(runtime.productCode) && !ContainsIgnoringCase(versions, runtime.version))
      versions.push_back(runtime.version);
  }
  return versions;
}

void DetectInstalledProducts(InstalledProducts& products) {
  const std::wstring version = GetProductVersion();
  products.version = version;
  products.engineKey = ProductKey(kEngineKeyBase, version);
  products.desktopKey = ProductKey(kDesktopKeyBase, version);
  products.skyloftKey = kSkyloftKey;
  products.serverKey = ProductKey(kServerKeyBase, version);

  DetectionEvidence evidence;
  evidence.desktopMarkerSet = IsMarkerSet(L"KVEL_DESKTOP" + version + L"_INSTALLED");
  evidence.engineMarkerSet = IsMarkerSet(L"KVEL_ENGINE" + version + L"_INSTALLED");
  evidence.runtimes = ReadRuntimes(products.runtimeEnumerator.Get());
  // Skyloft is a 64-bit product: its key counts only in the 64-bit view.
  fw::RegistryKey skyloft;
  evidence.skyloftKeyFound =
      skyloft.Open(HKEY_LOCAL_MACHINE, products.skyloftKey.c_str(), KEY_QUERY_VALUE | KEY_WOW64_64KEY) == ERROR_SUCCESS;

  // serverInstalled is left as it is: no rule detects a Server.
  const DetectedProducts detected = DecideInstalledProducts(version, evidence);
  products.desktopInstalled = detected.desktop;
  products.engineInstalled = detected.engine;
  products.skyloftInstalled = detected.skyloft;
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
  // A default-constructed record holds each field's default.
  ProductInstallInfo info;
  // One key for all the values: the report reads three products at every start.
  fw::RegistryKey key;
  if (OpenProductKey(key, HKEY_LOCAL_MACHINE, productKey) == ERROR_SUCCESS) {
    for (const InstallValue& value : kInstallValues) {
      // Engine keeps its installation image under another name.
      const bool engineImage = kind == ProductKind::Engine && value.member == &ProductInstallInfo::imageLocation;
      key.ReadAnyValueAsText(engineImage ? L"SourceDir" : value.valueName, info.*value.member);
    }
  }
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
  // the program before any of its code runs. Kept once loaded, as an import would be: every
  // report reads three products.
  static const fw::SystemLibrary versionLibrary(L"version.dll");
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
  if (FAILED(CoCreateInstance(CLSID_SuiteRuntimeInfo, nullptr, CLSCTX_INPROC_SERVER,
                              IID_ISuiteRuntimeInfo, products.runtimeInfo.ReceiveVoid())))
    return {};  // not installed: detection does without it
  OleRun(products.runtimeInfo.Get());
  if (FAILED(products.runtimeInfo->GetEnumerator(products.runtimeEnumerator.Receive()))) {
    products.runtimeEnumerator.Reset();
    return {};
  }
  return DistinctRuntimeVersions(ReadRuntimes(products.runtimeEnumerator.Get()));
}
