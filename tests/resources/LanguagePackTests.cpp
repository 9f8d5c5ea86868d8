// Every language pack must hold what the console loads from it, or the console shows nothing there:
// each English string with the same format arguments, each dialog with the same controls, the icon
// and the tree images. The English resources are linked into this program.
#include <gtest/gtest.h>
#include <windows.h>

#include <map>
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

// String tables come in blocks of 16 counted strings; block n holds identifiers (n-1)*16...
std::map<UINT, std::vector<std::wstring>> StringArguments(HMODULE module) {
  std::map<UINT, std::vector<std::wstring>> strings;
  for (WORD block : Ids(module, RT_STRING)) {
    DWORD size = 0;
    const auto* entry = reinterpret_cast<const WCHAR*>(Data(module, RT_STRING, block, &size));
    const WCHAR* const end = entry + size / sizeof(WCHAR);
    // Each entry is its length followed by that many characters.
    for (UINT slot = 0; slot < 16 && entry < end; ++slot) {
      if (*entry) strings[(block - 1u) * 16u + slot] = testing_support::FormatArguments(std::wstring(entry + 1, *entry));
      entry += *entry + 1;
    }
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
  namespace words = dialog_words;
  const auto* const start = reinterpret_cast<const WORD*>(Data(module, RT_DIALOG, dialog));
  if (!start || start[words::kSignature] != 0xFFFF) return {};
  auto skipName = [](const WORD* name) {
    return *name == 0xFFFF ? name + 2 : name + std::wcslen(reinterpret_cast<const wchar_t*>(name)) + 1;
  };
  const WORD* at = skipName(skipName(skipName(start + words::kMenu)));
  if (start[words::kStyle] & (DS_SETFONT | DS_SHELLFONT)) at = skipName(at + words::kFontBeforeFace);
  std::multiset<DWORD> ids;
  for (WORD item = 0; item < start[words::kItemCount]; ++item) {
    at = start + ((at - start + 1) & ~1);  // each entry starts on a DWORD
    ids.insert(MAKELONG(at[words::kItemId], at[words::kItemId + 1]));
    at = skipName(skipName(at + words::kItemClass));
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
