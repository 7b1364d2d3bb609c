// A program that uses the registered extension while it is replaced: makes an object, says so, waits for a
// line or the end of its input, and makes another one while the first is still there.
//
// exit status: 0 both objects could be made
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
