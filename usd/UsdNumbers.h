#pragma once
// Numbers as a USD text layer prints them: the shortest text that reads back to the same value,
// in decimal form for decimal exponents from -6 to 14 and in exponent form ("1e-7", "1.5e15")
// outside, with no trailing ".0"; halves with six significant digits, as a C stream prints them.

#include <cstdint>

namespace AnvilUsd {

/// Room that any one number needs.
inline constexpr int MaxNumberChars = 32;

/// Each writes at `o_pOut` and returns the end of what it wrote; no terminating zero.
char* WriteFloat(char* o_pOut, float value);
char* WriteDouble(char* o_pOut, double value);
char* WriteHalf(char* o_pOut, std::uint16_t bits);

} // namespace AnvilUsd
