// The installation report of the workstation page (and of the headless report tool): the rule
// that turns the products' installation values into the text and its emphasised headings, and
// the readers that gather those values for it.
#pragma once

#include <cstddef>
#include <string>
#include <vector>

#include "inventory/InstalledProducts.h"

// Texts of the current resource module the report is made of.
struct ReportTexts {
  std::wstring desktop;  // product headings, already upper case
  std::wstring engine;
  std::wstring skyloft;
  std::wstring server;
  std::wstring installationInformation;  // section headings
  std::wstring servicePackInformation;
  std::wstring productTemplate;  // printf-style, one "%s" per line's value
  std::wstring skyloftTemplate;
};

// Who runs the report and where the per-user and temporary files go; the same in every block.
struct SessionFolders {
  std::wstring user;
  std::wstring appData;
  std::wstring temp;
};

// Everything one report is made from.
struct ReportInput {
  bool desktopInstalled = false;
  bool engineInstalled = false;
  bool skyloftInstalled = false;
  bool serverInstalled = false;
  ProductInstallInfo desktop;
  ProductInstallInfo engine;
  ProductInstallInfo server;
  std::wstring skyloftInstallDir;
  SessionFolders session;
};

// The four products in report order: where detection keeps each one's key and flag, and where the
// report input keeps them; reportName names the product in reports.
struct ReportProduct {
  ProductKind kind;
  const char* reportName;
  std::wstring InstalledProducts::*key;
  bool InstalledProducts::*detected;
  bool ReportInput::*installed;
  ProductInstallInfo ReportInput::*values;  // null for Skyloft: only its installation folder counts
};
inline const ReportProduct kReportProducts[] = {
    {ProductKind::Desktop, "desktop", &InstalledProducts::desktopKey, &InstalledProducts::desktopInstalled,
     &ReportInput::desktopInstalled, &ReportInput::desktop},
    {ProductKind::Engine, "engine", &InstalledProducts::engineKey, &InstalledProducts::engineInstalled,
     &ReportInput::engineInstalled, &ReportInput::engine},
    {ProductKind::Skyloft, "skyloft", &InstalledProducts::skyloftKey, &InstalledProducts::skyloftInstalled,
     &ReportInput::skyloftInstalled, nullptr},
    {ProductKind::Server, "server", &InstalledProducts::serverKey, &InstalledProducts::serverInstalled,
     &ReportInput::serverInstalled, &ReportInput::server},
};

// A run of characters of the report text to show emphasised: [start, start + length).
struct TextRange {
  size_t start = 0;
  size_t length = 0;
  bool operator==(const TextRange& other) const { return start == other.start && length == other.length; }
};

struct InstallationReport {
  std::wstring text;
  // In text order is not promised: product headings first, then the section headings.
  std::vector<TextRange> emphasis;
};

// The blocks of the installed products in the fixed order Desktop, Engine, Skyloft, Server.
// Emphasised: the first whole-word, case-exact occurrence of each product heading, and every
// occurrence of each section heading. A word is whole when no letter or digit touches it.
InstallationReport ComposeInstallationReport(const ReportInput& input, const ReportTexts& texts);

// The offset in a rich edit control of an offset in text: the control keeps "\r\n" as one
// character.
size_t RichEditOffset(const std::wstring& text, size_t offset);

// The report texts of the current resource module.
ReportTexts LoadReportTexts();
// The current user, the roaming application-data folder and the temporary folder; empty where
// one cannot be had.
SessionFolders ReadSessionFolders();
// Reads every product's values afresh from the registry for the products detected.
ReportInput ReadReportInput(const InstalledProducts& products);
