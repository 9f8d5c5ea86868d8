// GDI+, bound at run time from the system folder. It is no known library on Windows 7, so an
// imported gdiplus.dll would be taken from beside the program; bound here, it never is.
#pragma once

#include <windows.h>
#include <objidl.h>

namespace fw {

// GDI+ (version 1, no debug callback, its own background thread and the system's codecs) for as
// long as the object lives. A session that failed to start is simply not started: images that
// need it are then skipped.
class GdiplusSession {
 public:
  GdiplusSession();
  ~GdiplusSession();
  GdiplusSession(const GdiplusSession&) = delete;
  GdiplusSession& operator=(const GdiplusSession&) = delete;

  bool Started() const { return token_ != 0; }

 private:
  ULONG_PTR token_ = 0;
};

// The image in the stream as a bitmap drawn on an opaque background; null when GDI+ cannot read
// it. A GDI+ session must be running.
HBITMAP DecodeBitmap(IStream* stream, COLORREF background);

}  // namespace fw
