// Writes .ser files.
#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <vector>

#include "file_bytes.h"

namespace Qel::Lumetra::ShellExt::Testing {

struct SerCalibration {
  double offset = 0;
  double delta = 1;
  std::int32_t element = 0;
};

struct SerDimension {
  std::uint32_t size = 1;
  SerCalibration calibration{};
  std::string description = "Number";
  std::string units{};
  std::optional<std::int32_t> descriptionLength{};  // default: the length of `description`
  std::optional<std::int32_t> unitsLength{};        // default: the length of `units`
};

struct SerElement {
  SerCalibration calibrationX{};
  SerCalibration calibrationY{};
  std::int16_t typeCode = 1;  // 1 to 6: unsigned, then signed, of 8, 16 and 32 bits; 7 float; 8 double;
                              // 9 complex of floats; 10 complex of doubles
  std::uint32_t width = 1;
  std::uint32_t height = 1;
  std::string pixels{};

  std::string Bytes() const;
};

/// A file with the header, the dimensions, the elements, the data offsets and the tag offsets, in this order.
struct SerFile {
  std::uint16_t byteOrder = 0x4949;
  std::uint16_t seriesId = 0x0197;
  std::uint16_t version = 0x0210;     // from 0x0220 on, offsetArrayOffset has 64 bits
  std::uint32_t dataTypeId = 0x4122;  // images; 0x4120: lines
  std::uint32_t tagTypeId = 0x4152;   // times; 0x4142: times and positions
  std::vector<SerDimension> dimensions = std::vector<SerDimension>(1);
  std::vector<SerElement> elements{};

  // Replace the values that follow from the fields above, to write a file with wrong ones.
  std::optional<std::uint32_t> totalElements{};
  std::optional<std::uint32_t> validElements{};
  std::optional<std::uint64_t> offsetArrayOffset{};
  std::optional<std::uint32_t> dimensionCount{};
  std::optional<std::string> offsetArrays{};  // the bytes of both arrays

  std::string Bytes() const;
};

}  // namespace Qel::Lumetra::ShellExt::Testing
