#include "River/CoreOstraTypesUtils/ExpressionNumber.h"

#include <cmath>
#include <cstdio>

namespace CoreOstraTypesUtils {

std::string FormatExpressionNumber(double value) {
  if (std::isnan(value)) return std::signbit(value) ? "-nan" : "nan";
  if (std::isinf(value)) return value < 0 ? "-inf" : "inf";
  if (value == 0.0) return "0"; // never "-0": a sign on zero is an artefact of arithmetic
  char buffer[40];
  const int n = std::snprintf(buffer, sizeof buffer, "%.*g", 17, value);
  return std::string(buffer, n > 0 ? static_cast<std::size_t>(n) : 0u);
}

} // namespace CoreOstraTypesUtils
