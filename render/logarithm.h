// The natural logarithm of many numbers, rounded to float, as complex frames need it.
#pragma once

#include <cstddef>

namespace Qel::Lumetra::ShellExt {

/// Writes static_cast<float>(std::log(values[i])) for each of `count` values, bit for bit, several times
/// faster. Uses the widest vectors that this processor has.
void LogarithmsToFloat(const double* values, std::size_t count, float* logarithms);

/// The two bodies behind it, which tests compare: for every x86-64 processor, and for those with AVX2.
void LogarithmsToFloatBaseline(const double* values, std::size_t count, float* logarithms);
void LogarithmsToFloatAvx2(const double* values, std::size_t count, float* logarithms);

/// Whether this processor has AVX2.
bool HasAvx2();

}  // namespace Qel::Lumetra::ShellExt
