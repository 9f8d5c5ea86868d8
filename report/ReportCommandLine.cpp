#include "report/ReportCommandLine.h"

#include <cwchar>

namespace {

constexpr wchar_t kJson[] = L"--json";
constexpr wchar_t kHelp[] = L"--help";
constexpr wchar_t kOut[] = L"--out";

bool IsOption(const wchar_t* argument) { return std::wcsncmp(argument, L"--", 2) == 0; }

}  // namespace

ParsedCommandLine ParseReportCommandLine(int argc, const wchar_t* const* argv) {
  ParsedCommandLine parsed;
  for (int i = 1; i < argc; ++i) {
    const wchar_t* argument = argv[i] != nullptr ? argv[i] : L"";
    if (std::wcscmp(argument, kJson) == 0) {
      parsed.options.json = true;
    } else if (std::wcscmp(argument, kHelp) == 0 || std::wcscmp(argument, L"/?") == 0) {
      parsed.options.help = true;
    } else if (std::wcscmp(argument, L"--version") == 0) {
      parsed.options.version = true;
    } else if (std::wcscmp(argument, kOut) == 0) {
      if (i + 1 >= argc || argv[i + 1] == nullptr || argv[i + 1][0] == L'\0' || IsOption(argv[i + 1])) {
        parsed.error = CommandLineError::MissingFileName;
        parsed.argument = argument;
        return parsed;
      }
      parsed.options.outFile = argv[++i];
    } else {
      parsed.error = CommandLineError::UnknownOption;
      parsed.argument = argument;
      return parsed;
    }
  }
  return parsed;
}
