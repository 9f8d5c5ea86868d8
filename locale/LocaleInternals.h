// Operations of KVELLocale that the suite's own code uses but that are not exported.
#pragma once

#include "locale/KVELLocale.h"

namespace KVELLocale {

// Computes the process-wide state once; later calls return at once.
void InitLocale();
// True when some supported system locale shares the primary language of langId. Not re-entrant.
bool IsValidLangID(unsigned short langId);
// Maps a language-pack folder name ("de" -> 0x0007, "de-DE" -> 0x0407) to a LANGID.
// langId is 0 unless a supported locale matches. Not re-entrant.
bool GetLangIDFromName(const wchar_t* name, unsigned short& langId);

}  // namespace KVELLocale
