// .ser files: a series of images, found through an array of offsets. The first image stands for the file.
#pragma once

#include <cstdint>
#include <istream>
#include <optional>
#include <string>
#include <vector>

#include "file_parser.h"

namespace Qel::Lumetra::ShellExt {

/// Element number `element` of an axis has the value `offset`; the step from element to element is `delta`.
struct SerCalibration {
  double offset = 0;
  double delta = 0;
  std::int32_t element = 0;
};

/// One of the directions in which the images of a series follow each other.
struct SerDimension {
  std::uint32_t dimensionSize = 0;
  SerCalibration calibration;
  std::string description;  // this and `units` as far as ReadText keeps them
  std::string units;
};

/// What the header says of the series as a whole.
struct SerSeries {
  bool hasPositionTags = false;  // otherwise the tags of the images are times
  std::uint32_t dimensionCount = 0;
  std::vector<SerDimension> dimensions;  // the first ones, at most kMaxDimensions
};

/// The axes of an image.
struct SerElement {
  SerCalibration calibrationX;
  SerCalibration calibrationY;
};

/// Goes once through the whole index, from the stream's position, and keeps the first element of it. Takes
/// neither memory nor time for more than what the file really holds.
class SerParser final : public FileParser {
 public:
  /// Throws std::length_error for a text of negative length.
  explicit SerParser(std::istream& stream);

  /// A series of lines is parsed too, but is not valid.
  bool IsValid() const { return stream().good() && isImageSeries_; }

  /// A series has one or two dimensions; more than these are not kept.
  static constexpr std::size_t kMaxDimensions = 16;

  /// None if the header is not acceptable. The dimensions are those that were read before a fault.
  const std::optional<SerSeries>& series() const { return series_; }

  /// Of the first image; none if its header could not be read.
  const std::optional<SerElement>& element() const { return element_; }

 private:
  void ReadDimensions();
  void ReadElements(std::uint32_t arrayOffset, std::uint32_t count);

  /// Reads the header of an image, and keeps the calibrations of the first one. Fails the stream for an
  /// element that is not there or of an unknown type.
  FrameLayout ReadElement(std::uint32_t position);

  bool isImageSeries_ = false;
  std::optional<SerSeries> series_;
  std::optional<SerElement> element_;
};

}  // namespace Qel::Lumetra::ShellExt
