#include "app/CommandLine.h"

#include <cwchar>

namespace {

enum Expect { kExpectNothing = 0, kExpectLang = 1 };

// Option names compare without regard to ASCII letter case only, whatever the user's locale.
bool EqualsIgnoringAsciiCase(const wchar_t* text, const wchar_t* name) {
  auto lower = [](wchar_t c) { return (c >= L'A' && c <= L'Z') ? static_cast<wchar_t>(c - L'A' + L'a') : c; };
  for (; *text != L'\0' && *name != L'\0'; ++text, ++name)
    if (lower(*text) != lower(*name)) return false;
  return *text == L'\0' && *name == L'\0';
}

}  // namespace

void CMDACommandLineInfo::ParseParam(const wchar_t* param, BOOL isFlag, BOOL) {
  if (param == nullptr) param = L"";
  if (isFlag) {
    if (!EqualsIgnoringAsciiCase(param, L"Lang")) {
      m_nExpect = kExpectNothing;
      return;
    }
    m_nExpect = kExpectLang;
  } else {
    if (m_nExpect != kExpectLang) {
      m_nExpect = kExpectNothing;
      return;
    }
    // The state stays "expect Lang", so a later plain argument overwrites this one.
    m_strLang = param;
  }
}

bool CMDACommandLineInfo::LanguageOverride(unsigned short& langId) const {
  if (m_strLang.empty()) return false;
  langId = LangIdFromText(m_strLang);
  return true;
}

unsigned short LangIdFromText(const CString& text) {
  long value = std::wcstol(text.c_str(), nullptr, 10);
  return static_cast<unsigned short>(static_cast<unsigned long>(value) & 0xFFFFu);
}
