// The Group Policy templates: well-formed, translated completely, and writing only the values the
// suite reads, where it reads them.
#include <gtest/gtest.h>

#include <map>
#include <regex>
#include <set>
#include <tuple>

#include "inventory/ProductRegistry.h"
#include "locale/LocaleInternals.h"
#include "locale/SuiteUserSettings.h"
#include "settings/SettingsRegistry.h"
#include "tests/policy/PolicyTests.h"

using namespace policy_template;
using namespace policy_tests;

namespace {

// The settings as the suite reads them; REG_DWORD each.
struct Setting {
  const char* name;
  bool machine;
  std::wstring key;
  const wchar_t* valueName;
};

const Setting kSettings[] = {
    {"display language", false, kSuiteUserKey, kUILangIDValue},
    {"improvement programme", true, EnableKueiKey(DesktopKey()), kEnableKueiValue},
    {"local portal", false, kConnectionSettingsKey, kSupportLocalPortalValue},
    {"portal server set by admin", true, kPortalMachineSettingsKey, kPortalServerSetByAdminValue},
};

std::wstring ToUpper(std::wstring text) {
  CharUpperBuffW(&text[0], static_cast<DWORD>(text.size()));
  return text;
}

bool SameName(const std::wstring& left, const std::wstring& right) {
  return _wcsicmp(left.c_str(), right.c_str()) == 0;
}

const Setting* SettingWritten(const RegistryWrite& write) {
  for (const Setting& setting : kSettings)
    if (setting.machine == write.machine && SameName(setting.key, NativeKey(write)) &&
        SameName(setting.valueName, write.valueName))
      return &setting;
  return nullptr;
}

// Every $(string.x) or $(presentation.x) that the attributes of the tree name, with the policy naming it.
void CollectReferences(const Element& element, const wchar_t* kind, std::map<std::wstring, const Element*>& found,
                       const Element* policy = nullptr) {
  if (element.name == L"policy") policy = &element;
  const std::wregex reference(std::wstring(L"\\$\\(") + kind + L"\\.([^)]*)\\)");
  std::wsmatch match;
  for (const auto& attribute : element.attributes)
    if (std::regex_match(attribute.second, match, reference)) found[match[1]] = policy;
  for (const Element& child : element.children) CollectReferences(child, kind, found, policy);
}

// The printf conversions, message inserts and stray % of a text, in order; "%%" is none.
std::vector<std::wstring> Markers(const std::wstring& text) {
  static const std::wregex marker(L"%(%|[-+ #0]*[0-9*]*(\\.[0-9*]+)?[hlLwzjtI36]*[diouxXcCsSeEfgGaAp]|[1-9][0-9]?|)");
  std::vector<std::wstring> markers;
  for (std::wsregex_iterator m(text.begin(), text.end(), marker), end; m != end; ++m)
    if (m->str() != L"%%") markers.push_back(m->str());
  return markers;
}

// id -> text; a second definition of an id is reported as text "(duplicate)".
std::map<std::wstring, std::wstring> Strings(const Element& adml) {
  std::map<std::wstring, std::wstring> strings;
  const Element* resources = adml.Child(L"resources");
  const Element* table = resources ? resources->Child(L"stringTable") : nullptr;
  for (const Element* entry : table ? table->Children(L"string") : std::vector<const Element*>()) {
    const bool known = strings.count(entry->Attribute(L"id")) != 0;
    strings[entry->Attribute(L"id")] = known ? L"(duplicate)" : entry->text;
  }
  return strings;
}

// presentation id -> the element ids its controls refer to.
std::map<std::wstring, std::set<std::wstring>> Presentations(const Element& adml) {
  std::map<std::wstring, std::set<std::wstring>> presentations;
  const Element* resources = adml.Child(L"resources");
  const Element* table = resources ? resources->Child(L"presentationTable") : nullptr;
  for (const Element* presentation : table ? table->Children(L"presentation") : std::vector<const Element*>()) {
    std::set<std::wstring>& refs = presentations[presentation->Attribute(L"id")];
    for (const Element& control : presentation->children)
      if (!control.Attribute(L"refId").empty()) refs.insert(control.Attribute(L"refId"));
  }
  return presentations;
}

TEST(PolicyTemplate, ParsesWithTheSystemParser) {
  const Element admx = LoadAdmx();
  EXPECT_EQ(admx.name, L"policyDefinitions") << admx.text;
  EXPECT_EQ(admx.namespaceUri, kPolicyNamespace);
  for (const TemplateLanguage& language : kTemplateLanguages) {
    const Element adml = LoadAdml(language.locale);
    EXPECT_EQ(adml.name, L"policyDefinitionResources") << language.locale << ": " << adml.text;
    EXPECT_EQ(adml.namespaceUri, kPolicyNamespace) << language.locale;
  }
}

// A pack added to the console needs its template language too.
TEST(PolicyTemplate, HasALanguageForEveryPack) {
  std::set<std::wstring> translated;
  for (const TemplateLanguage& language : kTemplateLanguages)
    if (language.pack) translated.insert(language.pack);
  const std::vector<std::wstring> packs = PackTags();
  EXPECT_EQ(translated, std::set<std::wstring>(packs.begin(), packs.end()));
}

TEST(PolicyTemplate, EveryLanguageDefinesExactlyWhatTheTemplateUses) {
  const Element admx = LoadAdmx();
  std::map<std::wstring, const Element*> stringsUsed, presentationsUsed;
  CollectReferences(admx, L"string", stringsUsed);
  CollectReferences(admx, L"presentation", presentationsUsed);
  std::map<std::wstring, std::set<std::wstring>> controlsUsed;
  for (const auto& used : presentationsUsed) {
    std::set<std::wstring>& ids = controlsUsed[used.first];
    const Element* elements = used.second ? used.second->Child(L"elements") : nullptr;
    for (const Element& element : elements ? elements->children : std::vector<Element>())
      ids.insert(element.Attribute(L"id"));
  }
  const std::map<std::wstring, std::wstring> english = Strings(LoadAdml(L"en-US"));
  for (const TemplateLanguage& language : kTemplateLanguages) {
    SCOPED_TRACE(language.locale);
    const Element adml = LoadAdml(language.locale);
    const std::map<std::wstring, std::wstring> strings = Strings(adml);
    std::set<std::wstring> defined;
    for (const auto& entry : strings) {
      defined.insert(entry.first);
      EXPECT_NE(entry.second, L"(duplicate)") << entry.first;
      const auto source = english.find(entry.first);
      if (source != english.end()) {
        EXPECT_EQ(Markers(entry.second), Markers(source->second)) << entry.first;
      }
    }
    std::set<std::wstring> used;
    for (const auto& entry : stringsUsed) used.insert(entry.first);
    EXPECT_EQ(defined, used);
    EXPECT_EQ(Presentations(adml), controlsUsed);
  }
}

// Names from the headers the code reads them through; a WOW6432Node key is the same key as a
// 32-bit program sees it, and a per-machine policy writes both views alike.
TEST(PolicyTemplate, WritesOnlyTheValuesTheSuiteReadsInBothViews) {
  const Element admx = LoadAdmx();
  std::set<std::string> covered;
  for (const Element* policy : admx.Child(L"policies")->Children(L"policy")) {
    SCOPED_TRACE(policy->Attribute(L"name"));
    std::vector<std::vector<RegistryWrite>> states{DisabledWrites(*policy)};
    for (const Element* item : EnumItems(*policy)) states.push_back(EnabledWrites(*policy, item));
    if (EnumItems(*policy).empty()) states.push_back(EnabledWrites(*policy));
    for (const std::vector<RegistryWrite>& writes : states) {
      std::multiset<std::tuple<std::wstring, std::wstring, DWORD, std::wstring>> views[2];
      for (const RegistryWrite& write : writes) {
        const Setting* setting = SettingWritten(write);
        EXPECT_NE(setting, nullptr) << write.key << " " << write.valueName;
        if (write.type != REG_NONE) {
          EXPECT_EQ(write.type, static_cast<DWORD>(REG_DWORD)) << write.valueName;
        }
        if (setting) covered.insert(setting->name);
        views[Is32BitView(write)].emplace(ToUpper(NativeKey(write)), ToUpper(write.valueName), write.type, write.data);
      }
      if (policy->Attribute(L"class") == L"Machine") {
        EXPECT_EQ(views[1], views[0]);
      } else {
        EXPECT_TRUE(views[1].empty()) << "a user setting is not under WOW6432Node";
      }
    }
  }
  std::set<std::string> all;
  for (const Setting& setting : kSettings) all.insert(setting.name);
  EXPECT_EQ(covered, all);
}

// The list offers exactly what the console itself stores for English and each installed pack
// folder, which is what the locale library makes of the folder's name on this system.
TEST(PolicyTemplate, LanguageListOffersWhatTheConsoleStoresForEachPack) {
  const Element admx = LoadAdmx();
  const Element* policy = Policy(admx, kDisplayLanguagePolicy);
  ASSERT_NE(policy, nullptr);
  std::multiset<std::wstring> offered, expected{L"(deleted)"};
  for (const Element* item : EnumItems(*policy)) {
    const RegistryWrite write = EnabledWrites(*policy, item).back();
    offered.insert(write.type == REG_NONE ? L"(deleted)" : write.data);
  }
  std::vector<std::wstring> languages = PackTags();
  languages.push_back(L"en");
  for (const std::wstring& language : languages) {
    unsigned short langId = 0;
    EXPECT_TRUE(KVELLocale::GetLangIDFromName(language.c_str(), langId)) << language;
    expected.insert(std::to_wstring(langId));
  }
  EXPECT_EQ(offered, expected);
}

}  // namespace
