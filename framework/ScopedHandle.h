// One owner type per kind of handle. Each closes its handle exactly once, when it is reset or
// destroyed; owners move but never copy, so a handle cannot be closed twice or leak on an early
// return.
#pragma once

#include <windows.h>
#include <commctrl.h>
#include <objbase.h>
#include <oleauto.h>
#include <shtypes.h>

namespace fw {

// Traits: Handle, Invalid(), IsValid(handle), Close(handle).
template <class Traits>
class UniqueHandle {
 public:
  using Handle = typename Traits::Handle;

  UniqueHandle() = default;
  explicit UniqueHandle(Handle handle) : handle_(handle) {}
  ~UniqueHandle() { Reset(); }
  UniqueHandle(UniqueHandle&& other) noexcept : handle_(other.Take()) {}
  UniqueHandle& operator=(UniqueHandle&& other) noexcept {
    if (this != &other) Reset(other.Take());
    return *this;
  }
  UniqueHandle(const UniqueHandle&) = delete;
  UniqueHandle& operator=(const UniqueHandle&) = delete;

  bool IsValid() const { return Traits::IsValid(handle_); }
  explicit operator bool() const { return IsValid(); }
  Handle Get() const { return handle_; }

  // Closes what is held and takes handle (by default: nothing).
  void Reset(Handle handle = Traits::Invalid()) {
    Handle old = handle_;
    handle_ = handle;
    if (Traits::IsValid(old)) Traits::Close(old);
  }
  // Gives the handle up without closing it.
  Handle Take() {
    Handle handle = handle_;
    handle_ = Traits::Invalid();
    return handle;
  }
  // For out-parameters: closes what is held and hands out the slot.
  Handle* Receive() {
    Reset();
    return &handle_;
  }

 private:
  Handle handle_ = Traits::Invalid();
};

// Kernel objects (processes, threads, snapshots, files). Both null and INVALID_HANDLE_VALUE mean
// "none", because the API returns either depending on the call.
struct KernelHandleTraits {
  using Handle = HANDLE;
  static Handle Invalid() { return nullptr; }
  static bool IsValid(Handle handle) { return handle != nullptr && handle != INVALID_HANDLE_VALUE; }
  static void Close(Handle handle) { ::CloseHandle(handle); }
};
using ScopedHandle = UniqueHandle<KernelHandleTraits>;

// FindFirstFileW searches.
struct FindHandleTraits {
  using Handle = HANDLE;
  static Handle Invalid() { return INVALID_HANDLE_VALUE; }
  static bool IsValid(Handle handle) { return handle != nullptr && handle != INVALID_HANDLE_VALUE; }
  static void Close(Handle handle) { ::FindClose(handle); }
};
using ScopedFindHandle = UniqueHandle<FindHandleTraits>;

// Memory the system allocated with LocalAlloc for the caller (FormatMessageW with
// FORMAT_MESSAGE_ALLOCATE_BUFFER, CommandLineToArgvW), typed as what it holds.
template <class T>
struct LocalMemoryTraits {
  using Handle = T*;
  static Handle Invalid() { return nullptr; }
  static bool IsValid(Handle handle) { return handle != nullptr; }
  static void Close(Handle handle) { ::LocalFree(handle); }
};
template <class T>
using ScopedLocalMemory = UniqueHandle<LocalMemoryTraits<T>>;

// Movable global memory (streams on HGLOBAL).
struct GlobalMemoryTraits {
  using Handle = HGLOBAL;
  static Handle Invalid() { return nullptr; }
  static bool IsValid(Handle handle) { return handle != nullptr; }
  static void Close(Handle handle) { ::GlobalFree(handle); }
};
using ScopedGlobalMemory = UniqueHandle<GlobalMemoryTraits>;

// GDI objects: bitmaps, brushes, fonts.
template <class T>
struct GdiObjectTraits {
  using Handle = T;
  static Handle Invalid() { return nullptr; }
  static bool IsValid(Handle handle) { return handle != nullptr; }
  static void Close(Handle handle) { ::DeleteObject(handle); }
};
using ScopedBitmap = UniqueHandle<GdiObjectTraits<HBITMAP>>;

// Libraries loaded at run time.
struct LibraryTraits {
  using Handle = HMODULE;
  static Handle Invalid() { return nullptr; }
  static bool IsValid(Handle handle) { return handle != nullptr; }
  static void Close(Handle handle) { ::FreeLibrary(handle); }
};
using ScopedLibrary = UniqueHandle<LibraryTraits>;

// Image lists of the common controls.
struct ImageListTraits {
  using Handle = HIMAGELIST;
  static Handle Invalid() { return nullptr; }
  static bool IsValid(Handle handle) { return handle != nullptr; }
  static void Close(Handle handle) { ImageList_Destroy(handle); }
};
using ScopedImageList = UniqueHandle<ImageListTraits>;

// Texts a COM call hands out as BSTR.
struct BstrTraits {
  using Handle = BSTR;
  static Handle Invalid() { return nullptr; }
  static bool IsValid(Handle handle) { return handle != nullptr; }
  static void Close(Handle handle) { ::SysFreeString(handle); }
};
using ScopedBstr = UniqueHandle<BstrTraits>;

// Shell item lists (PIDLs), which belong to the shell's allocator, the COM task allocator.
struct ItemListTraits {
  using Handle = PIDLIST_ABSOLUTE;
  static Handle Invalid() { return nullptr; }
  static bool IsValid(Handle handle) { return handle != nullptr; }
  static void Close(Handle handle) { ::CoTaskMemFree(handle); }
};
using ScopedItemList = UniqueHandle<ItemListTraits>;

}  // namespace fw
