// The built DLL as a test sees it: loaded from the build folder, spoken to through its exports only.
#pragma once

#include <gtest/gtest.h>
#include <windows.h>

#include <unknwn.h>

#include <filesystem>

#include "com_ptr.h"

namespace Qel::Lumetra::ShellExt::Testing {

using Com::ComPtr;

// The classes that clients know, by identifiers that must never change.
inline constexpr CLSID kShellExtClass = {
    0x79E696A1, 0x2FA5, 0x4B3E, {0x96, 0x10, 0xD5, 0xF7, 0x60, 0x41, 0x7E, 0x62}};
inline constexpr CLSID kEbnHandlerClass = {
    0xE37DEDA9, 0xF652, 0x401B, {0xB6, 0x19, 0xA1, 0xA8, 0x8E, 0xAD, 0xD0, 0x03}};
inline constexpr CLSID kRawHandlerClass = {
    0xE217E970, 0x5E2E, 0x11E1, {0xB8, 0x6C, 0x08, 0x00, 0x20, 0x0C, 0x9A, 0x66}};
inline constexpr CLSID kMrcHandlerClass = {
    0xADF28042, 0x3A9F, 0x4409, {0x9C, 0x62, 0x44, 0x4B, 0x01, 0x8A, 0x78, 0x10}};

/// QelShellExt.dll, loaded as long as this lives.
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

  /// The class factory of `clsid`; a test failure and null when there is none.
  ComPtr<IClassFactory> Factory(REFCLSID clsid) const;

  /// A new object of the class; a test failure and null when there is none.
  template <class Interface>
  ComPtr<Interface> CreateInstance(REFCLSID clsid, REFIID iid, IUnknown* outer = nullptr) const {
    ComPtr<Interface> object;
    if (const ComPtr<IClassFactory> factory = Factory(clsid)) {
      EXPECT_EQ(factory->CreateInstance(outer, iid, reinterpret_cast<void**>(object.Put())), S_OK);
    }
    return object;
  }

  /// The module's lock count. It is found by unlocking the server until it may be unloaded, and locking it
  /// as often again, so no other thread may use the server meanwhile. A test failure and -1 when the count is
  /// negative or above 1,000.
  LONG LockCount() const;

 private:
  HMODULE module_;
  LPFNGETCLASSOBJECT getClassObject_;
  LPFNCANUNLOADNOW canUnloadNow_;
};

/// The object's `Interface`; a test failure and null when it has none.
template <class Interface, class Object>
ComPtr<Interface> As(const ComPtr<Object>& object, REFIID iid) {
  ComPtr<Interface> answer;
  EXPECT_EQ(object->QueryInterface(iid, reinterpret_cast<void**>(answer.Put())), S_OK);
  return answer;
}

/// How many references others hold on `object`.
template <class Object>
ULONG References(const ComPtr<Object>& object) {
  object->AddRef();
  return object->Release() - 1;
}

/// A test of the DLL, which must leave nothing behind: no lock, and so a DLL that unloads.
class ServerTest : public testing::Test {
 protected:
  ~ServerTest() override { EXPECT_EQ(dll_.CanUnloadNow(), S_OK); }

  ServerDll dll_;
};

/// The outer half of an aggregate, on the caller's stack. The inner half is released when this goes.
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
