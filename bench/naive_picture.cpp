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

BitmapPixels Rgb(std::ifstream& file, const PixelPlaces& places, const SIZE& request) {
  return Colour(file, places, request, false);
}

BitmapPixels Bgr(std::ifstream& file, const PixelPlaces& places, const SIZE& request) {
  return Colour(file, places, request, true);
}

}  // namespace

BitmapPixels NaivePicture(const std::wstring& path, const PixelPlaces& places, const SIZE& request) {
  static const std::map<std::string, decltype(&Rgb)> kPictures = {
      {"uint8", Grey<std::uint8_t>},
      {"uint16", Grey<std::uint16_t>},
      {"uint32", Grey<std::uint32_t>},
      {"int8", Grey<std::int8_t>},
      {"int16", Grey<std::int16_t>},
      {"int32", Grey<std::int32_t>},
      {"float32", Grey<float>},
      {"float64", Grey<double>},
      {"complex64", Complex<float>},
      {"complexint16", Complex<std::int16_t>},
      {"complex128", Complex<double>},
      {"rgb", Rgb},
      {"bgr", Bgr},
  };
  const auto picture = kPictures.find(places.pixel);
  if (picture == kPictures.end()) throw std::runtime_error("there is no pixel type '" + places.pixel + "'");
  std::ifstream file(std::filesystem::path(path), std::ios_base::binary);
  return file ? picture->second(file, places, request) : BitmapPixels{};
}

}  // namespace Qel::Lumetra::ShellExt::Bench
