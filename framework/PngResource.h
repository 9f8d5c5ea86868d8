// Images kept as resources of type "PNG" in the current resource module. GDI+ must be running.
#pragma once

#include <windows.h>

namespace fw {

// The PNG resource id decoded into a bitmap, transparent parts drawn on background;
// null when the resource is missing or cannot be decoded.
HBITMAP LoadPngBitmap(UINT id, COLORREF background);

}  // namespace fw
