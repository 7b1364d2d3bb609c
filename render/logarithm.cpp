#include "logarithm.h"

#include <algorithm>
#include <array>
#include <bit>
#include <cmath>
#include <cstdint>
#include <limits>
#include <numbers>

namespace Qel::Lumetra::ShellExt {
namespace {

constexpr std::size_t kBatch = 256;

// x = 2^k * m with m from sqrt(1/2) to sqrt(2), and ln m = s * P(s^2) with s = (m - 1) / (m + 1).
constexpr std::uint64_t kMantissaBits = 52;
constexpr std::uint64_t kMantissaMask = (std::uint64_t{1} << kMantissaBits) - 1;
constexpr std::uint64_t kOne = 0x3FF0000000000000;
constexpr std::uint64_t kRootOfHalf = 0x3FE6A09E667F3BCD;

// P(z) = 2 atanh(sqrt z) / sqrt z, interpolated at the Chebyshev nodes of the range of s^2; its relative
// error is below 3e-14.
constexpr std::array<double, 6> kPolynomial = {0x1.fffffffffff12p+0, 0x1.5555555671473p-1,
                                               0x1.9999962c0828ep-2, 0x1.2494381e474b9p-2,
                                               0x1.c620ee95dc85cp-3, 0x1.9192e2aa6c40cp-3};

// An upper bound of the relative difference between the approximation and the library's logarithm: four times
// the error of the polynomial, against which rounding is negligible. Only four values in a million need the
// library.
constexpr double kMargin = 0x1p-43;

/// Approximates a batch of logarithms. `low` and `high` differ where the nearest float is in doubt: the
/// logarithm is too close to the middle between two floats, or the value is not a positive normal number.
__attribute__((always_inline)) inline void Approximate(const double* values, std::size_t count, float* low,
                                                       float* high) {
  // Adding 2^52 makes a small integer the mantissa of a double, which converts it without a conversion
  // instruction.
  constexpr std::uint64_t kIntegerBits = 0x4330000000000000;
  constexpr double kIntegerOffset = 4503599627370496.0 + 1023.0;
  for (std::size_t i = 0; i < count; ++i) {
    const auto bits = std::bit_cast<std::uint64_t>(values[i]) + (kOne - kRootOfHalf);
    const double k = std::bit_cast<double>((bits >> kMantissaBits) | kIntegerBits) - kIntegerOffset;
    const auto m = std::bit_cast<double>((bits & kMantissaMask) + kRootOfHalf);
    const double s = (m - 1.0) / (m + 1.0);
    const double z = s * s;
    double p = kPolynomial.back();
    for (std::size_t j = kPolynomial.size() - 1; j-- > 0;) p = p * z + kPolynomial[j];
    const double logarithm = k * std::numbers::ln2 + s * p;
    const double margin = std::abs(logarithm) * kMargin;
    const bool normal =
        values[i] >= std::numeric_limits<double>::min() && values[i] <= std::numeric_limits<double>::max();
    const double doubt = normal ? margin : std::numeric_limits<double>::infinity();
    low[i] = static_cast<float>(logarithm - doubt);
    high[i] = static_cast<float>(logarithm + doubt);
  }
}

__attribute__((always_inline)) inline void Logarithms(const double* values, std::size_t count,
                                                      float* logarithms) {
  std::array<float, kBatch> high;
  for (std::size_t first = 0; first < count; first += kBatch) {
    const std::size_t batch = std::min(kBatch, count - first);
    const double* const x = values + first;
    float* const low = logarithms + first;
    Approximate(x, batch, low, high.data());
    int doubtful = 0;
    for (std::size_t i = 0; i < batch; ++i) doubtful |= low[i] == high[i] ? 0 : 1;
    if (doubtful == 0) continue;
    for (std::size_t i = 0; i < batch; ++i) {
      if (!(low[i] == high[i])) low[i] = static_cast<float>(std::log(x[i]));
    }
  }
}

}  // namespace

void LogarithmsToFloatBaseline(const double* values, std::size_t count, float* logarithms) {
  Logarithms(values, count, logarithms);
}

#ifdef __x86_64__

// Compiles the same body for wider vectors. Neither version fuses a product and a sum, so both give the same
// bits.
__attribute__((target("avx2"))) void LogarithmsToFloatAvx2(const double* values, std::size_t count,
                                                           float* logarithms) {
  Logarithms(values, count, logarithms);
}

bool HasAvx2() {
  return __builtin_cpu_supports("avx2") != 0;
}

#else

void LogarithmsToFloatAvx2(const double* values, std::size_t count, float* logarithms) {
  LogarithmsToFloatBaseline(values, count, logarithms);
}

bool HasAvx2() {
  return false;
}

#endif

void LogarithmsToFloat(const double* values, std::size_t count, float* logarithms) {
  static const auto best = HasAvx2() ? LogarithmsToFloatAvx2 : LogarithmsToFloatBaseline;
  best(values, count, logarithms);
}

}  // namespace Qel::Lumetra::ShellExt
