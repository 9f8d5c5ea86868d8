// Every language pack must hold what the console loads from it: each English string with the
// same format arguments and line layout, each dialog with the same controls, the icon and the
// tree images. A pack that misses one falls back to nothing (the console shows an empty text or
// no dialog), so these are checked against the English resources linked into this program.
#include <windows.h>

#include <gtest/gtest.h>

#include <algorithm>
#include <cwctype>
#include <map>
#include <regex>
#include <set>
#include <string>
#include <utility>
#include <vector>

#include "res/resource.h"
#include "tests/support/TestSupport.h"

namespace {

struct Resource {
  const BYTE* data = nullptr;
  DWORD size = 0;
};

Resource FindData(HMODULE module, LPCWSTR type, WORD id) {
  HRSRC info = FindResourceW(module, MAKEINTRESOURCEW(id), type);
  if (!info) return {};
  HGLOBAL loaded = LoadResource(module, info);
  return {static_cast<const BYTE*>(LockResource(loaded)), SizeofResource(module, info)};
}

BOOL CALLBACK CollectName(HMODULE, LPCWSTR, LPWSTR name, LONG_PTR ids) {
  if (IS_INTRESOURCE(name))
    reinterpret_cast<std::set<WORD>*>(ids)->insert(static_cast<WORD>(reinterpret_cast<ULONG_PTR>(name)));
  return TRUE;
}

std::set<WORD> ResourceIds(HMODULE module, LPCWSTR type) {
  std::set<WORD> ids;
  EnumResourceNamesW(module, type, CollectName, reinterpret_cast<LONG_PTR>(&ids));
  return ids;
}

// String tables come in blocks of 16 counted strings; block n holds identifiers (n-1)*16...
std::map<UINT, std::wstring> Strings(HMODULE module) {
  std::map<UINT, std::wstring> strings;
  for (WORD block : ResourceIds(module, RT_STRING)) {
    Resource r = FindData(module, RT_STRING, block);
    auto p = reinterpret_cast<const WCHAR*>(r.data);
    auto end = reinterpret_cast<const WCHAR*>(r.data + r.size);
    for (UINT slot = 0; slot < 16 && p < end; ++slot) {
      WORD length = *p++;
      if (length > 0) strings[(block - 1u) * 16u + slot] = std::wstring(p, length);
      p += length;
    }
  }
  return strings;
}

// The arguments a text consumes, in order: printf conversions (%s, %d, %ls...) and message
// inserts (%1 to %99, with or without a !format!).
std::vector<std::wstring> FormatArguments(const std::wstring& text) {
  static const std::wregex printfSpec(
      L"%[-+ #0]*(\\*|[0-9]+)?(\\.(\\*|[0-9]+))?(hh|h|ll|l|L|w|z|j|t|I64|I32|I)?([diouxXcCsSeEfgGaAp])");
  static const std::wregex insert(L"%([1-9][0-9]?)(![^!]*!)?");
  std::vector<std::wstring> arguments;
  for (size_t at = text.find(L'%'); at != std::wstring::npos; at = text.find(L'%', at)) {
    std::wsmatch m;
    auto from = text.begin() + static_cast<std::ptrdiff_t>(at);
    if (at + 1 < text.size() && text[at + 1] == L'%') {
      at += 2;
    } else if (std::regex_search(from, text.end(), m, printfSpec, std::regex_constants::match_continuous)) {
      arguments.push_back(L"%" + m.str(4) + m.str(5));
      at += static_cast<size_t>(m.length(0));
    } else if (std::regex_search(from, text.end(), m, insert, std::regex_constants::match_continuous)) {
      arguments.push_back(L"%" + m.str(1));
      at += static_cast<size_t>(m.length(0));
    } else {
      arguments.push_back(L"stray %");
      ++at;
    }
  }
  return arguments;
}

// The report texts are templates filled line by line: the same lines, each with the same
// leading blanks. A lone CR or LF inside a line shows as -1.
std::vector<int> LineLayout(const std::wstring& text) {
  std::vector<int> layout;
  size_t start = 0;
  for (;;) {
    size_t end = text.find(L"\r\n", start);
    std::wstring line = text.substr(start, end == std::wstring::npos ? std::wstring::npos : end - start);
    bool broken = line.find_first_of(L"\r\n") != std::wstring::npos;
    layout.push_back(broken ? -1 : static_cast<int>(line.find_first_not_of(L' ') == std::wstring::npos
                                                         ? line.size()
                                                         : line.find_first_not_of(L' ')));
    if (end == std::wstring::npos) return layout;
    start = end + 2;
  }
}

struct Control {
  DWORD id;
  std::wstring windowClass;
  std::wstring text;
  RECT box;  // dialog units: left, top, right, bottom
};

struct Dialog {
  bool valid = false;
  DWORD exStyle = 0;
  RECT box{};
  std::vector<Control> controls;
};

class TemplateReader {
 public:
  explicit TemplateReader(Resource r) : base_(r.data), at_(r.data), end_(r.data + r.size) {}
  template <typename T>
  T Read() {
    T value{};
    if (at_ + sizeof(T) <= end_) memcpy(&value, at_, sizeof(T));
    at_ += sizeof(T);
    return value;
  }
  // A name or an ordinal; ordinals read as "#n".
  std::wstring NameOrOrdinal() {
    WORD first = Read<WORD>();
    if (first == 0xFFFF) return L"#" + std::to_wstring(Read<WORD>());
    std::wstring text;
    for (WORD c = first; c != 0 && at_ < end_; c = Read<WORD>()) text.push_back(static_cast<wchar_t>(c));
    return text;
  }
  void Skip(size_t bytes) { at_ += bytes; }
  void AlignDword() { at_ = base_ + ((at_ - base_ + 3) & ~static_cast<std::ptrdiff_t>(3)); }
  bool Overran() const { return at_ > end_; }

 private:
  const BYTE* base_;
  const BYTE* at_;
  const BYTE* end_;
};

RECT ReadBox(TemplateReader& in) {
  LONG x = in.Read<SHORT>(), y = in.Read<SHORT>(), cx = in.Read<SHORT>(), cy = in.Read<SHORT>();
  return {x, y, x + cx, y + cy};
}

// DLGTEMPLATEEX followed by its DLGITEMTEMPLATEEX entries.
Dialog ParseDialog(Resource r) {
  Dialog dialog;
  if (!r.data) return dialog;
  TemplateReader in(r);
  if (in.Read<WORD>() != 1 || in.Read<WORD>() != 0xFFFF) return dialog;
  in.Read<DWORD>();  // help identifier
  dialog.exStyle = in.Read<DWORD>();
  DWORD style = in.Read<DWORD>();
  WORD count = in.Read<WORD>();
  dialog.box = ReadBox(in);
  in.NameOrOrdinal();  // menu
  in.NameOrOrdinal();  // class
  in.NameOrOrdinal();  // caption
  if (style & (DS_SETFONT | DS_SHELLFONT)) {
    in.Skip(sizeof(WORD) * 2 + 2);  // point size, weight, italic, character set
    in.NameOrOrdinal();
  }
  for (WORD i = 0; i < count; ++i) {
    in.AlignDword();
    in.Skip(sizeof(DWORD) * 3);  // help identifier, extended style, style
    Control control;
    control.box = ReadBox(in);
    control.id = in.Read<DWORD>();
    control.windowClass = in.NameOrOrdinal();
    control.text = in.NameOrOrdinal();
    in.Skip(in.Read<WORD>());
    dialog.controls.push_back(control);
  }
  dialog.valid = !in.Overran();
  return dialog;
}

std::multiset<std::pair<DWORD, std::wstring>> ControlKinds(const Dialog& dialog) {
  std::multiset<std::pair<DWORD, std::wstring>> kinds;
  for (const Control& c : dialog.controls) kinds.emplace(c.id, c.windowClass);
  return kinds;
}

// Access keys of a window's controls ("&&" is a literal ampersand), upper-cased.
std::vector<wchar_t> AccessKeys(const Dialog& dialog) {
  std::vector<wchar_t> keys;
  for (const Control& c : dialog.controls) {
    for (size_t i = 0; i + 1 < c.text.size(); ++i) {
      if (c.text[i] != L'&') continue;
      if (c.text[i + 1] != L'&') keys.push_back(static_cast<wchar_t>(std::towupper(c.text[i + 1])));
      ++i;
    }
  }
  return keys;
}

constexpr WORD kDialogs[] = {IDD_ABOUTBOX, IDD_MAPORAADMIN_DIALOG, IDD_MAPORA_CONFIG, IDD_ADVANCED_CONFIG};

struct PackCase {
  const wchar_t* tag;
  bool rightToLeft;
};

void PrintTo(const PackCase& pack, std::ostream* out) { *out << testing::PrintToString(std::wstring(pack.tag)); }

std::string CaseName(const testing::TestParamInfo<PackCase>& info) {
  std::string name;
  for (const wchar_t* c = info.param.tag; *c; ++c) name.push_back(std::iswalnum(*c) ? static_cast<char>(*c) : '_');
  return name;
}

class LanguagePack : public testing::TestWithParam<PackCase> {
 protected:
  void SetUp() override {
    path_ = testing_support::ModuleFolder() + L"\\" + L"" MAPORA_PACKS_DIR + L"\\" + GetParam().tag +
            L"\\ResMaporaAdmin.dll";
    std::replace(path_.begin(), path_.end(), L'/', L'\\');
    pack_ = LoadLibraryExW(path_.c_str(), nullptr, LOAD_LIBRARY_AS_DATAFILE | LOAD_LIBRARY_AS_IMAGE_RESOURCE);
    ASSERT_NE(pack_, nullptr) << "cannot load " << testing::PrintToString(path_);
  }
  void TearDown() override {
    if (pack_) FreeLibrary(pack_);
  }

  HMODULE english_ = GetModuleHandleW(nullptr);
  HMODULE pack_ = nullptr;
  std::wstring path_;
};

TEST_P(LanguagePack, HoldsEveryEnglishStringAndNoOther) {
  std::map<UINT, std::wstring> english = Strings(english_), translated = Strings(pack_);
  ASSERT_FALSE(english.empty());
  std::set<UINT> englishIds, translatedIds;
  for (const auto& [id, text] : english) englishIds.insert(id);
  for (const auto& [id, text] : translated) translatedIds.insert(id);
  EXPECT_EQ(translatedIds, englishIds);
}

TEST_P(LanguagePack, StringsTakeTheEnglishArgumentsAndLines) {
  std::map<UINT, std::wstring> translated = Strings(pack_);
  for (const auto& [id, text] : Strings(english_)) {
    auto found = translated.find(id);
    if (found == translated.end()) continue;  // reported by the identifier check
    EXPECT_EQ(FormatArguments(found->second), FormatArguments(text)) << "string " << id;
    EXPECT_EQ(LineLayout(found->second), LineLayout(text)) << "string " << id;
  }
}

TEST_P(LanguagePack, DialogsHaveTheEnglishControlsInsideThem) {
  for (WORD id : kDialogs) {
    Dialog english = ParseDialog(FindData(english_, RT_DIALOG, id));
    Dialog translated = ParseDialog(FindData(pack_, RT_DIALOG, id));
    ASSERT_TRUE(english.valid) << "English dialog " << id;
    ASSERT_TRUE(translated.valid) << "dialog " << id;
    EXPECT_EQ(ControlKinds(translated), ControlKinds(english)) << "dialog " << id;
    LONG width = translated.box.right - translated.box.left, height = translated.box.bottom - translated.box.top;
    for (const Control& c : translated.controls) {
      EXPECT_TRUE(c.box.left >= 0 && c.box.top >= 0 && c.box.right <= width && c.box.bottom <= height)
          << "dialog " << id << ", control " << static_cast<int>(c.id) << " reaches outside the dialog";
    }
    EXPECT_EQ((translated.exStyle & WS_EX_LAYOUTRTL) != 0, GetParam().rightToLeft) << "dialog " << id;
  }
}

// The workstation page is a child of the main window at the place its own template gives, so
// the two form one window: the page has to fit, and access keys must not repeat across both.
TEST_P(LanguagePack, MainWindowHoldsTheWorkstationPage) {
  Dialog main = ParseDialog(FindData(pack_, RT_DIALOG, IDD_MAPORAADMIN_DIALOG));
  Dialog page = ParseDialog(FindData(pack_, RT_DIALOG, IDD_MAPORA_CONFIG));
  Dialog englishPage = ParseDialog(FindData(english_, RT_DIALOG, IDD_MAPORA_CONFIG));
  ASSERT_TRUE(main.valid && page.valid && englishPage.valid);
  EXPECT_EQ(page.box.left, englishPage.box.left);
  EXPECT_EQ(page.box.top, englishPage.box.top);
  EXPECT_LE(page.box.right, main.box.right - main.box.left);
  EXPECT_LE(page.box.bottom, main.box.bottom - main.box.top);

  std::vector<wchar_t> keys = AccessKeys(main), pageKeys = AccessKeys(page);
  keys.insert(keys.end(), pageKeys.begin(), pageKeys.end());
  std::set<wchar_t> unique(keys.begin(), keys.end());
  EXPECT_EQ(unique.size(), keys.size()) << "an access key repeats in the main window";
  for (WORD id : {IDD_ABOUTBOX, IDD_ADVANCED_CONFIG}) {
    std::vector<wchar_t> dialogKeys = AccessKeys(ParseDialog(FindData(pack_, RT_DIALOG, id)));
    EXPECT_EQ(std::set<wchar_t>(dialogKeys.begin(), dialogKeys.end()).size(), dialogKeys.size())
        << "an access key repeats in dialog " << id;
  }
}

TEST_P(LanguagePack, HoldsTheIconAndTreeImages) {
  EXPECT_EQ(ResourceIds(pack_, RT_GROUP_ICON), ResourceIds(english_, RT_GROUP_ICON));
  std::set<WORD> images = ResourceIds(english_, L"PNG");
  EXPECT_EQ(images.size(), 3u);
  EXPECT_EQ(ResourceIds(pack_, L"PNG"), images);
  for (WORD id : images) {
    Resource png = FindData(pack_, L"PNG", id);
    EXPECT_TRUE(png.size > 8 && memcmp(png.data, "\x89PNG\r\n\x1a\n", 8) == 0) << "image " << id;
  }
}

INSTANTIATE_TEST_SUITE_P(Packs, LanguagePack,
                         testing::Values(PackCase{L"fr", false}, PackCase{L"de", false}, PackCase{L"es", false},
                                         PackCase{L"ja", false}, PackCase{L"zh-CN", false},
                                         PackCase{L"ar", true}),
                         CaseName);

// The checks themselves, on texts whose faults they must see.
TEST(FormatArguments, SeesPrintfConversionsAndInsertsInOrder) {
  using V = std::vector<std::wstring>;
  EXPECT_EQ(FormatArguments(L"%s (build %s)"), (V{L"%s", L"%s"}));
  EXPECT_EQ(FormatArguments(L"(Build %1)"), (V{L"%1"}));
  EXPECT_EQ(FormatArguments(L"100%% %-5ls %d %2!s!"), (V{L"%ls", L"%d", L"%2"}));
  EXPECT_NE(FormatArguments(L"%d %s"), FormatArguments(L"%s %d"));
  EXPECT_NE(FormatArguments(L"50 % off"), FormatArguments(L"50 off"));
}

TEST(LineLayout, SeesLinesAndTheirLeadingBlanks) {
  EXPECT_EQ(LineLayout(L" %s\r\n\r\n    %s\r\n "), (std::vector<int>{1, 0, 4, 1}));
  EXPECT_NE(LineLayout(L"a\r\nb"), LineLayout(L"a\nb\r\n"));
  EXPECT_EQ(LineLayout(L"a\nb"), (std::vector<int>{-1}));
}

}  // namespace
