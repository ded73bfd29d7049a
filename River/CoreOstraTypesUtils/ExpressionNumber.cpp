#include "River/CoreOstraTypesUtils/ExpressionNumber.h"

#include <cmath>
#include <cstdint>
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

bool ReadShortDecimal(std::string_view text, double& o_rValue) {
  // Up to 15 digits the integer is exact, and one division by an exact power of ten rounds
  // once, as strtod does.
  static constexpr double powersOfTen[] = {1e0, 1e1, 1e2,  1e3,  1e4,  1e5,  1e6,  1e7,
                                           1e8, 1e9, 1e10, 1e11, 1e12, 1e13, 1e14, 1e15};
  std::uint64_t mantissa = 0;
  int digits = 0, fractionDigits = 0;
  bool point = false;
  for (const char c : text) {
    if (c >= '0' && c <= '9') {
      if (++digits > 15) return false;
      mantissa = mantissa * 10 + static_cast<std::uint64_t>(c - '0');
      if (point) ++fractionDigits;
    } else if (c == '.' && !point) {
      point = true;
    } else {
      return false;
    }
  }
  if (digits == 0) return false;
  o_rValue = static_cast<double>(mantissa) / powersOfTen[fractionDigits];
  return true;
}

} // namespace CoreOstraTypesUtils
