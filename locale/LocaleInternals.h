// Operations of KVELLocale that the suite's own code uses but that are not exported.
#pragma once

#include "locale/KVELLocale.h"

namespace KVELLocale {

// Sizes of the fixed text fields of the locale state, in wide characters.
constexpr int kLocaleNameChars = 85;
constexpr int kLocalePathChars = MAX_PATH;

constexpr LANGID kEnglishUS = MAKELANGID(LANG_ENGLISH, SUBLANG_ENGLISH_US);
constexpr LANGID kEnglishNeutral = MAKELANGID(LANG_ENGLISH, SUBLANG_NEUTRAL);

// The process-wide locale record: zero at load, filled once by InitLocale, never freed.
// Exported string results point into it.
struct LocaleState {
  unsigned short langId;
  unsigned short countryId;
  wchar_t langName[kLocaleNameChars];
  wchar_t countryName[kLocaleNameChars];
  wchar_t langDir[kLocalePathChars];         // kept for callers outside the library
  wchar_t langCountryDir[kLocalePathChars];  // likewise
  unsigned short uiLangId;
  unsigned short uiCountryId;
  wchar_t uiLangName[kLocaleNameChars];
  wchar_t uiCountryName[kLocaleNameChars];
  wchar_t uiLangDir[kLocalePathChars];
  wchar_t uiLangCountryDir[kLocalePathChars];
  bool overridePending;
  bool rtlLanguageKnown, rtlLanguage;
  bool rtlKnown, rtl;
};

extern LocaleState g_localeState;

// Computes the process-wide state once; later calls return at once.
void InitLocale();
// Decides the UI language and its language-pack folders (part of InitLocale).
void InitUILocale();
// The UI language from the stored choice or the user's default; sets the thread's UI language.
LANGID DetermineUILangID();
// The stored UI language choice (UILANGID, or Q4-UILANGID for q4.exe); 0 when there is none.
LANGID ReadStoredUILangID();
// True when some supported system locale shares the primary language of langId.
bool IsValidLangID(unsigned short langId);
// Maps a language-pack folder name ("de" -> 0x0007, "de-DE" -> 0x0407) to a LANGID: the first
// supported locale in the system's order that the name names. langId is 0 unless one does.
bool GetLangIDFromName(const wchar_t* name, unsigned short& langId);
// <Common Files>\Mapora, where language packs and help live; "" when the shell folder is
// unknown, which leaves the folders below it relative.
void GetSuiteFolder(wchar_t (&folder)[kLocalePathChars]);
// Reads a value of HKCU\Software\KVEL (read-only) into buffer; false when it cannot be read
// or does not fit.
bool QuerySettingsValue(const wchar_t* valueName, void* buffer, DWORD size);
// A right-to-left switch under HKCU\Software\KVEL: false for left-to-right UI languages,
// otherwise true unless the value reads "false"; defaultValue when it cannot be read.
bool ReadRTLSetting(const wchar_t* valueName, bool defaultValue);

// Calls the HTML Help control's HtmlHelpW; null when the control cannot be loaded.
HWND CallHtmlHelp(HWND window, const wchar_t* file, UINT command, DWORD_PTR data);

}  // namespace KVELLocale
