// Owns a system handle, as ComPtr owns an interface.
#pragma once

#include <windows.h>

#include <utility>

namespace Qel::Com {

/// Owns a handle or none, and closes it in its destructor.
template <class Handle, auto kClose>
class HandleOwner {
 public:
  HandleOwner() = default;

  /// Takes ownership of `handle`. A handle of -1, which functions that create files return on failure, counts
  /// as none, as null does.
  explicit HandleOwner(Handle handle)
      : handle_(reinterpret_cast<LONG_PTR>(handle) == -1 ? nullptr : handle) {}

  HandleOwner(HandleOwner&& other) noexcept : handle_(std::exchange(other.handle_, nullptr)) {}

  HandleOwner& operator=(HandleOwner other) noexcept {
    std::swap(handle_, other.handle_);
    return *this;
  }

  ~HandleOwner() {
    if (handle_ != nullptr) kClose(handle_);
  }

  Handle Get() const { return handle_; }
  explicit operator bool() const { return handle_ != nullptr; }

  /// Closes the handle now.
  void Reset() { *this = HandleOwner(); }

  /// Closes the handle and returns the address for a call that returns a new one.
  Handle* Put() {
    Reset();
    return &handle_;
  }

 private:
  Handle handle_ = nullptr;
};

using OwnedHandle = HandleOwner<HANDLE, &CloseHandle>;
using OwnedModule = HandleOwner<HMODULE, &FreeLibrary>;
using OwnedKey = HandleOwner<HKEY, &RegCloseKey>;
using OwnedBitmap = HandleOwner<HBITMAP, &DeleteObject>;

}  // namespace Qel::Com
