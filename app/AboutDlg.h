// The About box: program name, release and build from its template, plus the service pack
// installed for the Desktop product.
#pragma once

#include "framework/Dialog.h"

class CAboutDlg : public CDialog {
 public:
  CAboutDlg();

  void SetServicePackInfo(const CString& servicePack, const CString& build);

  CString m_strServicePack;
  CString m_strServicePackBuild;

 protected:
  void DoDataExchange(CDataExchange* pDX) override;
};

// The installers record a service pack's build as "<sp>.<build>": everything from the first "."
// on, without the dots ("2.6491" -> "6491", "10.5.6491" -> "56491"). Text without "." is kept.
CString NormalizeServicePackBuild(const CString& build);

// What the box's two service-pack fields show.
struct ServicePackTexts {
  CString servicePack;
  CString build;
};

// From the recorded name and build (SPDisplayName, SPBuild) and the build field's format
// ("(Build %1)", with the system's message inserts): no name shows nothing at all, no build (or no
// format) leaves the build field empty, and a build fills the format with its normalized text.
ServicePackTexts ServicePackFieldTexts(const CString& name, const CString& recordedBuild, const CString& buildFormat);

// Fills the box from the Desktop product's registry key, read afresh.
void LoadInstalledServicePack(CAboutDlg& about);
