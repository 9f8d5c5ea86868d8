// Stand-in for the suite's runtime-information component: an in-process COM server that lists
// the runtimes written in the registry (format in inventory/SuiteRuntimeEnumerator.h).
#include <windows.h>
#include <ole2.h>
#include <olectl.h>

#include <cwchar>
#include <string>
#include <vector>

#include "inventory/SuiteRuntimeEnumerator.h"

namespace {

HMODULE g_module = nullptr;
LONG g_liveObjects = 0;
LONG g_serverLocks = 0;

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
class ComObject : public Interface {
 public:
  ComObject() { InterlockedIncrement(&g_liveObjects); }
  virtual ~ComObject() { InterlockedDecrement(&g_liveObjects); }
  ComObject(const ComObject&) = delete;
  ComObject& operator=(const ComObject&) = delete;

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

// The one class factory lives as long as the module; its references do not keep it alive.
class RuntimeInfoFactory : public IClassFactory {
 public:
  HRESULT STDMETHODCALLTYPE QueryInterface(REFIID riid, void** object) override {
    if (object == nullptr) return E_POINTER;
    *object = nullptr;
    if (!IsEqualIID(riid, IID_IUnknown) && !IsEqualIID(riid, IID_IClassFactory)) return E_NOINTERFACE;
    *object = static_cast<IClassFactory*>(this);
    return S_OK;
  }
  ULONG STDMETHODCALLTYPE AddRef() override { return 2; }
  ULONG STDMETHODCALLTYPE Release() override { return 1; }

  HRESULT STDMETHODCALLTYPE CreateInstance(IUnknown* outer, REFIID riid, void** object) override {
    if (object == nullptr) return E_POINTER;
    *object = nullptr;
    if (outer != nullptr) return CLASS_E_NOAGGREGATION;
    RuntimeInfo* info = new RuntimeInfo();
    HRESULT hr = info->QueryInterface(riid, object);
    info->Release();
    return hr;
  }
  HRESULT STDMETHODCALLTYPE LockServer(BOOL lock) override {
    if (lock)
      InterlockedIncrement(&g_serverLocks);
    else
      InterlockedDecrement(&g_serverLocks);
    return S_OK;
  }
};

RuntimeInfoFactory g_factory;

std::wstring ClassKeyPath() {
  wchar_t clsid[40] = L"";
  StringFromGUID2(CLSID_SuiteRuntimeInfo, clsid, 40);
  return std::wstring(L"CLSID\\") + clsid;
}

LONG SetStringValue(HKEY key, const wchar_t* name, const std::wstring& value) {
  return RegSetValueExW(key, name, 0, REG_SZ, reinterpret_cast<const BYTE*>(value.c_str()),
                        static_cast<DWORD>((value.size() + 1) * sizeof(wchar_t)));
}

}  // namespace

BOOL WINAPI DllMain(HINSTANCE module, DWORD reason, LPVOID) {
  if (reason == DLL_PROCESS_ATTACH) {
    g_module = module;
    DisableThreadLibraryCalls(module);
  }
  return TRUE;
}

STDAPI DllGetClassObject(REFCLSID rclsid, REFIID riid, LPVOID* object) {
  if (object == nullptr) return E_POINTER;
  *object = nullptr;
  if (!IsEqualCLSID(rclsid, CLSID_SuiteRuntimeInfo)) return CLASS_E_CLASSNOTAVAILABLE;
  return g_factory.QueryInterface(riid, object);
}

STDAPI DllCanUnloadNow() { return g_liveObjects == 0 && g_serverLocks == 0 ? S_OK : S_FALSE; }

STDAPI DllRegisterServer() {
  wchar_t path[MAX_PATH] = L"";
  DWORD length = GetModuleFileNameW(g_module, path, MAX_PATH);
  if (length == 0 || length >= MAX_PATH) return SELFREG_E_CLASS;

  const std::wstring classKey = ClassKeyPath();
  HKEY key = nullptr;
  if (RegCreateKeyExW(HKEY_CLASSES_ROOT, (classKey + L"\\InprocServer32").c_str(), 0, nullptr, 0, KEY_SET_VALUE,
                      nullptr, &key, nullptr) != ERROR_SUCCESS)
    return SELFREG_E_CLASS;
  LONG status = SetStringValue(key, nullptr, path);
  if (status == ERROR_SUCCESS) status = SetStringValue(key, L"ThreadingModel", L"Apartment");
  RegCloseKey(key);
  if (status == ERROR_SUCCESS &&
      RegOpenKeyExW(HKEY_CLASSES_ROOT, classKey.c_str(), 0, KEY_SET_VALUE, &key) == ERROR_SUCCESS) {
    status = SetStringValue(key, nullptr, L"Suite runtime information (stand-in)");
    RegCloseKey(key);
  }
  if (status != ERROR_SUCCESS) {
    RegDeleteTreeW(HKEY_CLASSES_ROOT, classKey.c_str());
    return SELFREG_E_CLASS;
  }
  return S_OK;
}

STDAPI DllUnregisterServer() {
  LONG status = RegDeleteTreeW(HKEY_CLASSES_ROOT, ClassKeyPath().c_str());
  return status == ERROR_SUCCESS || status == ERROR_FILE_NOT_FOUND ? S_OK : SELFREG_E_CLASS;
}
