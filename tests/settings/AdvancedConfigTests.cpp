// The Advanced Configuration dialog, run as the workstation page runs it, and the machine-settings probe.
#include <gtest/gtest.h>

#include <algorithm>
#include <functional>
#include <utility>

#include "app/ClientAdminDlg.h"
#include "res/resource.h"
#include "framework/RegistryKey.h"
#include "settings/AdvancedSettings.h"
#include "settings/URLTokenManager.h"
#include "tests/support/TestSupport.h"

namespace {

using testing_support::ScopedRegistryKey;
using Texts = std::vector<std::wstring>;
constexpr wchar_t kDesktopKey[] = L"SOFTWARE\\KVEL\\Desktop10.5", kEngineKey[] = L"SOFTWARE\\KVEL\\Engine10.5";
constexpr wchar_t kKueiKey[] = L"SOFTWARE\\KVEL\\Desktop10.5\\Settings";
constexpr DWORD kNo = ~0u;  // not stored

DWORD Stored(HKEY root, const std::wstring& key, const wchar_t* name) {
  DWORD value = 0;
  return testing_support::ReadDword(root, key, name, value) ? value : kNo;
}

struct Workstation {
  ScopedRegistryKey desktop{HKEY_LOCAL_MACHINE, kDesktopKey}, engine{HKEY_LOCAL_MACHINE, kEngineKey};
  ScopedRegistryKey user{HKEY_CURRENT_USER, kSuiteUserKey};
  ScopedRegistryKey connection{HKEY_LOCAL_MACHINE, L"SOFTWARE\\KVEL\\Mapora Connection"};
  testing_support::ScopedDirectory folders{testing_support::ModuleFolder() + L"\\settings-products"};
  CClientAdminDlg mainDlg;
  void Install(bool isDesktop, const Texts& packs) {  // nothing without packs
    if (packs.empty()) return;
    InstalledProducts& products = mainDlg.m_installedProducts;
    const std::wstring name = isDesktop ? L"desktop" : L"engine";
    (isDesktop ? desktop : engine).SetString(L"InstallDir", folders.MakeDir(name));
    (isDesktop ? products.desktopKey : products.engineKey) = isDesktop ? kDesktopKey : kEngineKey;
    (isDesktop ? products.desktopInstalled : products.engineInstalled) = true;
    folders.MakeFile(name + L"\\bin\\it");  // a file named like a pack is no pack
    for (const std::wstring& pack : packs) folders.MakeDir(name + L"\\bin\\" + pack);
  }
};

void Click(HWND dlg, int id) { SendMessageW(GetDlgItem(dlg, id), BM_CLICK, 0, 0); }
LRESULT List(HWND d, UINT m, WPARAM w = 0, LPARAM l = 0) { return SendDlgItemMessageW(d, IDC_LANGUAGE_LIST, m, w, l); }
// Runs the dialog as the workstation page does; from a timer, inside() acts on it and button closes it.
std::function<void(HWND)> g_inside;
void RunDialog(Workstation& ws, int button, const std::function<void(HWND)>& inside) {
  g_inside = [&](HWND dlg) { inside(dlg); Click(dlg, button); };
  UINT_PTR timer = SetTimer(nullptr, 0, 50, [](HWND, UINT, UINT_PTR, DWORD) {
    HWND dlg = FindWindowW(nullptr, L"Advanced Configuration");
    if (dlg != nullptr && g_inside) std::exchange(g_inside, nullptr)(dlg);
  });
  PersistAdvancedSettings(ws.mainDlg);
  KillTimer(nullptr, timer);
  EXPECT_FALSE(g_inside) << "the dialog never showed";
}
// The style bit, so that it does not matter whether the dialog itself is shown yet.
bool Shown(HWND dlg, int id) { return (GetWindowLongW(GetDlgItem(dlg, id), GWL_STYLE) & WS_VISIBLE) != 0; }
bool Enabled(HWND dlg, int id) { return IsWindowEnabled(GetDlgItem(dlg, id)) != FALSE; }
void Select(HWND dlg, int index) {  // as the user does: the selection, then the notification
  List(dlg, CB_SETCURSEL, static_cast<WPARAM>(index));
  SendMessageW(dlg, WM_COMMAND, MAKEWPARAM(IDC_LANGUAGE_LIST, CBN_SELCHANGE), 0);
}

constexpr const wchar_t *kDE = L"Deutsch (Deutschland)", *kAT = L"Deutsch (\u00d6sterreich)",
                       *kUS = L"English (United States)", *kJa = L"\u65e5\u672c\u8a9e";
const struct PackCase {
  const char* name;
  LANGID ui;
  Texts desktop, engine, listed;  // packs per product (none: not installed); the entries listed, sorted
  bool warning;                   // with the Windows language entry selected
} kPackCases[] = {
    {"EnUSNeedsNoPackAndIsListedPerFolder", 0x0409, {L"en-US"}, {L"de", L"de-AT", L"en", L"en-US", L"ja", L"xx-YY"},
     {L"Deutsch", kAT, kUS, kUS, kJa}, false},
    // A language-only folder shortens the name that the next product's scan compares.
    {"LaterScanComparesShortenedName", 0x0409, {L"ja"}, {L"de-AT"}, {kAT, kJa}, true},
    {"LanguageOnlyPackServesCountry", 0x0407, {L"de"}, {}, {L"Deutsch"}, false},
    {"OnlyLastScannedProductCounts", 0x0407, {L"de-DE"}, {L"ja"}, {kDE, kJa}, true},
    {"SamePackUnderBothListedOnce", 0x0407, {L"de-DE", L"en-US"}, {L"de-DE"}, {kDE, kUS}, false},
    {"CountryPack", 0x0C0C, {L"fr-FR"}, {L"fr-CA"}, {L"fran\u00e7ais (Canada)", L"fran\u00e7ais (France)"}, false},
    {"OtherCountryDoesNotServe", 0x0C0C, {}, {L"fr-FR"}, {L"fran\u00e7ais (France)"}, true},
};
const struct { LANGID ui; const wchar_t *entry, *warning; } kUiLanguages[] = {
    {0x0409, L"Display language (English - United States)", L"Warning: Mapora English language pack"},
    {0x0407, L"Display language (Deutsch - Deutschland)", L"Warning: Mapora Deutsch language pack"},
    {0x0C0C, L"Display language (fran\u00e7ais - Canada)", L"Warning: Mapora fran\u00e7ais language pack"},
};

// Each process runs under one Windows UI language (CTest sets LANG) and takes its cases.
TEST(LanguageList, ListsPacksAndWarnsWhenNoneServesTheWindowsLanguage) {
  const LANGID ui = GetUserDefaultUILanguage();
  auto lang = std::find_if(std::begin(kUiLanguages), std::end(kUiLanguages), [&](auto& l) { return l.ui == ui; });
  ASSERT_NE(lang, std::end(kUiLanguages)) << "unexpected Windows UI language " << ui;
  for (const PackCase& c : kPackCases) {
    if (c.ui != ui) continue;
    SCOPED_TRACE(c.name);
    Workstation ws;
    ws.Install(true, c.desktop);
    ws.Install(false, c.engine);
    RunDialog(ws, IDCANCEL, [&](HWND dlg) {
      Texts texts;
      wchar_t text[256];
      for (WPARAM i = 0; List(dlg, CB_GETLBTEXT, i, reinterpret_cast<LPARAM>(text)) >= 0; ++i) texts.push_back(text);
      ASSERT_GE(texts.size(), 2u);
      EXPECT_EQ(texts.at(0), lang->entry);
      std::sort(texts.begin() + 2, texts.end());
      EXPECT_EQ(Texts(texts.begin() + 2, texts.end()), c.listed);
      EXPECT_EQ(GetWindowTextOf(GetDlgItem(dlg, IDC_LANGUAGE_WARNING)).rfind(lang->warning, 0), 0u);
      EXPECT_EQ(Shown(dlg, IDC_LANGUAGE_WARNING), c.warning);
      Select(dlg, 1);
      EXPECT_FALSE(Shown(dlg, IDC_LANGUAGE_WARNING));
    });
  }
}

enum { kReadOnly = 1, kAdminPortal = 2, kNoDesktop = 4 };
const struct PersistCase {
  const char* name;
  int flags, button;
  DWORD kuei, local, language;  // stored before opening
  std::vector<int> steps;       // a control to click, or (below 100) a language entry to select
  DWORD kueiAfter, localAfter, languageAfter;
} kPersistCases[] = {
    {"UntouchedKeepsRawValue", 0, IDOK, 2, 1, 9, {}, 2, 1, 9},
    {"UncheckedAndRecheckedWritesOne", 0, IDOK, 2, kNo, kNo, {IDC_KUEI_CHECK, IDC_KUEI_CHECK, 1}, 1, 0, 9},
    {"BoxesChanged", 0, IDOK, 1, 0, 9, {IDC_LOCAL_PORTAL, IDC_KUEI_CHECK, 2}, 0, 1, 0x0C07},
    {"NoMachineWriteRightNorDesktop", kReadOnly | kNoDesktop, IDOK, kNo, 1, kNo, {}, kNo, 1, kNo},
    {"PortalSetByAdminStillWritesZeroOrOne", kAdminPortal, IDOK, kNo, 2, 0x0C07, {0}, kNo, 0, kNo},
    {"CancelWritesOnlyTheLanguage", 0, IDCANCEL, 0, 2, 0x0C07, {IDC_KUEI_CHECK, IDC_LOCAL_PORTAL, 1}, 0, 2, 0x0C07},
    {"CancelKeepsRemovalOfLanguageWithoutPack", 0, IDCANCEL, 1, 1, 0x0409, {1}, 1, 1, kNo},
};

TEST(SaveAndCancel, ShowTheStoredStateAndWriteWhatTheButtonSays) {
  for (const PersistCase& c : kPersistCases) {
    SCOPED_TRACE(c.name);
    Workstation ws;
    ws.mainDlg.m_machineSettingsWritable = !(c.flags & kReadOnly);
    ws.Install(!(c.flags & kNoDesktop), {L"de-AT"});
    if (c.flags & kAdminPortal)
      WriteRegistryDword(kPortalMachineSettingsKey, kPortalServerSetByAdminValue, 1, HKEY_LOCAL_MACHINE);
    if (c.kuei != kNo) WriteRegistryDword(kKueiKey, kEnableKueiValue, c.kuei, HKEY_LOCAL_MACHINE);
    if (c.local != kNo)
      WriteRegistryDword(kConnectionSettingsKey, kSupportLocalPortalValue, c.local, HKEY_CURRENT_USER);
    if (c.language != kNo) ws.user.SetDword(kUILangIDValue, ws.mainDlg.m_dwUILangID = c.language);
    RunDialog(ws, c.button, [&](HWND dlg) {
      EXPECT_EQ(Enabled(dlg, IDC_KUEI_CHECK), !(c.flags & kReadOnly));
      EXPECT_EQ(IsDlgButtonChecked(dlg, IDC_KUEI_CHECK), UINT{c.kuei != kNo && c.kuei != 0});
      for (int id : {IDC_KUEI_CHECK, IDC_KUEI_GROUP, IDC_KUEI_LINK}) EXPECT_EQ(Shown(dlg, id), !(c.flags & kNoDesktop));
      for (int id : {IDC_MANAGE_PORTALS, IDC_LOCAL_PORTAL}) EXPECT_EQ(Enabled(dlg, id), !(c.flags & kAdminPortal));
      EXPECT_EQ(IsDlgButtonChecked(dlg, IDC_LOCAL_PORTAL), UINT{c.local == 1});
      // A stored language without a pack is gone already; the remaining choice is selected.
      const DWORD current = ws.mainDlg.m_dwUILangID;
      EXPECT_EQ(Stored(HKEY_CURRENT_USER, kSuiteUserKey, kUILangIDValue), current == 0 ? kNo : current);
      EXPECT_EQ(static_cast<DWORD>(List(dlg, CB_GETITEMDATA, static_cast<WPARAM>(List(dlg, CB_GETCURSEL)))), current);
      for (int step : c.steps) step < 100 ? Select(dlg, step) : Click(dlg, step);
    });
    EXPECT_EQ(Stored(HKEY_LOCAL_MACHINE, kKueiKey, kEnableKueiValue), c.kueiAfter);
    EXPECT_EQ(Stored(HKEY_CURRENT_USER, kConnectionSettingsKey, kSupportLocalPortalValue), c.localAfter);
    EXPECT_EQ(Stored(HKEY_CURRENT_USER, kSuiteUserKey, kUILangIDValue), c.languageAfter);
  }
}

TEST(MachineSettingsProbe, LeavesTheRegistryAsFound) {
  const std::wstring clsid = L"CLSID\\{EACA595B-B64B-4B80-91AF-DD4517EB4ABC}";
  const std::wstring probe = clsid + L"\\Implemented Categories\\{40FC6ED5-2438-11CF-A3DB-080036F12502}";
  ScopedRegistryKey cleanup(HKEY_CLASSES_ROOT, clsid);
  for (bool present : {false, true}) {
    if (present) WriteRegistryDword(probe, L"test", 1, HKEY_CLASSES_ROOT);
    EXPECT_TRUE(CanWriteMachineSettings()) << present;  // no suite application runs
    HKEY key = nullptr;
    EXPECT_EQ(RegOpenKeyW(HKEY_CLASSES_ROOT, clsid.c_str(), &key) == ERROR_SUCCESS, present);
    if (key != nullptr) RegCloseKey(key);
    EXPECT_EQ(RegDeleteKeyW(HKEY_CLASSES_ROOT, probe.c_str()) == ERROR_SUCCESS, present);
  }
}

}  // namespace
