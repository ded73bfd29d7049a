#include "usd/UsdNumbers.h"

#include "usd/UsdTypes.h"

#include <charconv>
#include <cmath>
#include <cstring>

namespace AnvilUsd {

namespace {

char* WriteText(char* o_pOut, const char* pText) {
  const std::size_t length = std::strlen(pText);
  std::memcpy(o_pOut, pText, length);
  return o_pOut + length;
}

/// Lays out the shortest scientific form ("-1.2345e-07") by the layer's rule.
char* Relayout(char* o_pOut, const char* pBegin, const char* pEnd) {
  const char* p = pBegin;
  if (*p == '-') *o_pOut++ = *p++;
  char digits[24];
  int count = 0;
  for (; p < pEnd && *p != 'e'; ++p)
    if (*p != '.') digits[count++] = *p;
  int exponent = 0;
  std::from_chars(p + 1 + (p[1] == '+'), pEnd, exponent);

  if (exponent < -6 || exponent >= 15) {
    *o_pOut++ = digits[0];
    if (count > 1) {
      *o_pOut++ = '.';
      std::memcpy(o_pOut, digits + 1, std::size_t(count - 1));
      o_pOut += count - 1;
    }
    *o_pOut++ = 'e';
    return std::to_chars(o_pOut, o_pOut + 8, exponent).ptr;
  }
  if (exponent < 0) {
    *o_pOut++ = '0';
    *o_pOut++ = '.';
    for (int i = -1; i > exponent; --i)
      *o_pOut++ = '0';
    std::memcpy(o_pOut, digits, std::size_t(count));
    return o_pOut + count;
  }
  const int whole = exponent + 1;
  for (int i = 0; i < whole; ++i)
    *o_pOut++ = i < count ? digits[i] : '0';
  if (count > whole) {
    *o_pOut++ = '.';
    std::memcpy(o_pOut, digits + whole, std::size_t(count - whole));
    o_pOut += count - whole;
  }
  return o_pOut;
}

template <class T> char* WriteShortest(char* o_pOut, T value) {
  if (std::isnan(value)) return WriteText(o_pOut, "nan");
  if (std::isinf(value)) return WriteText(o_pOut, value < 0 ? "-inf" : "inf");
  if (value == 0) return WriteText(o_pOut, std::signbit(value) ? "-0" : "0");
  char scientific[MaxNumberChars];
  const auto result = std::to_chars(scientific, scientific + sizeof scientific, value,
                                    std::chars_format::scientific);
  return Relayout(o_pOut, scientific, result.ptr);
}

} // namespace

char* WriteFloat(char* o_pOut, float value) {
  return WriteShortest(o_pOut, value);
}

char* WriteDouble(char* o_pOut, double value) {
  return WriteShortest(o_pOut, value);
}

char* WriteHalf(char* o_pOut, std::uint16_t bits) {
  const float value = HalfToFloat(bits);
  if (std::isnan(value)) return WriteText(o_pOut, "nan");
  if (std::isinf(value)) return WriteText(o_pOut, value < 0 ? "-inf" : "inf");
  // As "%g": six significant digits, trailing zeros dropped.
  return std::to_chars(o_pOut, o_pOut + MaxNumberChars, value, std::chars_format::general, 6).ptr;
}

} // namespace AnvilUsd
