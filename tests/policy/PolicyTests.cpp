// The Group Policy templates in policy/, and the suite settings as the console reads them after each policy has
// written its values.
#include <gtest/gtest.h>
#include <msxml2.h>

#include <set>

#include "framework/ComRef.h"
#include "framework/ScopedHandle.h"
#include "framework/Strings.h"
#include "inventory/InstalledProducts.h"
#include "inventory/ProductRegistry.h"
#include "locale/LocaleInternals.h"
#include "locale/SuiteUserSettings.h"
#include "settings/SettingsRegistry.h"
#include "settings/SuiteSettings.h"
#include "tests/e2e/ConsoleDriver.h"
#include "tests/support/TestSupport.h"

using namespace e2e;
using namespace testing_support;

namespace {

using Node = ComRef<IXMLDOMNode>;
using Bag = std::multiset<std::wstring>;

const std::vector<std::wstring> kPackTags{MAPORA_PACK_TAGS};
// Each template language with the console pack it matches (none for English).
const std::pair<const wchar_t*, const wchar_t*> kTemplateLanguages[] = {
    {L"en-US", nullptr}, {L"fr-FR", L"fr"},    {L"de-DE", L"de"}, {L"es-ES", L"es"},
    {L"ja-JP", L"ja"},   {L"zh-CN", L"zh-CN"}, {L"ar-SA", L"ar"}};
// The values a policy writes when disabled, and when enabled (each item of an enum at once).
const wchar_t* const kStates[] = {L"p:disabledValue | p:disabledList/p:item/p:value",
                                  L"p:enabledValue | p:enabledList/p:item/p:value | p:elements/*[not(self::p:enum)]"
                                  L" | p:elements/p:enum/p:item/p:value"};
constexpr wchar_t kUnread[] = L"(a kind of value the suite does not read)";
constexpr CLSID kParser = {0x88d96a05, 0xf192, 0x11d4, {0xa6, 0x5f, 0x00, 0x40, 0x96, 0x32, 0x51, 0xe5}};
constexpr IID kDocument2 = {0x2933bf95, 0x7b36, 0x11d2, {0xb2, 0x0e, 0x00, 0xc0, 0x4f, 0x98, 0x3e, 0x60}};

struct Variant : VARIANT {
  explicit Variant(const std::wstring& text) : VARIANT{} {
    vt = VT_BSTR;
    bstrVal = SysAllocString(text.c_str());
  }
  ~Variant() { VariantClear(this); }
};

std::vector<Node> Select(IXMLDOMNode* context, const std::wstring& xpath) {
  std::vector<Node> nodes;
  ComRef<IXMLDOMNodeList> list;
  if (context) context->selectNodes(Variant(xpath).bstrVal, list.Receive());
  for (Node node; list && list->nextNode(node.Receive()) == S_OK && node;) nodes.push_back(std::move(node));
  return nodes;
}

// A file of policy/ as the system's parser reads it. One that does not parse, or lacks the root
// element of its kind, fails the test with the parser's reason.
struct Xml {
  explicit Xml(const std::wstring& name) {
    CoInitializeEx(nullptr, COINIT_APARTMENTTHREADED);
    if (FAILED(CoCreateInstance(kParser, nullptr, CLSCTX_INPROC_SERVER, kDocument2, document.ReceiveVoid()))) return;
    document->put_async(VARIANT_FALSE);
    document->setProperty(Variant(L"SelectionNamespaces").bstrVal,
                          Variant(L"xmlns:p='http://schemas.microsoft.com/GroupPolicy/2006/07/PolicyDefinitions'"));
    VARIANT_BOOL loaded = VARIANT_FALSE;
    ComRef<IXMLDOMParseError> parseError;
    fw::ScopedBstr reason;
    if (document->load(Variant(WindowsPath(MAPORA_POLICY_DIR) + L"\\" + name), &loaded) != S_OK &&
        SUCCEEDED(document->get_parseError(parseError.Receive())) && parseError)
      parseError->get_reason(reason.Receive());
    EXPECT_EQ(std::wstring(reason ? reason.Get() : L""), L"") << name;
    const wchar_t* root = name.back() == L'x' ? L"/p:policyDefinitions" : L"/p:policyDefinitionResources";
    EXPECT_EQ(Select(document.Get(), root).size(), 1u) << name;
  }
  operator IXMLDOMNode*() const { return document.Get(); }
  ComRef<IXMLDOMDocument2> document;
};

std::vector<std::wstring> Strings(IXMLDOMNode* context, const std::wstring& xpath) {
  std::vector<std::wstring> strings;
  for (const Node& node : Select(context, xpath)) {
    fw::ScopedBstr text;
    node->get_text(text.Receive());
    strings.emplace_back(text ? text.Get() : L"");
  }
  return strings;
}

std::wstring String(IXMLDOMNode* context, const std::wstring& xpath) {
  const std::vector<std::wstring> strings = Strings(context, xpath);
  return strings.empty() ? L"" : strings.front();
}

Bag BagOf(const std::vector<std::wstring>& strings) { return Bag(strings.begin(), strings.end()); }

// The data of a value element (or of another kind of element): a decimal, or "-" for a deletion.
std::wstring Data(IXMLDOMNode* value) {
  if (!Select(value, L"p:delete").empty()) return L"-";
  const std::vector<std::wstring> decimal = Strings(value, L"p:decimal/@value");
  return decimal.empty() ? kUnread : decimal.front();
}

// One value a policy writes; key and value name in upper case.
struct RegistryWrite {
  bool machine;
  std::wstring key;
  std::wstring valueName;
  std::wstring data;

  std::wstring Name() const { return (machine ? L"HKLM\\" : L"HKCU\\") + key + L"\\" + valueName; }
  std::wstring Text() const { return Name() + L"=" + data; }  // "HKLM\KEY\VALUE NAME=data"
};

// Key and value name from the nearest element that names them.
RegistryWrite Write(IXMLDOMNode* node, const std::wstring& data) {
  return {String(node, L"ancestor-or-self::p:policy/@class") == L"Machine",
          fw::ToUpper(String(node, L"ancestor-or-self::*[@key or @defaultKey][1]/@*[name()='key' or name()='defaultKey']")),
          fw::ToUpper(String(node, L"ancestor-or-self::*[@valueName][1]/@valueName")), data};
}

unsigned short LangId(const std::wstring& language) {
  unsigned short langId = 0xFFFF;
  KVELLocale::GetLangIDFromName(language.c_str(), langId);
  return langId;
}

// Each string and presentation the template names defined once, no others; each string with the
// English placeholders, each presentation showing exactly the elements of its policy.
TEST(PolicyTemplate, EveryLanguageDefinesExactlyWhatTheTemplateUses) {
  const Xml admx(L"Mapora.admx"), english(L"en-US\\Mapora.adml");
  for (const auto& language : kTemplateLanguages) {
    const Xml adml(language.first + std::wstring(L"\\Mapora.adml"));
    for (const std::wstring kind : {L"string", L"presentation"}) {
      SCOPED_TRACE(std::wstring(language.first) + L" " + kind);
      std::set<std::wstring> used;
      const std::wstring opening = L"$(" + kind + L".";  // "$(string.ID)"
      for (const std::wstring& reference : Strings(admx, L"//@*[starts-with(., '" + opening + L"')]"))
        used.insert(reference.substr(opening.size(), reference.size() - opening.size() - 1));
      EXPECT_EQ(BagOf(Strings(adml, L"//p:" + kind + L"/@id")), Bag(used.begin(), used.end()));
      for (const std::wstring& id : used) {
        const std::wstring defined = L"//p:" + kind + L"[@id='" + id + L"']";
        if (kind == L"string") {
          EXPECT_EQ(FormatArguments(String(adml, defined)), FormatArguments(String(english, defined))) << id;
        } else {
          EXPECT_EQ(BagOf(Strings(adml, defined + L"/*/@refId")),
                    BagOf(Strings(admx, L"//p:policy[@presentation='$(presentation." + id + L")']/p:elements/*/@id")));
        }
      }
    }
  }
}

// Each pack the build makes has its template language and its entry in the language list, which
// offers what the console stores for English and each pack (for the Windows language: no value).
TEST(PolicyTemplate, EveryPackIsTranslatedAndOffered) {
  std::set<std::wstring> translated;
  for (const auto& language : kTemplateLanguages)
    if (language.second) translated.insert(language.second);
  EXPECT_EQ(translated, std::set<std::wstring>(kPackTags.begin(), kPackTags.end()));
  const Xml admx(L"Mapora.admx");
  Bag offered, expected{L"-", std::to_wstring(LangId(L"en"))};
  for (const Node& value : Select(admx, L"//p:policy[@name='DisplayLanguage']//p:enum/p:item/p:value"))
    offered.insert(Data(value.Get()));
  for (const std::wstring& tag : kPackTags) expected.insert(std::to_wstring(LangId(tag)));
  EXPECT_EQ(offered, expected);
}

std::string Describe(const StoredSuiteSettings& settings) {
  return "language " + (settings.uiLangId ? std::to_string(*settings.uiLangId) : std::string("none")) + ", programme " +
         (settings.enableKuei ? "on" : "off") + ", local portal " + (settings.localPortalSupport ? "on" : "off") +
         ", locked " + (settings.portalServerSetByAdmin ? "yes" : "no");
}

// Each state of each policy written as the Group Policy client writes it, over no settings (Enabled) or every
// setting on (Disabled), and read the one way the console and the report read the settings. Every value
// written is one the code reads (names as it reads them) and every one it reads has its policy; a per-machine
// policy writes the WOW6432Node copy (where a 32-bit program on 64-bit Windows reads the same key) alike, a
// per-user one writes none. (What the console shows for them is the settings tests' matter.)
TEST(PolicyConsole, ReadsEachStateAsThePolicySays) {
  const std::wstring chinese = std::to_wstring(LangId(L"zh-CN"));
  const struct { const wchar_t* policy; bool enabled; std::wstring values; std::string read; } rows[] = {
      {L"DisplayLanguage", false, kStates[0], "language none, programme on, local portal on, locked yes"},
      {L"DisplayLanguage", true, L"p:elements//p:value[p:decimal/@value='" + chinese + L"']",
       "language " + std::string(chinese.begin(), chinese.end()) + ", programme off, local portal off, locked no"},
      {L"ImprovementProgram", false, kStates[0], "language 7, programme off, local portal on, locked yes"},
      {L"ImprovementProgram", true, kStates[1], "language none, programme on, local portal off, locked no"},
      {L"SupportLocalPortal", false, kStates[0], "language 7, programme on, local portal off, locked yes"},
      {L"SupportLocalPortal", true, kStates[1], "language none, programme off, local portal on, locked no"},
      {L"PortalServerSetByAdmin", false, kStates[0], "language 7, programme on, local portal on, locked no"},
      {L"PortalServerSetByAdmin", true, kStates[1], "language none, programme off, local portal off, locked yes"},
  };
  const std::set<std::wstring> read{
      fw::ToUpper(L"HKCU\\" + std::wstring(kSuiteUserKey) + L"\\" + kUILangIDValue),
      fw::ToUpper(L"HKLM\\" + EnableKueiKey(DesktopKey()) + L"\\" + kEnableKueiValue),
      fw::ToUpper(L"HKCU\\" + std::wstring(kConnectionSettingsKey) + L"\\" + kSupportLocalPortalValue),
      fw::ToUpper(L"HKLM\\" + std::wstring(kPortalMachineSettingsKey) + L"\\" + kPortalServerSetByAdminValue)};
  const Xml admx(L"Mapora.admx");
  InstalledProducts products;
  products.desktopKey = DesktopKey();
  std::set<std::wstring> written;
  Bag policies;
  for (const auto& row : rows) {
    SCOPED_TRACE(testing::Message() << row.policy << (row.enabled ? " enabled" : " disabled"));
    ScopedHiveOverride hives;
    if (!row.enabled) {
      SetRegistryDword(HKEY_CURRENT_USER, kSuiteUserKey, kUILangIDValue, 7);
      SetRegistryDword(HKEY_LOCAL_MACHINE, EnableKueiKey(DesktopKey()), kEnableKueiValue, 1);
      SetRegistryDword(HKEY_CURRENT_USER, kConnectionSettingsKey, kSupportLocalPortalValue, 1);
      SetRegistryDword(HKEY_LOCAL_MACHINE, kPortalMachineSettingsKey, kPortalServerSetByAdminValue, 1);
    }
    const std::vector<Node> policy = Select(admx, L"//p:policy[@name='" + std::wstring(row.policy) + L"']");
    ASSERT_EQ(policy.size(), 1u);
    policies.insert(row.policy);
    Bag views[2];  // native, WOW6432Node
    for (const Node& value : Select(policy.front().Get(), row.values)) {
      RegistryWrite write = Write(value.Get(), Data(value.Get()));
      const HKEY root = write.machine ? HKEY_LOCAL_MACHINE : HKEY_CURRENT_USER;
      if (write.data == L"-")
        RegDeleteKeyValueW(root, write.key.c_str(), write.valueName.c_str());
      else
        SetRegistryDword(root, write.key, write.valueName.c_str(), std::wcstoul(write.data.c_str(), nullptr, 10));
      const std::wstring wowSoftware = L"SOFTWARE\\WOW6432NODE\\";
      const bool wow = write.key.compare(0, wowSoftware.size(), wowSoftware) == 0;
      if (wow) write.key = L"SOFTWARE\\" + write.key.substr(wowSoftware.size());
      EXPECT_EQ(read.count(write.Name()), 1u) << write.Name();
      EXPECT_NE(write.data, kUnread) << write.Name();
      written.insert(write.Name());
      views[wow].insert(write.Text());
    }
    EXPECT_EQ(views[1], String(policy.front().Get(), L"@class") == L"Machine" ? views[0] : Bag());
    EXPECT_EQ(Describe(ReadStoredSuiteSettings(products)), row.read);
  }
  EXPECT_EQ(written, read);
  Bag stated;  // each policy's Disabled and Enabled
  for (const std::wstring& name : Strings(admx, L"//p:policy/@name")) stated.insert({name, name});
  EXPECT_EQ(policies, stated);
}

}  // namespace
