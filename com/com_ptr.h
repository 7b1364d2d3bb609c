// One counted reference on a COM object.
#pragma once

#include <utility>

namespace Qel::Com {

/// Holds a reference or none; releases it when it goes.
template <class Interface>
class ComPtr {
 public:
  ComPtr() = default;

  /// Takes a reference of its own on `object`, which may be null.
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

  /// The place for a call that hands out a reference. Releases what was held before.
  Interface** Put() {
    *this = ComPtr();
    return &object_;
  }

  /// The reference, which is the caller's from now on.
  [[nodiscard]] Interface* Detach() { return std::exchange(object_, nullptr); }

 private:
  Interface* object_ = nullptr;
};

}  // namespace Qel::Com
