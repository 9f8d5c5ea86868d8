// The console's command line, walked as start-up walks it, the About box's service-pack texts and
// the tree images decoded on a worker.
#include <gtest/gtest.h>

#include <vector>

#include "app/AboutDlg.h"
#include "app/CommandLine.h"
#include "framework/PngResource.h"
#include "res/resource.h"

namespace {

TEST(CommandLine, LangForcesTheLanguage) {
  const struct { const char* name; std::vector<const wchar_t*> argv; bool forced; unsigned short langId; } rows[] = {
      {"SlashLang", {L"/Lang", L"1036"}, true, 1036}, {"DashLangAnyCase", {L"-lang", L"1036"}, true, 1036},
      {"LangAlone", {L"/Lang"}, false, 0}, {"LastValueWins", {L"/Lang", L"1033", L"1036"}, true, 1036},
      {"NoNumberIsZero", {L"/Lang", L"abc"}, true, 0}, {"NumberBeforeText", {L"/Lang", L" +1041x"}, true, 1041},
      {"Low16Bits", {L"/Lang", L"66572"}, true, 1036}, {"DoubleMarker", {L"//Lang", L"1036"}, false, 0},
      {"LongerName", {L"/Language", L"1036"}, false, 0}, {"PlainArgumentAlone", {L"1036"}, false, 0},
      // "-1" is an option: another option drops the value to come, not one already given.
      {"OptionBefore", {L"/Lang", L"-1", L"1036"}, false, 0}, {"OptionAfter", {L"/Lang", L"1036", L"/X"}, true, 1036},
  };
  for (const auto& row : rows) {
    SCOPED_TRACE(row.name);
    std::vector<const wchar_t*> argv = {L"MaporaAdmin.exe"};
    argv.insert(argv.end(), row.argv.begin(), row.argv.end());
    CMDACommandLineInfo commandLine;
    WalkCommandLine(commandLine, static_cast<int>(argv.size()), argv.data());
    unsigned short langId = 0;
    EXPECT_EQ(commandLine.LanguageOverride(langId), row.forced);
    EXPECT_EQ(langId, row.langId);
  }
}

TEST(ServicePackFields, ShowTheNameAndTheBuildAfterItsFirstDot) {
  const struct { const char* name; const wchar_t* pack; const wchar_t* build; const wchar_t* shown; } rows[] = {
      {"NoNameNothing", L"", L"1.6491", L""}, {"NoBuild", L"SP1", L"", L""}, {"DotAlone", L"SP1", L".", L"(Build )"},
      {"Dot", L"SP1", L"1.6491", L"(Build 6491)"}, {"NoDot", L"SP1", L"6491", L"(Build 6491)"},
      {"LaterDotsGo", L"SP1", L"10.5.6491", L"(Build 56491)"}, {"InsertsStayText", L"SP1", L"x.%1", L"(Build %1)"},
  };
  for (const auto& row : rows) {
    SCOPED_TRACE(row.name);
    const ServicePackTexts texts = ServicePackFieldTexts(row.pack, row.build, L"(Build %1)");
    EXPECT_EQ(texts.servicePack, row.pack);
    EXPECT_EQ(texts.build, row.shown);
  }
}

// The bitmap's pixels as 32-bit rows, top first; empty for no bitmap.
std::vector<unsigned char> Pixels(const fw::ScopedBitmap& bitmap) {
  BITMAP info = {};
  if (!bitmap || GetObjectW(bitmap.Get(), sizeof info, &info) == 0) return {};
  BITMAPINFO header = {};
  header.bmiHeader = {sizeof header.bmiHeader, info.bmWidth, -info.bmHeight, 1, 32, BI_RGB, 0, 0, 0, 0, 0};
  std::vector<unsigned char> pixels(static_cast<size_t>(info.bmWidth) * info.bmHeight * 4);
  HDC screen = GetDC(nullptr);
  GetDIBits(screen, bitmap.Get(), 0, info.bmHeight, pixels.data(), &header, DIB_RGB_COLORS);
  ReleaseDC(nullptr, screen);
  return pixels;
}

TEST(PngPreload, GivesWhatDecodingHereGivesInTheOrderAsked) {
  const HMODULE console = GetModuleHandleW(nullptr);
  const UINT missing = 1;
  const HMODULE kernel = GetModuleHandleW(L"kernel32.dll");
  // taken: the module in use when the images are taken, which the worker may not have decoded.
  const struct { const char* name; HMODULE module, taken; std::vector<UINT> ids; std::vector<bool> present; } rows[] = {
      {"TreeImages", console, console, {IDB_TREE_WORKSTATION, IDB_TREE_FOLDER, IDB_TREE_PAGE}, {true, true, true}},
      {"OtherOrder", console, console, {IDB_TREE_PAGE, IDB_TREE_WORKSTATION}, {true, true}},
      {"MissingKeepsItsPlace", console, console, {IDB_TREE_FOLDER, missing, IDB_TREE_PAGE}, {true, false, true}},
      {"ModuleWithoutImages", kernel, kernel, {IDB_TREE_WORKSTATION}, {false}},
      {"ModuleSetAsideMeanwhile", kernel, console, {IDB_TREE_WORKSTATION}, {true}},
      {"NoImages", console, console, {}, {}},
  };
  for (const auto& row : rows) {
    SCOPED_TRACE(row.name);
    fw::PngPreload preload(row.module, row.ids, RGB(255, 255, 255));
    const std::vector<fw::ScopedBitmap> here = fw::DecodePngBitmaps(row.taken, row.ids, RGB(255, 255, 255));
    // The second Take decodes on this thread: both must give the same.
    for (const std::vector<fw::ScopedBitmap>& got : {preload.Take(row.taken), preload.Take(row.taken)}) {
      ASSERT_EQ(got.size(), row.present.size());
      for (size_t i = 0; i < got.size(); ++i) {
        EXPECT_EQ(got[i].IsValid(), row.present[i]) << "image " << i;
        EXPECT_EQ(Pixels(got[i]), Pixels(here[i])) << "image " << i;
      }
    }
  }
  // The order is only seen if the images differ.
  const std::vector<fw::ScopedBitmap> tree =
      fw::DecodePngBitmaps(console, {IDB_TREE_WORKSTATION, IDB_TREE_FOLDER, IDB_TREE_PAGE}, RGB(255, 255, 255));
  EXPECT_NE(Pixels(tree[0]), Pixels(tree[1]));
  EXPECT_NE(Pixels(tree[1]), Pixels(tree[2]));
}

}  // namespace
