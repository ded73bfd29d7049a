// The fast number conversions of the schema layer against the C library conversions they
// replace: "%.17g" for writing and scanf's "%lf" for reading must give the same text and the
// same bits.

#include "Utils/UtilsRapidXml/AttributeText.h"

#include <gtest/gtest.h>

#include <cmath>
#include <cstdint>
#include <cstdio>
#include <cstring>
#include <limits>
#include <random>
#include <string>
#include <vector>

using namespace UtilsRapidXml;

namespace {

std::string Reference(double value) {
  if (value == 0.0) return "0";
  char buffer[64];
  std::snprintf(buffer, sizeof buffer, "%.17g", value);
  return buffer;
}

std::uint64_t Bits(double value) {
  std::uint64_t bits = 0;
  std::memcpy(&bits, &value, sizeof bits);
  return bits;
}

/// ParseDouble's old road: the trimmed text scanned whole with "%lf%n".
bool ReferenceParse(const std::string& text, double& o_rValue) {
  int consumed = 0;
  return !text.empty() && std::sscanf(text.c_str(), "%lf%n", &o_rValue, &consumed) == 1 &&
         consumed == static_cast<int>(text.size());
}

/// Random doubles of every kind: any bit pattern (NaNs and subnormals among them), integers,
/// short decimals and values near the integer fast path's limits, both signs.
std::vector<double> Samples(std::size_t count) {
  std::mt19937_64 random(12);
  std::vector<double> values = {0.0,
                                -0.0,
                                1e15,
                                -1e15,
                                999999999999999.0,
                                1e15 + 1,
                                0.1,
                                -0.5,
                                std::numeric_limits<double>::infinity(),
                                -std::numeric_limits<double>::infinity(),
                                std::numeric_limits<double>::quiet_NaN(),
                                -std::numeric_limits<double>::quiet_NaN(),
                                std::numeric_limits<double>::denorm_min(),
                                std::numeric_limits<double>::max(),
                                std::numeric_limits<double>::lowest()};
  std::uniform_int_distribution<std::int64_t> integers(-2'000'000'000'000'000,
                                                       2'000'000'000'000'000);
  std::uniform_int_distribution<int> digits(0, 15);
  while (values.size() < count) {
    double bitsValue = 0;
    const std::uint64_t bits = random();
    std::memcpy(&bitsValue, &bits, sizeof bits);
    values.push_back(bitsValue);
    values.push_back(static_cast<double>(integers(random) >> digits(random)));
    values.push_back(static_cast<double>(integers(random) % 100000) /
                     std::pow(10.0, digits(random) % 8));
  }
  return values;
}

} // namespace

TEST(NumberText, FormattingMatchesPrintfOnAMillionValues) {
  for (double value : Samples(1'000'000)) {
    ASSERT_EQ(FormatDouble(value), Reference(value)) << Bits(value);
    char buffer[40];
    ASSERT_EQ(FormatDouble(value, buffer), Reference(value)) << Bits(value);
  }
  std::string appended = "x";
  AppendDouble(appended, -20.0);
  AppendDouble(appended, 0.25);
  EXPECT_EQ(appended, "x-200.25");
}

TEST(NumberText, ParsingMatchesScanfBitForBit) {
  std::vector<std::string> texts = {"0",
                                    "-0",
                                    "-0.0",
                                    "1.",
                                    ".5",
                                    "-.5",
                                    "00.5",
                                    "007",
                                    "1e5",
                                    "1E-3",
                                    "+1",
                                    "-",
                                    ".",
                                    "1..2",
                                    "1.2.3",
                                    "0x10",
                                    "inf",
                                    "-nan",
                                    "1e400",
                                    "1e-400",
                                    "4.9e-324",
                                    "1e-310",
                                    "12abc",
                                    "1 2",
                                    "9007199254740993",
                                    "123456789012345",
                                    "1234567890123456",
                                    "0.30000000000000004",
                                    "2.2250738585072011e-308"};
  std::mt19937_64 random(3);
  for (double value : Samples(100'000)) {
    texts.push_back(Reference(value));
    char buffer[64];
    std::snprintf(buffer, sizeof buffer, "%.*f", static_cast<int>(random() % 12), value);
    texts.push_back(buffer);
  }
  for (const auto& text : texts) {
    double expected = 7.0, actual = 7.0;
    const bool expectedOk = ReferenceParse(text, expected);
    const bool actualOk = ParseDouble(text, actual);
    ASSERT_EQ(actualOk, expectedOk) << text;
    if (!expectedOk) continue;
    if (std::isnan(expected)) {
      ASSERT_TRUE(std::isnan(actual)) << text;
      ASSERT_EQ(std::signbit(actual), std::signbit(expected)) << text;
    } else {
      ASSERT_EQ(Bits(actual), Bits(expected)) << text;
    }
  }
}
