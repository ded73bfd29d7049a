#pragma once
// Fixed-precision decimal text of doubles, the same characters as printf's "%.Nf", without
// printf's cost. The value is converted exactly: a double is m * 2^e, so m * 10^N * 2^e is
// shifted in 128-bit integers and rounded half to even on the exact remainder, which is what
// printf does in the default rounding mode. Values whose scaled magnitude does not fit in 64
// bits, infinities and NaNs go to snprintf.
#include <bit>
#include <cstddef>
#include <cstdint>
#include <cstring>

namespace TrajectoryText {

/// Room one value may take: sign, 309 integer digits, point and up to 9 decimals, with margin.
constexpr size_t kFixedMaxChars = 330;

/// snprintf(o_p, kFixedMaxChars, "%.*f", i_precision, i_value); returns the end of the text.
char* formatFixedSlow(char* o_p, double i_value, int i_precision);

namespace Detail {
constexpr uint64_t kPow10[] = {1,      10,      100,      1000,      10000,
                               100000, 1000000, 10000000, 100000000, 1000000000};

/// The decimal digits of `i_value`, with no leading zeros ("0" for 0).
inline char* appendUnsigned(char* o_p, uint64_t i_value) {
  static constexpr char kPairs[] = "00010203040506070809101112131415161718192021222324"
                                   "25262728293031323334353637383940414243444546474849"
                                   "50515253545556575859606162636465666768697071727374"
                                   "75767778798081828384858687888990919293949596979899";
  char digits[20];
  char* pEnd = digits + sizeof digits;
  char* p = pEnd;
  while (i_value >= 100) {
    const unsigned pair = unsigned(i_value % 100) * 2;
    i_value /= 100;
    p -= 2;
    std::memcpy(p, kPairs + pair, 2);
  }
  if (i_value >= 10) {
    p -= 2;
    std::memcpy(p, kPairs + i_value * 2, 2);
  } else {
    *--p = char('0' + i_value);
  }
  const size_t n = size_t(pEnd - p);
  std::memcpy(o_p, p, n);
  return o_p + n;
}

/// Exactly `N` digits of `i_value` (below 10^N), with leading zeros.
template <int N> inline char* appendPadded(char* o_p, uint64_t i_value) {
  for (int i = N - 1; i >= 0; --i) {
    o_p[i] = char('0' + i_value % 10);
    i_value /= 10;
  }
  return o_p + N;
}
} // namespace Detail

/// Writes `i_value` as "%.Nf" does (N from 0 to 9) and returns the end of the text; `o_p` must
/// have room for `kFixedMaxChars` characters.
template <int N> inline char* formatFixed(char* o_p, double i_value) {
  static_assert(N >= 0 && N <= 9);
  const uint64_t bits = std::bit_cast<uint64_t>(i_value);
  const int biased = int((bits >> 52) & 0x7FF);
  if (biased == 0x7FF) return formatFixedSlow(o_p, i_value, N);
  const uint64_t fraction = bits & ((uint64_t(1) << 52) - 1);
  const uint64_t mantissa = biased == 0 ? fraction : fraction | (uint64_t(1) << 52);
  const int exponent = biased == 0 ? -1074 : biased - 1075;
  // |value| * 10^N = scaled * 2^exponent, with scaled below 2^83.
  const unsigned __int128 scaled = (unsigned __int128)mantissa * Detail::kPow10[N];
  uint64_t units; // |value| * 10^N rounded half to even
  if (exponent >= 0) {
    if (exponent >= 64 || (scaled >> (64 - exponent)) != 0) return formatFixedSlow(o_p, i_value, N);
    units = uint64_t(scaled << exponent);
  } else if (exponent <= -128) {
    units = 0; // below half a unit: scaled < 2^83 <= 2^(-exponent - 1)
  } else {
    const int shift = -exponent;
    const unsigned __int128 quotient = scaled >> shift;
    const unsigned __int128 remainder = scaled & ((((unsigned __int128)1) << shift) - 1);
    const unsigned __int128 half = ((unsigned __int128)1) << (shift - 1);
    unsigned __int128 rounded = quotient;
    if (remainder > half || (remainder == half && (quotient & 1))) ++rounded;
    if ((rounded >> 64) != 0) return formatFixedSlow(o_p, i_value, N);
    units = uint64_t(rounded);
  }
  char* p = o_p;
  if (bits >> 63) *p++ = '-'; // printf keeps the sign of -0 and of negatives that round to 0
  p = Detail::appendUnsigned(p, units / Detail::kPow10[N]);
  if constexpr (N > 0) {
    *p++ = '.';
    p = Detail::appendPadded<N>(p, units % Detail::kPow10[N]);
  }
  return p;
}

} // namespace TrajectoryText
