#include "framework/GdiPlus.h"

#include <algorithm>

#include "framework/SystemLibrary.h"

// GDI+'s headers use min and max unqualified, which NOMINMAX takes away.
namespace Gdiplus {
using std::max;
using std::min;
}  // namespace Gdiplus

#include <gdiplus.h>

namespace fw {
namespace {

namespace flat = Gdiplus::DllExports;

// The functions the console uses. The library stays loaded for the life of the process, as an
// imported one would: GDI+ keeps a thread and its objects while it runs.
struct GdiPlusLibrary {
  decltype(&Gdiplus::GdiplusStartup) startup = nullptr;
  decltype(&Gdiplus::GdiplusShutdown) shutdown = nullptr;
  decltype(&flat::GdipCreateBitmapFromStream) createBitmapFromStream = nullptr;
  decltype(&flat::GdipCreateHBITMAPFromBitmap) createHBitmapFromBitmap = nullptr;
  decltype(&flat::GdipDisposeImage) disposeImage = nullptr;

  GdiPlusLibrary() {
    HMODULE module = LoadSystemLibrary(L"gdiplus.dll");
    if (module == nullptr) return;
    Bind(module, "GdiplusStartup", startup);
    Bind(module, "GdiplusShutdown", shutdown);
    Bind(module, "GdipCreateBitmapFromStream", createBitmapFromStream);
    Bind(module, "GdipCreateHBITMAPFromBitmap", createHBitmapFromBitmap);
    Bind(module, "GdipDisposeImage", disposeImage);
  }
  bool Complete() const {
    return startup && shutdown && createBitmapFromStream && createHBitmapFromBitmap && disposeImage;
  }

 private:
  template <class Proc>
  static void Bind(HMODULE module, const char* name, Proc& proc) {
    proc = reinterpret_cast<Proc>(reinterpret_cast<void*>(GetProcAddress(module, name)));
  }
};

const GdiPlusLibrary& Library() {
  static const GdiPlusLibrary library;
  return library;
}

}  // namespace

GdiplusSession::GdiplusSession() {
  if (!Library().Complete()) return;
  Gdiplus::GdiplusStartupInput input;
  if (Library().startup(&token_, &input, nullptr) != Gdiplus::Ok) token_ = 0;
}

GdiplusSession::~GdiplusSession() {
  if (token_ != 0) Library().shutdown(token_);
}

HBITMAP DecodeBitmap(IStream* stream, COLORREF background) {
  if (!Library().Complete()) return nullptr;
  Gdiplus::GpBitmap* image = nullptr;
  if (Library().createBitmapFromStream(stream, &image) != Gdiplus::Ok || image == nullptr) return nullptr;
  HBITMAP bitmap = nullptr;
  const Gdiplus::ARGB color =
      Gdiplus::Color::MakeARGB(255, GetRValue(background), GetGValue(background), GetBValue(background));
  if (Library().createHBitmapFromBitmap(image, &bitmap, color) != Gdiplus::Ok) bitmap = nullptr;
  Library().disposeImage(image);
  return bitmap;
}

}  // namespace fw
