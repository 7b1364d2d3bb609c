// A smart pointer that owns one reference to a COM object.
#pragma once

#include <utility>

namespace Qel::Com {

/// Owns a reference or none, and releases it in its destructor.
template <class Interface>
class ComPtr {
 public:
  ComPtr() = default;

  /// Adds a reference to `object`, which may be null.
  explicit ComPtr(Interface* object) : object_(object) {
    if (object_ != nullptr) object_->AddRef();
  }

  ComPtr(const ComPtr& other) : ComPtr(other.object_) {}
  ComPtr(ComPtr&& other) noexcept : object_(other.Detach()) {}

  ComPtr& operator=(ComPtr other) noexcept {
    std::swap(object_, other.object_);
    return *this;
  }

  ~ComPtr() {
    if (object_ != nullptr) object_->Release();
  }

  Interface* Get() const { return object_; }
  Interface* operator->() const { return object_; }
  explicit operator bool() const { return object_ != nullptr; }

  /// Releases the reference and returns the address for a call that returns a new one.
  Interface** Put() {
    *this = ComPtr();
    return &object_;
  }

  /// Returns the reference without releasing it; the caller owns it from now on.
  [[nodiscard]] Interface* Detach() { return std::exchange(object_, nullptr); }

 private:
  Interface* object_ = nullptr;
};

}  // namespace Qel::Com
