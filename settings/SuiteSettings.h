// The suite settings as they are stored, read the one way the main window, Advanced
// Configuration and MaporaReport all take them. Reading never writes, except that Advanced
// Configuration's own read of "Support Local Portal" creates the per-user key it later writes.
#pragma once

#include <windows.h>

#include <optional>

struct InstalledProducts;

struct StoredSuiteSettings {
  // UILANGID; none when it is not stored.
  std::optional<DWORD> uiLangId;
  // Raw EnableKUEI of the Desktop product; 0 when absent.
  DWORD enableKuei = 0;
  // 1 when "Support Local Portal" counts as set, else 0.
  DWORD localPortalSupport = 0;
  bool portalServerSetByAdmin = false;
};

// How the per-user portal settings key is reached.
enum class ConnectionKeyAccess { OpenOnly, CreateMissing };

// UILANGID: any value of at most 4 bytes, whatever its type, read over all-ones; a value that
// reads as all-ones, a longer one or none at all counts as not stored.
std::optional<DWORD> ReadStoredUILangID();
// The raw EnableKUEI of the Desktop product (0 when absent).
DWORD ReadEnableKuei(const InstalledProducts& products);
// "Support Local Portal" counts only when it holds exactly 1: 1 then, else 0.
inline DWORD LocalPortalSupportFromValue(DWORD stored) { return stored == 1 ? 1 : 0; }
// 1 when "Support Local Portal" holds exactly 1 (any value of at most 4 bytes), else 0.
DWORD ReadSupportLocalPortal(ConnectionKeyAccess access);
// An administrator has locked the portal settings ("Portal Server Set By Admin" nonzero).
bool ReadPortalServerSetByAdmin();

// Everything above, with the per-user key only opened.
StoredSuiteSettings ReadStoredSuiteSettings(const InstalledProducts& products);
