// The About box: program name, release and build from its template, plus the service pack
// installed for the Desktop product.
#pragma once

#include "framework/Dialog.h"

class CAboutDlg : public CDialog {
 public:
  CAboutDlg();
  ~CAboutDlg() override;

  void SetServicePackInfo(const CString& servicePack, const CString& build);

  CString m_strServicePack;
  CString m_strServicePackBuild;

 protected:
  void DoDataExchange(CDataExchange* pDX) override;
  const MessageMap* GetMessageMap() const override;
};

// The installers record a service pack's build as "<sp>.<build>": everything from the first "."
// on, without the dots ("2.6491" -> "6491", "10.5.6491" -> "56491"). Text without "." is kept.
CString NormalizeServicePackBuild(const CString& build);

// Fills the box with the Desktop product's service pack name and "(Build n)" from the registry;
// both stay empty when no service pack is recorded.
void LoadInstalledServicePack(CAboutDlg& about);
