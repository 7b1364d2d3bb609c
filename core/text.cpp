#include "text.h"

#include <windows.h>

#include <algorithm>
#include <array>

// The linker defines this symbol in every module. Its address is the instance handle of the module that this
// code is linked into, the DLL or a test program.
extern "C" IMAGE_DOS_HEADER __ImageBase;

namespace Qel::Lumetra::ShellExt {

std::wstring LoadResourceString(std::uint32_t id) {
  std::array<wchar_t, 256> buffer{};
  const auto module = reinterpret_cast<HINSTANCE>(&__ImageBase);
  if (LoadStringW(module, id, buffer.data(), static_cast<int>(buffer.size())) <= 0) return {};
  return buffer.data();
}

std::wstring WidenComment(const char* first, const char* last) {
  std::wstring wide(static_cast<std::size_t>(last - first), L'\0');
  std::transform(first, last, wide.begin(), [](char byte) {
    return static_cast<wchar_t>(static_cast<std::uint16_t>(static_cast<signed char>(byte)));
  });
  return wide;
}

}  // namespace Qel::Lumetra::ShellExt
