// The suite products the console knows, where each keeps its installation record, and how the
// console decides which of them are installed. Everything here only reads.
#pragma once

#include <windows.h>

#include <string>
#include <vector>

#include "inventory/SuiteRuntimeEnumerator.h"

enum class ProductKind { Engine = 0, Desktop = 1, Skyloft = 2, Server = 3 };

// The detection result; one instance lives in the main window.
struct InstalledProducts {
  std::wstring version;
  std::wstring desktopKey;
  std::wstring engineKey;
  std::wstring skyloftKey;
  std::wstring serverKey;
  bool desktopInstalled = false;
  bool engineInstalled = false;
  bool skyloftInstalled = false;
  bool serverInstalled = false;  // no detection rule sets it: a Server is never reported

  // Kept by ListInstalledRuntimeVersions for DetectInstalledProducts; empty when the suite's
  // runtime-information component is not registered.
  ComRef<ISuiteRuntimeInfo> runtimeInfo;
  ComRef<ISuiteRuntimeEnumerator> runtimeEnumerator;
};

// The installation values of one product, as text; defaults are the report's.
struct ProductInstallInfo {
  std::wstring installDir;
  std::wstring installer;
  std::wstring productName;
  std::wstring imageLocation;
  std::wstring installDate;
  std::wstring installTime;
  std::wstring realVersion;
  std::wstring spNumber = L"0";
  std::wstring spBuild = L"0";
  std::wstring spInstaller = L"N/A";
  std::wstring spInstallDate = L"N/A";
  std::wstring spInstallTime = L"N/A";
  std::wstring spStatus = L"N/A";
  std::wstring spDisplayName;
  std::wstring productVersion = L"?";
};

// The installation values read from a product's key, in report order: the member, the registry
// value it comes from (Engine keeps its image under "SourceDir" instead) and its name in reports.
// productVersion is not among them: it comes from the core library.
struct InstallValue {
  std::wstring ProductInstallInfo::*member;
  const wchar_t* valueName;
  const char* reportName;
};
inline const InstallValue kInstallValues[] = {
    {&ProductInstallInfo::installDir, L"InstallDir", "installDir"},
    {&ProductInstallInfo::installer, L"Installer", "installer"},
    {&ProductInstallInfo::productName, L"ProductName", "productName"},
    {&ProductInstallInfo::imageLocation, L"ImageLocation", "imageLocation"},
    {&ProductInstallInfo::installDate, L"InstallDate", "installDate"},
    {&ProductInstallInfo::installTime, L"InstallTime", "installTime"},
    {&ProductInstallInfo::realVersion, L"RealVersion", "realVersion"},
    {&ProductInstallInfo::spNumber, L"SPNumber", "spNumber"},
    {&ProductInstallInfo::spBuild, L"SPBuild", "spBuild"},
    {&ProductInstallInfo::spInstaller, L"SPInstaller", "spInstaller"},
    {&ProductInstallInfo::spInstallDate, L"SPInstallDate", "spInstallDate"},
    {&ProductInstallInfo::spInstallTime, L"SPInstallTime", "spInstallTime"},
    {&ProductInstallInfo::spStatus, L"SPStatus", "spStatus"},
    {&ProductInstallInfo::spDisplayName, L"SPDisplayName", "spDisplayName"},
};

// The release the console administers: "10.5".
std::wstring GetProductVersion();

// Reads any value of any type and size as UTF-16 text up to its first zero character;
// defaultText when the key or the value cannot be read. Keys naming "Skyloft2016.1" are read
// through the 64-bit registry view.
std::wstring ReadRegistryString(HKEY hive, const std::wstring& subkey, const std::wstring& valueName,
                                const std::wstring& defaultText);

void DetectInstalledProducts(InstalledProducts& products);
ProductInstallInfo ReadProductInstallInfo(ProductKind kind, const std::wstring& productKey);
bool GetInstallDir(int productIndex, std::wstring version, std::wstring& installDir);
std::wstring GetProductBinFolder(const std::wstring& productKey);
std::wstring GetCoreProductVersion(const std::wstring& installDir);
std::vector<std::wstring> ListInstalledRuntimeVersions(InstalledProducts& products);

// The rules behind detection, free of the registry, the environment and COM.

// Keys naming Skyloft's release are read through the 64-bit registry view (case-sensitive).
bool ReadsThe64BitView(const std::wstring& subkey);

// One runtime as the suite's runtime-information component lists it.
struct SuiteRuntime {
  long productCode = 0;
  std::wstring version;
};

// What detection looks at.
struct DetectionEvidence {
  bool desktopMarkerSet = false;  // KVEL_DESKTOP<version>_INSTALLED exists and is not empty
  bool engineMarkerSet = false;   // KVEL_ENGINE<version>_INSTALLED likewise
  std::vector<SuiteRuntime> runtimes;  // in the component's order, up to the first failing item
  bool skyloftKeyFound = false;        // Skyloft's key opens in the 64-bit view
};

struct DetectedProducts {
  bool desktop = false;
  bool engine = false;
  bool skyloft = false;
};

// Desktop wins over Engine among the markers; a runtime counts only in the release version,
// which must also be the console's own release; Skyloft is its key.
DetectedProducts DecideInstalledProducts(const std::wstring& version, const DetectionEvidence& evidence);
// The versions of the Desktop and Engine runtimes, each once (letter case ignored), in order.
std::vector<std::wstring> DistinctRuntimeVersions(const std::vector<SuiteRuntime>& runtimes);
