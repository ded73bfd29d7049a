// The fast fixed-precision text against snprintf: random bit patterns (every exponent), random
// coordinates, values on rounding ties, the limits of the fast path, special values and both
// signs of zero, at the precisions the text writers use and at the ends of the range.
#include "exporters/trajectory/FixedDecimal.h"
#include <cfloat>
#include <cmath>
#include <cstdio>
#include <cstring>
#include <gtest/gtest.h>
#include <limits>
#include <random>
#include <string>

namespace {

template <int N> std::string fast(double i_value) {
  char text[TrajectoryText::kFixedMaxChars];
  return std::string(text, TrajectoryText::formatFixed<N>(text, i_value));
}

template <int N> std::string reference(double i_value) {
  char text[TrajectoryText::kFixedMaxChars];
  const int n = std::snprintf(text, sizeof text, "%.*f", N, i_value);
  return std::string(text, size_t(n));
}

// Counts mismatches and keeps the first for the message.
struct Mismatches {
  long count = 0;
  std::string first;
  template <int N> void check(double i_value) {
    const std::string a = fast<N>(i_value), b = reference<N>(i_value);
    if (a == b) return;
    if (count++ == 0)
      first = "%." + std::to_string(N) + "f of " + reference<17>(i_value) + ": " + a +
              " instead of " + b;
  }
  template <int N> void checkBothSigns(double i_value) {
    check<N>(i_value);
    check<N>(-i_value);
  }
};

TEST(FixedDecimalTest, MatchesSnprintfOnAMillionRandomValues) {
  std::mt19937_64 gen(12);
  std::uniform_real_distribution<double> coordinate(-5000.0, 5000.0);
  Mismatches m;
  for (int i = 0; i < 1000000; ++i) {
    double any;
    const uint64_t bits = gen();
    std::memcpy(&any, &bits, sizeof any);
    m.check<6>(any);
    m.check<3>(any);
    const double c = coordinate(gen);
    m.check<6>(c);
    m.check<3>(c);
  }
  EXPECT_EQ(m.count, 0) << m.first;
}

TEST(FixedDecimalTest, RoundsTiesToEvenAsSnprintfDoes) {
  Mismatches m;
  // Multiples of 2^-k near the last decimal hold exact ties (0.0625 at three decimals).
  std::mt19937_64 gen(5);
  for (int i = 0; i < 200000; ++i) {
    const double tie = std::ldexp(double(int64_t(gen() % 4000001) - 2000000), -int(gen() % 24));
    m.check<6>(tie);
    m.check<3>(tie);
    m.check<0>(tie);
    m.check<9>(tie);
  }
  for (const double v : {0.5, 1.5, 2.5, 0.0625, 0.0005, 0.0015, 0.0000005, 1e-7, 0.125})
    m.checkBothSigns<3>(v), m.checkBothSigns<6>(v), m.checkBothSigns<0>(v);
  EXPECT_EQ(m.count, 0) << m.first;
}

TEST(FixedDecimalTest, SpecialValuesZerosAndTheEdgesOfTheFastPath) {
  EXPECT_EQ(fast<6>(0.0), "0.000000");
  EXPECT_EQ(fast<6>(-0.0), "-0.000000");
  EXPECT_EQ(fast<3>(-1e-9), "-0.000");
  EXPECT_EQ(fast<0>(-0.0), "-0");
  Mismatches m;
  const double inf = std::numeric_limits<double>::infinity();
  const double nan = std::numeric_limits<double>::quiet_NaN();
  for (const double v :
       {0.0, inf, nan, DBL_MAX, DBL_MIN, std::numeric_limits<double>::denorm_min(), 1e-300, 1e300,
        9.2e12, 1.8e13, 1.8446744073709552e13, 1.8446744073709552e10, 1.8446744073709552e19,
        123456789.1234565, 4503599627370496.5, 9007199254740993.0})
    m.checkBothSigns<6>(v), m.checkBothSigns<3>(v), m.checkBothSigns<0>(v), m.checkBothSigns<9>(v);
  // Every power of two, through the change from the fast path to snprintf.
  for (int e = -1074; e <= 1023; ++e)
    m.checkBothSigns<6>(std::ldexp(1.0, e)), m.checkBothSigns<3>(std::ldexp(1.0, e));
  EXPECT_EQ(m.count, 0) << m.first;
}

} // namespace
