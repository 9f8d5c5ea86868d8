// MaporaReport: the installation report of this workstation, printed without a window, for the
// inventory jobs that administrators run on every machine. It reads what the console reads and
// changes nothing.
#include <windows.h>

#include <exception>
#include <string>

#include "MaporaVersion.h"
#include "framework/App.h"
#include "framework/Strings.h"
#include "inventory/InstallationReport.h"
#include "locale/KVELLocale.h"
#include "report/ReportCommandLine.h"
#include "report/ReportIds.h"
#include "report/ReportOutput.h"
#include "report/WorkstationInventory.h"

namespace {

constexpr int kExitDone = 0;
constexpr int kExitFailed = 1;
constexpr int kExitUsage = 2;

constexpr wchar_t kLineBreak[] = L"\r\n";
// The console's language pack: the report's texts are the console's.
constexpr wchar_t kConsolePack[] = L"ResMaporaAdmin.dll";

// The tool's own texts come from its language pack (ResMaporaReport.dll) where the locale
// library finds one, and otherwise, or when the pack lacks one, from the English built in.
std::wstring ToolString(UINT id) {
  static const HINSTANCE self = GetModuleHandleW(nullptr);
  static const HINSTANCE pack = KVELLocale::LoadLocalizedRes(self);
  for (HINSTANCE module : {pack, self}) {
    const wchar_t* text = nullptr;
    // With a zero length LoadStringW points into the resource, which is not zero-terminated.
    const int length = module ? LoadStringW(module, id, reinterpret_cast<LPWSTR>(&text), 0) : 0;
    if (length > 0 && text != nullptr) return std::wstring(text, static_cast<size_t>(length));
  }
  return std::wstring();
}

void PrintError(const std::wstring& message) { WriteStandard(STD_ERROR_HANDLE, ToUtf8(message + kLineBreak)); }

int UsageError(const ParsedCommandLine& parsed) {
  const UINT message =
      parsed.error == CommandLineError::MissingFileName ? IDS_REPORT_MISSING_FILE_NAME : IDS_REPORT_UNKNOWN_OPTION;
  PrintError(fw::Format(ToolString(message).c_str(), parsed.argument.c_str()) + kLineBreak +
             ToolString(IDS_REPORT_USAGE));
  return kExitUsage;
}

// The text the workstation page shows, in the language the locale library picks.
std::wstring ReportText(const InstalledProducts& products) {
  if (HINSTANCE pack = KVELLocale::LoadLocalizedResFromFile(kConsolePack)) fw::SetResourceHandle(pack);
  return ComposeInstallationReport(ReadReportInput(products), LoadReportTexts()).text;
}

// Writes the output to outFile, or to standard output when it is empty.
int Emit(const std::wstring& outFile, const std::string& output) {
  const DWORD error = outFile.empty() ? WriteStandard(STD_OUTPUT_HANDLE, output) : WriteFileContent(outFile, output);
  if (error == ERROR_SUCCESS) return kExitDone;
  const std::wstring reason = DescribeSystemError(error);
  if (outFile.empty())
    PrintError(fw::Format(ToolString(IDS_REPORT_CANNOT_WRITE_OUTPUT).c_str(), reason.c_str()));
  else
    PrintError(fw::Format(ToolString(IDS_REPORT_CANNOT_WRITE_FILE).c_str(), outFile.c_str(), reason.c_str()));
  return kExitFailed;
}

std::string MakeOutput(const ReportOptions& options) {
  InstalledProducts products;
  DetectProductsAsTheConsoleDoes(products);
  if (options.json) return InventoryJson(ReadWorkstationInventory(products));
  return ToUtf8(ReportText(products));
}

int Run(int argc, const wchar_t* const* argv) {
  const ParsedCommandLine parsed = ParseReportCommandLine(argc, argv);
  if (parsed.error != CommandLineError::None) return UsageError(parsed);
  const ReportOptions& options = parsed.options;
  if (options.help) return Emit(L"", ToUtf8(ToolString(IDS_REPORT_USAGE)));
  if (options.version)
    return Emit(L"", ToUtf8(fw::Format(ToolString(IDS_REPORT_VERSION).c_str(), MAPORA_FILE_VERSION_WTEXT)));

  // COM as the console has it: the runtime-information component answers only there.
  CWinApp app;
  if (!app.InitOle()) {
    PrintError(ToolString(IDS_REPORT_OLE_FAILED));
    return kExitFailed;
  }
  return Emit(options.outFile, MakeOutput(options));
}

}  // namespace

int wmain(int argc, wchar_t** argv) {
  // An unattended job must get an exit code and a message, never a crash dialog.
  try {
    return Run(argc, argv);
  } catch (const std::exception& error) {
    PrintError(fw::Format(ToolString(IDS_REPORT_FAILED).c_str(), FromUtf8(error.what()).c_str()));
  } catch (...) {
    PrintError(fw::Format(ToolString(IDS_REPORT_FAILED).c_str(), L"?"));
  }
  return kExitFailed;
}
