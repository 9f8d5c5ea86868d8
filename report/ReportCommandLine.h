// MaporaReport's command line: what to print and where to.
#pragma once

#include <string>

struct ReportOptions {
  bool json = false;
  bool help = false;
  bool version = false;
  // Empty: standard output.
  std::wstring outFile;
};

enum class CommandLineError { None, UnknownOption, MissingFileName };

struct ParsedCommandLine {
  ReportOptions options;
  CommandLineError error = CommandLineError::None;
  // The argument the error is about.
  std::wstring argument;
};

// Arguments 1..argc-1: "--json", "--help", "--version", "--out FILE". The first wrong argument ends the walk.
// A file name that looks like an option ("--out --json") counts as missing: such a name is far
// more likely a forgotten one than a file meant to be called that.
ParsedCommandLine ParseReportCommandLine(int argc, const wchar_t* const* argv);
