// Helpers of the locale library's tests: scenario selection, resource libraries, child runs.
#pragma once

#include <gtest/gtest.h>
#include <process.h>

#include <cstdlib>
#include <string>

#include "locale/LocaleInternals.h"
#include "tests/support/TestSupport.h"

namespace locale_tests {

using namespace testing_support;

// A scenario needs the locale state untouched and the process started in its language; in a
// run of every test in one process, all but the first matching scenario skip.
inline bool FreshProcessIn(LANGID language) {
  const KVELLocale::LocaleState& s = KVELLocale::g_localeState;
  return s.langId == 0 && s.uiLangId == 0 && GetUserDefaultUILanguage() == language;
}

inline std::string Variant() {
  const char* value = std::getenv("LOCALE_VARIANT");
  return value ? value : "";
}

// The file a module was loaded from; "" for null.
inline std::wstring ModulePath(HMODULE module) {
  wchar_t path[MAX_PATH] = L"";
  if (module) GetModuleFileNameW(module, path, MAX_PATH);
  return path;
}

// A copy of the test's resource-only library at folder\name; returns its path.
inline std::wstring PutResLibrary(const std::wstring& folder, const std::wstring& name) {
  std::wstring path = folder + L"\\" + name;
  EXPECT_TRUE(CopyFileTo(ModuleFolder() + L"\\locale_test_res.dll", path));
  return path;
}

// Runs the LocaleChild tests in a copy of this program at copyPath; returns its exit code.
inline intptr_t RunChildCopy(const std::wstring& copyPath) {
  if (!CopyFileTo(ModulePath(GetModuleHandleW(nullptr)), copyPath)) return -1;
  std::wstring quoted = L"\"" + copyPath + L"\"";
  return _wspawnl(_P_WAIT, copyPath.c_str(), quoted.c_str(), L"--gtest_filter=LocaleChild.*",
                  nullptr);
}

}  // namespace locale_tests

#define SKIP_UNLESS_FRESH_PROCESS_IN(language) \
  if (!locale_tests::FreshProcessIn(language)) GTEST_SKIP() << "needs a process of its own"
