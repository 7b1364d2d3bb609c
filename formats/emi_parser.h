// .emi files: a tree of tagged items, some of which are image objects. The first image stands for the file.
#pragma once

#include <cstdint>
#include <istream>
#include <optional>
#include <string>
#include <string_view>

#include "data_type.h"
#include "emi_object_path.h"
#include "file_parser.h"

namespace Qel::Lumetra::ShellExt {

/// What an image object and a line-data object have in common. Texts that the file does not have are empty;
/// they are as ReadText keeps them.
struct EmiDataObject {
  std::string label100;
  std::string label419;
  std::string label400;
  std::string label440;
  std::optional<double> extraValue1;
  std::optional<double> extraValue2;
};

/// A line of values. What it has none of is 0 or none.
struct EmiLineData : EmiDataObject {
  std::uint32_t length = 0;  // number of values
  std::optional<DataType> dataType;
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
  bool IsValid() const { return !stream().bad() && imageCount_ > 0; }

  static std::string_view comment() { return "VRA EMI File"; }

  /// The first of each, without the size and the pixels of the image, which are those of the frame.
  const EmiDataObject& image() const { return image_; }
  const EmiLineData& lineData() const { return lineData_; }

  std::uint64_t lineDataCount() const { return lineDataCount_; }

 private:
  EmiItemId ReadItemId();
  void Walk();

  /// Goes past the value of the innermost open item. False for a structure, whose value is a list of items.
  bool ReadValue();
  void ReadDoubleValue();
  void ReadTextValue();
  void ReadArray();
  void ReadPixelArray();
  void ReadLineArray();

  /// Where the values of the object `id`, which was opened last, are kept; null for any but a first one.
  EmiDataObject* KeptObject(const EmiItemId& id);

  EmiObjectPath objectPath_;
  std::uint64_t imageCount_ = 0;
  std::uint64_t lineDataCount_ = 0;
  EmiDataObject image_;
  EmiLineData lineData_;
};

}  // namespace Qel::Lumetra::ShellExt
