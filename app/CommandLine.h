// The console's command line: "/Lang <decimal LANGID>" (or "-lang ...") forces the display
// language for this run.
#pragma once

#include "framework/App.h"

class CMDACommandLineInfo : public CCommandLineInfo {
 public:
  void ParseParam(const wchar_t* param, BOOL isFlag, BOOL isLast) override;
  // The display language forced for this run: true, with its LANGID, once Lang has had a value.
  bool LanguageOverride(unsigned short& langId) const;

  CString m_strLang;  // the text given after "Lang"; empty when the option was not given
  int m_nExpect = 0;  // what the next plain argument is: 0 nothing, 1 the Lang value
};

// The LANGID a Lang value stands for: a decimal number (leading blanks and a sign allowed, read
// up to the first non-digit, 0 when there is no number), cut to its low 16 bits.
unsigned short LangIdFromText(const CString& text);
