// The box average: every whole block of factor by factor pixels becomes one pixel of the target.
//
// Each sum is what adding the block's values as doubles gives, row by row from the block's top row and from
// left to right within a row. Values of 8 and 16 bits are added as integers, which gives the same sum in any
// order; wider integers and floating-point values are added as doubles in exactly that order.
#pragma once

#include <algorithm>
#include <array>
#include <bit>
#include <cstddef>
#include <cstdint>
#include <cstring>
#include <type_traits>
#include <utility>
#include <vector>

#include "image_view.h"
#include "pixel.h"
#include "wrap.h"

namespace Qel::Lumetra::ShellExt {

/// A pixel is one sample (grey) or several (colour channels), each averaged by itself. The reduced image
/// holds the same pixels, but for colours, which go into a bitmap and take its byte order.
template <class Pixel>
struct SamplesOf {
  using Sample = Pixel;
  using Target = Pixel;
  static constexpr std::size_t kCount = 1;

  static Target ToTarget(const Pixel& pixel) { return pixel; }
};
template <ColourOrder kOrder>
struct SamplesOf<ColourPixel<kOrder>> {
  using Sample = std::uint8_t;
  using Target = BitmapPixel;
  static constexpr std::size_t kCount = 3;

  static Target ToTarget(const ColourPixel<kOrder>& pixel) {
    const auto& [first, second, third] = pixel.channel;
    if (kOrder == ColourOrder::kRedFirst) return {{third, second, first}};
    return {{first, second, third}};
  }
};

/// The sums of one row of blocks, for samples whose sum is exact whatever the order.
template <class Pixel>
class ExactBlockSums {
 public:
  using Sample = typename SamplesOf<Pixel>::Sample;
  static constexpr std::size_t kSamples = SamplesOf<Pixel>::kCount;

  ExactBlockSums(std::int32_t blocks, std::int32_t factor)
      : factor_(factor), sums_(static_cast<std::size_t>(blocks) * kSamples) {}

  /// Adds dense rows of one row of blocks, whose first pixel is at column `x` of the frame.
  void Add(const ImageView<const Pixel>& rows, std::int32_t x) {
    columnSums_.resize(static_cast<std::size_t>(rows.width) * kSamples);
    for (std::int32_t y = 0; y < rows.height; y += kMostRows) {
      SumColumns(rows.Part(0, y, rows.width, std::min(kMostRows, rows.height - y)));
      FoldColumns(x, rows.width);
    }
  }

  /// The sum of one sample of a block, which starts again at 0.
  double Take(std::int32_t block, std::size_t sample) {
    return static_cast<double>(std::exchange(sums_[Index(block, sample)], 0));
  }

 private:
  static_assert(sizeof(Sample) <= 2);
  // Wide enough for the sum of kMostRows samples; narrow lanes make the pass over the rows a fast one.
  using Lane = std::conditional_t<sizeof(Sample) == 1,
                                  std::conditional_t<std::is_signed_v<Sample>, std::int16_t, std::uint16_t>,
                                  std::conditional_t<std::is_signed_v<Sample>, std::int32_t, std::uint32_t>>;
  static constexpr std::int32_t kMostRows = sizeof(Sample) == 1 ? 255 : 65535;

  std::size_t Index(std::int32_t block, std::size_t sample) const {
    return static_cast<std::size_t>(block) * kSamples + sample;
  }

  void SumColumns(const ImageView<const Pixel>& rows) {
    std::int32_t y = 0;
    std::fill(columnSums_.begin(), columnSums_.end(), Lane{0});
    for (; y + 4 <= rows.height; y += 4) AddRows<4>(rows, y);
    for (; y < rows.height; ++y) AddRows<1>(rows, y);
  }

  template <std::size_t kRows>
  void AddRows(const ImageView<const Pixel>& rows, std::int32_t y) {
    std::array<const std::byte*, kRows> row;
    for (const std::byte*& bytes : row) bytes = rows.At(0, y++);
    Lane* const __restrict sums = columnSums_.data();
    const std::size_t count = columnSums_.size();
    for (std::size_t i = 0; i < count; ++i) {
      Lane sum = sums[i];
      for (const std::byte* bytes : row) {
        Sample sample;
        std::memcpy(&sample, bytes + i * sizeof(Sample), sizeof(Sample));
        sum = static_cast<Lane>(sum + sample);
      }
      sums[i] = sum;
    }
  }

  void FoldColumns(std::int32_t x, std::int32_t columns) {
    const Lane* lane = columnSums_.data();
    for (std::int32_t column = 0; column < columns;) {
      const std::int32_t block = (x + column) / factor_;
      const std::int32_t end = std::min(columns - column, factor_ - (x + column) % factor_);
      std::array<std::int64_t, kSamples> sums{};
      for (std::int32_t i = 0; i < end; ++i) {
        for (std::size_t sample = 0; sample < kSamples; ++sample) sums[sample] += *lane++;
      }
      for (std::size_t sample = 0; sample < kSamples; ++sample) sums_[Index(block, sample)] += sums[sample];
      column += end;
    }
  }

  std::int32_t factor_;
  std::vector<std::int64_t> sums_;
  std::vector<Lane> columnSums_;
};

/// The sums of one row of blocks, for samples that have to be added as doubles and in order.
template <class Sample>
class OrderedBlockSums {
 public:
  OrderedBlockSums(std::int32_t blocks, std::int32_t factor)
      : factor_(factor), sums_(static_cast<std::size_t>(blocks)) {}

  /// Adds dense rows of one row of blocks, whose first pixel is at column `x` of the frame.
  void Add(const ImageView<const Sample>& rows, std::int32_t x) {
    std::int32_t column = 0;
    // A block that the rows enter in its middle, then whole blocks, many side by side because each is a
    // chain of additions of its own, then what is left.
    if (x % factor_ != 0) column = AddBlocks<1>(rows, x, 0, std::min(rows.width, factor_ - x % factor_));
    while ((rows.width - column) / static_cast<std::int32_t>(kSideBySide) >= factor_) {
      column = AddBlocks<kSideBySide>(rows, x, column, factor_);
    }
    while (column < rows.width) {
      column = AddBlocks<1>(rows, x, column, std::min(rows.width - column, factor_));
    }
  }

  /// The sum of a block, which starts again at 0.
  double Take(std::int32_t block, std::size_t /*sample*/) {
    return std::exchange(sums_[static_cast<std::size_t>(block)], 0.0);
  }

 private:
  static constexpr std::size_t kSideBySide = 8;

  /// Adds `columns` columns of each of kBlocks neighbouring blocks; returns the column after them.
  template <std::size_t kBlocks>
  std::int32_t AddBlocks(const ImageView<const Sample>& rows, std::int32_t x, std::int32_t column,
                         std::int32_t columns) {
    double* const sums = &sums_[static_cast<std::size_t>((x + column) / factor_)];
    std::array<double, kBlocks> chain;
    std::copy_n(sums, kBlocks, chain.begin());
    const std::size_t blockBytes = static_cast<std::size_t>(factor_) * sizeof(Sample);
    for (std::int32_t y = 0; y < rows.height; ++y) {
      const std::byte* bytes = rows.At(column, y);
      for (std::int32_t i = 0; i < columns; ++i, bytes += sizeof(Sample)) {
        for (std::size_t block = 0; block < kBlocks; ++block) {
          Sample sample;
          std::memcpy(&sample, bytes + block * blockBytes, sizeof(Sample));
          chain[block] += static_cast<double>(sample);
        }
      }
    }
    std::copy_n(chain.begin(), kBlocks, sums);
    return column + static_cast<std::int32_t>(kBlocks) * columns;
  }

  std::int32_t factor_;
  std::vector<double> sums_;
};

/// Takes a frame in pieces and writes the average of every whole block into `target`.
///
/// The pieces may be of any size and at any place, as long as the pixels of each block arrive in order (row
/// by row, left to right) and a row of blocks is complete before the same columns of another begin.
/// Pixels outside of the whole blocks must not be given. A factor below 1 has no blocks.
template <class Pixel>
class BoxReducer {
 public:
  using Target = typename SamplesOf<Pixel>::Target;

  BoxReducer(std::int32_t factor, const ImageView<Target>& target)
      : factor_(factor),
        reciprocal_(1.0 / WrappingProduct(factor, factor)),
        target_(target),
        sums_(factor > 1 ? target.width : 0, factor) {}

  /// Adds a piece whose first pixel is at column `x` of row `y` of the frame.
  void Add(const ImageView<const Pixel>& piece, std::int32_t x, std::int32_t y) {
    if (factor_ < 1) return;
    if (factor_ == 1) return Copy(piece, x, y);
    for (std::int32_t row = 0; row < piece.height;) {
      const std::int32_t rows = std::min(piece.height - row, factor_ - (y + row) % factor_);
      AddToBlockRow(piece.Part(0, row, piece.width, rows), x);
      row += rows;
      if ((y + row) % factor_ == 0) StoreBlocks(x, piece.width, (y + row) / factor_ - 1);
    }
  }

 private:
  using Sample = typename SamplesOf<Pixel>::Sample;
  static constexpr std::int32_t kGatheredColumns = 4096;

  void Copy(const ImageView<const Pixel>& piece, std::int32_t x, std::int32_t y) {
    for (std::int32_t row = 0; row < piece.height; ++row) {
      for (std::int32_t column = 0; column < piece.width; ++column) {
        target_.Store(x + column, y + row, SamplesOf<Pixel>::ToTarget(piece.Load(column, row)));
      }
    }
  }

  void AddToBlockRow(const ImageView<const Pixel>& rows, std::int32_t x) {
    if (rows.pixelStride == static_cast<std::int64_t>(sizeof(Pixel))) return sums_.Add(rows, x);
    // Pixels that are not neighbours are gathered first, a part of a row at a time.
    gathered_.resize(static_cast<std::size_t>(std::min(rows.width, kGatheredColumns)));
    for (std::int32_t y = 0; y < rows.height; ++y) {
      for (std::int32_t column = 0; column < rows.width; column += kGatheredColumns) {
        const std::int32_t count = std::min(rows.width - column, kGatheredColumns);
        for (std::int32_t i = 0; i < count; ++i) {
          gathered_[static_cast<std::size_t>(i)] = rows.Load(column + i, y);
        }
        sums_.Add(PackedView<const Pixel>(gathered_.data(), count, 1), x + column);
      }
    }
  }

  /// Stores the blocks that end within `columns` columns from column `x`.
  void StoreBlocks(std::int32_t x, std::int32_t columns, std::int32_t blockRow) {
    for (std::int32_t block = x / factor_; block < (x + columns) / factor_; ++block) {
      std::array<Sample, SamplesOf<Pixel>::kCount> average;
      for (std::size_t sample = 0; sample < average.size(); ++sample) {
        average[sample] = ToSample(sums_.Take(block, sample) * reciprocal_);
      }
      target_.Store(block, blockRow, SamplesOf<Pixel>::ToTarget(std::bit_cast<Pixel>(average)));
    }
  }

  /// Integers are truncated toward zero, floats rounded to the nearest, doubles kept.
  static Sample ToSample(double average) {
    if constexpr (std::is_integral_v<Sample>) {
      return static_cast<Sample>(static_cast<std::int64_t>(average));
    } else {
      return static_cast<Sample>(average);
    }
  }

  using BlockSums = std::conditional_t<(sizeof(Sample) <= 2), ExactBlockSums<Pixel>, OrderedBlockSums<Pixel>>;

  std::int32_t factor_;
  double reciprocal_;
  ImageView<Target> target_;
  BlockSums sums_;
  std::vector<Pixel> gathered_;
};

}  // namespace Qel::Lumetra::ShellExt
