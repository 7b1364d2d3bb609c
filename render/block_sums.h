// The sums of one row of blocks of factor by factor pixels, for the box average (box_reducer.h).
//
// A sum equals that of the block's values added as doubles, row by row from the top and left to right within
// a row. Integers of 8 and 16 bits give the same sum in any order, so whole rows are added to column sums,
// which are then folded into blocks. Wider values are added as doubles in exactly that order; the blocks are
// independent, so several are added side by side.
#pragma once

#include <algorithm>
#include <array>
#include <cstddef>
#include <cstdint>
#include <cstring>
#include <limits>
#include <type_traits>
#include <utility>
#include <vector>

#include "block_kernels.h"
#include "image_view.h"
#include "pixel.h"

namespace Qel::Lumetra::ShellExt {

/// The samples of a pixel, one (grey) or three (colour channels), each averaged by itself. The reduced image
/// has the same type of pixel, except that colours take the byte order of a bitmap.
template <class Pixel>
struct SamplesOf {
  using Sample = Pixel;
  using Target = Pixel;
  static constexpr std::size_t kCount = 1;

  /// Returns the index in the target pixel of a pixel's sample `i`.
  static constexpr std::size_t TargetIndex(std::size_t i) { return i; }
};
template <ColourOrder kOrder>
struct SamplesOf<ColourPixel<kOrder>> {
  using Sample = std::uint8_t;
  using Target = BgrPixel;
  static constexpr std::size_t kCount = 3;
  static constexpr bool kSwaps = kOrder == ColourOrder::kRedFirst;

  static constexpr std::size_t TargetIndex(std::size_t i) { return kSwaps ? 2 - i : i; }
};

/// Sums samples whose sums are exact in any order.
template <class Pixel>
class ExactBlockSums {
 public:
  ExactBlockSums(std::int32_t blocks, std::int32_t factor)
      : factor_(static_cast<std::size_t>(factor)), sums_(static_cast<std::size_t>(blocks) * kSamples) {}

  /// Returns whether Add accepts rows with this distance in bytes between pixels. Add also sums the bytes
  /// between the pixels, as columns that it then drops. If the pixels are far apart, it is cheaper to gather
  /// them first.
  static bool Takes(std::int64_t pixelStride) {
    constexpr std::int64_t kSampleBytes = sizeof(Sample);
    constexpr std::int64_t kPixelBytes = kSampleBytes * kSamples;
    return pixelStride >= kPixelBytes && pixelStride <= 8 * kPixelBytes && pixelStride % kSampleBytes == 0;
  }

  /// Adds rows of one row of blocks, whose first pixel is at column `x` of the frame.
  void Add(const ImageView<const Pixel>& rows, std::int32_t x) {
    columns_ = static_cast<std::size_t>(rows.width);
    for (std::int32_t y = 0; y < rows.height; y += kMaxRows) {
      const std::int32_t count = std::min(kMaxRows, rows.height - y);
      SumColumns(rows.Part(0, y, rows.width, count));
      FoldColumns(static_cast<std::size_t>(x), static_cast<std::size_t>(count) * factor_);
    }
  }

  /// Returns the sums of every block's samples, in the order of the target's samples. The caller resets the
  /// sums that it has used to 0.
  double* sums() { return sums_.data(); }

 private:
  using Sample = typename SamplesOf<Pixel>::Sample;
  static constexpr std::size_t kSamples = SamplesOf<Pixel>::kCount;
  static_assert(sizeof(Sample) <= 2);

  // The type of a column sum, wide enough for kMaxRows samples. Narrow lanes make the pass over the rows
  // fast.
  using Lane = std::conditional_t<sizeof(Sample) == 1,
                                  std::conditional_t<std::is_signed_v<Sample>, std::int16_t, std::uint16_t>,
                                  std::int32_t>;
  static constexpr std::int32_t kMaxRows = sizeof(Sample) == 1 ? 255 : 32767;
  // Three channels are loaded as a vector of eight lanes, which reads past the last channel.
  static constexpr std::size_t kFolded = kSamples == 3 ? 8 : kSamples;

  void SumColumns(const ImageView<const Pixel>& rows) {
    const std::size_t step = static_cast<std::size_t>(rows.pixelStride) / sizeof(Sample);
    const std::size_t count = (columns_ - 1) * step + kSamples;
    columnSums_.resize(count + kFolded - kSamples);
    std::int32_t y = 0;
    for (; y + 8 <= rows.height; y += 8) AddRows<8>(rows, y, count);
    for (; y + 4 <= rows.height; y += 4) AddRows<4>(rows, y, count);
    for (; y + 2 <= rows.height; y += 2) AddRows<2>(rows, y, count);
    if (y < rows.height) AddRows<1>(rows, y, count);
    if (step != kSamples) DropColumnsBetween(step);
  }

  void DropColumnsBetween(std::size_t step) {
    Lane* const sums = columnSums_.data();
    std::size_t column = 1;
    if constexpr (sizeof(Lane) == 4) {
      // This step is common: two interleaved images have it.
      if (step == 2) column = DropOddColumns(sums, columns_);
    }
    for (; column < columns_; ++column) std::copy_n(sums + column * step, kSamples, sums + column * kSamples);
  }

  /// Adds `count` samples of each row to the column sums, or overwrites the sums if the first row is row 0.
  template <std::size_t kRows>
  void AddRows(const ImageView<const Pixel>& rows, std::int32_t y, std::size_t count) {
    y == 0 ? AddRows<kRows, true>(rows, y, count) : AddRows<kRows, false>(rows, y, count);
  }

  template <std::size_t kRows, bool kFirst>
  void AddRows(const ImageView<const Pixel>& rows, std::int32_t y, std::size_t count) {
    std::array<const std::byte*, kRows> row;
    for (const std::byte*& bytes : row) bytes = rows.At(0, y++);
    Lane* const __restrict sums = columnSums_.data();
    std::size_t i = 0;
    if constexpr (std::is_same_v<Sample, std::int16_t> && kRows % 2 == 0) {
      i = AddPairsOfRows<kRows, kFirst>(row, count, sums);
    }
    for (; i < count; ++i) {
      Lane sum = kFirst ? Lane{0} : sums[i];
      for (std::size_t r = 0; r < kRows; ++r) {
        Sample sample;
        std::memcpy(&sample, row[r] + i * sizeof(Sample), sizeof(Sample));
        sum = static_cast<Lane>(sum + sample);
      }
      sums[i] = sum;
    }
  }

  /// Folds the column sums into the blocks' sums, with the narrowest type that holds the sum of `samples`
  /// samples, which is the fastest.
  void FoldColumns(std::size_t x, std::size_t samples) {
    if constexpr (sizeof(Lane) < sizeof(std::int32_t)) {
      if (samples <= kMaxRows) return FoldColumns<Lane>(x);
    }
    if (samples <= std::numeric_limits<std::int32_t>::max() / 65536) return FoldColumns<std::int32_t>(x);
    FoldColumns<std::int64_t>(x);
  }

  template <class Sum>
  void FoldColumns(std::size_t x) {
    std::size_t column = 0;
    if (x % factor_ != 0) column = FoldPart<Sum>(x, 0, std::min(columns_, factor_ - x % factor_));
    const std::size_t blocks = (columns_ - column) / factor_;
    const Lane* const lanes = &columnSums_[column * kSamples];
    double* const sums = &sums_[(x + column) / factor_ * kSamples];
    // A factor known at compile time lets the compiler fold many small blocks at once.
    switch (factor_) {
      case 2: FoldBlocks<Sum>(lanes, sums, blocks, std::integral_constant<std::size_t, 2>()); break;
      case 3: FoldBlocks<Sum>(lanes, sums, blocks, std::integral_constant<std::size_t, 3>()); break;
      case 4: FoldBlocks<Sum>(lanes, sums, blocks, std::integral_constant<std::size_t, 4>()); break;
      case 5: FoldBlocks<Sum>(lanes, sums, blocks, std::integral_constant<std::size_t, 5>()); break;
      case 6: FoldBlocks<Sum>(lanes, sums, blocks, std::integral_constant<std::size_t, 6>()); break;
      case 7: FoldBlocks<Sum>(lanes, sums, blocks, std::integral_constant<std::size_t, 7>()); break;
      case 8: FoldBlocks<Sum>(lanes, sums, blocks, std::integral_constant<std::size_t, 8>()); break;
      default: FoldBlocks<Sum>(lanes, sums, blocks, factor_); break;
    }
    column += blocks * factor_;
    if (column < columns_) FoldPart<Sum>(x, column, columns_ - column);
  }

  template <class Sum, class Factor>
  static void FoldBlocks(const Lane* __restrict lanes, double* __restrict sums, std::size_t blocks,
                         Factor factor) {
    for (std::size_t block = 0; block < blocks; ++block) {
      if constexpr (kSamples == 3 && sizeof(Sum) <= 4) {
        FoldColours<Sum, SamplesOf<Pixel>::kSwaps>(lanes + block * factor * kSamples, sums + block * kSamples,
                                                   factor);
      } else {
        // An array of sums would be slower: indexing one, even with a constant, can keep GCC from folding
        // blocks side by side.
        for (std::size_t sample = 0; sample < kSamples; ++sample) {
          Sum sum = 0;
          for (std::size_t i = 0; i < factor; ++i) {
            sum = static_cast<Sum>(sum + lanes[(block * factor + i) * kSamples + sample]);
          }
          sums[block * kSamples + SamplesOf<Pixel>::TargetIndex(sample)] += static_cast<double>(sum);
        }
      }
    }
  }

  /// Folds some columns of one block; returns the next column.
  template <class Sum>
  std::size_t FoldPart(std::size_t x, std::size_t column, std::size_t columns) {
    FoldBlocks<Sum>(&columnSums_[column * kSamples], &sums_[(x + column) / factor_ * kSamples], 1, columns);
    return column + columns;
  }

  std::size_t factor_;
  std::vector<double> sums_;
  std::size_t columns_ = 0;
  std::vector<Lane> columnSums_;
};

/// Sums samples that must be added as doubles, in order.
template <class Sample>
class OrderedBlockSums {
 public:
  OrderedBlockSums(std::int32_t blocks, std::int32_t factor)
      : factor_(factor), sums_(static_cast<std::size_t>(blocks)) {}

  /// Returns whether Add takes rows with this distance in bytes between pixels.
  static bool Takes(std::int64_t pixelStride) {
    return pixelStride == static_cast<std::int64_t>(sizeof(Sample));
  }

  /// Adds dense rows of one row of blocks, whose first pixel is at column `x` of the frame.
  void Add(const ImageView<const Sample>& rows, std::int32_t x) {
    std::int32_t column = 0;
    if (x % factor_ != 0) column = AddPart(rows, x, 0, std::min(rows.width, factor_ - x % factor_));
    const std::int32_t blocks = (rows.width - column) / factor_ / kBlocksSideBySide * kBlocksSideBySide;
    double* const sums = sums_.data() + (x + column) / factor_;
    // A factor known at compile time makes small blocks faster.
    switch (factor_) {
      case 2: AddBlocks(rows, column, blocks, std::integral_constant<std::int32_t, 2>(), sums); break;
      case 3: AddBlocks(rows, column, blocks, std::integral_constant<std::int32_t, 3>(), sums); break;
      case 4: AddBlocks(rows, column, blocks, std::integral_constant<std::int32_t, 4>(), sums); break;
      default: AddBlocks(rows, column, blocks, factor_, sums); break;
    }
    column += blocks * factor_;
    while (column < rows.width) column = AddPart(rows, x, column, std::min(rows.width - column, factor_));
  }

  /// Returns the sums of every block. The caller resets the sums that it has used to 0.
  double* sums() { return sums_.data(); }

 private:
  /// Adds all columns of `blocks` neighbouring blocks from `column` on, kBlocksSideBySide at a time.
  template <class Factor>
  static void AddBlocks(const ImageView<const Sample>& rows, std::int32_t column, std::int32_t blocks,
                        Factor factor, double* sums) {
    for (std::int32_t block = 0; block < blocks; block += kBlocksSideBySide, sums += kBlocksSideBySide) {
      AddSideBySide<Sample>(rows, column + block * factor, factor, sums);
    }
  }

  /// Adds some columns of one block; returns the next column.
  std::int32_t AddPart(const ImageView<const Sample>& rows, std::int32_t x, std::int32_t column,
                       std::int32_t columns) {
    double& sum = sums_[static_cast<std::size_t>((x + column) / factor_)];
    for (std::int32_t y = 0; y < rows.height; ++y) {
      for (std::int32_t i = 0; i < columns; ++i) sum += LoadAsDouble<Sample>(rows.At(column + i, y));
    }
    return column + columns;
  }

  std::int32_t factor_;
  std::vector<double> sums_;
};

}  // namespace Qel::Lumetra::ShellExt
