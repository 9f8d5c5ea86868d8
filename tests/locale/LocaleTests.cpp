// The locale library: UI language and packs, right-to-left answers, resource libraries, help.
#include <gtest/gtest.h>
#include <process.h>

#include "locale/LocaleInternals.h"
#include "tests/support/TestSupport.h"

using namespace KVELLocale;
using namespace testing_support;
using Expected = std::pair<std::wstring, std::wstring>;

namespace {

const LocaleState& state = g_localeState;

std::wstring ModulePath(HMODULE module) {
  wchar_t path[MAX_PATH] = L"";
  return module && GetModuleFileNameW(module, path, MAX_PATH) ? path : L"";
}

std::wstring PutResLibrary(const std::wstring& path) {
  EXPECT_TRUE(CopyFileTo(ModuleFolder() + L"\\locale_test_res.dll", path));
  return path;
}

TEST(LanguageNames, FolderNamesMatchSupportedLocales) {
  const std::pair<const wchar_t*, int> names[] = {{L"fr", 0x000C},    {L"fr-CA", 0x0C0C},
                                                  {L"PT-br", 0x0416}, {L"xx", 0},
                                                  {L"fr-", 0},        {nullptr, 0}};
  unsigned short langId = 0xFFFF;  // kept across rows: every call sets it
  for (const auto& [name, id] : names)
    EXPECT_TRUE(GetLangIDFromName(name, langId) == (id != 0) && langId == id) << id;
}

// The locale state is computed once per process: each row is a CTest entry of its own, setting
// LOCALE_VARIANT. Packs lie below Mapora\bin: "x\\" an empty folder, "x" a file, "x\\y" a pack.
struct Scenario {
  const char* variant;
  LANGID lang, ui;                  // the process's Windows language, the UI language expected
  const wchar_t *valueName, *text;  // a stored value: text, or else the DWORD
  DWORD dword;
  std::vector<std::wstring> packs;
  std::wstring names, langDir, countryDir;  // UI language+country names and pack folders
};
const Scenario kScenarios[] = {
    {"override", 0x0409, 0x0411, L"UILANGID", nullptr, 0x0407, {L"ja\\x"}, L"jaJP", L"ja", L""},
    {"dword", 0x0409, 0x0407, L"UILANGID", nullptr, 0x0407, {L"de\\x"}, L"deDE", L"de", L""},
    {"string", 0x0409, 0x0409, L"UILANGID", L"1031", 0, {L"de\\x"}, L"", L"", L""},
    {"unknown", 0x0407, 0x0407, L"UILANGID", nullptr, 0x03FF, {L"de\\x"}, L"deDE", L"de", L""},
    {"q4", 0x040C, 0x040C, L"Q4-UILANGID", nullptr, 0x0407, {L"fr\\x"}, L"frFR", L"fr", L""},
    // No pack counts: English, but the requested names stay so that translated help is found.
    {"missing", 0x0407, 0x0409, nullptr, nullptr, 0, {}, L"deDE", L"", L""},
    {"empty", 0x0407, 0x0409, nullptr, nullptr, 0, {L"de\\", L"de-DE\\"}, L"deDE", L"", L""},
    {"file", 0x0407, 0x0409, nullptr, nullptr, 0, {L"de", L"de-DE"}, L"deDE", L"", L""},
    // With only the language-and-country pack, both folders are kept as formed.
    {"country", 0x040C, 0x040C, nullptr, nullptr, 0, {L"fr-FR\\x"}, L"frFR", L"fr", L"fr-FR"},
    {"arabic", 0x0401, 0x0401, nullptr, nullptr, 0, {L"ar\\x"}, L"arSA", L"ar", L""},
    {"hebrew", 0x040D, 0x040D, L"RTL", L"FALSE", 0, {L"he\\x"}, L"heIL", L"he", L""},
};

// RTLUI and TABLERTL, read on every query; text too long for the 260-byte buffer is as absent.
const std::tuple<std::wstring, bool, bool> kRtlValues[] = {
    {L"(absent)", true, false}, {L"FaLsE", false, false},
    {L"0", true, true},         {L"", true, true},
    {L"(dword)", true, true},   {L"false" + std::wstring(200, L' '), true, false}};

TEST(LocaleScenario, Run) {
  char variantText[32] = "";
  GetEnvironmentVariableA("LOCALE_VARIANT", variantText, sizeof variantText);
  const std::string variant = variantText;
  const Scenario* row = nullptr;
  for (const Scenario& s : kScenarios)
    if (variant == s.variant) row = &s;
  if (!row || state.langId != 0 || state.uiLangId != 0 || GetUserDefaultUILanguage() != row->lang)
    GTEST_SKIP() << "needs a process of its own, started in its language";
  ScopedDirectory mapora(MaporaCommonFolder()), scratch(ModuleFolder() + L"\\locale-scratch");
  const std::wstring bin = mapora.Path() + L"\\bin\\", docs = scratch.Path() + L"\\";
  for (const std::wstring& pack : row->packs)
    pack.back() == L'\\' ? mapora.MakeDir(L"bin\\" + pack) : mapora.MakeFile(L"bin\\" + pack);
  ScopedRegistryKey settings(HKEY_CURRENT_USER, L"Software\\KVEL");
  if (row->text) settings.SetString(row->valueName, row->text);
  if (row->valueName && !row->text) settings.SetDword(row->valueName, row->dword);
  // An override is refused without a primary language, or while another is pending.
  EXPECT_TRUE(variant != "override" ||
              (!SetupEXEOverRide(0x0400) && SetupEXEOverRide(0x0411) && !SetupEXEOverRide(0x040C)));
  EXPECT_EQ(GetUILocale(), row->ui);
  EXPECT_EQ(GetLocale(), row->lang);
  EXPECT_EQ(std::wstring(GetUILangIDString()) + GetUICountryIDString(), row->names);
  auto dir = [&](const std::wstring& d) { return d.empty() ? d : bin + d; };
  const std::wstring uiDirs = std::wstring(state.uiLangDir) + L"|" + state.uiLangCountryDir;
  EXPECT_EQ(uiDirs, dir(row->langDir) + L"|" + dir(row->countryDir));
  EXPECT_EQ(std::wstring(state.langDir) + L"|" + state.langCountryDir,
            row->lang == row->ui ? uiDirs : L"|");

  // Hebrew's RTL value switches the whole layout off; English ignores every value.
  const bool rtl = row->ui == 0x0401;
  EXPECT_EQ(IsRightToLeftLanguage(), rtl || row->ui == 0x040D);
  EXPECT_EQ(IsRightToLeft(), rtl);
  const std::wstring library = rtl ? PutResLibrary(bin + L"ar\\ResRtl.dll") : L"";
  for (const auto& [value, ui, table] : kRtlValues) {
    for (const wchar_t* name : {L"RTLUI", L"TABLERTL"})
      value == L"(absent)"  ? settings.DeleteValue(name)
      : value == L"(dword)" ? settings.SetDword(name, 0)
                            : settings.SetString(name, value);
    EXPECT_EQ(IsRightToLeftUI(), rtl && ui) << value;
    EXPECT_EQ(IsTableRightToLeft(), rtl && table) << value;
    // Without its mirrored UI a right-to-left language keeps the built-in resources.
    HMODULE loaded = LoadLocalizedResFromFile(L"ResRtl.dll");
    EXPECT_EQ(ModulePath(loaded), ui ? library : L"") << value;
    if (loaded) FreeLibrary(loaded);
  }

  if (variant == "q4") {  // q4.exe reads Q4-UILANGID; the child run checks q4.exe itself
    mapora.MakeFile(L"q4\\bin\\de\\x");
    const std::wstring copy = mapora.Path() + L"\\q4\\tools\\q4.exe";
    ASSERT_TRUE(CopyFileTo(ModulePath(GetModuleHandleW(nullptr)), copy));
    EXPECT_EQ(_wspawnl(_P_WAIT, copy.c_str(), L"q4", L"--gtest_filter=LocaleChild.*", nullptr), 0);
  }
  if (variant != "country") return;
  // The language folder, formed though it did not count, is still tried after the other.
  PutResLibrary(bin + L"fr\\ResBoth.dll");
  mapora.MakeFile(L"bin\\fr-FR\\ResBroken.dll", "not a library");
  const Expected loads[] = {{L"ResBoth.dll", L"fr-FR\\ResBoth.dll"},
                            {L"ResBroken.dll", L"fr\\ResBroken.dll"},
                            {L"ResMissing.dll", L""},
                            {L"Viewer.ocx", L"fr\\ResViewer.dll"},
                            {L"Setup.EXE", L"fr\\ResSetup.dll"},
                            {L"Codec.ax", L"fr\\ResCodec.ax"}};
  for (const auto& [name, expected] : loads) {
    if (!expected.empty()) PutResLibrary(bin + expected);
    HMODULE module =
        name.rfind(L"Res", 0) != 0 ? LoadLibraryW(PutResLibrary(docs + name).c_str()) : nullptr;
    HMODULE library = module ? LoadLocalizedRes(module) : LoadLocalizedResFromFile(name.c_str());
    EXPECT_EQ(ModulePath(library), dir(expected)) << name;
    if (library) FreeLibrary(library);
    if (module) FreeLibrary(module);
  }

  for (const wchar_t* file : {L"fr\\Guide.CHM", L"fr-FR\\both.chm", L"fr\\both.chm", L"both.chm",
                              L"plain.chm", L"guide.htm"})
    mapora.MakeFile(std::wstring(L"help\\") + file);
  scratch.MakeFile(L"fr-FR\\guide.chm");
  const std::wstring help = mapora.Path() + L"\\help\\", intro = L"guide.chm::/html/intro.htm";
  const Expected refs[] = {
      {L"Guide", help + L"fr\\Guide.CHM"},       {L"both.chm", help + L"fr-FR\\both.chm"},
      {L"guide.htm", help + L"guide.htm"},       {L"plain>main", help + L"plain.CHM>main"},
      {docs + intro, docs + L"fr-FR\\" + intro}, {scratch.Path(), L""},
      {L"missing.chm::/a.htm", L"::/a.htm"}};
  std::wstring result = L"stale";  // kept across rows: every call starts afresh
  for (const auto& [ref, expected] : refs)
    EXPECT_STREQ(GetLocaleHelpFile(ref.c_str(), result, L".CHM"), expected.c_str()) << ref;
}

// q4.exe takes its UI packs from beside its own folder, the user locale's from the suite folder.
TEST(LocaleChild, Q4) {
  const std::wstring tools = ModuleFolder();
  if (ModulePath(GetModuleHandleW(nullptr)) != tools + L"\\q4.exe") GTEST_SKIP();
  EXPECT_EQ(GetUILocale(), 0x0407);
  EXPECT_EQ(std::wstring(state.uiLangDir), tools.substr(0, tools.rfind(L'\\')) + L"\\bin\\de");
  EXPECT_EQ(std::wstring(state.langDir), MaporaCommonFolder() + L"\\bin\\fr");
}

}  // namespace
