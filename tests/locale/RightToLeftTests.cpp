// Right-to-left answers for right-to-left UI languages and odd registry values.
#include "tests/locale/LocaleTestSupport.h"

using namespace KVELLocale;
using namespace locale_tests;

namespace {

const wchar_t kSettings[] = L"Software\\KVEL";

// RTL is read once per process, RTLUI and TABLERTL on every query: one process tries them all.
TEST(LocaleScenario, ArabicSwitches) {
  SKIP_UNLESS_FRESH_PROCESS_IN(0x0401);
  ScopedDirectory mapora(MaporaCommonFolder());
  std::wstring library = PutResLibrary(mapora.Path() + L"\\bin\\ar", L"ResRtl.dll");
  ScopedRegistryKey settings(HKEY_CURRENT_USER, kSettings);
  EXPECT_TRUE(IsRightToLeftLanguage() && IsRightToLeft());

  // Values: absent (nullptr), a DWORD (L"#"), or a text; anything too long for the 260-byte
  // buffer is as good as absent.
  const std::wstring tooLong = L"false" + std::wstring(200, L' ');
  struct Case {
    const wchar_t* value;
    bool ui, table;
  };
  const Case cases[] = {{nullptr, true, false},
                        {L"false", false, false},
                        {L"FaLsE", false, false},
                        {L"0", true, true},
                        {L"", true, true},
                        {L"#", true, true},
                        {tooLong.c_str(), true, false}};
  for (const Case& c : cases) {
    for (const wchar_t* name : {L"RTLUI", L"TABLERTL"}) {
      settings.DeleteValue(name);
      if (c.value && *c.value == L'#')
        settings.SetDword(name, 0);
      else if (c.value)
        settings.SetString(name, c.value);
    }
    EXPECT_EQ(IsRightToLeftUI(), c.ui) << (c.value ? c.value : L"(absent)");
    EXPECT_EQ(IsTableRightToLeft(), c.table) << (c.value ? c.value : L"(absent)");
  }

  // A right-to-left language without its mirrored UI keeps the built-in resources.
  settings.SetString(L"RTLUI", L"false");
  EXPECT_EQ(LoadLocalizedResFromFile(L"ResRtl.dll"), nullptr);
  settings.DeleteValue(L"RTLUI");
  HMODULE loaded = LoadLocalizedResFromFile(L"ResRtl.dll");
  EXPECT_EQ(ModulePath(loaded), library);
  FreeLibrary(loaded);
}

// RTL switches the whole layout off, whatever RTLUI and TABLERTL say.
TEST(LocaleScenario, HebrewRtlOff) {
  SKIP_UNLESS_FRESH_PROCESS_IN(0x040D);
  ScopedDirectory mapora(MaporaCommonFolder());
  mapora.MakeFile(L"bin\\he\\ResOther.dll");
  ScopedRegistryKey settings(HKEY_CURRENT_USER, kSettings);
  settings.SetString(L"RTL", L"FALSE");
  settings.SetString(L"TABLERTL", L"true");
  EXPECT_TRUE(IsRightToLeftLanguage());
  EXPECT_FALSE(IsRightToLeft() || IsRightToLeftUI() || IsTableRightToLeft());
}

}  // namespace
