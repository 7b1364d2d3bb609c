#include "raw_file.h"

#include <utility>

namespace Qel::Lumetra::ShellExt::Testing {
namespace {

std::int32_t ValueClass(DataType type) {
  switch (type) {
    case DataType::kUInt8:
    case DataType::kUInt16:
    case DataType::kUInt32: return 0;
    case DataType::kInt8:
    case DataType::kInt16:
    case DataType::kInt32: return 1;
    case DataType::kFloat32:
    case DataType::kFloat64: return 2;
    case DataType::kRgb24: return 3;
    case DataType::kBgr24: return 5;
    case DataType::kComplexFloat32:
    case DataType::kComplexFloat64: return 10;
  }
  return -1;
}

}  // namespace

std::string RawFile::Bytes() const {
  FileBytes file;
  file.Text(magic).Put(word1).Put(width).Put(height).Put(word4).Put(bitsPerPixel).Put(valueClass);
  return file.Put(offset).Put(pixelStride).Put(rowStride).Text(pixels).bytes();
}

RawFile PackedRawFile(DataType type, std::int32_t width, std::int32_t height, std::string pixels) {
  RawFile file;
  file.width = width;
  file.height = height;
  file.bitsPerPixel = BitsPerPixel(type);
  file.valueClass = ValueClass(type);
  file.pixelStride = file.bitsPerPixel / 8;
  file.rowStride = width * file.pixelStride;
  file.pixels = std::move(pixels);
  return file;
}

}  // namespace Qel::Lumetra::ShellExt::Testing
