// Where MaporaReport's output goes: text is UTF-16 inside the program and UTF-8 outside it,
// except on a console window, which takes the characters themselves.
#pragma once

#include <windows.h>

#include <string>

// UTF-8 of text. A lone surrogate (registry text is not checked when stored) becomes U+FFFD, so
// the result is always valid UTF-8.
std::string ToUtf8(const std::wstring& text);
// The reverse, for valid UTF-8.
std::wstring FromUtf8(const std::string& text);

// Writes utf8 to a standard handle (STD_OUTPUT_HANDLE, STD_ERROR_HANDLE): with WriteConsoleW
// when it is a console window, as the bytes themselves when it is redirected. ERROR_SUCCESS, or
// the error that stopped it.
DWORD WriteStandard(DWORD standardHandle, const std::string& utf8);

// Replaces the file's content with utf8. ERROR_SUCCESS, or the error that stopped it.
DWORD WriteFileContent(const std::wstring& path, const std::string& utf8);

// The system's description of a Win32 error code, without its line break.
std::wstring DescribeSystemError(DWORD error);
