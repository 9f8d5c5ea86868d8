// Text types and string-table access. Every text a user sees is loaded through here, from the
// current resource module (the localized resource library once start-up has chosen one).
#pragma once

#include <windows.h>

#include <string>
#include <vector>

using CString = std::wstring;
using CStringArray = std::vector<std::wstring>;

namespace fw {

// The module that dialogs, strings, icons and images are loaded from. Starts as the program's
// own module; start-up switches it to the localized resource library.
HINSTANCE GetResourceHandle();
void SetResourceHandle(HINSTANCE module);
// Returns to the program's own resources for the rest of the run: a window the adopted library
// cannot build is built from them, as without a library. False when they are in use already.
bool RevertToBuiltInResources();
// Reverts as above when the module in use has no dialog template id, before the dialog opens:
// texts loaded for it beforehand then come from the same resources as the dialog itself.
void RevertUnlessDialogTemplateFound(UINT id);

// String-table entry id of the current resource module; empty when it has none.
CString LoadString(UINT id);
// String-table entry id of module; empty when it has none.
CString LoadStringFrom(HINSTANCE module, UINT id);
// printf-style formatting of a wide format ("%s" takes a wide string, as on Windows).
CString FormatV(const wchar_t* format, va_list args);
CString Format(const wchar_t* format, ...);
// String-table entry id used as a printf-style format.
CString FormatString(UINT id, ...);
// String-table entry id with "%1".."%9" inserts filled by the system's message formatting;
// empty when the entry is missing.
CString FormatMessageString(UINT id, const std::vector<CString>& inserts);
// The same for a format already loaded; empty for an empty format.
CString FormatMessageText(const CString& format, const std::vector<CString>& inserts);

CString ToUpper(const CString& text);

// The system's description of a Win32 error code or HRESULT, in the user's language and without
// its trailing line break; empty when the system has none.
CString SystemErrorText(DWORD code);
// The computer's NetBIOS name (at most 15 characters); empty for a longer one or when it cannot be had.
CString ComputerName();

}  // namespace fw
