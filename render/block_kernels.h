// The inner loops of block_sums.h, with vector instructions for x86 and in plain C++ for other processors.
// Both give the same bits. GCC's portable vector types compile to slower code: widening 8 bytes, for
// instance, becomes eight scalar conversions.
#pragma once

#ifdef __SSE2__
#include <emmintrin.h>
#endif

#include <array>
#include <cstddef>
#include <cstdint>
#include <cstring>
#include <type_traits>

#include "image_view.h"

namespace Qel::Lumetra::ShellExt {

/// The number of neighbouring blocks that AddSideBySide sums at once.
inline constexpr std::int32_t kBlocksSideBySide = 8;

template <class Sample>
double LoadAsDouble(const std::byte* bytes) {
  Sample sample;
  std::memcpy(&sample, bytes, sizeof sample);
  return static_cast<double>(sample);
}

#ifdef __SSE2__

/// Moves every second of 2 * `columns` sums, beginning with the first, to the front. Returns how many are in
/// place; the caller moves the others.
inline std::size_t DropOddColumns(std::int32_t* sums, std::size_t columns) {
  std::size_t column = 0;
  for (; column + 4 < columns; column += 4) {
    const __m128 a = _mm_loadu_ps(reinterpret_cast<const float*>(sums + 2 * column));
    const __m128 b = _mm_loadu_ps(reinterpret_cast<const float*>(sums + 2 * column + 4));
    _mm_storeu_ps(reinterpret_cast<float*>(sums + column), _mm_shuffle_ps(a, b, _MM_SHUFFLE(2, 0, 2, 0)));
  }
  return column;
}

/// Adds an even number of rows of signed 16-bit samples to `sums`, or overwrites `sums` if the rows are the
/// first. The processor widens and adds two rows at a time. Returns how many of the `count` columns are done.
template <std::size_t kRows, bool kFirst>
std::size_t AddPairsOfRows(const std::array<const std::byte*, kRows>& row, std::size_t count,
                           std::int32_t* sums) {
  const __m128i ones = _mm_set1_epi16(1);
  const auto load = [](const void* bytes) { return _mm_loadu_si128(static_cast<const __m128i*>(bytes)); };
  std::size_t i = 0;
  for (; i + 8 <= count; i += 8) {
    __m128i low = kFirst ? _mm_setzero_si128() : load(sums + i);
    __m128i high = kFirst ? _mm_setzero_si128() : load(sums + i + 4);
    for (std::size_t r = 0; r < kRows; r += 2) {
      const __m128i a = load(row[r] + i * sizeof(std::int16_t));
      const __m128i b = load(row[r + 1] + i * sizeof(std::int16_t));
      low = _mm_add_epi32(low, _mm_madd_epi16(_mm_unpacklo_epi16(a, b), ones));
      high = _mm_add_epi32(high, _mm_madd_epi16(_mm_unpackhi_epi16(a, b), ones));
    }
    _mm_storeu_si128(reinterpret_cast<__m128i*>(sums + i), low);
    _mm_storeu_si128(reinterpret_cast<__m128i*>(sums + i + 4), high);
  }
  return i;
}

/// Adds `factor` colours to the sums of their three channels, in the opposite order if `kSwaps`. Sum must be
/// able to hold the sum of a channel. Reads five lanes past the last colour.
template <class Sum, bool kSwaps, class Factor>
void FoldColours(const std::uint16_t* lanes, double* sums, Factor factor) {
  constexpr std::size_t kChannels = 3;
  const auto load = [lanes](std::size_t i) {
    return _mm_loadu_si128(reinterpret_cast<const __m128i*>(lanes + i * kChannels));
  };
  const auto widened = [](__m128i narrow) { return _mm_unpacklo_epi16(narrow, _mm_setzero_si128()); };
  __m128i sum = _mm_setzero_si128();
  if constexpr (sizeof(Sum) == 2) {
    // Adds two columns at a time; the second one is in the lanes after the first.
    for (std::size_t i = 0; i + 2 <= factor; i += 2) sum = _mm_add_epi16(sum, load(i));
    sum = _mm_add_epi16(sum, _mm_srli_si128(sum, kChannels * sizeof *lanes));
    if (factor % 2 != 0) sum = _mm_add_epi16(sum, load(factor - 1));
    sum = widened(sum);
  } else {
    for (std::size_t i = 0; i < factor; ++i) sum = _mm_add_epi32(sum, widened(load(i)));
  }
  const __m128i two = kSwaps ? _mm_shuffle_epi32(sum, _MM_SHUFFLE(3, 3, 1, 2)) : sum;
  const __m128i third = kSwaps ? sum : _mm_unpackhi_epi64(sum, sum);
  _mm_storeu_pd(sums, _mm_add_pd(_mm_loadu_pd(sums), _mm_cvtepi32_pd(two)));
  sums[2] += _mm_cvtsd_f64(_mm_cvtepi32_pd(third));
}

template <class Sample>
__m128d LoadTwoAsDoubles(const std::byte* bytes) {
  if constexpr (std::is_same_v<Sample, double>) {
    return _mm_loadu_pd(reinterpret_cast<const double*>(bytes));
  } else {
    const __m128i samples = _mm_loadl_epi64(reinterpret_cast<const __m128i*>(bytes));
    if constexpr (std::is_same_v<Sample, float>) return _mm_cvtps_pd(_mm_castsi128_ps(samples));
    if constexpr (std::is_same_v<Sample, std::int32_t>) return _mm_cvtepi32_pd(samples);
    // SSE2 has no conversion of unsigned numbers: each becomes the low half of a double of at least 2^52.
    const __m128i raised = _mm_unpacklo_epi32(samples, _mm_set1_epi32(0x43300000));
    return _mm_sub_pd(_mm_castsi128_pd(raised), _mm_set1_pd(4503599627370496.0));
  }
}

/// Adds the rows of kBlocksSideBySide neighbouring blocks, whose first samples are in `column`, to the
/// blocks' sums.
///
/// Two blocks are summed in one vector, two columns at a time: a block's two columns are loaded and widened
/// together, then paired with the other block's.
template <class Sample, class Factor>
void AddSideBySide(const ImageView<const Sample>& rows, std::int32_t column, Factor factor, double* sums) {
  constexpr std::size_t kPairs = kBlocksSideBySide / 2;
  __m128d chain[kPairs];
  for (std::size_t pair = 0; pair < kPairs; ++pair) chain[pair] = _mm_loadu_pd(sums + 2 * pair);
  const std::size_t blockBytes = static_cast<std::size_t>(factor) * sizeof(Sample);
  for (std::int32_t y = 0; y < rows.height; ++y) {
    const std::byte* bytes = rows.At(column, y);
    std::int32_t i = 0;
    for (; i + 2 <= factor; i += 2, bytes += 2 * sizeof(Sample)) {
      for (std::size_t pair = 0; pair < kPairs; ++pair) {
        const __m128d left = LoadTwoAsDoubles<Sample>(bytes + 2 * pair * blockBytes);
        const __m128d right = LoadTwoAsDoubles<Sample>(bytes + (2 * pair + 1) * blockBytes);
        chain[pair] = _mm_add_pd(chain[pair], _mm_unpacklo_pd(left, right));
        chain[pair] = _mm_add_pd(chain[pair], _mm_unpackhi_pd(left, right));
      }
    }
    if (i < factor) {
      for (std::size_t pair = 0; pair < kPairs; ++pair) {
        chain[pair] =
            _mm_add_pd(chain[pair], _mm_set_pd(LoadAsDouble<Sample>(bytes + (2 * pair + 1) * blockBytes),
                                               LoadAsDouble<Sample>(bytes + 2 * pair * blockBytes)));
      }
    }
  }
  for (std::size_t pair = 0; pair < kPairs; ++pair) _mm_storeu_pd(sums + 2 * pair, chain[pair]);
}

#else

inline std::size_t DropOddColumns(std::int32_t* sums, std::size_t columns) {
  for (std::size_t column = 1; column < columns; ++column) sums[column] = sums[2 * column];
  return columns;
}

template <std::size_t kRows, bool kFirst>
std::size_t AddPairsOfRows(const std::array<const std::byte*, kRows>&, std::size_t, std::int32_t*) {
  return 0;  // the caller's scalar loop adds all columns
}

template <class Sum, bool kSwaps, class Factor>
void FoldColours(const std::uint16_t* lanes, double* sums, Factor factor) {
  std::array<std::uint32_t, 3> sum{};
  for (std::size_t i = 0; i < 3 * factor; i += 3) {
    for (std::size_t channel = 0; channel < 3; ++channel) sum[channel] += lanes[i + channel];
  }
  for (std::size_t channel = 0; channel < 3; ++channel) sums[kSwaps ? 2 - channel : channel] += sum[channel];
}

template <class Sample, class Factor>
void AddSideBySide(const ImageView<const Sample>& rows, std::int32_t column, Factor factor, double* sums) {
  std::array<double, kBlocksSideBySide> chain;
  std::memcpy(chain.data(), sums, sizeof chain);
  const std::size_t blockBytes = static_cast<std::size_t>(factor) * sizeof(Sample);
  for (std::int32_t y = 0; y < rows.height; ++y) {
    const std::byte* bytes = rows.At(column, y);
    for (std::int32_t i = 0; i < factor; ++i, bytes += sizeof(Sample)) {
      for (std::size_t block = 0; block < chain.size(); ++block) {
        chain[block] += LoadAsDouble<Sample>(bytes + block * blockBytes);
      }
    }
  }
  std::memcpy(sums, chain.data(), sizeof chain);
}

#endif

}  // namespace Qel::Lumetra::ShellExt
