// What the template and console tests share: where the templates are, which languages they come
// in, and how a key under WOW6432Node relates to the key the code names.
#pragma once

#include <windows.h>

#include <cstddef>
#include <cwchar>
#include <string>
#include <vector>

#include "tests/e2e/ConsoleDriver.h"
#include "tests/policy/PolicyTemplate.h"

namespace policy_tests {

constexpr wchar_t kPolicyNamespace[] = L"http://schemas.microsoft.com/GroupPolicy/2006/07/PolicyDefinitions";
constexpr wchar_t kDisplayLanguagePolicy[] = L"DisplayLanguage";

// pack: the console's language pack the locale is translated as; null for English.
struct TemplateLanguage {
  const wchar_t *locale, *pack;
};
constexpr TemplateLanguage kTemplateLanguages[] = {
    {L"en-US", nullptr}, {L"fr-FR", L"fr"},    {L"de-DE", L"de"}, {L"es-ES", L"es"},
    {L"ja-JP", L"ja"},   {L"zh-CN", L"zh-CN"}, {L"ar-SA", L"ar"},
};

inline std::wstring PolicyFolder() { return e2e::WindowsPath(MAPORA_POLICY_DIR); }
inline policy_template::Element LoadAdmx() { return policy_template::LoadXml(PolicyFolder() + L"\\Mapora.admx"); }
inline policy_template::Element LoadAdml(const std::wstring& locale) {
  return policy_template::LoadXml(PolicyFolder() + L"\\" + locale + L"\\Mapora.adml");
}

// The tags of the language packs the build makes, each in <packs>\<tag>.
inline std::vector<std::wstring> PackTags() {
  const std::string list = MAPORA_PACK_TAGS;  // comma-separated
  std::vector<std::wstring> tags;
  for (size_t start = 0, end = 0; start <= list.size(); start = end + 1) {
    end = list.find(',', start);
    if (end == std::string::npos) end = list.size();
    if (end > start) tags.emplace_back(list.begin() + static_cast<std::ptrdiff_t>(start),
                                       list.begin() + static_cast<std::ptrdiff_t>(end));
  }
  return tags;
}

constexpr wchar_t kWow64Software[] = L"SOFTWARE\\WOW6432Node\\";

// A machine key under WOW6432Node: what a 32-bit program on 64-bit Windows reads under SOFTWARE.
inline bool Is32BitView(const policy_template::RegistryWrite& write) {
  return write.machine && _wcsnicmp(write.key.c_str(), kWow64Software, std::wcslen(kWow64Software)) == 0;
}

// The key as the code names it, in either view.
inline std::wstring NativeKey(const policy_template::RegistryWrite& write) {
  if (!Is32BitView(write)) return write.key;
  return L"SOFTWARE\\" + write.key.substr(std::wcslen(kWow64Software));
}

}  // namespace policy_tests
