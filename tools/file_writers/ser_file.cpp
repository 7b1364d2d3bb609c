#include "ser_file.h"

namespace Qel::Lumetra::ShellExt::Testing {
namespace {

void PutCalibration(FileBytes& file, const SerCalibration& calibration) {
  file.Put(calibration.offset).Put(calibration.delta).Put(calibration.element);
}

void PutText(FileBytes& file, const std::string& text, std::optional<std::int32_t> length) {
  file.Put(length.value_or(static_cast<std::int32_t>(text.size()))).Text(text);
}

std::string DimensionBytes(const std::vector<SerDimension>& dimensions) {
  FileBytes file;
  for (const SerDimension& dimension : dimensions) {
    file.Put(dimension.size);
    PutCalibration(file, dimension.calibration);
    PutText(file, dimension.description, dimension.descriptionLength);
    PutText(file, dimension.units, dimension.unitsLength);
  }
  return file.bytes();
}

}  // namespace

std::string SerElement::Bytes() const {
  FileBytes file;
  PutCalibration(file, calibrationX);
  PutCalibration(file, calibrationY);
  return file.Put(typeCode).Put(width).Put(height).Text(pixels).bytes();
}

std::string SerFile::Bytes() const {
  const bool wide = version >= 0x0220;
  const std::string dimensionBytes = DimensionBytes(dimensions);
  const std::size_t firstElement = (wide ? 34 : 30) + dimensionBytes.size();

  FileBytes dataOffsets;
  FileBytes tagOffsets;
  std::string elementBytes;
  for (const SerElement& element : elements) {
    dataOffsets.Put(static_cast<std::uint32_t>(firstElement + elementBytes.size()));
    tagOffsets.Put(std::uint32_t{0});
    elementBytes += element.Bytes();
  }
  const auto count = static_cast<std::uint32_t>(elements.size());
  const std::uint64_t arrays = offsetArrayOffset.value_or(firstElement + elementBytes.size());

  FileBytes file;
  file.Put(byteOrder).Put(seriesId).Put(version).Put(dataTypeId).Put(tagTypeId);
  file.Put(totalElements.value_or(count)).Put(validElements.value_or(count));
  wide ? file.Put(arrays) : file.Put(static_cast<std::uint32_t>(arrays));
  file.Put(dimensionCount.value_or(static_cast<std::uint32_t>(dimensions.size())));
  file.Text(dimensionBytes).Text(elementBytes);
  return file.Text(offsetArrays.value_or(dataOffsets.bytes() + tagOffsets.bytes())).bytes();
}

}  // namespace Qel::Lumetra::ShellExt::Testing
