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

// Handles for which null is the only "none", released by Closer. The closers are taken by address
// as the system declares them, calling convention and all.
template <class H, auto Closer>
struct NullHandleTraits {
  using Handle = H;
  static Handle Invalid() { return nullptr; }
  static bool IsValid(Handle handle) { return handle != nullptr; }
  static void Close(Handle handle) { Closer(handle); }
};

// Memory the system allocated with LocalAlloc for the caller (FormatMessageW with
// FORMAT_MESSAGE_ALLOCATE_BUFFER, CommandLineToArgvW), typed as what it holds.
template <class T>
using ScopedLocalMemory = UniqueHandle<NullHandleTraits<T*, &::LocalFree>>;
// Movable global memory (streams on HGLOBAL).
using ScopedGlobalMemory = UniqueHandle<NullHandleTraits<HGLOBAL, &::GlobalFree>>;
// GDI bitmaps.
using ScopedBitmap = UniqueHandle<NullHandleTraits<HBITMAP, &::DeleteObject>>;
// Libraries loaded at run time.
using ScopedLibrary = UniqueHandle<NullHandleTraits<HMODULE, &::FreeLibrary>>;
// Image lists of the common controls.
using ScopedImageList = UniqueHandle<NullHandleTraits<HIMAGELIST, &::ImageList_Destroy>>;
// Texts a COM call hands out as BSTR.
using ScopedBstr = UniqueHandle<NullHandleTraits<BSTR, &::SysFreeString>>;
// Shell item lists (PIDLs), which belong to the shell's allocator, the COM task allocator.
using ScopedItemList = UniqueHandle<NullHandleTraits<PIDLIST_ABSOLUTE, &::CoTaskMemFree>>;

}  // namespace fw
