// Owns a handle of the system, as ComPtr owns an interface.
#pragma once

#include <windows.h>

#include <utility>

namespace Qel::Com {

/// Holds a handle or none and closes it in its destructor.
template <class Handle, auto close>
class HandleOwner {
 public:
  HandleOwner() = default;

  /// Functions that create files return -1 instead of null when they fail; it counts as no handle, too.
  explicit HandleOwner(Handle handle)
      : handle_(reinterpret_cast<LONG_PTR>(handle) == -1 ? nullptr : handle) {}

  HandleOwner(HandleOwner&& other) noexcept : handle_(std::exchange(other.handle_, nullptr)) {}

  HandleOwner& operator=(HandleOwner other) noexcept {
    std::swap(handle_, other.handle_);
    return *this;
  }

  ~HandleOwner() {
    if (handle_ != nullptr) close(handle_);
  }

  Handle Get() const { return handle_; }
  explicit operator bool() const { return handle_ != nullptr; }

  /// Closes the handle before the owner ends.
  void Reset() { *this = HandleOwner(); }

  /// Closes the handle and returns the place for a new one, for a function that stores it there.
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
