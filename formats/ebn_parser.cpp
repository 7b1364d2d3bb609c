#include "ebn_parser.h"

#include <array>
#include <charconv>
#include <cmath>
#include <limits>
#include <string_view>

#include "byte_order.h"
#include "data_type.h"
#include "type_code.h"

namespace Qel::Lumetra::ShellExt {
namespace {

constexpr std::int32_t kHeaderBytes = 54;
constexpr std::int32_t kMaxTypeCode = 8;  // the format has no complex types

constexpr double kMaxCode = 4;  // the largest magnitude of a code in the functions below

/// Returns the integer that a double represents: adds 0.5 and truncates toward zero. Below 0 the result is
/// not the nearest integer: a stored -2.0 is -1. Intentional.
double WholeNumber(double stored) {
  return std::trunc(stored + 0.5);
}

/// Returns the code that a double represents, or 0 if its magnitude is above kMaxCode.
std::int32_t CodeOf(double stored) {
  const double code = WholeNumber(stored);
  return std::abs(code) <= kMaxCode ? static_cast<std::int32_t>(code) : 0;
}

std::string_view ModelText(std::int32_t code) {
  switch (code) {
    case -2: return "Halden 10";
    case -1: return "Halden 12";
    case 1: return "Halden 20";
    case 2: return "Halden 30";
    default: return "";
  }
}

std::string_view SourceText(std::int32_t code) {
  switch (code) {
    case -2: return " W";
    case -1: return " Lab6";
    case 1: return " FEG";
    default: return "";
  }
}

std::string_view LensText(std::int32_t code) {
  switch (code) {
    case -3: return " HC";
    case -2: return " BioPOLE";
    case -1: return " POLE";
    case 1: return " SPOLE";
    case 2: return " UPOLE";
    case 3: return " XPOLE";
    case 4: return " CryoPOLE";
    default: return "";
  }
}

/// Formats a number with 0 or 1 (`decimals`) digits after the point, independently of the locale.
std::string Decimal(double number, int decimals) {
  // Room for the digits of the largest double, a sign, the point and the digit after it.
  std::array<char, std::numeric_limits<double>::max_exponent10 + 4> text;
  const auto end =
      std::to_chars(text.data(), text.data() + text.size(), number, std::chars_format::fixed, decimals);
  return {text.data(), end.ptr};
}

std::string Describe(const EbnInstrument& instrument) {
  std::string text(ModelText(CodeOf(instrument.model)));
  text += SourceText(CodeOf(instrument.source));
  text += LensText(CodeOf(instrument.lens));
  const double d = WholeNumber(instrument.dNumber);
  if (std::isfinite(d) && d != 0) text += " D" + Decimal(d, 0);
  return text + " " + Decimal(instrument.kilovolts, 1) + " kV";
}

}  // namespace

EbnParser::EbnParser(std::istream& stream) : FileParser(stream) {
  const auto typeCode = ReadLittleEndian<std::uint16_t>(stream);
  const auto width = ReadLittleEndian<std::int32_t>(stream);
  const auto height = ReadLittleEndian<std::int32_t>(stream);
  const auto dataOffset = ReadLittleEndian<std::int32_t>(stream);
  const EbnInstrument instrument = {
      .model = ReadLittleEndian<double>(stream),
      .source = ReadLittleEndian<double>(stream),
      .lens = ReadLittleEndian<double>(stream),
      .dNumber = ReadLittleEndian<double>(stream),
      .kilovolts = ReadLittleEndian<double>(stream),
  };
  const auto type = DataTypeOfCode(typeCode);
  Require(type && typeCode <= kMaxTypeCode, "data type code", typeCode, "from 1 to 8");
  Require(width >= 1, "width", width, "at least 1");
  Require(height >= 1, "height", height, "at least 1");
  Require(dataOffset >= kHeaderBytes, "data offset", dataOffset, "at least 54, the size of the header");
  if (fault()) {
    stream.setstate(std::ios_base::failbit);
    return;
  }
  frame_ = PackedLayout(PixelTypeOf(*type), {width, height}, dataOffset);
  instrument_ = instrument;
  comment_ = Describe(instrument);
}

}  // namespace Qel::Lumetra::ShellExt
