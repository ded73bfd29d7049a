#pragma once
// Byte-level constants and number conversions of the C3D file format, shared by the writer and
// the reader. Header-only, no dependencies beyond the standard library.
//
// A C3D file is a sequence of 512-byte blocks, numbered from 1: the header (block 1), the
// parameter section (from the block named in header byte 0), then the frames. Integers are
// little-endian in the Intel and DEC forms and big-endian in the MIPS form; the processor byte
// (parameter section byte 3) says which form the floats take.
#include <cstddef>
#include <cstdint>
#include <cstring>

namespace C3D {

constexpr int kBlockSize = 512;
/// Header byte 1 and parameter section byte 1: the key of the format.
constexpr uint8_t kFormatKey = 0x50;
/// Header word at byte offset 298: present when event labels are 4 characters long.
constexpr uint16_t kEventLabelKey = 0x3039;

/// Processor byte (parameter section byte 3).
enum EProcessor : uint8_t {
  EProcessorIntel = 0x54, ///< 84: IEEE floats, little-endian
  EProcessorDec = 0x55,   ///< 85: DEC (VAX F) floats, little-endian integers
  EProcessorMips = 0x56,  ///< 86: IEEE floats and integers, big-endian
};

/// Type byte of a parameter record.
enum EParameterType : int8_t {
  ETypeChar = -1, ///< 0xFF: characters
  ETypeByte = 1,  ///< one byte
  ETypeInt16 = 2, ///< 16-bit integer
  ETypeFloat = 4, ///< 32-bit float in the file's float form
};

/// Header byte offsets.
namespace HeaderOffset {
constexpr int EParameterBlock = 0; ///< 1 byte: first block of the parameter section
constexpr int EKey = 1;            ///< 1 byte: kFormatKey
constexpr int EPointCount = 2;
constexpr int EAnalogPerFrame = 4; ///< analog measurements (channels times samples) per frame
constexpr int EFirstFrame = 6;
constexpr int ELastFrame = 8;
constexpr int EMaxGap = 10;
constexpr int EScale = 12;     ///< float; negative means float frames
constexpr int EDataStart = 16; ///< block of the first frame
constexpr int ESamplesPerFrame = 18;
constexpr int EFrameRate = 20; ///< float
constexpr int EEventKey = 298; ///< kEventLabelKey
} // namespace HeaderOffset

inline uint32_t floatBits(float i_value) {
  uint32_t bits;
  std::memcpy(&bits, &i_value, 4);
  return bits;
}

inline float bitsFloat(uint32_t i_bits) {
  float value;
  std::memcpy(&value, &i_bits, 4);
  return value;
}

inline void putU16LE(uint8_t* o_p, uint16_t i_value) {
  o_p[0] = uint8_t(i_value & 0xFF);
  o_p[1] = uint8_t(i_value >> 8);
}

inline uint16_t getU16LE(const uint8_t* i_p) {
  return uint16_t(i_p[0] | (i_p[1] << 8));
}
inline uint16_t getU16BE(const uint8_t* i_p) {
  return uint16_t((i_p[0] << 8) | i_p[1]);
}

inline void putFloatIntel(uint8_t* o_p, float i_value) {
  const uint32_t bits = floatBits(i_value);
  for (int i = 0; i < 4; ++i)
    o_p[i] = uint8_t(bits >> (8 * i));
}

/// IEEE float to the four bytes of a DEC float. With b0..b3 the little-endian IEEE bytes, the
/// result is b2, b3 + 1, b0, b1 (zero stays four zero bytes). Adding 1 to b3 raises the exponent
/// by 2, the difference between the two exponent biases and mantissa conventions. Exact for
/// every normal float whose magnitude is below 2^126; larger values overflow into the sign.
inline void ieeeToDec(float i_value, uint8_t o_p[4]) {
  uint8_t b[4];
  putFloatIntel(b, i_value);
  o_p[0] = b[2];
  o_p[1] = b[3];
  o_p[2] = b[0];
  o_p[3] = b[1];
  if (b[0] | b[1] | b[2] | b[3]) o_p[1] = uint8_t(b[3] + 1);
}

/// The four bytes of a DEC float to an IEEE float. The words are swapped back and the value
/// divided by 4, which also handles the smallest DEC exponents (they become IEEE denormals).
/// A DEC "reserved operand" (sign set, exponent 0) reads as 0.
inline float decToIeee(const uint8_t i_p[4]) {
  const uint32_t bits = uint32_t(i_p[2]) | (uint32_t(i_p[3]) << 8) | (uint32_t(i_p[0]) << 16) |
                        (uint32_t(i_p[1]) << 24);
  if ((bits & 0x7F800000u) == 0) return 0.0f; // DEC exponent 0: zero, whatever the fraction
  return bitsFloat(bits) / 4.0f;
}

/// Reads a float in the given processor form.
inline float getFloat(const uint8_t i_p[4], EProcessor i_processor) {
  switch (i_processor) {
  case EProcessorDec:
    return decToIeee(i_p);
  case EProcessorMips:
    return bitsFloat((uint32_t(i_p[0]) << 24) | (uint32_t(i_p[1]) << 16) | (uint32_t(i_p[2]) << 8) |
                     uint32_t(i_p[3]));
  default:
    return bitsFloat(uint32_t(i_p[0]) | (uint32_t(i_p[1]) << 8) | (uint32_t(i_p[2]) << 16) |
                     (uint32_t(i_p[3]) << 24));
  }
}

/// Writes a float in the DEC form when `i_dec`, else in the Intel form.
inline void putFloat(uint8_t o_p[4], float i_value, bool i_dec) {
  if (i_dec)
    ieeeToDec(i_value, o_p);
  else
    putFloatIntel(o_p, i_value);
}

/// `i_count` floats in their four-byte form, DEC when `i_dec`, else Intel: the same bytes as
/// `putFloat` of each, in a loop the compiler can vectorise.
inline void putFloats(uint8_t* o_p, const float* i_pValues, size_t i_count, bool i_dec) {
  if (!i_dec) {
    for (size_t i = 0; i < i_count; ++i)
      putFloatIntel(o_p + 4 * i, i_pValues[i]);
    return;
  }
  for (size_t i = 0; i < i_count; ++i) {
    const uint32_t bits = floatBits(i_pValues[i]);
    // Words swapped: bytes b2, b3, b0, b1; then b3 + 1 (wrapping within its byte) unless zero.
    const uint32_t swapped = (bits >> 16) | (bits << 16);
    const uint32_t raised = ((swapped >> 8) + (bits != 0 ? 1u : 0u)) & 0xFFu;
    const uint32_t dec = (swapped & 0xFFFF00FFu) | (raised << 8);
    for (int k = 0; k < 4; ++k)
      o_p[4 * i + size_t(k)] = uint8_t(dec >> (8 * k));
  }
}

/// `i_count` 16-bit words, little-endian.
inline void putWordsLE(uint8_t* o_p, const int16_t* i_pValues, size_t i_count) {
  for (size_t i = 0; i < i_count; ++i)
    putU16LE(o_p + 2 * i, uint16_t(i_pValues[i]));
}

/// Reads a 16-bit word in the given processor form.
inline uint16_t getU16(const uint8_t* i_p, EProcessor i_processor) {
  return i_processor == EProcessorMips ? getU16BE(i_p) : getU16LE(i_p);
}

} // namespace C3D
