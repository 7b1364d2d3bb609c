#include "naive_picture.h"

#include <cstring>
#include <filesystem>
#include <fstream>
#include <iterator>
#include <map>
#include <stdexcept>
#include <utility>

#include "naive_thumbnail.h"

namespace Qel::Lumetra::ShellExt::Bench {
namespace {

using Testing::BitmapPixels;
using Testing::NaiveColour;
using Testing::NaiveComplex;
using Testing::NaiveFrame;

template <class T>
NaiveFrame<T> ReadFrame(std::ifstream& file, const PixelPlaces& places) {
  NaiveFrame<T> frame{places.size.width, places.size.height, {}};
  file.seekg(0, std::ios_base::end);
  std::string bytes(static_cast<std::size_t>(file.tellg()), '\0');
  file.seekg(0);
  file.read(bytes.data(), static_cast<std::streamsize>(bytes.size()));
  frame.values.reserve(static_cast<std::size_t>(frame.width) * static_cast<std::size_t>(frame.height));
  for (int y = 0; y < frame.height; ++y) {
    for (int x = 0; x < frame.width; ++x) {
      const std::int64_t place = places.firstPixel + x * places.pixelStride + y * places.rowStride;
      T value;
      std::memcpy(&value, &bytes.at(static_cast<std::size_t>(place)), sizeof(T));
      frame.values.push_back(value);
    }
  }
  return frame;
}

template <class T>
BitmapPixels Grey(std::ifstream& file, const PixelPlaces& places, const SIZE& request) {
  return NaiveGreyThumbnail(ReadFrame<T>(file, places), request.cx, request.cy);
}

template <class T>
BitmapPixels Complex(std::ifstream& file, const PixelPlaces& places, const SIZE& request) {
  return NaiveComplexThumbnail(ReadFrame<NaiveComplex<T>>(file, places), request.cx, request.cy);
}

BitmapPixels Colour(std::ifstream& file, const PixelPlaces& places, const SIZE& request, bool blueFirst) {
  auto frame = ReadFrame<NaiveColour>(file, places);
  if (blueFirst) {
    for (NaiveColour& colour : frame.values) std::swap(colour.front(), colour.back());
  }
  return NaiveColourThumbnail(frame, request.cx, request.cy);
}

}  // namespace

PixelFormat PixelFormatNamed(const std::string& name) {
  static const std::map<std::string, PixelFormat> kFormats = {
      {"uint8", PixelFormat::kUInt8},
      {"uint16", PixelFormat::kUInt16},
      {"uint32", PixelFormat::kUInt32},
      {"int8", PixelFormat::kInt8},
      {"int16", PixelFormat::kInt16},
      {"int32", PixelFormat::kInt32},
      {"float32", PixelFormat::kFloat32},
      {"float64", PixelFormat::kFloat64},
      {"complexint16", PixelFormat::kComplexInt16},
      {"complex64", PixelFormat::kComplexFloat32},
      {"complex128", PixelFormat::kComplexFloat64},
      {"rgb", PixelFormat::kRgb24},
      {"bgr", PixelFormat::kBgr24},
  };
  const auto found = kFormats.find(name);
  if (found == kFormats.end()) throw std::runtime_error("there is no pixel format '" + name + "'");
  return found->second;
}

BitmapPixels NaivePicture(const std::wstring& path, const PixelPlaces& places, const SIZE& request) {
  std::ifstream file(std::filesystem::path(path), std::ios_base::binary);
  if (!file) return {};
  switch (places.format) {
    case PixelFormat::kUInt8: return Grey<std::uint8_t>(file, places, request);
    case PixelFormat::kUInt16: return Grey<std::uint16_t>(file, places, request);
    case PixelFormat::kUInt32: return Grey<std::uint32_t>(file, places, request);
    case PixelFormat::kInt8: return Grey<std::int8_t>(file, places, request);
    case PixelFormat::kInt16: return Grey<std::int16_t>(file, places, request);
    case PixelFormat::kInt32: return Grey<std::int32_t>(file, places, request);
    case PixelFormat::kFloat32: return Grey<float>(file, places, request);
    case PixelFormat::kFloat64: return Grey<double>(file, places, request);
    case PixelFormat::kComplexInt16: return Complex<std::int16_t>(file, places, request);
    case PixelFormat::kComplexFloat32: return Complex<float>(file, places, request);
    case PixelFormat::kComplexFloat64: return Complex<double>(file, places, request);
    case PixelFormat::kRgb24: return Colour(file, places, request, false);
    case PixelFormat::kBgr24: return Colour(file, places, request, true);
  }
  return {};
}

}  // namespace Qel::Lumetra::ShellExt::Bench
