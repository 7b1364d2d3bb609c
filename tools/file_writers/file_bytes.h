// The bytes of a file under construction. The writers of the file kinds (mrc_file.h and others) append their
// fields one by one, so that a test can give any field any value.
#pragma once

#include <bit>
#include <concepts>
#include <cstddef>
#include <cstdint>
#include <initializer_list>
#include <string>
#include <string_view>
#include <type_traits>

namespace Qel::Lumetra::ShellExt::Testing {

enum class ByteOrder { kLittleEndian, kBigEndian };

class FileBytes {
 public:
  explicit FileBytes(ByteOrder order = ByteOrder::kLittleEndian) : order_(order) {}

  /// Appends an integer, or a float or double as its IEEE bits.
  template <class Number>
    requires std::is_arithmetic_v<Number>
  FileBytes& Put(Number number) {
    if constexpr (std::floating_point<Number>) {
      using Bits = std::conditional_t<sizeof(Number) == 4, std::uint32_t, std::uint64_t>;
      return Put(std::bit_cast<Bits>(number));
    } else {
      for (std::size_t i = 0; i < sizeof(Number); ++i) {
        const std::size_t byte = order_ == ByteOrder::kLittleEndian ? i : sizeof(Number) - 1 - i;
        bytes_.push_back(static_cast<char>(static_cast<std::uint64_t>(number) >> (8 * byte)));
      }
      return *this;
    }
  }

  FileBytes& Text(std::string_view text) {
    bytes_ += text;
    return *this;
  }

  /// Appends zero bytes up to file offset `offset`; nothing if the file is already longer.
  FileBytes& PadTo(std::size_t offset) {
    if (bytes_.size() < offset) bytes_.resize(offset);
    return *this;
  }

  std::size_t size() const { return bytes_.size(); }
  const std::string& bytes() const { return bytes_; }

 private:
  ByteOrder order_;
  std::string bytes_;
};

/// Returns the bytes of numbers of one type, for instance of the pixels of a frame.
template <class Number>
std::string BytesOf(std::initializer_list<Number> numbers, ByteOrder order = ByteOrder::kLittleEndian) {
  FileBytes bytes(order);
  for (const Number number : numbers) bytes.Put(number);
  return bytes.bytes();
}

}  // namespace Qel::Lumetra::ShellExt::Testing
