// The size of a frame in pixels.
#pragma once

#include <cstdint>

namespace Qel::Lumetra::ShellExt {

struct Size2 {
  std::int32_t width = 0;
  std::int32_t height = 0;

  friend bool operator==(const Size2&, const Size2&) = default;
};

}  // namespace Qel::Lumetra::ShellExt
