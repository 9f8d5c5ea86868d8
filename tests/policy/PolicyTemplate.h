// The Group Policy templates as the tests see them: parsed by the system's XML parser (MSXML,
// through COM) into plain element trees, and the registry writes a policy's state stands for.
#pragma once

#include <windows.h>

#include <string>
#include <utility>
#include <vector>

namespace policy_template {

struct Element {
  std::wstring name;          // local name, without a namespace prefix
  std::wstring namespaceUri;  // of the element itself
  std::vector<std::pair<std::wstring, std::wstring>> attributes;
  std::wstring text;  // the element's own text and CDATA, untouched
  std::vector<Element> children;

  std::wstring Attribute(const wchar_t* attributeName) const;  // "" when absent
  const Element* Child(const wchar_t* childName) const;         // the first one; null when absent
  std::vector<const Element*> Children(const wchar_t* childName) const;
};

// An empty element, with the parser's reason and line in text, when the file is not well-formed XML.
Element LoadXml(const std::wstring& path);

// One value the Group Policy client sets or deletes, keys as the template names them.
struct RegistryWrite {
  bool machine;  // HKEY_LOCAL_MACHINE, else HKEY_CURRENT_USER
  std::wstring key, valueName;
  DWORD type;         // REG_NONE: the value is deleted; REG_BINARY: a kind this reader does not know
  std::wstring data;  // decimal or text, as the template gives it
};

// The policies of an ADMX root, by name.
const Element* Policy(const Element& admx, const std::wstring& name);
// The items of the policy's enum elements, in order.
std::vector<const Element*> EnumItems(const Element& policy);
// What the policy writes when enabled, with `item` chosen in its enum (the first item when null).
std::vector<RegistryWrite> EnabledWrites(const Element& policy, const Element* item = nullptr);
// What it writes when disabled; element values are deleted then.
std::vector<RegistryWrite> DisabledWrites(const Element& policy);

}  // namespace policy_template
