// The place of a virtual function in its class's table, which is a part of a binary interface.
#pragma once

#include <array>
#include <bit>
#include <cstddef>

namespace Qel::Lumetra::ShellExt::Testing {

/// Counted from 0. A pointer to a virtual member function holds the offset in the table, and a bit that
/// distinguishes it from an address.
template <class Function>
std::size_t VirtualSlot(Function function) {
  return (std::bit_cast<std::array<std::size_t, 2>>(function)[0] - 1) / sizeof(void*);
}

}  // namespace Qel::Lumetra::ShellExt::Testing
