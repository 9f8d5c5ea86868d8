#include "framework/Strings.h"

#include <strsafe.h>

#include <cstdarg>

#include "framework/ScopedHandle.h"

namespace fw {
namespace {
HINSTANCE g_resourceModule = nullptr;
}

HINSTANCE GetResourceHandle() { return g_resourceModule ? g_resourceModule : GetModuleHandleW(nullptr); }

void SetResourceHandle(HINSTANCE module) { g_resourceModule = module; }

bool RevertToBuiltInResources() {
  if (GetResourceHandle() == GetModuleHandleW(nullptr)) return false;
  // The library stays loaded: what was taken from it already (icons among them) lives on.
  g_resourceModule = nullptr;
  return true;
}

void RevertUnlessDialogTemplateFound(UINT id) {
  if (FindResourceW(GetResourceHandle(), MAKEINTRESOURCEW(id), RT_DIALOG) == nullptr)
    RevertToBuiltInResources();
}

CString LoadString(UINT id) { return LoadStringFrom(GetResourceHandle(), id); }

CString LoadStringFrom(HINSTANCE module, UINT id) {
  // With a zero length LoadStringW hands out a pointer into the resource itself, which is not
  // zero-terminated; the returned length is what counts.
  const wchar_t* text = nullptr;
  int length = module != nullptr ? LoadStringW(module, id, reinterpret_cast<LPWSTR>(&text), 0) : 0;
  if (length <= 0 || text == nullptr) return CString();
  return CString(text, static_cast<size_t>(length));
}

CString FormatV(const wchar_t* format, va_list args) {
  if (format == nullptr) return CString();
  // Grow until the text fits; the strsafe formatter follows Windows' "%s" rule on every compiler.
  for (size_t capacity = 256; capacity <= STRSAFE_MAX_CCH; capacity *= 4) {
    std::vector<wchar_t> buffer(capacity);
    va_list copy;
    va_copy(copy, args);
    HRESULT hr = StringCchVPrintfW(buffer.data(), capacity, format, copy);
    va_end(copy);
    if (SUCCEEDED(hr)) return CString(buffer.data());
    if (hr != STRSAFE_E_INSUFFICIENT_BUFFER) return CString();
  }
  return CString();
}

CString Format(const wchar_t* format, ...) {
  va_list args;
  va_start(args, format);
  CString text = FormatV(format, args);
  va_end(args);
  return text;
}

CString FormatString(UINT id, ...) {
  CString format = LoadString(id);
  va_list args;
  va_start(args, id);
  CString text = FormatV(format.c_str(), args);
  va_end(args);
  return text;
}

CString FormatMessageString(UINT id, const std::vector<CString>& inserts) {
  return FormatMessageText(LoadString(id), inserts);
}

CString FormatMessageText(const CString& format, const std::vector<CString>& inserts) {
  if (format.empty()) return CString();
  std::vector<DWORD_PTR> args;
  for (const CString& insert : inserts) args.push_back(reinterpret_cast<DWORD_PTR>(insert.c_str()));
  // A (translated) text may name any insert from %1 to %99: every one must point at something.
  while (args.size() < 99) args.push_back(reinterpret_cast<DWORD_PTR>(L""));
  ScopedLocalMemory<wchar_t> out;
  DWORD length = FormatMessageW(FORMAT_MESSAGE_FROM_STRING | FORMAT_MESSAGE_ALLOCATE_BUFFER |
                                    FORMAT_MESSAGE_ARGUMENT_ARRAY,
                                format.c_str(), 0, 0, reinterpret_cast<LPWSTR>(out.Receive()), 0,
                                reinterpret_cast<va_list*>(args.data()));
  CString text;
  if (length > 0 && out) text.assign(out.Get(), length);
  return text;
}

CString ToUpper(const CString& text) {
  CString upper = text;
  if (!upper.empty()) CharUpperBuffW(&upper[0], static_cast<DWORD>(upper.size()));
  return upper;
}

CString SystemErrorText(DWORD code) {
  ScopedLocalMemory<wchar_t> text;
  const DWORD length =
      FormatMessageW(FORMAT_MESSAGE_FROM_SYSTEM | FORMAT_MESSAGE_ALLOCATE_BUFFER | FORMAT_MESSAGE_IGNORE_INSERTS,
                     nullptr, code, 0, reinterpret_cast<LPWSTR>(text.Receive()), 0, nullptr);
  CString description;
  if (length > 0 && text) description.assign(text.Get(), length);
  while (!description.empty() && (description.back() == L'\n' || description.back() == L'\r')) description.pop_back();
  return description;
}

CString ComputerName() {
  // The NetBIOS name's own limit: a longer name does not fit and reads as none, in the tree label
  // and the report alike, rather than one showing a name the other cannot.
  wchar_t name[MAX_COMPUTERNAME_LENGTH + 1] = {};
  DWORD size = MAX_COMPUTERNAME_LENGTH + 1;
  if (!GetComputerNameW(name, &size)) return CString();
  return CString(name, size);
}

}  // namespace fw
