// The parts every in-process COM stand-in server repeats: the module's object and lock counts,
// a class factory for its one class, and self-registration under HKEY_CLASSES_ROOT\CLSID.
// A server defines DllMain storing its module in inproc_server::g_module and forwards its
// DllGetClassObject / DllCanUnloadNow / DllRegisterServer / DllUnregisterServer here.
#pragma once

#include <windows.h>
#include <ole2.h>
#include <olectl.h>

#include <string>

namespace inproc_server {

inline HMODULE g_module = nullptr;
inline LONG g_liveObjects = 0;
inline LONG g_serverLocks = 0;

// Counts a live object of the server for DllCanUnloadNow.
struct LiveObject {
  LiveObject() { InterlockedIncrement(&g_liveObjects); }
  ~LiveObject() { InterlockedDecrement(&g_liveObjects); }
  LiveObject(const LiveObject&) = delete;
  LiveObject& operator=(const LiveObject&) = delete;
};

// The one class factory lives as long as the module; its references do not keep it alive.
// Object is created with one reference and answers QueryInterface.
template <class Object>
class ClassFactory final : public IClassFactory {
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
    Object* created = new Object();
    HRESULT hr = created->QueryInterface(riid, object);
    created->Release();
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

template <class Object>
HRESULT GetClassObject(const CLSID& served, REFCLSID requested, REFIID riid, void** object) {
  static ClassFactory<Object> factory;
  if (object == nullptr) return E_POINTER;
  *object = nullptr;
  if (!IsEqualCLSID(requested, served)) return CLASS_E_CLASSNOTAVAILABLE;
  return factory.QueryInterface(riid, object);
}

inline HRESULT CanUnloadNow() { return g_liveObjects == 0 && g_serverLocks == 0 ? S_OK : S_FALSE; }

inline std::wstring ClassKeyPath(const CLSID& clsid) {
  wchar_t text[40] = L"";
  StringFromGUID2(clsid, text, 40);
  return std::wstring(L"CLSID\\") + text;
}

// Registers the module as the apartment-threaded in-process server of clsid; a partial
// registration is removed again.
inline HRESULT RegisterServer(const CLSID& clsid, const wchar_t* description) {
  wchar_t path[MAX_PATH] = L"";
  DWORD length = GetModuleFileNameW(g_module, path, MAX_PATH);
  if (length == 0 || length >= MAX_PATH) return SELFREG_E_CLASS;
  const std::wstring classKey = ClassKeyPath(clsid);
  auto set = [](const std::wstring& keyPath, const wchar_t* name, const std::wstring& value) {
    HKEY key = nullptr;
    if (RegCreateKeyExW(HKEY_CLASSES_ROOT, keyPath.c_str(), 0, nullptr, 0, KEY_SET_VALUE, nullptr, &key, nullptr) !=
        ERROR_SUCCESS)
      return false;
    LONG status = RegSetValueExW(key, name, 0, REG_SZ, reinterpret_cast<const BYTE*>(value.c_str()),
                                 static_cast<DWORD>((value.size() + 1) * sizeof(wchar_t)));
    RegCloseKey(key);
    return status == ERROR_SUCCESS;
  };
  if (set(classKey, nullptr, description) && set(classKey + L"\\InprocServer32", nullptr, path) &&
      set(classKey + L"\\InprocServer32", L"ThreadingModel", L"Apartment"))
    return S_OK;
  RegDeleteTreeW(HKEY_CLASSES_ROOT, classKey.c_str());
  return SELFREG_E_CLASS;
}

inline HRESULT UnregisterServer(const CLSID& clsid) {
  LONG result = RegDeleteTreeW(HKEY_CLASSES_ROOT, ClassKeyPath(clsid).c_str());
  return result == ERROR_SUCCESS || result == ERROR_FILE_NOT_FOUND ? S_OK : SELFREG_E_CLASS;
}

}  // namespace inproc_server
