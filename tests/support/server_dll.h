// The built DLL as tests use it: loaded from the build folder and called through its exports only.
#pragma once

#include <gtest/gtest.h>
#include <windows.h>

#include <unknwn.h>

#include <filesystem>

#include "com_ptr.h"

namespace Qel::Lumetra::ShellExt::Testing {

using Com::ComPtr;

// The classes that clients create. These identifiers must never change.
inline constexpr CLSID kShellExtClass = {
    0x79E696A1, 0x2FA5, 0x4B3E, {0x96, 0x10, 0xD5, 0xF7, 0x60, 0x41, 0x7E, 0x62}};
inline constexpr CLSID kEbnHandlerClass = {
    0xE37DEDA9, 0xF652, 0x401B, {0xB6, 0x19, 0xA1, 0xA8, 0x8E, 0xAD, 0xD0, 0x03}};
inline constexpr CLSID kRawHandlerClass = {
    0xE217E970, 0x5E2E, 0x11E1, {0xB8, 0x6C, 0x08, 0x00, 0x20, 0x0C, 0x9A, 0x66}};
inline constexpr CLSID kMrcHandlerClass = {
    0xADF28042, 0x3A9F, 0x4409, {0x9C, 0x62, 0x44, 0x4B, 0x01, 0x8A, 0x78, 0x10}};

/// Keeps QelShellExt.dll loaded while it exists.
class ServerDll {
 public:
  /// Throws std::runtime_error if the DLL does not load.
  ServerDll();
  ~ServerDll();
  ServerDll(const ServerDll&) = delete;
  ServerDll& operator=(const ServerDll&) = delete;

  static std::filesystem::path Path();

  HMODULE module() const { return module_; }

  // The exports.
  HRESULT GetClassObject(REFCLSID clsid, REFIID iid, void** classObject) const {
    return getClassObject_(clsid, iid, classObject);
  }
  HRESULT CanUnloadNow() const { return canUnloadNow_(); }

  /// Returns the class factory of `clsid`. Without one it fails the test and returns null.
  ComPtr<IClassFactory> Factory(REFCLSID clsid) const;

  /// Returns a new object of the class. If there is none, it fails the test and returns null.
  template <class Interface>
  ComPtr<Interface> CreateInstance(REFCLSID clsid, REFIID iid, IUnknown* outer = nullptr) const {
    ComPtr<Interface> object;
    if (const ComPtr<IClassFactory> factory = Factory(clsid)) {
      EXPECT_EQ(factory->CreateInstance(outer, iid, reinterpret_cast<void**>(object.Put())), S_OK);
    }
    return object;
  }

  /// Returns the module's lock count. It unlocks the server until it may be unloaded, then locks it again the
  /// same number of times, so no other thread may use the server meanwhile. If the count is negative or above
  /// 1,000, it fails the test and returns -1.
  LONG LockCount() const;

 private:
  HMODULE module_;
  LPFNGETCLASSOBJECT getClassObject_;
  LPFNCANUNLOADNOW canUnloadNow_;
};

/// Returns the object's `Interface`. Without one it fails the test and returns null.
template <class Interface, class Object>
ComPtr<Interface> As(const ComPtr<Object>& object, REFIID iid) {
  ComPtr<Interface> answer;
  EXPECT_EQ(object->QueryInterface(iid, reinterpret_cast<void**>(answer.Put())), S_OK);
  return answer;
}

/// Returns how many references to `object` exist besides this one.
template <class Object>
ULONG References(const ComPtr<Object>& object) {
  object->AddRef();
  return object->Release() - 1;
}

/// A test of the DLL. Afterwards the DLL must have no lock, so that it can be unloaded.
class ServerTest : public testing::Test {
 protected:
  ~ServerTest() override { EXPECT_EQ(dll_.CanUnloadNow(), S_OK); }

  ServerDll dll_;
};

/// The outer object of an aggregate, on the caller's stack. Its destructor releases the inner object.
class OuterObject final : public IUnknown {
 public:
  HRESULT STDMETHODCALLTYPE QueryInterface(REFIID iid, void** object) override;
  ULONG STDMETHODCALLTYPE AddRef() override { return ++references_; }
  ULONG STDMETHODCALLTYPE Release() override { return --references_; }

  ULONG references() const { return references_; }

  ComPtr<IUnknown> inner;

 private:
  ULONG references_ = 1;
};

}  // namespace Qel::Lumetra::ShellExt::Testing
