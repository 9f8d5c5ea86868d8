#include "framework/PngResource.h"

#include <objbase.h>

#include <cstring>
#include <utility>

#include "framework/ComRef.h"
#include "framework/GdiPlus.h"

namespace fw {

HBITMAP LoadPngBitmap(HMODULE module, UINT id, COLORREF background) {
  HRSRC info = FindResourceW(module, MAKEINTRESOURCEW(id), L"PNG");
  if (info == nullptr) return nullptr;
  DWORD size = SizeofResource(module, info);
  HGLOBAL resource = LoadResource(module, info);
  const void* data = resource ? LockResource(resource) : nullptr;
  if (data == nullptr || size == 0) return nullptr;

  // GDI+ decodes from a stream it may read lazily, so it gets a copy it owns.
  fw::ScopedGlobalMemory copy(GlobalAlloc(GMEM_MOVEABLE, size));
  if (!copy) return nullptr;
  void* target = GlobalLock(copy.Get());
  if (target == nullptr) return nullptr;
  std::memcpy(target, data, size);
  GlobalUnlock(copy.Get());

  ComRef<IStream> stream;
  if (FAILED(CreateStreamOnHGlobal(copy.Get(), TRUE, stream.Receive()))) return nullptr;
  // The stream frees the memory from here on.
  copy.Take();
  return DecodeBitmap(stream.Get(), background);
}

std::vector<ScopedBitmap> DecodePngBitmaps(HMODULE module, const std::vector<UINT>& ids, COLORREF background) {
  std::vector<ScopedBitmap> bitmaps(ids.size());
  // The session ends after the streams and GDI+ images: only GDI bitmaps outlive it.
  GdiplusSession gdiplus;
  if (!gdiplus.Started()) return bitmaps;
  for (size_t i = 0; i < ids.size(); ++i) bitmaps[i].Reset(LoadPngBitmap(module, ids[i], background));
  return bitmaps;
}

PngPreload::PngPreload(HMODULE module, std::vector<UINT> ids, COLORREF background)
    : m_module(module), m_ids(std::move(ids)), m_background(background) {
  m_thread.Reset(CreateThread(nullptr, 0, Work, this, 0, nullptr));
}

PngPreload::~PngPreload() {
  if (m_thread) WaitForSingleObject(m_thread.Get(), INFINITE);
}

DWORD WINAPI PngPreload::Work(void* self) {
  PngPreload& preload = *static_cast<PngPreload*>(self);
  // Some systems' GDI+ reaches its codecs through COM, which every thread starts for itself.
  const HRESULT com = CoInitializeEx(nullptr, COINIT_MULTITHREADED);
  preload.m_bitmaps = DecodePngBitmaps(preload.m_module, preload.m_ids, preload.m_background);
  if (SUCCEEDED(com)) CoUninitialize();
  return 0;
}

std::vector<ScopedBitmap> PngPreload::Take(HMODULE module) {
  if (!m_thread) return DecodePngBitmaps(module, m_ids, m_background);
  WaitForSingleObject(m_thread.Get(), INFINITE);
  m_thread.Reset();
  if (module != m_module) return DecodePngBitmaps(module, m_ids, m_background);
  return std::move(m_bitmaps);
}

}  // namespace fw
