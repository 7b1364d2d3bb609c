// .emi files: a tree of tagged items, some of which are image objects. The first image represents the file.
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

/// The values that an image object and a line-data object (a line of values) both have. Strings are empty if
/// the file has none; ReadText limits their length.
struct EmiDataObject {
  std::string label100;
  std::string label419;
  std::string label400;
  std::string label440;
  std::optional<double> extraValue1;
  std::optional<double> extraValue2;
};

/// A line of values. Values that are missing from the file are 0 or empty.
struct EmiLineData : EmiDataObject {
  std::uint32_t length = 0;  // number of values
  std::optional<DataType> dataType;
};

/// Traverses the whole tree once from the stream's position, counts its images and keeps the first one. The
/// tree may have any depth: the open items are on the heap and take four bytes each.
class EmiParser final : public FileParser {
 public:
  /// Does not traverse a file whose header is not acceptable. A traversal ends at the end of the tree or of
  /// the file, and leaves the stream good. Throws std::invalid_argument ("bad EMI object index") for an item
  /// that is not as deep in the tree as its type requires.
  explicit EmiParser(std::istream& stream);

  /// Returns whether the file has an image. Of the stream's state only badbit matters: missing pixels do not
  /// make the file invalid.
  bool IsValid() const { return !stream().bad() && imageCount_ > 0; }

  static std::string_view comment() { return "VRA EMI File"; }

  /// Return the first image and the first line. The size and the pixels of the image are in the frame.
  const EmiDataObject& image() const { return image_; }
  const EmiLineData& lineData() const { return lineData_; }

  std::uint64_t lineDataCount() const { return lineDataCount_; }

 private:
  EmiItemId ReadItemId();
  void Traverse();

  /// Reads or skips the value of the innermost open item. Returns false for a structure, whose value is a
  /// list of items.
  bool ReadValue();
  void ReadDoubleValue();
  void ReadTextValue();
  void ReadArray();
  void ReadPixelArray();
  void ReadLineArray();

  /// Returns where to keep the values of the most recently opened object, whose identifier is `id`; null
  /// unless it is the first image or the first line.
  EmiDataObject* KeptObject(const EmiItemId& id);

  EmiObjectPath objectPath_;
  std::uint64_t imageCount_ = 0;
  std::uint64_t lineDataCount_ = 0;
  EmiDataObject image_;
  EmiLineData lineData_;
};

}  // namespace Qel::Lumetra::ShellExt
