// The suite's portal connection manager: a COM component that lists and edits the user's
// connections to portals. The console only opens its window.
//
// Identifiers (ours; the component registers under them):
//   class     PortalConnectionManager    {9A1D3B36-B085-4005-9041-9D70EC893EC8} (default)
//   interface IPortalConnectionManager   {C8DE60F2-4D0B-480B-AB97-7A3539458E9E} (main)
//   interface IPortalConnectionsWindow   {E48B19EB-A104-44A9-9398-3A080904AA18} (second)
//
// The class to create may be replaced, for a workstation with another implementation, by the
// REG_SZ value (braced GUID text)
//   HKEY_LOCAL_MACHINE\SOFTWARE\KVEL\Mapora Connection\Settings  "Portal Manager Class"
// A missing or unparsable value gives the default class above.
//
// The component may live in any server context, so it is created for IUnknown with CLSCTX_ALL,
// run with OleRun and only then asked for its main interface. The stand-in in
// standins/portal-manager (PortalManager.dll, in-process, apartment threaded, registered by
// regsvr32) serves both interfaces; its window is a plain "Portal Connections" box.
#pragma once

#include <windows.h>
#include <unknwn.h>

#include "settings/SettingsRegistry.h"

inline constexpr CLSID CLSID_PortalConnectionManager = {
    0x9a1d3b36, 0xb085, 0x4005, {0x90, 0x41, 0x9d, 0x70, 0xec, 0x89, 0x3e, 0xc8}};
inline constexpr IID IID_IPortalConnectionManager = {
    0xc8de60f2, 0x4d0b, 0x480b, {0xab, 0x97, 0x7a, 0x35, 0x39, 0x45, 0x8e, 0x9e}};
inline constexpr IID IID_IPortalConnectionsWindow = {
    0xe48b19eb, 0xa104, 0x44a9, {0x93, 0x98, 0x3a, 0x08, 0x09, 0x04, 0xaa, 0x18}};

struct IPortalConnectionManager : public IUnknown {
  // How many portal connections the user has.
  virtual HRESULT STDMETHODCALLTYPE GetConnectionCount(long* count) = 0;
};

struct IPortalConnectionsWindow : public IUnknown {
  // Shows the connections window modally over the caller's active window.
  virtual HRESULT STDMETHODCALLTYPE ShowConnections() = 0;
};

// The class the console creates: the configured one, else CLSID_PortalConnectionManager.
CLSID GetPortalConnectionManagerClass();

// Creates the manager and shows its window. A creation failure other than E_NOINTERFACE is
// raised as ComError; a manager without the main or the window interface shows nothing.
void OpenPortalConnectionManager();
