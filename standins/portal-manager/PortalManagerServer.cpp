// Stand-in for the suite's portal connection manager: an in-process COM server whose window
// tells the user that no portal connections exist (identifiers in
// settings/PortalConnectionManager.h).
#include <windows.h>

#include <string>

#include "PortalManagerResource.h"
#include "settings/PortalConnectionManager.h"
#include "standins/InprocServer.h"

namespace {

using inproc_server::g_module;

std::wstring LoadText(UINT id) {
  const wchar_t* text = nullptr;
  int length = LoadStringW(g_module, id, reinterpret_cast<LPWSTR>(&text), 0);
  return length > 0 && text != nullptr ? std::wstring(text, static_cast<size_t>(length)) : std::wstring();
}

class PortalManager final : public IPortalConnectionManager, public IPortalConnectionsWindow {
 public:
  PortalManager() = default;
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
  inproc_server::LiveObject live_;
  LONG refs_ = 1;
};

}  // namespace

BOOL WINAPI DllMain(HINSTANCE instance, DWORD reason, LPVOID) {
  if (reason == DLL_PROCESS_ATTACH) {
    g_module = instance;
    DisableThreadLibraryCalls(instance);
  }
  return TRUE;
}

extern "C" HRESULT STDAPICALLTYPE DllGetClassObject(REFCLSID clsid, REFIID riid, void** object) {
  return inproc_server::GetClassObject<PortalManager>(CLSID_PortalConnectionManager, clsid, riid, object);
}

extern "C" HRESULT STDAPICALLTYPE DllCanUnloadNow() { return inproc_server::CanUnloadNow(); }

extern "C" HRESULT STDAPICALLTYPE DllRegisterServer() {
  return inproc_server::RegisterServer(CLSID_PortalConnectionManager, L"Portal connection manager (stand-in)");
}

extern "C" HRESULT STDAPICALLTYPE DllUnregisterServer() {
  return inproc_server::UnregisterServer(CLSID_PortalConnectionManager);
}

