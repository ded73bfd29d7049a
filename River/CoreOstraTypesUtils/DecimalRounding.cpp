#include "River/CoreOstraTypesUtils/DecimalRounding.h"

#include <algorithm>
#include <cmath>

namespace CoreOstraTypesUtils {

void RoundToDecimals(double* io_pValues, std::size_t count) {
  double largest = 0.0;
  for (std::size_t i = 0; i < count; ++i) {
    if (!std::isfinite(io_pValues[i])) return;
    largest = std::max(largest, std::abs(io_pValues[i]));
  }
  if (!(largest >= 1e-8 && largest <= 1e14)) return;
  // The nearest power of ten, not the next one up: round values such as 1 or 100 sit far from
  // where the choice changes, so noise can't give them a different grid from one pass to the
  // next. Decimals after the point stay within 0 to 22, so the power of ten is an exact double
  // and the quotient below is the double nearest the decimal, as a reader parsing its text
  // gets it.
  const int decimals = RoundingDecimals - static_cast<int>(std::lround(std::log10(largest)));
  double scale = 1.0;
  for (int i = 0; i < decimals; ++i)
    scale *= 10.0;
  for (std::size_t i = 0; i < count; ++i) {
    const double rounded = std::nearbyint(io_pValues[i] * scale) / scale;
    io_pValues[i] = rounded == 0.0 ? 0.0 : rounded;
  }
}

} // namespace CoreOstraTypesUtils
