// A program that uses the registered extension while it is replaced. It makes an object, prints "using",
// waits for a line or the end of its input, and makes a second object while the first still exists.
//
// Exits with 0 if it could make both objects.
#include <windows.h>

#include <objbase.h>

#include <cstdio>

#include "com_ptr.h"
#include "server_dll.h"

namespace {

using namespace Qel::Lumetra::ShellExt::Testing;

HRESULT Create(ComPtr<IUnknown>& object) {
  return CoCreateInstance(kShellExtClass, nullptr, CLSCTX_INPROC_SERVER, IID_IUnknown,
                          reinterpret_cast<void**>(object.Put()));
}

}  // namespace

int main() {
  if (FAILED(CoInitializeEx(nullptr, COINIT_APARTMENTTHREADED))) return 2;
  ComPtr<IUnknown> first;
  ComPtr<IUnknown> second;
  if (Create(first) != S_OK) return 1;
  std::puts("using");
  std::fflush(stdout);
  std::getchar();
  return Create(second) == S_OK ? 0 : 1;
}
