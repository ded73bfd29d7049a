// The shared C3D number conversions, checked against the DEC definition in C3DTestFile.h.
#include "exporters/trajectory/c3d/C3DFormat.h"
#include "C3DTestFile.h"
#include "exporters/trajectory/C3DExporter.h"
#include <gtest/gtest.h>
#include <random>

TEST(C3DFormatTest, DecConversionMatchesTheFormatBothWays) {
  char bytes[4];
  C3DExporter::convertFloatToDec(1.0f, bytes);
  EXPECT_EQ(std::string(bytes, 4), std::string("\x80\x40\x00\x00", 4));
  C3DExporter::convertFloatToDec(-1.0f, bytes);
  EXPECT_EQ(std::string(bytes, 4), std::string("\x80\xC0\x00\x00", 4));
  C3DExporter::convertFloatToDec(0.0f, bytes);
  EXPECT_EQ(std::string(bytes, 4), std::string(4, '\0'));
  C3DExporter::convertWordToDec(short(-2), bytes);
  EXPECT_EQ(std::string(bytes, 2), "\xFE\xFF");
  C3DExporter::convertUnsignedWordToDec(0x1234, bytes);
  EXPECT_EQ(std::string(bytes, 2), "\x34\x12");

  std::mt19937 gen(7);
  std::uniform_real_distribution<float> mantissa(-1.0f, 1.0f);
  std::uniform_int_distribution<int> exponent(-100, 100);
  for (int i = 0; i < 2000; ++i) {
    const float value = std::ldexp(mantissa(gen), exponent(gen));
    std::vector<uint8_t> file(4);
    C3D::ieeeToDec(value, file.data());
    // The independent decoder reads the bytes as a DEC F-float.
    C3DTest::File reader(std::vector<uint8_t>{});
    reader.bytes = file;
    ASSERT_EQ(float(reader.decFloat(0)), value) << value;
    ASSERT_EQ(C3D::decToIeee(file.data()), value) << value;
    ASSERT_EQ(C3D::getFloat(file.data(), C3D::EProcessorDec), value);
  }
  // The smallest DEC exponents read as IEEE denormals, not as garbage.
  const uint8_t tiny[4] = {0x00, 0x01, 0x00, 0x00}; // exponent 2: 0.5 * 2^-126
  EXPECT_EQ(C3D::decToIeee(tiny), std::ldexp(0.5f, -126));
  const uint8_t mips[4] = {0x3F, 0x80, 0x00, 0x00};
  EXPECT_EQ(C3D::getFloat(mips, C3D::EProcessorMips), 1.0f);
}

// The array conversions the frame writer uses give the bytes of the one-value conversions, for
// any bit pattern: zeros of both signs, denormals, the exponents whose DEC byte wraps, NaNs.
TEST(C3DFormatTest, ArrayConversionsMatchOneValueConversions) {
  std::mt19937 gen(11);
  std::vector<float> values = {0.0f,
                               -0.0f,
                               1.0f,
                               -1.0f,
                               C3D::bitsFloat(0x7F800000u),
                               C3D::bitsFloat(0xFF7FFFFFu),
                               C3D::bitsFloat(0x00000001u),
                               C3D::bitsFloat(0x7FC00000u)};
  for (int i = 0; i < 100000; ++i)
    values.push_back(C3D::bitsFloat(uint32_t(gen())));
  for (const bool dec : {false, true}) {
    std::vector<uint8_t> together(4 * values.size()), single(4 * values.size());
    C3D::putFloats(together.data(), values.data(), values.size(), dec);
    for (size_t i = 0; i < values.size(); ++i)
      C3D::putFloat(&single[4 * i], values[i], dec);
    ASSERT_EQ(together, single) << (dec ? "DEC" : "Intel");
  }
  std::vector<int16_t> words = {0, -1, 32767, -32768, 0x1234};
  std::vector<uint8_t> bytes(2 * words.size());
  C3D::putWordsLE(bytes.data(), words.data(), words.size());
  EXPECT_EQ(std::string(bytes.begin(), bytes.end()),
            std::string("\x00\x00\xFF\xFF\xFF\x7F\x00\x80\x34\x12", 10));
}
