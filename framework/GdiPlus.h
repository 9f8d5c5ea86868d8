// GDI+, bound at run time from the system folder. It is no known library on Windows 7, so an
// imported gdiplus.dll would be taken from beside the program; bound here, it never is.
#pragma once

#include <windows.h>
#include <objidl.h>

namespace fw {

// Starts GDI+ (version 1, no debug callback, its own background thread and the system's codecs);
// the token for StopGdiPlus, or 0 when GDI+ cannot be started.
ULONG_PTR StartGdiPlus();
void StopGdiPlus(ULONG_PTR token);

// The image in the stream as a bitmap drawn on an opaque background; null when GDI+ cannot read
// it. GDI+ must have been started.
HBITMAP DecodeBitmap(IStream* stream, COLORREF background);

}  // namespace fw
