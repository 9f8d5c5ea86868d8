#include "framework/PngResource.h"

#include <cstring>

#include "framework/ComRef.h"
#include "framework/GdiPlus.h"
#include "framework/ScopedHandle.h"
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
  fw::ScopedGlobalMemory copy(GlobalAlloc(GMEM_MOVEABLE, size));
  if (!copy) return nullptr;
  void* target = GlobalLock(copy.Get());
  if (target == nullptr) return nullptr;
  std::memcpy(target, data, size);
  GlobalUnlock(copy.Get());

  ComRef<IStream> stream;
  if (FAILED(CreateStreamOnHGlobal(copy.Get(), TRUE, stream.Receive()))) return nullptr;
  // The stream frees the memory from here on.
  copy.Release();
  return DecodeBitmap(stream.Get(), background);
}

}  // namespace fw
