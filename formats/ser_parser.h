// .ser files: a series of images, found through an array of offsets (the index). The format calls each image
// an element of the series. The first one represents the file.
#pragma once

#include <cstdint>
#include <istream>
#include <optional>
#include <string>
#include <vector>

#include "file_parser.h"

namespace Qel::Lumetra::ShellExt {

/// The values of an axis: its position number `element` has the value `offset`, and neighbouring positions
/// differ by `delta`.
struct SerCalibration {
  double offset = 0;
  double delta = 0;
  std::int32_t element = 0;
};

/// A dimension of the series, along which its images follow each other.
struct SerDimension {
  std::uint32_t dimensionSize = 0;
  SerCalibration calibration;
  std::string description;  // ReadText limits the length of this and of `units`
  std::string units;
};

/// The part of the header that describes the series as a whole.
struct SerSeries {
  bool hasPositionTags = false;  // the images have times and positions; otherwise only times
  std::uint32_t dimensionCount = 0;
  std::vector<SerDimension> dimensions;  // the first kMaxDimensions at most
};

/// The calibrations of an image's axes.
struct SerElement {
  SerCalibration calibrationX;
  SerCalibration calibrationY;
};

/// Reads the whole index once from the stream's position and keeps its first element. Memory and time follow
/// the bytes of the file, not the counts in its header.
class SerParser final : public FileParser {
 public:
  /// Throws std::length_error for a string of negative length.
  explicit SerParser(std::istream& stream);

  /// Returns whether the file is a complete series of images. A series of lines is parsed too, but is not
  /// valid.
  bool IsValid() const { return stream().good() && isImageSeries_; }

  /// The maximum number of dimensions to keep. A real series has one or two.
  static constexpr std::size_t kMaxDimensions = 16;

  /// Returns the series, with the dimensions before any fault; nothing if the header is not acceptable.
  const std::optional<SerSeries>& series() const { return series_; }

  /// Returns the first image; nothing if its header could not be read.
  const std::optional<SerElement>& element() const { return element_; }

 private:
  void ReadDimensions();
  void ReadElements(std::uint32_t arrayOffset, std::uint32_t count);

  /// Reads the header of the element at `position`, keeps the calibrations of the first one, and returns the
  /// element's layout. Fails the stream if the element is not in the file or has an unknown type.
  FrameLayout ReadElement(std::uint32_t position);

  bool isImageSeries_ = false;
  std::optional<SerSeries> series_;
  std::optional<SerElement> element_;
};

}  // namespace Qel::Lumetra::ShellExt
