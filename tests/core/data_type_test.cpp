#include "data_type.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <type_traits>
#include <vector>

namespace Qel::Lumetra::ShellExt {
namespace {

struct Row {
  const wchar_t* name;
  std::uint32_t value;
  std::int32_t bits;
};

constexpr Row kRows[] = {
    {L"8 bit unsigned", 0, 8},         {L"16 bit unsigned", 1, 16},
    {L"32 bit unsigned", 2, 32},       {L"8 bit signed", 4, 8},
    {L"16 bit signed", 5, 16},         {L"32 bit signed", 6, 32},
    {L"32 bit float", 8, 32},          {L"64 bit float", 9, 64},
    {L"64 bit complex float", 10, 64}, {L"128 bit complex float", 13, 128},
    {L"24 bit RGB", 16, 24},           {L"24 bit BGR", 18, 24},
};

TEST(DataType, HasItsNameAndBits) {
  for (const Row& row : kRows) {
    EXPECT_EQ(DataTypeName(DataType{row.value}), row.name) << row.value;
    EXPECT_EQ(BitsPerPixel(DataType{row.value}), row.bits) << row.value;
  }
}

TEST(DataType, IsUnknownInTheGapsAndAboveTheLast) {
  std::vector<std::uint32_t> values = {1000, 0x10000, 0x7FFFFFFF, 0x80000000, 0xFFFFFFFF};
  for (std::uint32_t value = 0; value < 40; ++value) values.push_back(value);
  for (const std::uint32_t value : values) {
    if (std::ranges::find(kRows, value, &Row::value) != std::end(kRows)) continue;
    EXPECT_EQ(DataTypeName(DataType{value}), L"Unknown") << value;
    EXPECT_EQ(BitsPerPixel(DataType{value}), 0) << value;
  }
}

TEST(DataType, Has32Bits) {
  EXPECT_EQ(sizeof(DataType), 4u);
  EXPECT_TRUE((std::is_same_v<std::underlying_type_t<DataType>, std::uint32_t>));
}

}  // namespace
}  // namespace Qel::Lumetra::ShellExt
