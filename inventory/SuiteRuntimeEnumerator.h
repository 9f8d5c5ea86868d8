// The suite's runtime-information component: a COM object, installed with the suite, that lists
// the suite runtimes present on the workstation. The console only consumes it; where it is not
// registered, detection simply does without it.
//
// Identifiers (ours; the component registers under them):
//   class     SuiteRuntimeInfo            {FCF2C989-22CC-434D-B739-606620863616}
//   interface ISuiteRuntimeInfo           {6FAE15CA-1492-4F0B-87E5-FE6CE6B97374}
//   interface ISuiteRuntimeEnumerator     {2F8389F9-DEAC-4EDF-88CC-12273CC4C922}
//
// The component is an in-process server (its interfaces have no proxies), so the console asks
// for CLSCTX_INPROC_SERVER only.
// Use: CoCreateInstance(CLSID_SuiteRuntimeInfo), OleRun, ISuiteRuntimeInfo::GetEnumerator, then
// Reset and Next until Next reports S_FALSE (no more items) or fails.
//
// The stand-in server in standins/runtime-info (SuiteRuntimeInfo.dll, an in-process server with
// the apartment threading model, registered by regsvr32) serves this interface on workstations
// without the suite. It lists the runtimes written in the REG_MULTI_SZ value
//   HKEY_LOCAL_MACHINE\SOFTWARE\KVEL\RuntimeInfo  "Runtimes"
// one runtime per string, in order: "<product code> <version text> [<detail text>]", fields
// separated by blanks, for example "1 10.5 Desktop runtime" or "2 10.5". A string that does not
// start with a decimal product code stands for a damaged entry: Next fails when it reaches it.
// Reset reads the list again.
#pragma once

#include <windows.h>
#include <oleauto.h>

#include "framework/ComRef.h"

// Product codes that Next reports.
enum SuiteRuntimeProduct : long { kSuiteRuntimeDesktop = 1, kSuiteRuntimeEngine = 2 };

// Where the stand-in server keeps its list.
inline constexpr wchar_t kSuiteRuntimeListKey[] = L"SOFTWARE\\KVEL\\RuntimeInfo";
inline constexpr wchar_t kSuiteRuntimeListValue[] = L"Runtimes";

inline constexpr CLSID CLSID_SuiteRuntimeInfo = {
    0xfcf2c989, 0x22cc, 0x434d, {0xb7, 0x39, 0x60, 0x66, 0x20, 0x86, 0x36, 0x16}};
inline constexpr IID IID_ISuiteRuntimeInfo = {
    0x6fae15ca, 0x1492, 0x4f0b, {0x87, 0xe5, 0xfe, 0x6c, 0xe6, 0xb9, 0x73, 0x74}};
inline constexpr IID IID_ISuiteRuntimeEnumerator = {
    0x2f8389f9, 0xdeac, 0x4edf, {0x88, 0xcc, 0x12, 0x27, 0x3c, 0xc4, 0xc9, 0x22}};

struct ISuiteRuntimeEnumerator : public IUnknown {
  // Starts the walk again at the first item.
  virtual HRESULT STDMETHODCALLTYPE Reset() = 0;
  // S_OK with one item (the caller frees both texts), S_FALSE when no item is left.
  virtual HRESULT STDMETHODCALLTYPE Next(long* productCode, BSTR* versionText, BSTR* detailText) = 0;
};

struct ISuiteRuntimeInfo : public IUnknown {
  virtual HRESULT STDMETHODCALLTYPE GetEnumerator(ISuiteRuntimeEnumerator** enumerator) = 0;
};
