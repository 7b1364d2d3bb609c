#include "text.h"

#include <windows.h>

#include <algorithm>
#include <array>
#include <iterator>

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

std::wstring WidenComment(std::string_view bytes) {
  std::wstring wide;
  wide.reserve(bytes.size());
  std::ranges::transform(bytes, std::back_inserter(wide), [](char byte) {
    return static_cast<wchar_t>(static_cast<std::uint16_t>(static_cast<signed char>(byte)));
  });
  return wide;
}

}  // namespace Qel::Lumetra::ShellExt
