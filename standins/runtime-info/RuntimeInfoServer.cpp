// Stand-in for the suite's runtime-information component: an in-process COM server that lists
// the runtimes written in the registry (format in inventory/SuiteRuntimeEnumerator.h).
#include <windows.h>
#include <ole2.h>
#include <olectl.h>

#include <cwchar>
#include <string>
#include <vector>

#include "inventory/SuiteRuntimeEnumerator.h"
#include "standins/InprocServer.h"

namespace {

struct RuntimeEntry {
  bool valid = false;
  long productCode = 0;
  std::wstring version;
  std::wstring detail;
};

// Splits "<code> <version> [<detail>]"; anything without a leading decimal code is damaged.
RuntimeEntry ParseEntry(const std::wstring& line) {
  RuntimeEntry entry;
  const wchar_t* text = line.c_str();
  wchar_t* end = nullptr;
  long code = std::wcstol(text, &end, 10);
  if (end == text) return entry;
  entry.valid = true;
  entry.productCode = code;
  std::wstring rest(end);
  size_t start = rest.find_first_not_of(L' ');
  if (start == std::wstring::npos) return entry;
  size_t blank = rest.find(L' ', start);
  entry.version = rest.substr(start, blank == std::wstring::npos ? std::wstring::npos : blank - start);
  if (blank != std::wstring::npos) {
    size_t detail = rest.find_first_not_of(L' ', blank);
    if (detail != std::wstring::npos) entry.detail = rest.substr(detail);
  }
  return entry;
}

std::vector<RuntimeEntry> ReadConfiguredRuntimes() {
  std::vector<RuntimeEntry> entries;
  HKEY key = nullptr;
  if (RegOpenKeyExW(HKEY_LOCAL_MACHINE, kSuiteRuntimeListKey, 0, KEY_QUERY_VALUE, &key) != ERROR_SUCCESS)
    return entries;
  DWORD size = 0;
  std::vector<wchar_t> data;
  if (RegQueryValueExW(key, kSuiteRuntimeListValue, nullptr, nullptr, nullptr, &size) == ERROR_SUCCESS) {
    // Two spare zero characters end the list even when the stored value lacks its terminators.
    data.assign(size / sizeof(wchar_t) + 2, L'\0');
    if (RegQueryValueExW(key, kSuiteRuntimeListValue, nullptr, nullptr, reinterpret_cast<BYTE*>(data.data()),
                         &size) != ERROR_SUCCESS)
      data.clear();
  }
  RegCloseKey(key);
  for (size_t pos = 0; pos < data.size() && data[pos] != L'\0';) {
    std::wstring line(&data[pos], wcsnlen(&data[pos], data.size() - pos));
    entries.push_back(ParseEntry(line));
    pos += line.size() + 1;
  }
  return entries;
}

// Reference counting and the server's object count, shared by the two component objects.
template <class Interface>
class ComObject : public Interface, private inproc_server::LiveObject {
 public:
  ComObject() = default;
  virtual ~ComObject() = default;

  HRESULT STDMETHODCALLTYPE QueryInterface(REFIID riid, void** object) override {
    if (object == nullptr) return E_POINTER;
    *object = nullptr;
    if (!IsEqualIID(riid, IID_IUnknown) && !IsEqualIID(riid, InterfaceId())) return E_NOINTERFACE;
    *object = static_cast<Interface*>(this);
    AddRef();
    return S_OK;
  }
  ULONG STDMETHODCALLTYPE AddRef() override { return static_cast<ULONG>(InterlockedIncrement(&refs_)); }
  ULONG STDMETHODCALLTYPE Release() override {
    LONG refs = InterlockedDecrement(&refs_);
    if (refs == 0) delete this;
    return static_cast<ULONG>(refs);
  }

 protected:
  virtual const IID& InterfaceId() const = 0;

 private:
  LONG refs_ = 1;
};

class RuntimeEnumerator : public ComObject<ISuiteRuntimeEnumerator> {
 public:
  RuntimeEnumerator() : entries_(ReadConfiguredRuntimes()) {}

  HRESULT STDMETHODCALLTYPE Reset() override {
    entries_ = ReadConfiguredRuntimes();
    next_ = 0;
    return S_OK;
  }

  HRESULT STDMETHODCALLTYPE Next(long* productCode, BSTR* versionText, BSTR* detailText) override {
    if (productCode == nullptr || versionText == nullptr || detailText == nullptr) return E_POINTER;
    *productCode = 0;
    *versionText = nullptr;
    *detailText = nullptr;
    if (next_ >= entries_.size()) return S_FALSE;
    const RuntimeEntry& entry = entries_[next_];
    if (!entry.valid) return E_FAIL;
    ++next_;
    *productCode = entry.productCode;
    *versionText = SysAllocStringLen(entry.version.data(), static_cast<UINT>(entry.version.size()));
    *detailText = SysAllocStringLen(entry.detail.data(), static_cast<UINT>(entry.detail.size()));
    return S_OK;
  }

 protected:
  const IID& InterfaceId() const override { return IID_ISuiteRuntimeEnumerator; }

 private:
  std::vector<RuntimeEntry> entries_;
  size_t next_ = 0;
};

class RuntimeInfo : public ComObject<ISuiteRuntimeInfo> {
 public:
  HRESULT STDMETHODCALLTYPE GetEnumerator(ISuiteRuntimeEnumerator** enumerator) override {
    if (enumerator == nullptr) return E_POINTER;
    *enumerator = new RuntimeEnumerator();
    return S_OK;
  }

 protected:
  const IID& InterfaceId() const override { return IID_ISuiteRuntimeInfo; }
};

}  // namespace

BOOL WINAPI DllMain(HINSTANCE module, DWORD reason, LPVOID) {
  if (reason == DLL_PROCESS_ATTACH) {
    inproc_server::g_module = module;
    DisableThreadLibraryCalls(module);
  }
  return TRUE;
}

STDAPI DllGetClassObject(REFCLSID rclsid, REFIID riid, LPVOID* object) {
  return inproc_server::GetClassObject<RuntimeInfo>(CLSID_SuiteRuntimeInfo, rclsid, riid, object);
}

STDAPI DllCanUnloadNow() { return inproc_server::CanUnloadNow(); }

STDAPI DllRegisterServer() {
  return inproc_server::RegisterServer(CLSID_SuiteRuntimeInfo, L"Suite runtime information (stand-in)");
}

STDAPI DllUnregisterServer() { return inproc_server::UnregisterServer(CLSID_SuiteRuntimeInfo); }
