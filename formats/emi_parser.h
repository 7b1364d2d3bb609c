// .emi files: a tree of tagged items, some of which are image objects. The first image stands for the file.
#pragma once

#include <cstdint>
#include <istream>
#include <string_view>

#include "emi_object_path.h"
#include "file_parser.h"

namespace Qel::Lumetra::ShellExt {

/// Walks once through the whole tree, from the stream's position, counts its images and keeps the first.
/// The tree may be of any depth: the open items are kept on the heap, four bytes each as in the file.
class EmiParser final : public FileParser {
 public:
  /// A file with another header is not walked. A walk ends at the end of the tree or of the file, and leaves
  /// the stream good. Throws std::invalid_argument ("bad EMI object index") for an item that is not as deep
  /// in the tree as its meaning asks for.
  explicit EmiParser(std::istream& stream);

  /// The stream may be at its end or have failed in a read.
  bool IsValid() const { return !stream().bad() && imageCount_ > 0; }

  static std::string_view comment() { return "VRA EMI File"; }

 private:
  EmiItemId ReadItemId();
  void Walk();

  /// Goes past the value of the innermost open item. False for a structure, whose value is a list of items.
  bool ReadValue();
  void ReadArray();
  void ReadPixelArray();

  EmiObjectPath objectPath_;
  std::uint64_t imageCount_ = 0;
};

}  // namespace Qel::Lumetra::ShellExt
