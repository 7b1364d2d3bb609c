// Finds the slot of a virtual function in its class's table, which is part of a binary interface.
#pragma once

#include <array>
#include <bit>
#include <cstddef>

namespace Qel::Lumetra::ShellExt::Testing {

/// Returns the slot, counted from 0. In the Itanium ABI a pointer to a virtual member function holds the byte
/// offset in the table plus 1, where the 1 distinguishes it from an address.
template <class Function>
std::size_t VirtualSlot(Function function) {
  return (std::bit_cast<std::array<std::size_t, 2>>(function)[0] - 1) / sizeof(void*);
}

}  // namespace Qel::Lumetra::ShellExt::Testing
