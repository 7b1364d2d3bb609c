// The sums of one row of blocks of factor by factor pixels, for the box average (box_reducer.h).
//
// A sum equals that of the block's values added as doubles, row by row from the top and left to right within
// a row. Integers of 8 and 16 bits give the same sum in any order, so whole rows are added to column sums,
// which are then folded into blocks. Wider values are added as doubles in exactly that order; the blocks are
// independent, so several are added side by side.
#pragma once

#include <emmintrin.h>

#include <algorithm>
#include <array>
#include <cstddef>
#include <cstdint>
#include <cstring>
#include <limits>
#include <type_traits>
#include <utility>
#include <vector>

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

/// For samples whose sums are exact in any order.
template <class Pixel>
class ExactBlockSums {
 public:
  ExactBlockSums(std::int32_t blocks, std::int32_t factor)
      : factor_(static_cast<std::size_t>(factor)), sums_(static_cast<std::size_t>(blocks) * kSamples) {}

  /// Whether rows with this distance between pixels can be added directly. The bytes between pixels are then
  /// added too, as columns that are dropped afterwards; above a certain distance gathering the pixels is
  /// cheaper.
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

  /// The sums of every block's samples, in the order of the target's samples. The caller resets those that it
  /// has used to 0.
  double* sums() { return sums_.data(); }

 private:
  using Sample = typename SamplesOf<Pixel>::Sample;
  static constexpr std::size_t kSamples = SamplesOf<Pixel>::kCount;
  static_assert(sizeof(Sample) <= 2);

  // Wide enough for the sum of kMaxRows samples. Narrow lanes make the pass over the rows fast.
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
      // Two interleaved images are the common case.
      for (column = 0; step == 2 && column + 4 < columns_; column += 4) {
        const __m128 a = _mm_loadu_ps(reinterpret_cast<const float*>(sums + 2 * column));
        const __m128 b = _mm_loadu_ps(reinterpret_cast<const float*>(sums + 2 * column + 4));
        _mm_storeu_ps(reinterpret_cast<float*>(sums + column), _mm_shuffle_ps(a, b, _MM_SHUFFLE(2, 0, 2, 0)));
      }
    }
    for (; column < columns_; ++column) std::copy_n(sums + column * step, kSamples, sums + column * kSamples);
  }

  /// Adds `count` samples of each row to the column sums, or sets these if the first row is row 0.
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

  /// Adds signed 16-bit samples, which the processor widens and adds two rows at a time. Returns how many of
  /// the `count` columns are done.
  template <std::size_t kRows, bool kFirst>
  static std::size_t AddPairsOfRows(const std::array<const std::byte*, kRows>& row, std::size_t count,
                                    Lane* sums) {
    const __m128i ones = _mm_set1_epi16(1);
    const auto load = [](const void* bytes) { return _mm_loadu_si128(static_cast<const __m128i*>(bytes)); };
    std::size_t i = 0;
    for (; i + 8 <= count; i += 8) {
      __m128i low = kFirst ? _mm_setzero_si128() : load(sums + i);
      __m128i high = kFirst ? _mm_setzero_si128() : load(sums + i + 4);
      for (std::size_t r = 0; r < kRows; r += 2) {
        const __m128i a = load(row[r] + i * sizeof(Sample));
        const __m128i b = load(row[r + 1] + i * sizeof(Sample));
        low = _mm_add_epi32(low, _mm_madd_epi16(_mm_unpacklo_epi16(a, b), ones));
        high = _mm_add_epi32(high, _mm_madd_epi16(_mm_unpackhi_epi16(a, b), ones));
      }
      _mm_storeu_si128(reinterpret_cast<__m128i*>(sums + i), low);
      _mm_storeu_si128(reinterpret_cast<__m128i*>(sums + i + 4), high);
    }
    return i;
  }

  /// Folds with the narrowest type that holds the sum of `samples` samples, which is the fastest.
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
    // A factor that the compiler knows lets it fold many small blocks at once.
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
        FoldColours<Sum>(lanes + block * factor * kSamples, sums + block * kSamples, factor);
      } else {
        // No array of sums: indexing one, even with a constant, can keep GCC from folding blocks side by
        // side.
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

  /// Folds one block of colours, its channels side by side.
  template <class Sum, class Factor>
  static void FoldColours(const Lane* lanes, double* sums, Factor factor) {
    const auto load = [lanes](std::size_t i) {
      return _mm_loadu_si128(reinterpret_cast<const __m128i*>(lanes + i * kSamples));
    };
    const auto widened = [](__m128i narrow) { return _mm_unpacklo_epi16(narrow, _mm_setzero_si128()); };
    __m128i sum = _mm_setzero_si128();
    if constexpr (sizeof(Sum) == 2) {
      // Two columns at a time, the second in the lanes after the first.
      for (std::size_t i = 0; i + 2 <= factor; i += 2) sum = _mm_add_epi16(sum, load(i));
      sum = _mm_add_epi16(sum, _mm_srli_si128(sum, kSamples * sizeof(Lane)));
      if (factor % 2 != 0) sum = _mm_add_epi16(sum, load(factor - 1));
      sum = widened(sum);
    } else {
      for (std::size_t i = 0; i < factor; ++i) sum = _mm_add_epi32(sum, widened(load(i)));
    }
    constexpr bool kSwaps = SamplesOf<Pixel>::kSwaps;
    const __m128i two = kSwaps ? _mm_shuffle_epi32(sum, _MM_SHUFFLE(3, 3, 1, 2)) : sum;
    const __m128i third = kSwaps ? sum : _mm_unpackhi_epi64(sum, sum);
    _mm_storeu_pd(sums, _mm_add_pd(_mm_loadu_pd(sums), _mm_cvtepi32_pd(two)));
    sums[2] += _mm_cvtsd_f64(_mm_cvtepi32_pd(third));
  }

  /// Folds some columns of one block; returns the column after them.
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

/// For samples that must be added as doubles, in order.
template <class Sample>
class OrderedBlockSums {
 public:
  OrderedBlockSums(std::int32_t blocks, std::int32_t factor)
      : factor_(factor), sums_(static_cast<std::size_t>(blocks)) {}

  /// Whether rows with this distance between pixels can be added directly.
  static bool Takes(std::int64_t pixelStride) {
    return pixelStride == static_cast<std::int64_t>(sizeof(Sample));
  }

  /// Adds dense rows of one row of blocks, whose first pixel is at column `x` of the frame.
  void Add(const ImageView<const Sample>& rows, std::int32_t x) {
    std::int32_t column = 0;
    if (x % factor_ != 0) column = AddPart(rows, x, 0, std::min(rows.width, factor_ - x % factor_));
    const std::int32_t blocks = (rows.width - column) / factor_ / kSideBySide * kSideBySide;
    double* const sums = sums_.data() + (x + column) / factor_;
    // A factor that the compiler knows makes small blocks faster.
    switch (factor_) {
      case 2: AddBlocks(rows, column, blocks, std::integral_constant<std::int32_t, 2>(), sums); break;
      case 3: AddBlocks(rows, column, blocks, std::integral_constant<std::int32_t, 3>(), sums); break;
      case 4: AddBlocks(rows, column, blocks, std::integral_constant<std::int32_t, 4>(), sums); break;
      default: AddBlocks(rows, column, blocks, factor_, sums); break;
    }
    column += blocks * factor_;
    while (column < rows.width) column = AddPart(rows, x, column, std::min(rows.width - column, factor_));
  }

  /// The sums of every block. The caller resets those that it has used to 0.
  double* sums() { return sums_.data(); }

 private:
  static constexpr std::int32_t kSideBySide = 8;

  // Two blocks are summed in one vector, two columns at a time: a block's two columns are loaded and widened
  // together, then paired with the other block's.
  static __m128d LoadTwo(const std::byte* bytes) {
    if constexpr (std::is_same_v<Sample, double>) {
      return _mm_loadu_pd(reinterpret_cast<const double*>(bytes));
    } else {
      const __m128i samples = _mm_loadl_epi64(reinterpret_cast<const __m128i*>(bytes));
      if constexpr (std::is_same_v<Sample, float>) return _mm_cvtps_pd(_mm_castsi128_ps(samples));
      if constexpr (std::is_same_v<Sample, std::int32_t>) return _mm_cvtepi32_pd(samples);
      // No instruction converts unsigned numbers: each becomes the low half of a double of 2^52 and more.
      const __m128i raised = _mm_unpacklo_epi32(samples, _mm_set1_epi32(0x43300000));
      return _mm_sub_pd(_mm_castsi128_pd(raised), _mm_set1_pd(4503599627370496.0));
    }
  }

  static double LoadOne(const std::byte* bytes) {
    Sample sample;
    std::memcpy(&sample, bytes, sizeof sample);
    return static_cast<double>(sample);
  }

  /// Adds all columns of neighbouring blocks from a column on, kSideBySide at a time.
  template <class Factor>
  static void AddBlocks(const ImageView<const Sample>& rows, std::int32_t column, std::int32_t blocks,
                        Factor factor, double* sums) {
    for (std::int32_t block = 0; block < blocks; block += kSideBySide, sums += kSideBySide) {
      AddSideBySide(rows, column + block * factor, factor, sums);
    }
  }

  template <class Factor>
  static void AddSideBySide(const ImageView<const Sample>& rows, std::int32_t column, Factor factor,
                            double* sums) {
    constexpr std::size_t kPairs = kSideBySide / 2;
    __m128d chain[kPairs];
    for (std::size_t pair = 0; pair < kPairs; ++pair) chain[pair] = _mm_loadu_pd(sums + 2 * pair);
    const std::size_t blockBytes = static_cast<std::size_t>(factor) * sizeof(Sample);
    for (std::int32_t y = 0; y < rows.height; ++y) {
      const std::byte* bytes = rows.At(column, y);
      std::int32_t i = 0;
      for (; i + 2 <= factor; i += 2, bytes += 2 * sizeof(Sample)) {
        for (std::size_t pair = 0; pair < kPairs; ++pair) {
          const __m128d left = LoadTwo(bytes + 2 * pair * blockBytes);
          const __m128d right = LoadTwo(bytes + (2 * pair + 1) * blockBytes);
          chain[pair] = _mm_add_pd(chain[pair], _mm_unpacklo_pd(left, right));
          chain[pair] = _mm_add_pd(chain[pair], _mm_unpackhi_pd(left, right));
        }
      }
      if (i < factor) {
        for (std::size_t pair = 0; pair < kPairs; ++pair) {
          chain[pair] = _mm_add_pd(chain[pair], _mm_set_pd(LoadOne(bytes + (2 * pair + 1) * blockBytes),
                                                           LoadOne(bytes + 2 * pair * blockBytes)));
        }
      }
    }
    for (std::size_t pair = 0; pair < kPairs; ++pair) _mm_storeu_pd(sums + 2 * pair, chain[pair]);
  }

  /// Adds some columns of one block; returns the column after them.
  std::int32_t AddPart(const ImageView<const Sample>& rows, std::int32_t x, std::int32_t column,
                       std::int32_t columns) {
    double& sum = sums_[static_cast<std::size_t>((x + column) / factor_)];
    for (std::int32_t y = 0; y < rows.height; ++y) {
      for (std::int32_t i = 0; i < columns; ++i) sum += LoadOne(rows.At(column + i, y));
    }
    return column + columns;
  }

  std::int32_t factor_;
  std::vector<double> sums_;
};

}  // namespace Qel::Lumetra::ShellExt
