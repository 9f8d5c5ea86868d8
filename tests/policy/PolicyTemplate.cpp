#include "tests/policy/PolicyTemplate.h"

#include <msxml2.h>
#include <oleauto.h>

#include <algorithm>

#include "framework/ComRef.h"

namespace policy_template {

namespace {

std::wstring Take(BSTR text) {
  std::wstring taken = text ? std::wstring(text, SysStringLen(text)) : std::wstring();
  SysFreeString(text);
  return taken;
}

Element Convert(IXMLDOMNode* node) {
  Element element;
  BSTR text = nullptr;
  node->get_baseName(&text);
  element.name = Take(text);
  node->get_namespaceURI(&text);
  element.namespaceUri = Take(text);
  ComRef<IXMLDOMNamedNodeMap> attributes;
  long count = 0;
  if (SUCCEEDED(node->get_attributes(attributes.Receive())) && attributes) attributes->get_length(&count);
  for (long i = 0; i < count; ++i) {
    ComRef<IXMLDOMNode> attribute;
    if (FAILED(attributes->get_item(i, attribute.Receive())) || !attribute) continue;
    attribute->get_nodeName(&text);
    std::wstring name = Take(text);
    attribute->get_text(&text);
    element.attributes.emplace_back(name, Take(text));
  }
  ComRef<IXMLDOMNodeList> children;
  count = 0;
  if (SUCCEEDED(node->get_childNodes(children.Receive())) && children) children->get_length(&count);
  for (long i = 0; i < count; ++i) {
    ComRef<IXMLDOMNode> child;
    DOMNodeType type = NODE_INVALID;
    if (FAILED(children->get_item(i, child.Receive())) || !child) continue;
    child->get_nodeType(&type);
    if (type == NODE_ELEMENT) {
      element.children.push_back(Convert(child.Get()));
    } else if (type == NODE_TEXT || type == NODE_CDATA_SECTION) {
      VARIANT value;
      VariantInit(&value);
      if (SUCCEEDED(child->get_nodeValue(&value)) && value.vt == VT_BSTR) element.text += value.bstrVal;
      VariantClear(&value);
    }
  }
  return element;
}

RegistryWrite FromValue(bool machine, const std::wstring& key, const std::wstring& valueName, const Element* value) {
  RegistryWrite write{machine, key, valueName, REG_BINARY, L""};
  const Element* kind = value && !value->children.empty() ? &value->children.front() : nullptr;
  if (!kind) return write;
  if (kind->name == L"delete") {
    write.type = REG_NONE;
  } else if (kind->name == L"decimal") {
    write.type = REG_DWORD;
    write.data = kind->Attribute(L"value");
  }
  return write;
}

// The policy's elements, by reference: items are told apart by address.
const std::vector<Element>& ElementsOf(const Element& policy) {
  static const std::vector<Element> none;
  const Element* elements = policy.Child(L"elements");
  return elements ? elements->children : none;
}

bool IsMachine(const Element& policy) { return policy.Attribute(L"class") == L"Machine"; }

std::wstring KeyOr(const Element& element, const std::wstring& fallback) {
  const std::wstring key = element.Attribute(L"key");
  return key.empty() ? fallback : key;
}

void AddList(const Element& policy, const wchar_t* listName, std::vector<RegistryWrite>& writes) {
  const Element* list = policy.Child(listName);
  if (!list) return;
  std::wstring listKey = list->Attribute(L"defaultKey");
  if (listKey.empty()) listKey = policy.Attribute(L"key");
  for (const Element* item : list->Children(L"item"))
    writes.push_back(
        FromValue(IsMachine(policy), KeyOr(*item, listKey), item->Attribute(L"valueName"), item->Child(L"value")));
}

// The policy's own value; one left implicit counts as a kind this reader does not know.
void AddOwnValue(const Element& policy, const wchar_t* stateName, std::vector<RegistryWrite>& writes) {
  const std::wstring valueName = policy.Attribute(L"valueName");
  if (!valueName.empty())
    writes.push_back(FromValue(IsMachine(policy), policy.Attribute(L"key"), valueName, policy.Child(stateName)));
}

}  // namespace

std::wstring Element::Attribute(const wchar_t* attributeName) const {
  for (const auto& attribute : attributes)
    if (attribute.first == attributeName) return attribute.second;
  return L"";
}

const Element* Element::Child(const wchar_t* childName) const {
  for (const Element& child : children)
    if (child.name == childName) return &child;
  return nullptr;
}

std::vector<const Element*> Element::Children(const wchar_t* childName) const {
  std::vector<const Element*> found;
  for (const Element& child : children)
    if (child.name == childName) found.push_back(&child);
  return found;
}

Element LoadXml(const std::wstring& path) {
  Element root;
  const HRESULT com = CoInitializeEx(nullptr, COINIT_APARTMENTTHREADED);
  {
    CLSID parserClass{};
    ComRef<IXMLDOMDocument> document;
    if (FAILED(CLSIDFromProgID(L"Msxml2.DOMDocument.6.0", &parserClass)) ||
        FAILED(CoCreateInstance(parserClass, nullptr, CLSCTX_INPROC_SERVER, IID_IXMLDOMDocument,
                                document.ReceiveVoid()))) {
      root.text = L"no XML parser";
    } else {
      document->put_async(VARIANT_FALSE);
      document->put_preserveWhiteSpace(VARIANT_TRUE);
      VARIANT file;
      VariantInit(&file);
      file.vt = VT_BSTR;
      file.bstrVal = SysAllocString(path.c_str());
      VARIANT_BOOL loaded = VARIANT_FALSE;
      document->load(file, &loaded);
      VariantClear(&file);
      ComRef<IXMLDOMElement> top;
      if (loaded == VARIANT_TRUE && SUCCEEDED(document->get_documentElement(top.Receive())) && top) {
        root = Convert(top.Get());
      } else {
        ComRef<IXMLDOMParseError> error;
        BSTR reason = nullptr;
        long line = 0;
        if (SUCCEEDED(document->get_parseError(error.Receive())) && error) {
          error->get_reason(&reason);
          error->get_line(&line);
        }
        root.text = path + L"(" + std::to_wstring(line) + L"): " + Take(reason);
      }
    }
  }
  if (SUCCEEDED(com)) CoUninitialize();
  return root;
}

const Element* Policy(const Element& admx, const std::wstring& name) {
  const Element* policies = admx.Child(L"policies");
  for (const Element* policy : policies ? policies->Children(L"policy") : std::vector<const Element*>())
    if (policy->Attribute(L"name") == name) return policy;
  return nullptr;
}

std::vector<const Element*> EnumItems(const Element& policy) {
  std::vector<const Element*> items;
  if (const Element* elements = policy.Child(L"elements"))
    for (const Element* list : elements->Children(L"enum"))
      for (const Element* item : list->Children(L"item")) items.push_back(item);
  return items;
}

std::vector<RegistryWrite> EnabledWrites(const Element& policy, const Element* item) {
  std::vector<RegistryWrite> writes;
  AddOwnValue(policy, L"enabledValue", writes);
  AddList(policy, L"enabledList", writes);
  for (const Element& element : ElementsOf(policy)) {
    const std::wstring key = KeyOr(element, policy.Attribute(L"key")), name = element.Attribute(L"valueName");
    RegistryWrite write{IsMachine(policy), key, name, REG_BINARY, L""};  // other kinds are not read here
    if (element.name == L"enum") {
      const std::vector<const Element*> items = element.Children(L"item");
      const Element* chosen = items.empty() ? nullptr : items.front();
      if (std::find(items.begin(), items.end(), item) != items.end()) chosen = item;
      write = FromValue(write.machine, key, name, chosen ? chosen->Child(L"value") : nullptr);
    }
    writes.push_back(write);
  }
  return writes;
}

std::vector<RegistryWrite> DisabledWrites(const Element& policy) {
  std::vector<RegistryWrite> writes;
  AddOwnValue(policy, L"disabledValue", writes);
  AddList(policy, L"disabledList", writes);
  for (const Element& element : ElementsOf(policy))
    writes.push_back({IsMachine(policy), KeyOr(element, policy.Attribute(L"key")), element.Attribute(L"valueName"),
                      REG_NONE, L""});
  return writes;
}

}  // namespace policy_template
