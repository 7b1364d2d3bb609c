// .emi files: a tree of tagged items, some of which are image objects. The first image stands for the file.
#pragma once

#include <cstddef>
#include <cstdint>
#include <istream>
#include <string_view>
#include <vector>

#include "file_parser.h"

namespace Qel::Lumetra::ShellExt {

/// What every item begins with. Its type says how its value is stored, type and tag together what it means.
struct EmiItemId {
  std::uint16_t type = 0;
  std::uint16_t tag = 0;

  friend bool operator==(const EmiItemId&, const EmiItemId&) = default;
};

/// Walks once through the whole tree, from the stream's position, counts its images and keeps the first.
/// The tree may be of any depth: the open items are kept on the heap, four bytes each as in the file.
class EmiParser final : public FileParser {
 public:
  /// A file with another header is not walked. A walk ends at the end of the tree or of the file, and leaves
  /// the stream good. Throws std::invalid_argument ("bad EMI object index") for an item that is not as deep
  /// in the tree as its meaning asks for.
  explicit EmiParser(std::istream& stream);

  /// The stream may be at its end or have failed in a read.
  bool IsValid() const { return !stream().bad() && !fault(); }

  static std::string_view comment() { return "VRA EMI File"; }

 private:
  EmiItemId ReadItemId();
  void Walk();

  /// Goes past the value of the innermost open item. False for a structure, whose value is a list of items.
  bool ReadValue();
  void ReadArray();
  void ReadPixelArray();

  /// An open item: -1 is the innermost one, -2 its parent.
  const EmiItemId& PathEntry(std::ptrdiff_t index) const;

  std::vector<EmiItemId> objectPath_;  // the open items, innermost last
  std::uint64_t imageCount_ = 0;
};

}  // namespace Qel::Lumetra::ShellExt
