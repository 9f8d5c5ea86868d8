// Images kept as resources of type "PNG" in a resource module, decoded by GDI+.
#pragma once

#include <windows.h>

#include <vector>

#include "framework/ScopedHandle.h"

namespace fw {

// The PNG resource id of module decoded into a bitmap, transparent parts drawn on background;
// null when the resource is missing or cannot be decoded. GDI+ must be running.
HBITMAP LoadPngBitmap(HMODULE module, UINT id, COLORREF background);

// The PNG resources ids of module as bitmaps, in the order of ids, each null that is missing or
// cannot be decoded; GDI+ runs for the call only.
std::vector<ScopedBitmap> DecodePngBitmaps(HMODULE module, const std::vector<UINT>& ids, COLORREF background);

// DecodePngBitmaps on a thread of its own, started by the constructor, so that a window can go on
// building itself while GDI+ loads its codecs for the first image. The worker owns its GDI+ and
// COM for its whole run: both have ended, with every GDI+ object, before Take returns; the bitmaps
// are plain GDI objects that any thread may use.
class PngPreload {
 public:
  PngPreload(HMODULE module, std::vector<UINT> ids, COLORREF background);
  // Waits for the worker, which writes into this object.
  ~PngPreload();
  PngPreload(const PngPreload&) = delete;
  PngPreload& operator=(const PngPreload&) = delete;

  // Waits for the worker and hands over its bitmaps, as DecodePngBitmaps gives them for module.
  // Decodes module's on the calling thread instead when the worker decoded another module's (the
  // program has set a resource library aside since the worker started), when no worker could be
  // started, or after the first call.
  std::vector<ScopedBitmap> Take(HMODULE module);

 private:
  static DWORD WINAPI Work(void* self);

  HMODULE m_module;
  std::vector<UINT> m_ids;
  COLORREF m_background;
  std::vector<ScopedBitmap> m_bitmaps;
  ScopedHandle m_thread;
};

}  // namespace fw
