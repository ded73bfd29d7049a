#include "FixedDecimal.h"
#include <cstdio>

namespace TrajectoryText {

char* formatFixedSlow(char* o_p, double i_value, int i_precision) {
  const int n = std::snprintf(o_p, kFixedMaxChars, "%.*f", i_precision, i_value);
  return o_p + (n < 0 ? 0 : (size_t(n) < kFixedMaxChars ? n : int(kFixedMaxChars) - 1));
}

} // namespace TrajectoryText
