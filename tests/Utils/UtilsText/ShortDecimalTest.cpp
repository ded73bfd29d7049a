#include "Utils/UtilsText/ShortDecimal.h"
#include "../../support/RandomDecimalText.h"

#include <gtest/gtest.h>

#include <cmath>
#include <cstdlib>
#include <cstring>
#include <random>
#include <string>

using namespace UtilsText;

TEST(ShortDecimal, TakesOnlyWhatItCanReadExactly) {
  double value = 7.0;
  EXPECT_TRUE(ParseShortDecimal("-20", value));
  EXPECT_EQ(value, -20.0);
  EXPECT_TRUE(ParseShortDecimal("0.01", value));
  EXPECT_EQ(value, 0.01);
  EXPECT_TRUE(ParseShortDecimal("-0", value));
  EXPECT_TRUE(std::signbit(value));
  EXPECT_TRUE(ParseShortDecimal("123456789012345", value)); // the most digits
  EXPECT_EQ(value, 123456789012345.0);
  value = 7.0;
  for (const char* other : {"", "-", ".", "-.", "1e5", "+1", " 1", "1 ", "--1", "1234567890123456",
                            "1.2.3", "inf", "0x1"}) {
    EXPECT_FALSE(ParseShortDecimal(other, value)) << other;
    EXPECT_EQ(value, 7.0) << other;
  }
  // The grammar of expressions reads the sign itself: digits only here.
  EXPECT_FALSE(ParseUnsignedShortDecimal("-1", value));
  EXPECT_TRUE(ParseUnsignedShortDecimal("3.", value));
  EXPECT_EQ(value, 3.0);
}

TEST(ShortDecimal, GivesStrtodsValueBitForBit) {
  std::mt19937_64 random(11);
  for (int i = 0; i < 50000; ++i) {
    const std::string text = TestSupport::randomDecimalText(random, 15);
    double value = 0.0;
    ASSERT_TRUE(ParseShortDecimal(text, value)) << text;
    const double expected = std::strtod(text.c_str(), nullptr);
    ASSERT_EQ(std::memcmp(&value, &expected, sizeof value), 0) << text;
  }
}
