// Natural logarithms rounded to float, for complex frames.
#pragma once

#include <cstddef>

namespace Qel::Lumetra::ShellExt {

/// Writes static_cast<float>(std::log(values[i])) for each of `count` values, with the same bits but several
/// times faster. Uses AVX2 if this processor has it.
void LogarithmsToFloat(const double* values, std::size_t count, float* logarithms);

/// The two implementations of LogarithmsToFloat, for any processor and for processors with AVX2. They are
/// public for the tests that compare them.
void LogarithmsToFloatBaseline(const double* values, std::size_t count, float* logarithms);
void LogarithmsToFloatAvx2(const double* values, std::size_t count, float* logarithms);

/// Returns whether this processor has AVX2.
bool HasAvx2();

}  // namespace Qel::Lumetra::ShellExt
