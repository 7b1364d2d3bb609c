// The box average: every whole block of factor by factor pixels becomes one pixel of the target.
#pragma once

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <cstring>
#include <type_traits>
#include <vector>

#include "block_sums.h"
#include "image_view.h"
#include "wrap.h"

namespace Qel::Lumetra::ShellExt {

/// Takes a frame in pieces and writes the average of every whole block into `target`, which has no gaps
/// between the pixels of a row.
///
/// Pieces may have any size and position, as long as the pixels of each block arrive in order (row by row,
/// left to right) and a row of blocks is complete before another begins in the same columns. Pieces must not
/// contain pixels outside the whole blocks.
template <class Pixel>
class BoxReducer {
 public:
  using Target = typename SamplesOf<Pixel>::Target;

  BoxReducer(std::int32_t factor, const ImageView<Target>& target)
      : factor_(factor),
        // A frame without a whole block can have a factor whose square exceeds 32 bits.
        reciprocal_(1.0 / WrappingProduct(factor, factor)),
        target_(target),
        sums_(factor > 1 ? target.width : 0, factor) {}

  /// Adds a piece whose first pixel is at column `x` of row `y` of the frame.
  void Add(const ImageView<const Pixel>& piece, std::int32_t x, std::int32_t y) {
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
  static constexpr std::size_t kSamples = SamplesOf<Pixel>::kCount;
  static constexpr std::int32_t kMaxGathered = 16384;  // pixels

  static bool IsDense(const ImageView<const Pixel>& view) {
    return view.pixelStride == static_cast<std::int64_t>(sizeof(Pixel));
  }

  void Copy(const ImageView<const Pixel>& piece, std::int32_t x, std::int32_t y) {
    for (std::int32_t row = 0; row < piece.height; ++row) {
      std::byte* target = target_.At(x, y + row);
      if (std::is_same_v<Pixel, Target> && IsDense(piece)) {
        std::memcpy(target, piece.At(0, row), static_cast<std::size_t>(piece.width) * sizeof(Pixel));
        continue;
      }
      for (std::int32_t column = 0; column < piece.width; ++column, target += sizeof(Pixel)) {
        const std::byte* source = piece.At(column, row);
        for (std::size_t i = 0; i < kSamples; ++i, source += sizeof(Sample)) {
          Sample sample;
          std::memcpy(&sample, source, sizeof sample);
          StoreSample(target, i, sample);
        }
      }
    }
  }

  void AddToBlockRow(const ImageView<const Pixel>& rows, std::int32_t x) {
    if (BlockSums::Takes(rows.pixelStride)) return sums_.Add(rows, x);
    // Gathers all other pixels first, as many rows at a time as fit.
    const std::int32_t columns = std::min(rows.width, kMaxGathered);
    const std::int32_t maxRows = kMaxGathered / columns;
    for (std::int32_t y = 0; y < rows.height; y += maxRows) {
      for (std::int32_t column = 0; column < rows.width; column += columns) {
        sums_.Add(Gather(rows.Part(column, y, std::min(rows.width - column, columns),
                                   std::min(rows.height - y, maxRows))),
                  x + column);
      }
    }
  }

  ImageView<const Pixel> Gather(const ImageView<const Pixel>& rows) {
    gathered_.resize(static_cast<std::size_t>(kMaxGathered));
    Pixel* next = gathered_.data();
    for (std::int32_t y = 0; y < rows.height; ++y) {
      for (std::int32_t x = 0; x < rows.width; ++x) *next++ = rows.Load(x, y);
    }
    return PackedView<const Pixel>(gathered_.data(), rows.width, rows.height);
  }

  /// Stores the blocks that end within `columns` columns from column `x`, and resets their sums.
  void StoreBlocks(std::int32_t x, std::int32_t columns, std::int32_t blockRow) {
    const std::int32_t first = x / factor_;
    const std::int32_t end = (x + columns) / factor_;
    const std::size_t count = static_cast<std::size_t>(end - first) * kSamples;
    double* const __restrict sums = sums_.sums() + static_cast<std::size_t>(first) * kSamples;
    std::byte* const __restrict target = target_.At(first, blockRow);
    for (std::size_t i = 0; i < count; ++i) {
      const Sample average = ToSample(sums[i] * reciprocal_);
      std::memcpy(target + i * sizeof(Sample), &average, sizeof average);
      sums[i] = 0;
    }
  }

  static void StoreSample(std::byte* target, std::size_t i, Sample sample) {
    std::memcpy(target + SamplesOf<Pixel>::TargetIndex(i) * sizeof(Sample), &sample, sizeof sample);
  }

  /// Truncates to an integer toward zero, rounds to the nearest float, or keeps a double.
  static Sample ToSample(double average) {
    // Averages of values that fit into signed 32 bits fit as well, and the 32-bit conversion is faster.
    using Whole = std::conditional_t<std::is_same_v<Sample, std::uint32_t>, std::int64_t, std::int32_t>;
    if constexpr (std::is_integral_v<Sample>) {
      return static_cast<Sample>(static_cast<Whole>(average));
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
