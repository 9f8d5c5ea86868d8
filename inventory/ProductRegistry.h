// Where the suite products keep their installation records under HKEY_LOCAL_MACHINE. Every
// layer that names a product key takes it from here.
#pragma once

#include <string>

// The release this console administers.
inline constexpr wchar_t kSuiteRelease[] = L"10.5";

// Product keys carry the release directly after the base, with no separator
// ("SOFTWARE\KVEL\Desktop10.5").
inline constexpr wchar_t kEngineKeyBase[] = L"SOFTWARE\\KVEL\\Engine";
inline constexpr wchar_t kDesktopKeyBase[] = L"SOFTWARE\\KVEL\\Desktop";
inline constexpr wchar_t kServerKeyBase[] = L"SOFTWARE\\KVEL\\Server";
// Skyloft has its own release numbering and installs 64-bit only: its key counts in the 64-bit
// registry view. Any key path naming its release is read through that view.
inline constexpr wchar_t kSkyloftRelease[] = L"Skyloft2016.1";
inline constexpr wchar_t kSkyloftKey[] = L"SOFTWARE\\Kvel\\Skyloft2016.1";
// Skyloft's release-free record; its "Path" value is its installation folder.
inline constexpr wchar_t kSkyloftPathKey[] = L"SOFTWARE\\Skyloft";

// The product key of a release: base + release.
inline std::wstring ProductKey(const wchar_t* base, const std::wstring& release) { return base + release; }
inline std::wstring DesktopKey() { return ProductKey(kDesktopKeyBase, kSuiteRelease); }
