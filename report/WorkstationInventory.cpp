#include "report/WorkstationInventory.h"

#include <nlohmann/json.hpp>
#include <iterator>
#include <vector>

#include "framework/Strings.h"
#include "report/ReportOutput.h"

namespace {

using Json = nlohmann::ordered_json;

Json Product(const ReportProduct& entry, const std::wstring& key, const ReportInput& values) {
  Json product = {{"installed", values.*entry.installed}, {"registryKey", ToUtf8(key)}};
  if (entry.values == nullptr) {
    product["installDir"] = ToUtf8(values.skyloftInstallDir);
    return product;
  }
  const ProductInstallInfo& info = values.*entry.values;
  for (const InstallValue& value : kInstallValues) product[value.reportName] = ToUtf8(info.*value.member);
  product["productVersion"] = ToUtf8(info.productVersion);
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
  for (const ReportProduct& product : kReportProducts) inventory.productKeys.push_back(products.*product.key);
  inventory.values = ReadReportInput(products);
  inventory.settings = ReadStoredSuiteSettings(products);
  return inventory;
}

std::string InventoryJson(const WorkstationInventory& inventory) {
  const ReportInput& values = inventory.values;
  const StoredSuiteSettings& settings = inventory.settings;
  Json products = Json::object();
  for (size_t index = 0; index < std::size(kReportProducts); ++index)
    products[kReportProducts[index].reportName] =
        Product(kReportProducts[index], inventory.productKeys.at(index), values);
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
      {"products", products},
      {"settings",
       {{"displayLanguage", displayLanguage},
        {"improvementProgram", {{"enableKuei", settings.enableKuei}, {"on", settings.enableKuei != 0}}},
        {"localPortalSupport", settings.localPortalSupport == 1},
        {"portalServerSetByAdmin", settings.portalServerSetByAdmin}}},
  };
  return document.dump(2) + "\n";
}
