#include "report/WorkstationInventory.h"

#include <nlohmann/json.hpp>
#include <vector>

#include "framework/Strings.h"
#include "report/ReportOutput.h"

namespace {

using Json = nlohmann::ordered_json;

struct InstallField {
  const char* name;
  std::wstring ProductInstallInfo::*member;
};

// Every installation value, named as in ProductInstallInfo.
const InstallField kInstallFields[] = {
    {"installDir", &ProductInstallInfo::installDir},
    {"installer", &ProductInstallInfo::installer},
    {"productName", &ProductInstallInfo::productName},
    {"imageLocation", &ProductInstallInfo::imageLocation},
    {"installDate", &ProductInstallInfo::installDate},
    {"installTime", &ProductInstallInfo::installTime},
    {"realVersion", &ProductInstallInfo::realVersion},
    {"spNumber", &ProductInstallInfo::spNumber},
    {"spBuild", &ProductInstallInfo::spBuild},
    {"spInstaller", &ProductInstallInfo::spInstaller},
    {"spInstallDate", &ProductInstallInfo::spInstallDate},
    {"spInstallTime", &ProductInstallInfo::spInstallTime},
    {"spStatus", &ProductInstallInfo::spStatus},
    {"spDisplayName", &ProductInstallInfo::spDisplayName},
    {"productVersion", &ProductInstallInfo::productVersion},
};

Json Product(bool installed, const std::wstring& key, const ProductInstallInfo& info) {
  Json product = {{"installed", installed}, {"registryKey", ToUtf8(key)}};
  for (const InstallField& field : kInstallFields) product[field.name] = ToUtf8(info.*field.member);
  return product;
}

}  // namespace

void DetectProductsAsTheConsoleDoes(InstalledProducts& products) {
  // The enumerator it keeps is what detection asks about the installed runtimes.
  ListInstalledRuntimeVersions(products);
  DetectInstalledProducts(products);
}

WorkstationInventory ReadWorkstationInventory(const InstalledProducts& products) {
  WorkstationInventory inventory;
  inventory.release = products.version;
  inventory.computerName = fw::ComputerName();
  inventory.desktopKey = products.desktopKey;
  inventory.engineKey = products.engineKey;
  inventory.skyloftKey = products.skyloftKey;
  inventory.serverKey = products.serverKey;
  inventory.values = ReadReportInput(products);
  inventory.settings = ReadStoredSuiteSettings(products);
  return inventory;
}

std::string InventoryJson(const WorkstationInventory& inventory) {
  const ReportInput& values = inventory.values;
  const StoredSuiteSettings& settings = inventory.settings;
  Json skyloft = {{"installed", values.skyloftInstalled},
                  {"registryKey", ToUtf8(inventory.skyloftKey)},
                  {"installDir", ToUtf8(values.skyloftInstallDir)}};
  Json displayLanguage = {{"uiLangId", nullptr}, {"followsWindows", true}};
  if (settings.uiLangId) {
    displayLanguage["uiLangId"] = *settings.uiLangId;
    // 0 is never written by the console, but means the same as no value to every reader.
    displayLanguage["followsWindows"] = *settings.uiLangId == 0;
  }
  Json document = {
      {"release", ToUtf8(inventory.release)},
      {"computerName", ToUtf8(inventory.computerName)},
      {"session",
       {{"user", ToUtf8(values.session.user)},
        {"appDataFolder", ToUtf8(values.session.appData)},
        {"tempFolder", ToUtf8(values.session.temp)}}},
      {"products",
       {{"desktop", Product(values.desktopInstalled, inventory.desktopKey, values.desktop)},
        {"engine", Product(values.engineInstalled, inventory.engineKey, values.engine)},
        {"skyloft", skyloft},
        {"server", Product(values.serverInstalled, inventory.serverKey, values.server)}}},
      {"settings",
       {{"displayLanguage", displayLanguage},
        {"improvementProgram", {{"enableKuei", settings.enableKuei}, {"on", settings.enableKuei != 0}}},
        {"localPortalSupport", settings.localPortalSupport == 1},
        {"portalServerSetByAdmin", settings.portalServerSetByAdmin}}},
  };
  return document.dump(2) + "\n";
}
