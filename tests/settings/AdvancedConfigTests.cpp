// The Advanced Configuration dialog's other settings: their initial states, what Save and
// Cancel write, the machine-settings probe and the portal connection manager button.
#include <gtest/gtest.h>

#include <ole2.h>

#include <optional>

#include "framework/App.h"
#include "res/resource.h"
#include "settings/AdvancedSettings.h"
#include "settings/PortalConnectionManager.h"
#include "tests/settings/SettingsTestSupport.h"

using settings_tests::Click;
using settings_tests::OpenDialog;
using settings_tests::WhileModal;
using settings_tests::Workstation;
using testing_support::ReadDword;
using testing_support::ScopedRegistryKey;

namespace {

constexpr const wchar_t* kConnectionKey = kConnectionSettingsKey;

std::optional<DWORD> Stored(HKEY root, const wchar_t* key, const wchar_t* name) {
  DWORD value = 0;
  if (!ReadDword(root, key, name, value)) return std::nullopt;
  return value;
}

struct StateCase {
  const char* name;
  bool writable;
  bool adminSetPortal;
  bool desktop;
  std::optional<DWORD> kuei;
  std::optional<DWORD> localPortal;
  bool kueiChecked;
  bool localPortalChecked;
};

const StateCase kStateCases[] = {
    {"Defaults", true, false, true, std::nullopt, std::nullopt, false, false},
    {"AnyNonzeroTakesPart", true, false, true, 2, 1, true, true},
    {"OnlyOneSupportsLocalPortal", true, false, true, 0, 2, false, false},
    {"NoMachineWriteRight", false, false, true, 1, 0, true, false},
    {"PortalServerSetByAdmin", true, true, true, std::nullopt, 1, false, true},
    {"DesktopNotInstalled", true, false, false, 1, std::nullopt, true, false},
};

class DialogState : public testing::TestWithParam<StateCase> {};

TEST_P(DialogState, FollowsRightsProductsAndStoredValues) {
  const StateCase& c = GetParam();
  Workstation ws;
  ws.mainDlg.m_machineSettingsWritable = c.writable;
  if (c.desktop) ws.InstallDesktop({});
  ws.InstallEngine({});
  if (c.adminSetPortal) ws.portalMachineKey.SetDword(L"Portal Server Set By Admin", 1);
  if (c.kuei) ws.desktopSettingsKey.SetDword(L"EnableKUEI", *c.kuei);
  if (c.localPortal) ws.portalUserKey.SetDword(L"Support Local Portal", *c.localPortal);

  OpenDialog dlg(ws.mainDlg);
  EXPECT_EQ(dlg.Enabled(IDC_KUEI_CHECK), c.writable);
  EXPECT_EQ(dlg.Checked(IDC_KUEI_CHECK), c.kueiChecked);
  for (int id : {IDC_KUEI_CHECK, IDC_KUEI_GROUP, IDC_KUEI_LINK}) EXPECT_EQ(dlg.Shown(id), c.desktop) << id;
  EXPECT_EQ(dlg.Enabled(IDC_MANAGE_PORTALS), !c.adminSetPortal);
  EXPECT_EQ(dlg.Enabled(IDC_LOCAL_PORTAL), !c.adminSetPortal);
  EXPECT_EQ(dlg.Checked(IDC_LOCAL_PORTAL), c.localPortalChecked);
  // Opening creates the per-user portal settings key.
  HKEY key = nullptr;
  ASSERT_EQ(RegOpenKeyW(HKEY_CURRENT_USER, kConnectionKey, &key), ERROR_SUCCESS);
  RegCloseKey(key);
}

INSTANTIATE_TEST_SUITE_P(Cases, DialogState, testing::ValuesIn(kStateCases),
                         [](const testing::TestParamInfo<StateCase>& info) { return info.param.name; });

// One user action inside the running dialog: a click on a control, or a list selection.
struct Step {
  int click;
  int select = -1;
};
Step ClickOn(int id) { return {id}; }
Step SelectEntry(int index) { return {0, index}; }

struct PersistCase {
  const char* name;
  std::optional<DWORD> kuei;
  std::optional<DWORD> localPortal;
  DWORD language;  // stored UILANGID, 0 = none
  bool adminSetPortal;
  std::vector<Step> steps;
  int button;
  std::optional<DWORD> kueiAfter;
  std::optional<DWORD> localPortalAfter;
  std::optional<DWORD> languageAfter;
};

const PersistCase kPersistCases[] = {
    {"UntouchedKeepsRawProgrammeValue", 2, std::nullopt, 9, false, {}, IDOK, 2, 0, 9},
    {"UncheckedAndRecheckedWritesOne", 2, 1, 9, false, {ClickOn(IDC_KUEI_CHECK), ClickOn(IDC_KUEI_CHECK)}, IDOK,
     1, 1, 9},
    {"LocalPortalAlwaysWrittenAsZeroOrOne", 0, 2, 0, false, {}, IDOK, 0, 0, std::nullopt},
    {"LocalPortalChecked", 1, 0, 0, false, {ClickOn(IDC_LOCAL_PORTAL), ClickOn(IDC_KUEI_CHECK)}, IDOK, 0, 1,
     std::nullopt},
    {"AdminSetPortalStillWritesUnchangedState", std::nullopt, 2, 0, true, {}, IDOK, std::nullopt, 0,
     std::nullopt},
    {"WindowsEntryRemovesLanguage", std::nullopt, 1, 0x0C07, false, {SelectEntry(0)}, IDOK, std::nullopt, 1,
     std::nullopt},
    {"EnglishEntryStoresNine", std::nullopt, 1, 0, false, {SelectEntry(1)}, IDOK, std::nullopt, 1, 9},
    {"PackEntryStoresItsLanguage", std::nullopt, 1, 9, false, {SelectEntry(2)}, IDOK, std::nullopt, 1, 0x0C07},
    {"CancelWritesOnlyTheLanguageAgain", 0, 2, 0x0C07, false,
     {ClickOn(IDC_KUEI_CHECK), ClickOn(IDC_LOCAL_PORTAL), SelectEntry(1)}, IDCANCEL, 0, 2, 0x0C07},
    {"CancelKeepsRemovalOfLanguageWithoutPack", 1, 1, 0x0410, false, {SelectEntry(1)}, IDCANCEL, 1, 1,
     std::nullopt},
};

class SaveAndCancel : public testing::TestWithParam<PersistCase> {};

TEST_P(SaveAndCancel, WriteWhatTheButtonSays) {
  const PersistCase& c = GetParam();
  Workstation ws;
  ws.InstallDesktop({L"de-AT"});
  if (c.kuei) ws.desktopSettingsKey.SetDword(L"EnableKUEI", *c.kuei);
  if (c.localPortal) ws.portalUserKey.SetDword(L"Support Local Portal", *c.localPortal);
  if (c.language != 0) ws.StoreLanguage(c.language);
  if (c.adminSetPortal) ws.portalMachineKey.SetDword(L"Portal Server Set By Admin", 1);

  bool pressed = false;
  WhileModal drive([&] {
    HWND dialog = settings_tests::FindOwnWindow(L"Advanced Configuration");
    if (dialog == nullptr) return false;
    for (const Step& step : c.steps) {
      if (step.select >= 0)
        settings_tests::SelectLanguage(dialog, step.select);
      else
        Click(dialog, step.click);
    }
    Click(dialog, c.button);
    pressed = true;
    return true;
  });
  PersistAdvancedSettings(ws.mainDlg);
  ASSERT_TRUE(pressed);

  EXPECT_EQ(Stored(HKEY_LOCAL_MACHINE, settings_tests::kDesktopSettingsKey, L"EnableKUEI"), c.kueiAfter);
  EXPECT_EQ(Stored(HKEY_CURRENT_USER, kConnectionKey, L"Support Local Portal"), c.localPortalAfter);
  EXPECT_EQ(Stored(HKEY_CURRENT_USER, L"SOFTWARE\\KVEL", L"UILANGID"), c.languageAfter);
  EXPECT_EQ(ws.mainDlg.m_dwUILangID, c.languageAfter.value_or(0));
}

INSTANTIATE_TEST_SUITE_P(Cases, SaveAndCancel, testing::ValuesIn(kPersistCases),
                         [](const testing::TestParamInfo<PersistCase>& info) { return info.param.name; });

TEST(MachineSettingsProbe, LeavesTheProbeKeyAsFoundAndAllowsWhenNoSuiteAppRuns) {
  const std::wstring classKey = L"CLSID\\{EACA595B-B64B-4B80-91AF-DD4517EB4ABC}";
  const std::wstring probeKey = classKey + L"\\Implemented Categories\\{40FC6ED5-2438-11CF-A3DB-080036F12502}";
  ScopedRegistryKey cleanup(HKEY_CLASSES_ROOT, classKey);
  for (bool present : {false, true}) {
    if (present) {
      HKEY key = nullptr;
      ASSERT_EQ(RegCreateKeyW(HKEY_CLASSES_ROOT, probeKey.c_str(), &key), ERROR_SUCCESS);
      RegCloseKey(key);
    }
    EXPECT_TRUE(CanWriteMachineSettings()) << present;
    HKEY key = nullptr;
    bool exists = RegOpenKeyW(HKEY_CLASSES_ROOT, probeKey.c_str(), &key) == ERROR_SUCCESS;
    if (exists) RegCloseKey(key);
    EXPECT_EQ(exists, present);
  }
}

// The portal connection manager button, against the stand-in server beside the test program.
class PortalManagerButton : public testing::Test {
 protected:
  void SetUp() override { ASSERT_TRUE(SUCCEEDED(OleInitialize(nullptr))); }
  void TearDown() override { OleUninitialize(); }

  Workstation ws;
  ScopedRegistryKey classKey{HKEY_CLASSES_ROOT, L"CLSID\\{9A1D3B36-B085-4005-9041-9D70EC893EC8}"};
};

// Closes the box with the given caption once it shows, keeping the texts it showed.
std::function<bool()> CloseBox(std::wstring caption, std::wstring& texts) {
  return [caption, &texts] {
    HWND box = settings_tests::FindOwnWindow(caption);
    if (box == nullptr) return false;
    texts = settings_tests::ChildTexts(box);
    PostMessageW(box, WM_COMMAND, IDOK, 0);
    return true;
  };
}

TEST_F(PortalManagerButton, ShowsTheManagersWindow) {
  HMODULE server = LoadLibraryW((testing_support::ModuleFolder() + L"\\PortalManager.dll").c_str());
  ASSERT_NE(server, nullptr);
  auto registerServer = reinterpret_cast<HRESULT(STDAPICALLTYPE*)()>(
      reinterpret_cast<void*>(GetProcAddress(server, "DllRegisterServer")));
  ASSERT_NE(registerServer, nullptr);
  ASSERT_EQ(registerServer(), S_OK);

  OpenDialog dlg(ws.mainDlg);
  std::wstring shown;
  WhileModal close(CloseBox(L"Portal Connections", shown));
  Click(dlg.m_hWnd, IDC_MANAGE_PORTALS);
  EXPECT_NE(shown.find(L"No portal connections"), std::wstring::npos) << shown;
}

TEST_F(PortalManagerButton, ClassThatCannotBeCreatedReachesTheApplicationsReport) {
  ws.portalMachineKey.SetString(L"Portal Manager Class", L"{506C93CE-B221-467F-BB6F-7BDC460CDB23}");
  CWinApp app;
  OpenDialog dlg(ws.mainDlg);
  std::wstring report;
  WhileModal close(CloseBox(app.GetAppName(), report));
  Click(dlg.m_hWnd, IDC_MANAGE_PORTALS);
  EXPECT_NE(report.find(L"The operation could not be completed."), std::wstring::npos) << report;
  EXPECT_NE(report.find(L"0x80040154"), std::wstring::npos) << report;  // class not registered
}

}  // namespace
