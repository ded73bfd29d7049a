#pragma once
// Random decimal texts for checking number readers against strtod: an optional minus, up to
// `maxDigits` digits, and a point anywhere among them (or before them).
#include <random>
#include <string>

namespace TestSupport {

inline std::string randomDecimalText(std::mt19937_64& io_rRandom, int i_maxDigits) {
  const int digits = 1 + static_cast<int>(io_rRandom() % static_cast<unsigned>(i_maxDigits));
  const int point = static_cast<int>(io_rRandom() % static_cast<unsigned>(digits + 1));
  std::string text = io_rRandom() % 2 ? "-" : "";
  for (int d = 0; d < digits; ++d) {
    if (d == point) text += '.';
    text += static_cast<char>('0' + io_rRandom() % 10);
  }
  return text;
}

} // namespace TestSupport
