#pragma once
// Short decimal numbers ("12", "-0.25", ".5", "3.") read without strtod. Up to 15 digits the
// digits form an integer held exactly, and one division by an exact power of ten rounds once,
// correctly: the result is the one strtod gives, bit for bit. Files hold such numbers nearly
// everywhere, so the readers of attributes and expressions try this road first.
#include <cstdint>
#include <string_view>

namespace UtilsText {

/// Most digits a short decimal may have: 10^15 < 2^53, so the integer of the digits is exact.
inline constexpr int ShortDecimalDigits = 15;

/// The value of `mantissa` / 10^`fractionDigits`, for at most `ShortDecimalDigits` digits in
/// all (the caller counts them).
inline double ShortDecimalValue(std::uint64_t mantissa, int fractionDigits) {
  static constexpr double powersOfTen[ShortDecimalDigits + 1] = {
      1e0, 1e1, 1e2, 1e3, 1e4, 1e5, 1e6, 1e7, 1e8, 1e9, 1e10, 1e11, 1e12, 1e13, 1e14, 1e15};
  return static_cast<double>(mantissa) / powersOfTen[fractionDigits];
}

/// Digits with at most one point among them, 1 to 15 digits and nothing else: their value.
/// False, with `o_rValue` untouched, for any other text (a sign, an exponent, blanks...).
inline bool ParseUnsignedShortDecimal(std::string_view text, double& o_rValue) {
  std::uint64_t mantissa = 0;
  int digits = 0, fractionDigits = 0;
  bool point = false;
  for (const char c : text) {
    if (c >= '0' && c <= '9') {
      if (++digits > ShortDecimalDigits) return false;
      mantissa = mantissa * 10 + static_cast<std::uint64_t>(c - '0');
      if (point) ++fractionDigits;
    } else if (c == '.' && !point) {
      point = true;
    } else {
      return false;
    }
  }
  if (digits == 0) return false;
  o_rValue = ShortDecimalValue(mantissa, fractionDigits);
  return true;
}

/// As `ParseUnsignedShortDecimal`, with an optional leading minus ("-0" gives negative zero).
inline bool ParseShortDecimal(std::string_view text, double& o_rValue) {
  const bool negative = !text.empty() && text.front() == '-';
  double value = 0.0;
  if (!ParseUnsignedShortDecimal(negative ? text.substr(1) : text, value)) return false;
  o_rValue = negative ? -value : value;
  return true;
}

} // namespace UtilsText
