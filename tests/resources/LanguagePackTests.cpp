// Every language pack must hold what the console loads from it, or the console shows nothing there:
// each English string with the same format arguments, each dialog with the same controls, the icon
// and the tree images. The English resources are linked into this program.
#include <gtest/gtest.h>
#include <windows.h>

#include <map>
#include <regex>
#include <set>

#include "res/resource.h"
#include "tests/support/TestSupport.h"

namespace {

const BYTE* Data(HMODULE module, LPCWSTR type, WORD id, DWORD* size = nullptr) {
  HRSRC info = FindResourceW(module, MAKEINTRESOURCEW(id), type);
  if (size) *size = info ? SizeofResource(module, info) : 0;
  return info ? static_cast<const BYTE*>(LockResource(LoadResource(module, info))) : nullptr;
}

BOOL CALLBACK CollectId(HMODULE, LPCWSTR, LPWSTR name, LONG_PTR ids) {
  if (IS_INTRESOURCE(name)) reinterpret_cast<std::set<WORD>*>(ids)->insert(LOWORD(reinterpret_cast<ULONG_PTR>(name)));
  return TRUE;
}

std::set<WORD> Ids(HMODULE module, LPCWSTR type) {
  std::set<WORD> ids;
  EnumResourceNamesW(module, type, CollectId, reinterpret_cast<LONG_PTR>(&ids));
  return ids;
}

// What a text consumes, in order: printf conversions (%s, %ls, %d...), message inserts (%1 to
// %99) and any stray %; "%%" is none.
std::vector<std::wstring> Arguments(const std::wstring& text) {
  static const std::wregex spec(L"%(%|[-+ #0]*[0-9*]*(\\.[0-9*]+)?([hlLwzjtI36]*[diouxXcCsSeEfgGaAp])|[1-9][0-9]?|)");
  std::vector<std::wstring> arguments;
  for (std::wsregex_iterator m(text.begin(), text.end(), spec), end; m != end; ++m)
    if (m->str() != L"%%") arguments.push_back(L"%" + (m->length(3) ? m->str(3) : m->str(1)));
  return arguments;
}

// String tables come in blocks of 16 counted strings; block n holds identifiers (n-1)*16...
std::map<UINT, std::vector<std::wstring>> StringArguments(HMODULE module) {
  std::map<UINT, std::vector<std::wstring>> strings;
  for (WORD block : Ids(module, RT_STRING)) {
    DWORD size = 0;
    const auto* entry = reinterpret_cast<const WCHAR*>(Data(module, RT_STRING, block, &size));
    const WCHAR* const end = entry + size / sizeof(WCHAR);
    // Each entry is its length followed by that many characters.
    for (UINT slot = 0; slot < 16 && entry < end; entry += *entry + 1, ++slot)
      if (*entry) strings[(block - 1u) * 16u + slot] = Arguments(std::wstring(entry + 1, *entry));
  }
  return strings;
}

// Where the fields of a DLGTEMPLATEEX and of its DLGITEMTEMPLATEEX entries lie, in WORDs.
namespace dialog_words {
constexpr size_t kSignature = 1;  // 0xFFFF for the extended template
constexpr size_t kStyle = 6;      // low word
constexpr size_t kItemCount = 8;
constexpr size_t kMenu = 13;           // then class and caption, each a name or an ordinal
constexpr size_t kFontBeforeFace = 3;  // point size, weight, italic and charset
constexpr size_t kItemId = 10;         // a DWORD
constexpr size_t kItemClass = 12;      // then text, then creation data
}  // namespace dialog_words

// The control identifiers of a DLGTEMPLATEEX and its DLGITEMTEMPLATEEX entries.
std::multiset<DWORD> ControlIds(HMODULE module, WORD dialog) {
  namespace w = dialog_words;
  const auto* const start = reinterpret_cast<const WORD*>(Data(module, RT_DIALOG, dialog));
  if (!start || start[w::kSignature] != 0xFFFF) return {};
  auto skipName = [](const WORD* name) {
    return *name == 0xFFFF ? name + 2 : name + std::wcslen(reinterpret_cast<const wchar_t*>(name)) + 1;
  };
  const WORD* at = skipName(skipName(skipName(start + w::kMenu)));
  if (start[w::kStyle] & (DS_SETFONT | DS_SHELLFONT)) at = skipName(at + w::kFontBeforeFace);
  std::multiset<DWORD> ids;
  for (WORD item = 0; item < start[w::kItemCount]; ++item) {
    at = start + ((at - start + 1) & ~1);  // each entry starts on a DWORD
    ids.insert(MAKELONG(at[w::kItemId], at[w::kItemId + 1]));
    at = skipName(skipName(at + w::kItemClass));
    at += (*at + 1) / 2 + 1;  // creation data: its size in bytes, then the data
  }
  return ids;
}

class LanguagePack : public testing::TestWithParam<const wchar_t*> {};

TEST_P(LanguagePack, HoldsWhatTheConsoleLoadsFromIt) {
  std::wstring path =
      testing_support::ModuleFolder() + L"\\" MAPORA_PACKS_DIR "\\" + GetParam() + L"\\ResMaporaAdmin.dll";
  HMODULE english = GetModuleHandleW(nullptr);
  HMODULE pack = LoadLibraryExW(path.c_str(), nullptr, LOAD_LIBRARY_AS_DATAFILE | LOAD_LIBRARY_AS_IMAGE_RESOURCE);
  ASSERT_NE(pack, nullptr);
  EXPECT_EQ(StringArguments(pack), StringArguments(english));  // identifier -> arguments
  for (WORD id : {IDD_ABOUTBOX, IDD_MAPORAADMIN_DIALOG, IDD_MAPORA_CONFIG, IDD_ADVANCED_CONFIG}) {
    EXPECT_FALSE(ControlIds(english, id).empty());
    EXPECT_EQ(ControlIds(pack, id), ControlIds(english, id)) << "dialog " << id;
  }
  EXPECT_EQ(Ids(pack, RT_GROUP_ICON), Ids(english, RT_GROUP_ICON));
  EXPECT_EQ(Ids(pack, L"PNG"), (std::set<WORD>{IDB_TREE_WORKSTATION, IDB_TREE_FOLDER, IDB_TREE_PAGE}));
}

INSTANTIATE_TEST_SUITE_P(Packs, LanguagePack, testing::Values(L"fr", L"de", L"es", L"ja", L"zh-CN", L"ar"));

}  // namespace
