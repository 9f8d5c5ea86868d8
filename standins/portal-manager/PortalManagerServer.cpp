// Stand-in for the suite's portal connection manager: an in-process COM server whose window
// tells the user that no portal connections exist (identifiers in
// settings/PortalConnectionManager.h).
#include <windows.h>
#include <ole2.h>
#include <olectl.h>

#include <string>

#include "PortalManagerResource.h"
#include "settings/PortalConnectionManager.h"

namespace {

HMODULE g_module = nullptr;
LONG g_liveObjects = 0;
LONG g_serverLocks = 0;

std::wstring LoadText(UINT id) {
  const wchar_t* text = nullptr;
  int length = LoadStringW(g_module, id, reinterpret_cast<LPWSTR>(&text), 0);
  return length > 0 && text != nullptr ? std::wstring(text, static_cast<size_t>(length)) : std::wstring();
}

class PortalManager final : public IPortalConnectionManager, public IPortalConnectionsWindow {
 public:
  PortalManager() { InterlockedIncrement(&g_liveObjects); }
  ~PortalManager() { InterlockedDecrement(&g_liveObjects); }
  PortalManager(const PortalManager&) = delete;
  PortalManager& operator=(const PortalManager&) = delete;

  HRESULT STDMETHODCALLTYPE QueryInterface(REFIID riid, void** object) override {
    if (object == nullptr) return E_POINTER;
    *object = nullptr;
    if (IsEqualIID(riid, IID_IUnknown) || IsEqualIID(riid, IID_IPortalConnectionManager))
      *object = static_cast<IPortalConnectionManager*>(this);
    else if (IsEqualIID(riid, IID_IPortalConnectionsWindow))
      *object = static_cast<IPortalConnectionsWindow*>(this);
    else
      return E_NOINTERFACE;
    AddRef();
    return S_OK;
  }
  ULONG STDMETHODCALLTYPE AddRef() override { return static_cast<ULONG>(InterlockedIncrement(&refs_)); }
  ULONG STDMETHODCALLTYPE Release() override {
    LONG left = InterlockedDecrement(&refs_);
    if (left == 0) delete this;
    return static_cast<ULONG>(left);
  }

  HRESULT STDMETHODCALLTYPE GetConnectionCount(long* count) override {
    if (count == nullptr) return E_POINTER;
    *count = 0;
    return S_OK;
  }

  HRESULT STDMETHODCALLTYPE ShowConnections() override {
    MessageBoxW(GetActiveWindow(), LoadText(IDS_PORTAL_CONNECTIONS_NONE).c_str(),
                LoadText(IDS_PORTAL_CONNECTIONS_TITLE).c_str(), MB_OK | MB_ICONINFORMATION);
    return S_OK;
  }

 private:
  LONG refs_ = 1;
};

class ClassFactory final : public IClassFactory {
 public:
  HRESULT STDMETHODCALLTYPE QueryInterface(REFIID riid, void** object) override {
    if (object == nullptr) return E_POINTER;
    if (IsEqualIID(riid, IID_IUnknown) || IsEqualIID(riid, IID_IClassFactory)) {
      *object = static_cast<IClassFactory*>(this);
      return S_OK;
    }
    *object = nullptr;
    return E_NOINTERFACE;
  }
  // One static factory for the life of the module.
  ULONG STDMETHODCALLTYPE AddRef() override { return 2; }
  ULONG STDMETHODCALLTYPE Release() override { return 1; }

  HRESULT STDMETHODCALLTYPE CreateInstance(IUnknown* outer, REFIID riid, void** object) override {
    if (object == nullptr) return E_POINTER;
    *object = nullptr;
    if (outer != nullptr) return CLASS_E_NOAGGREGATION;
    PortalManager* manager = new PortalManager;
    HRESULT hr = manager->QueryInterface(riid, object);
    manager->Release();
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

ClassFactory g_factory;

std::wstring ClassKeyPath() {
  wchar_t clsid[64] = L"";
  StringFromGUID2(CLSID_PortalConnectionManager, clsid, 64);
  return std::wstring(L"CLSID\\") + clsid;
}

bool SetString(HKEY root, const std::wstring& path, const wchar_t* name, const std::wstring& value) {
  HKEY key = nullptr;
  if (RegCreateKeyExW(root, path.c_str(), 0, nullptr, 0, KEY_SET_VALUE, nullptr, &key, nullptr) != ERROR_SUCCESS)
    return false;
  LONG result = RegSetValueExW(key, name, 0, REG_SZ, reinterpret_cast<const BYTE*>(value.c_str()),
                               static_cast<DWORD>((value.size() + 1) * sizeof(wchar_t)));
  RegCloseKey(key);
  return result == ERROR_SUCCESS;
}

}  // namespace

BOOL WINAPI DllMain(HINSTANCE instance, DWORD reason, LPVOID) {
  if (reason == DLL_PROCESS_ATTACH) {
    g_module = instance;
    DisableThreadLibraryCalls(instance);
  }
  return TRUE;
}

extern "C" HRESULT STDAPICALLTYPE DllGetClassObject(REFCLSID clsid, REFIID riid, void** object) {
  if (object == nullptr) return E_POINTER;
  *object = nullptr;
  if (!IsEqualCLSID(clsid, CLSID_PortalConnectionManager)) return CLASS_E_CLASSNOTAVAILABLE;
  return g_factory.QueryInterface(riid, object);
}

extern "C" HRESULT STDAPICALLTYPE DllCanUnloadNow() {
  return g_liveObjects == 0 && g_serverLocks == 0 ? S_OK : S_FALSE;
}

extern "C" HRESULT STDAPICALLTYPE DllRegisterServer() {
  wchar_t path[MAX_PATH] = L"";
  DWORD length = GetModuleFileNameW(g_module, path, MAX_PATH);
  if (length == 0 || length >= MAX_PATH) return SELFREG_E_CLASS;
  const std::wstring classKey = ClassKeyPath();
  const std::wstring server = classKey + L"\\InprocServer32";
  bool ok = SetString(HKEY_CLASSES_ROOT, classKey, nullptr, L"Portal Connection Manager") &&
            SetString(HKEY_CLASSES_ROOT, server, nullptr, path) &&
            SetString(HKEY_CLASSES_ROOT, server, L"ThreadingModel", L"Apartment");
  return ok ? S_OK : SELFREG_E_CLASS;
}

extern "C" HRESULT STDAPICALLTYPE DllUnregisterServer() {
  LONG result = RegDeleteTreeW(HKEY_CLASSES_ROOT, ClassKeyPath().c_str());
  return result == ERROR_SUCCESS || result == ERROR_FILE_NOT_FOUND ? S_OK : SELFREG_E_CLASS;
}
