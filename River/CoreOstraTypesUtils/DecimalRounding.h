#pragma once
// Values derived through a rotation (an axis from an angle-axis vector, a pose inverted twice)
// carry rounding noise in their last bits: an angle-axis vector can't hold a right angle
// exactly, so the Y axis comes back as (0, 1, 2.8e-16). Rounding such values to a fixed number
// of decimals relative to their size removes the noise, so that exact values come back exactly
// and a value written, read and written again keeps its text.

#include <array>
#include <cmath>
#include <cstddef>

namespace CoreOstraTypesUtils {

/// Decimals kept relative to the size of a vector: far more than any measurement holds, far
/// coarser than the noise of a conversion (about 1e-16 of that size).
inline constexpr int RoundingDecimals = 14;

/// Each of `count` values rounded to the nearest multiple of 10^(e - RoundingDecimals), where
/// 10^e is the power of ten nearest (in logarithm) the largest magnitude among them, as the
/// double nearest that decimal: a unit vector keeps 14 decimals, so 0.5 stays 0.5 and 2.8e-16
/// next to a 1 becomes 0. Zero is always +0. Left as they are when all are zero, any is not
/// finite, or the largest magnitude is outside 1e-8 to 1e14.
void RoundToDecimals(double* io_pValues, std::size_t count);

template <std::size_t N> std::array<double, N> RoundedToDecimals(std::array<double, N> values) {
  RoundToDecimals(values.data(), N);
  return values;
}

/// Chooses what to write for a value derived from a source (an axis from an orientation), given
/// `reproduces(candidate)`, true when reading the candidate gives the source back exactly. The
/// first that does of: `rounded`, `raw`, and the values within one unit in the last place of
/// `raw` in each entry; else `rounded`. Once a written value reproduces its source, writing what
/// was read gives the same value again.
template <std::size_t N, class F>
std::array<double, N> PreferReproducing(const std::array<double, N>& raw,
                                        const std::array<double, N>& rounded, F reproduces) {
  if (reproduces(rounded)) return rounded;
  if (raw != rounded && reproduces(raw)) return raw;
  std::size_t combinations = 1;
  for (std::size_t i = 0; i < N; ++i)
    combinations *= 3;
  for (std::size_t combination = 1; combination < combinations; ++combination) {
    std::array<double, N> candidate = raw;
    std::size_t digits = combination;
    for (std::size_t i = 0; i < N; ++i, digits /= 3) {
      if (digits % 3 == 1) candidate[i] = std::nextafter(raw[i], HUGE_VAL);
      if (digits % 3 == 2) candidate[i] = std::nextafter(raw[i], -HUGE_VAL);
    }
    if (reproduces(candidate)) return candidate;
  }
  return rounded;
}

} // namespace CoreOstraTypesUtils
