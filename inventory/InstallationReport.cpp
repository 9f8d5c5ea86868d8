#include "inventory/InstallationReport.h"

#include <shlobj.h>

#include "framework/ScopedHandle.h"
#include "framework/Strings.h"
#include "res/resource.h"

namespace {

// GetUserNameW's limit for a user name plus its terminator.
constexpr DWORD kUserNameChars = 257;
constexpr DWORD kPathChars = MAX_PATH;

bool IsWordCharacter(wchar_t c) { return IsCharAlphaNumericW(c) != FALSE; }

// The first whole-word, case-exact occurrence of word at or after from; npos when there is none.
size_t FindWholeWord(const std::wstring& text, const std::wstring& word, size_t from) {
  // An empty word (a string missing from a resource library) would match everywhere.
  if (word.empty()) return std::wstring::npos;
  for (size_t at = text.find(word, from); at != std::wstring::npos; at = text.find(word, at + 1)) {
    const size_t end = at + word.size();
    const bool startsWord = at == 0 || !IsWordCharacter(text[at - 1]) || !IsWordCharacter(word.front());
    const bool endsWord = end == text.size() || !IsWordCharacter(text[end]) || !IsWordCharacter(word.back());
    if (startsWord && endsWord) return at;
  }
  return std::wstring::npos;
}

std::wstring ProductBlock(const ReportTexts& texts, const std::wstring& heading, const ProductInstallInfo& info,
                          const SessionFolders& session) {
  return fw::Format(texts.productTemplate.c_str(), heading.c_str(), texts.installationInformation.c_str(),
                    info.productName.c_str(), info.realVersion.c_str(), info.productVersion.c_str(),
                    info.installDir.c_str(), info.installer.c_str(), info.installDate.c_str(),
                    info.installTime.c_str(), info.imageLocation.c_str(), session.user.c_str(),
                    session.appData.c_str(), session.temp.c_str(), texts.servicePackInformation.c_str(),
                    info.spNumber.c_str(), info.spBuild.c_str());
}

std::wstring CurrentUserName() {
  wchar_t name[kUserNameChars] = L"";
  DWORD size = kUserNameChars;
  if (!GetUserNameW(name, &size)) return std::wstring();
  return name;
}

std::wstring RoamingAppDataFolder() {
  fw::ScopedItemList itemList;
  if (FAILED(SHGetSpecialFolderLocation(nullptr, CSIDL_APPDATA, itemList.Receive())) || !itemList)
    return std::wstring();
  wchar_t path[kPathChars] = L"";
  if (!SHGetPathFromIDListW(itemList.Get(), path)) path[0] = L'\0';
  return path;
}

std::wstring TemporaryFolder() {
  wchar_t path[kPathChars] = L"";
  DWORD length = GetTempPathW(kPathChars, path);
  // A result of kPathChars or more is the size the path would need: nothing was written.
  if (length == 0 || length >= kPathChars) return std::wstring();
  return std::wstring(path, length);
}

}  // namespace

InstallationReport ComposeInstallationReport(const ReportInput& input, const ReportTexts& texts) {
  // Every block is formatted, installed or not; only the installed ones make up the report.
  const std::wstring desktopBlock = ProductBlock(texts, texts.desktop, input.desktop, input.session);
  const std::wstring engineBlock = ProductBlock(texts, texts.engine, input.engine, input.session);
  const std::wstring serverBlock = ProductBlock(texts, texts.server, input.server, input.session);
  const std::wstring skyloftBlock = fw::Format(texts.skyloftTemplate.c_str(), texts.skyloft.c_str(),
                                               texts.installationInformation.c_str(),
                                               input.skyloftInstallDir.c_str());
  InstallationReport report;
  if (input.desktopInstalled) report.text += desktopBlock;
  if (input.engineInstalled) report.text += engineBlock;
  if (input.skyloftInstalled) report.text += skyloftBlock;
  if (input.serverInstalled) report.text += serverBlock;

  // A product heading is its first occurrence only; section headings repeat once per block.
  for (const std::wstring* product : {&texts.desktop, &texts.engine, &texts.skyloft, &texts.server}) {
    const size_t at = FindWholeWord(report.text, *product, 0);
    if (at != std::wstring::npos) report.emphasis.push_back({at, product->size()});
  }
  for (const std::wstring* section : {&texts.installationInformation, &texts.servicePackInformation}) {
    for (size_t at = FindWholeWord(report.text, *section, 0); at != std::wstring::npos;
         at = FindWholeWord(report.text, *section, at + 1))
      report.emphasis.push_back({at, section->size()});
  }
  return report;
}

size_t RichEditOffset(const std::wstring& text, size_t offset) {
  size_t pairs = 0;
  for (size_t at = text.find(L"\r\n"); at != std::wstring::npos && at + 1 < offset; at = text.find(L"\r\n", at + 2))
    ++pairs;
  return offset - pairs;
}

ReportTexts LoadReportTexts() {
  ReportTexts texts;
  texts.desktop = fw::ToUpper(fw::LoadString(IDS_DESKTOP));
  texts.engine = fw::ToUpper(fw::LoadString(IDS_ENGINE));
  texts.skyloft = fw::ToUpper(fw::LoadString(IDS_SKYLOFT));
  texts.server = fw::ToUpper(fw::LoadString(IDS_SERVER));
  texts.installationInformation = fw::LoadString(IDS_INSTALLATION_INFORMATION);
  texts.servicePackInformation = fw::LoadString(IDS_SERVICE_PACK_INFORMATION);
  texts.productTemplate = fw::LoadString(IDS_PRODUCT_REPORT);
  texts.skyloftTemplate = fw::LoadString(IDS_SKYLOFT_REPORT);
  return texts;
}

SessionFolders ReadSessionFolders() { return {CurrentUserName(), RoamingAppDataFolder(), TemporaryFolder()}; }

ReportInput ReadReportInput(const InstalledProducts& products) {
  ReportInput input;
  for (const ReportProduct& product : kReportProducts) {
    input.*product.installed = products.*product.detected;
    if (product.values != nullptr)
      input.*product.values = ReadProductInstallInfo(product.kind, products.*product.key);
    else
      input.skyloftInstallDir = ReadRegistryString(HKEY_LOCAL_MACHINE, products.*product.key, L"InstallDir", L"");
  }
  input.session = ReadSessionFolders();
  return input;
}
