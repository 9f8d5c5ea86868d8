// KVELLocale: the suite's locale and help library. Every suite executable links it and exports
// these operations, so that the controls and libraries it loads share one locale decision.
//
// The state behind these operations is process-wide, computed once on first use and never
// recomputed; none of it is thread-safe. Returned strings point into that state and live as long
// as the process; callers never free them. A returned module handle belongs to the caller.
#pragma once

#include <windows.h>

#include <string>

#if defined(KVEL_LOCALE_BUILD)
#define KVEL_LOCALE_API __declspec(dllexport)
#else
#define KVEL_LOCALE_API __declspec(dllimport)
#endif

namespace KVELLocale {

// User (data) locale.
KVEL_LOCALE_API unsigned short GetLangID();
KVEL_LOCALE_API unsigned short GetCountryID();
KVEL_LOCALE_API unsigned short GetLocale();
KVEL_LOCALE_API const wchar_t* GetLangIDString();
KVEL_LOCALE_API const wchar_t* GetCountryIDString();

// User-interface language.
KVEL_LOCALE_API unsigned short GetUILangID();
KVEL_LOCALE_API unsigned short GetUICountryID();
KVEL_LOCALE_API unsigned short GetUILocale();
KVEL_LOCALE_API const wchar_t* GetUILangIDString();
KVEL_LOCALE_API const wchar_t* GetUICountryIDString();

// Right-to-left switches.
KVEL_LOCALE_API bool IsRightToLeftLanguage();
KVEL_LOCALE_API bool IsRightToLeft();
KVEL_LOCALE_API bool IsRightToLeftUI();
KVEL_LOCALE_API bool IsTableRightToLeft();
KVEL_LOCALE_API wchar_t GetLeftToRightMark();

// Setters that push the chosen locale into the C runtime and the calling thread.
KVEL_LOCALE_API void SetLocale(int category);
KVEL_LOCALE_API void SetThreadLocale();
KVEL_LOCALE_API void SetThreadUILocale();

// Forces the UI language; only effective before anything has determined it.
KVEL_LOCALE_API bool SetupEXEOverRide(unsigned short langId);

// Localized resource library ("Res" + module file name, in the UI language's pack folder).
KVEL_LOCALE_API HINSTANCE LoadLocalizedRes(HINSTANCE module);
KVEL_LOCALE_API HINSTANCE LoadLocalizedResFromFile(const wchar_t* fileName);

// Localized help. Command and data go to the system's help call untouched; data is pointer-sized
// because the topic text travels in it.
KVEL_LOCALE_API const wchar_t* GetLocaleHelpFile(const wchar_t* helpReference, std::wstring& result,
                                                 const wchar_t* defaultExt);
KVEL_LOCALE_API HWND KVEL_HtmlHelp(HWND window, const wchar_t* helpReference, UINT command,
                                   DWORD_PTR data);
KVEL_LOCALE_API HWND KVEL_HtmlHelp(HWND window, UINT command, DWORD_PTR data);
KVEL_LOCALE_API BOOL KVEL_WinHelp(HWND window, const wchar_t* helpReference, UINT command,
                                  ULONG_PTR data);

}  // namespace KVELLocale
