// Right-to-left switches: the UI language's script and the user's RTL, RTLUI and TABLERTL values.
#include "locale/LocaleInternals.h"
#include "locale/LocaleNameCatalog.h"
#include "locale/SuiteUserSettings.h"

#include <cstring>

namespace KVELLocale {

namespace {

LocaleState& s = g_localeState;

// Bit 123 of the Unicode subset bitfield marks a right-to-left script.
bool FontSignatureIsRightToLeft(LCID locale) {
  // The signature is 16 characters of binary data, not text.
  std::wstring signature;
  if (!ReadLocaleInfo(locale, LOCALE_FONTSIGNATURE, 16, signature)) return false;
  DWORD usb[4] = {};  // the Unicode subset bitfield opens the signature
  signature.resize(16, L'\0');
  static_assert(sizeof usb <= 16 * sizeof(wchar_t), "the bitfield lies within the signature");
  std::memcpy(usb, signature.data(), sizeof usb);
  return (usb[3] & (1UL << 27)) != 0;
}

}  // namespace

bool ReadRTLSetting(const wchar_t* valueName, bool defaultValue) {
  if (!IsRightToLeftLanguage()) return false;
  // 260 bytes of whatever type the value has, plus a terminator that the data may lack.
  constexpr DWORD kValueBytes = 260;
  wchar_t text[kValueBytes / sizeof(wchar_t) + 1] = {};
  if (!QuerySettingsValue(valueName, text, kValueBytes)) return defaultValue;
  return lstrcmpiW(text, L"false") != 0;
}

KVEL_LOCALE_API bool IsRightToLeftLanguage() {
  InitLocale();
  if (!s.rtlLanguageKnown) {
    s.rtlLanguage = FontSignatureIsRightToLeft(GetUILocale());
    s.rtlLanguageKnown = true;
  }
  return s.rtlLanguage;
}

KVEL_LOCALE_API bool IsRightToLeft() {
  InitLocale();
  if (!s.rtlKnown) {
    s.rtl = ReadRTLSetting(kRtlValue, true);
    s.rtlKnown = true;
  }
  return s.rtl;
}

KVEL_LOCALE_API bool IsRightToLeftUI() { return IsRightToLeft() && ReadRTLSetting(kRtlUIValue, true); }

// Tables stay left to right unless asked for, unlike the rest of the layout.
KVEL_LOCALE_API bool IsTableRightToLeft() {
  return IsRightToLeft() && ReadRTLSetting(kTableRtlValue, false);
}

KVEL_LOCALE_API wchar_t GetLeftToRightMark() { return L'\x200E'; }

}  // namespace KVELLocale
