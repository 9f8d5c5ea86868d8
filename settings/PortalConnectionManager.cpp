#include "settings/PortalConnectionManager.h"

#include <objbase.h>
#include <ole2.h>

#include "framework/App.h"
#include "framework/ComRef.h"
#include "inventory/InstalledProducts.h"
#include "settings/URLTokenManager.h"

namespace {

// The object is created for IUnknown and run first: a local or remote server may need that
// before it answers for its main interface.
HRESULT CreatePortalManager(const CLSID& clsid, ComRef<IPortalConnectionManager>& manager) {
  ComRef<IUnknown> unknown;
  HRESULT hr = CoCreateInstance(clsid, nullptr, CLSCTX_ALL, IID_IUnknown, unknown.ReceiveVoid());
  if (FAILED(hr)) return hr;
  hr = OleRun(unknown.Get());
  if (FAILED(hr)) return hr;
  return unknown->QueryInterface(IID_IPortalConnectionManager, manager.ReceiveVoid());
}

}  // namespace

CLSID GetPortalConnectionManagerClass() {
  std::wstring text = ReadRegistryString(HKEY_LOCAL_MACHINE, kPortalMachineSettingsKey, kPortalManagerClassValue, L"");
  CLSID clsid = CLSID_PortalConnectionManager;
  if (!text.empty() && SUCCEEDED(CLSIDFromString(text.c_str(), &clsid))) return clsid;
  return CLSID_PortalConnectionManager;
}

void OpenPortalConnectionManager() {
  ComRef<IPortalConnectionManager> manager;
  HRESULT hr = CreatePortalManager(GetPortalConnectionManagerClass(), manager);
  if (FAILED(hr) && hr != E_NOINTERFACE) throw ComError(hr);
  if (!manager) return;
  ComRef<IPortalConnectionsWindow> window;
  if (SUCCEEDED(manager->QueryInterface(IID_IPortalConnectionsWindow, window.ReceiveVoid())) && window)
    window->ShowConnections();
}
