// Localized resource library search and help file resolution for a French (France) user.
#include "tests/locale/LocaleTestSupport.h"

using namespace KVELLocale;
using namespace locale_tests;

namespace {

TEST(LocaleScenario, ResourceLoading) {
  SKIP_UNLESS_FRESH_PROCESS_IN(0x040C);
  ScopedDirectory mapora(MaporaCommonFolder()), modules(ModuleFolder() + L"\\res-modules");
  const std::wstring fr = mapora.Path() + L"\\bin\\fr", frFR = mapora.Path() + L"\\bin\\fr-FR";
  for (const wchar_t* name :
       {L"ResBoth.dll", L"ResBroken.dll", L"ResViewer.dll", L"ResSetup.dll", L"ResTools.dll"})
    PutResLibrary(fr, name);
  PutResLibrary(frFR, L"ResBoth.dll");
  mapora.MakeFile(L"bin\\fr-FR\\ResBroken.dll", "not a library");

  // The language-and-country pack wins; a failed load there falls through to the language pack.
  const std::pair<const wchar_t*, std::wstring> files[] = {
      {L"ResBoth.dll", frFR + L"\\ResBoth.dll"},
      {L"ResBroken.dll", fr + L"\\ResBroken.dll"},
      {L"ResMissing.dll", L""},
      {nullptr, L""}};
  for (const auto& file : files) {
    HMODULE library = LoadLocalizedResFromFile(file.first);
    EXPECT_EQ(ModulePath(library), file.second);
    FreeLibrary(library);
  }
  // Programs and controls look for a .dll; libraries keep their name.
  const std::pair<const wchar_t*, const wchar_t*> names[] = {{L"Viewer.ocx", L"ResViewer.dll"},
                                                             {L"Setup.EXE", L"ResSetup.dll"},
                                                             {L"Tools.dll", L"ResTools.dll"}};
  for (const auto& name : names) {
    HMODULE module = LoadLibraryW(PutResLibrary(modules.Path(), name.first).c_str());
    HMODULE library = LoadLocalizedRes(module);
    EXPECT_EQ(ModulePath(library), fr + L"\\" + name.second);
    FreeLibrary(library);
    FreeLibrary(module);
  }
}

TEST(LocaleScenario, HelpResolution) {
  SKIP_UNLESS_FRESH_PROCESS_IN(0x040C);
  ScopedDirectory mapora(MaporaCommonFolder()), docs(ModuleFolder() + L"\\help-docs");
  for (const wchar_t* file : {L"fr\\Guide.CHM", L"fr-FR\\both.chm", L"fr\\both.chm", L"both.chm",
                              L"plain.chm", L"guide.htm"})
    mapora.MakeFile(std::wstring(L"help\\") + file);
  docs.MakeFile(L"fr-FR\\guide.chm");
  const std::wstring help = mapora.Path() + L"\\help", intro = L"\\guide.chm::/html/intro.htm";
  const std::pair<std::wstring, std::wstring> cases[] = {
      {L"Guide", help + L"\\fr\\Guide.CHM"},
      {L"both.chm", help + L"\\fr-FR\\both.chm"},
      {L"plain", help + L"\\plain.CHM"},
      {L"guide.htm", help + L"\\guide.htm"},
      {L"plain.chm>main", help + L"\\plain.chm>main"},
      {docs.Path() + intro, docs.Path() + L"\\fr-FR" + intro},
      {docs.Path(), L""},
      {L"missing.chm::/a.htm", L"::/a.htm"}};
  for (const auto& c : cases) {
    std::wstring result = L"stale";
    const wchar_t* returned = GetLocaleHelpFile(c.first.c_str(), result, L".CHM");
    EXPECT_EQ(returned, result.c_str());
    EXPECT_EQ(result, c.second) << c.first;
  }
  // The HTML Help control is found and bound; closing all help windows is harmless.
  KVEL_HtmlHelp(nullptr, 0x0012 /* HH_CLOSE_ALL */, 0);
  EXPECT_NE(GetModuleHandleW(L"hhctrl.ocx"), nullptr);
}

}  // namespace
