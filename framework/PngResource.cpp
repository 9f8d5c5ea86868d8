#include "framework/PngResource.h"

#include <cstring>

#include "framework/ComRef.h"
#include "framework/GdiPlus.h"
#include "framework/Strings.h"

namespace fw {

HBITMAP LoadPngBitmap(UINT id, COLORREF background) {
  HMODULE module = GetResourceHandle();
  HRSRC info = FindResourceW(module, MAKEINTRESOURCEW(id), L"PNG");
  if (info == nullptr) return nullptr;
  DWORD size = SizeofResource(module, info);
  HGLOBAL resource = LoadResource(module, info);
  const void* data = resource ? LockResource(resource) : nullptr;
  if (data == nullptr || size == 0) return nullptr;

  // GDI+ decodes from a stream it may read lazily, so it gets a copy it owns.
  HGLOBAL copy = GlobalAlloc(GMEM_MOVEABLE, size);
  if (copy == nullptr) return nullptr;
  void* target = GlobalLock(copy);
  if (target == nullptr) {
    GlobalFree(copy);
    return nullptr;
  }
  std::memcpy(target, data, size);
  GlobalUnlock(copy);

  ComRef<IStream> stream;
  if (FAILED(CreateStreamOnHGlobal(copy, TRUE, stream.Receive()))) {
    GlobalFree(copy);
    return nullptr;
  }
  return DecodeBitmap(stream.Get(), background);
}

}  // namespace fw
