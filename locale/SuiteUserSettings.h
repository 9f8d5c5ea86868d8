// The per-user suite settings key, shared by every suite application: the locale library reads
// the display language and the right-to-left switches from it, the console writes the display
// language. Every other layer takes these names from here.
#pragma once

// HKEY_CURRENT_USER.
inline constexpr wchar_t kSuiteUserKey[] = L"Software\\KVEL";
// REG_DWORD, a LANGID in the low 16 bits: the chosen display language. Absent means "follow the
// Windows language", 9 means English; it is never stored as 0.
inline constexpr wchar_t kUILangIDValue[] = L"UILANGID";
// The same choice for q4.exe, which keeps its own.
inline constexpr wchar_t kQ4UILangIDValue[] = L"Q4-UILANGID";
// Right-to-left switches (strings; "false" in any letter case turns a switch off).
inline constexpr wchar_t kRtlValue[] = L"RTL";
inline constexpr wchar_t kRtlUIValue[] = L"RTLUI";
inline constexpr wchar_t kTableRtlValue[] = L"TABLERTL";
