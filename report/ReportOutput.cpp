#include "report/ReportOutput.h"

#include <algorithm>

#include "framework/ScopedHandle.h"
#include "framework/Strings.h"

namespace {

// WriteConsoleW has refused large buffers on older systems; pieces of this size always pass.
constexpr size_t kConsoleChunkChars = 8192;
constexpr size_t kFileChunkBytes = 1 << 20;

bool IsConsole(HANDLE handle) {
  DWORD mode = 0;
  return GetFileType(handle) == FILE_TYPE_CHAR && GetConsoleMode(handle, &mode);
}

DWORD WriteToConsole(HANDLE console, const std::wstring& text) {
  for (size_t at = 0; at < text.size();) {
    size_t count = std::min(kConsoleChunkChars, text.size() - at);
    // A surrogate pair stays in one piece.
    if (at + count < text.size() && IS_HIGH_SURROGATE(text[at + count - 1]) && count > 1) --count;
    DWORD written = 0;
    if (!WriteConsoleW(console, text.data() + at, static_cast<DWORD>(count), &written, nullptr)) return GetLastError();
    if (written == 0) return ERROR_WRITE_FAULT;
    at += written;
  }
  return ERROR_SUCCESS;
}

DWORD WriteBytes(HANDLE handle, const std::string& bytes) {
  for (size_t at = 0; at < bytes.size();) {
    const DWORD count = static_cast<DWORD>(std::min(kFileChunkBytes, bytes.size() - at));
    DWORD written = 0;
    if (!WriteFile(handle, bytes.data() + at, count, &written, nullptr)) return GetLastError();
    if (written == 0) return ERROR_WRITE_FAULT;
    at += written;
  }
  return ERROR_SUCCESS;
}

}  // namespace

std::string ToUtf8(const std::wstring& text) {
  if (text.empty()) return std::string();
  // Without WC_ERR_INVALID_CHARS the system puts U+FFFD in place of a lone surrogate.
  const int length =
      WideCharToMultiByte(CP_UTF8, 0, text.data(), static_cast<int>(text.size()), nullptr, 0, nullptr, nullptr);
  if (length <= 0) return std::string();
  std::string utf8(static_cast<size_t>(length), '\0');
  WideCharToMultiByte(CP_UTF8, 0, text.data(), static_cast<int>(text.size()), &utf8[0], length, nullptr, nullptr);
  return utf8;
}

std::wstring FromUtf8(const std::string& text) {
  if (text.empty()) return std::wstring();
  const int length = MultiByteToWideChar(CP_UTF8, 0, text.data(), static_cast<int>(text.size()), nullptr, 0);
  if (length <= 0) return std::wstring();
  std::wstring wide(static_cast<size_t>(length), L'\0');
  MultiByteToWideChar(CP_UTF8, 0, text.data(), static_cast<int>(text.size()), &wide[0], length);
  return wide;
}

DWORD WriteStandard(DWORD standardHandle, const std::string& utf8) {
  // Nothing to write is no failure, also where the process has no such handle.
  if (utf8.empty()) return ERROR_SUCCESS;
  HANDLE handle = GetStdHandle(standardHandle);
  if (handle == nullptr || handle == INVALID_HANDLE_VALUE) return ERROR_INVALID_HANDLE;
  if (IsConsole(handle)) return WriteToConsole(handle, FromUtf8(utf8));
  return WriteBytes(handle, utf8);
}

DWORD WriteFileContent(const std::wstring& path, const std::string& utf8) {
  fw::ScopedHandle file(
      CreateFileW(path.c_str(), GENERIC_WRITE, 0, nullptr, CREATE_ALWAYS, FILE_ATTRIBUTE_NORMAL, nullptr));
  if (!file) return GetLastError();
  return WriteBytes(file.Get(), utf8);
}

std::wstring DescribeSystemError(DWORD error) {
  // A message is set into a sentence of the tool's own: its closing full stop goes.
  std::wstring description = fw::SystemErrorText(error);
  while (!description.empty() && (description.back() == L'\n' || description.back() == L'\r' ||
                                  description.back() == L' ' || description.back() == L'.'))
    description.pop_back();
  return description.empty() ? std::to_wstring(error) : description;
}
