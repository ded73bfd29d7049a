#include "usd/UsdTypes.h"

#include <bit>
#include <cmath>

namespace AnvilUsd {

namespace {
template <class T> struct TypeNameOf;
template <> struct TypeNameOf<TokenArray> { static constexpr const char* value = "token[]"; };
template <> struct TypeNameOf<Matrix4dArray> { static constexpr const char* value = "matrix4d[]"; };
template <> struct TypeNameOf<Vec3fArray> { static constexpr const char* value = "float3[]"; };
template <> struct TypeNameOf<QuatfArray> { static constexpr const char* value = "quatf[]"; };
template <> struct TypeNameOf<Vec3hArray> { static constexpr const char* value = "half3[]"; };
} // namespace

const char* TypeName(const VValue& value) {
  return std::visit([](const auto& v) { return TypeNameOf<std::decay_t<decltype(v)>>::value; },
                    value);
}

std::uint16_t FloatToHalf(float value) {
  const std::uint32_t bits = std::bit_cast<std::uint32_t>(value);
  const std::uint32_t sign = (bits >> 16) & 0x8000u;
  const std::uint32_t magnitude = bits & 0x7fffffffu;
  if (magnitude >= 0x7f800000u) // infinity or NaN
    return std::uint16_t(sign | 0x7c00u | (magnitude > 0x7f800000u ? 0x200u : 0u));
  if (magnitude >= 0x477ff000u) // rounds to at least 65520: infinity
    return std::uint16_t(sign | 0x7c00u);
  if (magnitude < 0x38800000u) { // below the smallest normal half: a subnormal or zero
    const float scaled = std::bit_cast<float>(magnitude) * 16777216.0f; // 2^24, exact
    // The nearest integer count of 2^-24 under the current (nearest even) rounding.
    return std::uint16_t(sign | std::uint32_t(std::nearbyint(scaled)));
  }
  // Normal: rebias the exponent and round the 13 dropped mantissa bits to nearest even.
  const std::uint32_t rebased = magnitude - 0x38000000u;
  const std::uint32_t rounded = rebased + 0x0fffu + ((rebased >> 13) & 1u);
  return std::uint16_t(sign | (rounded >> 13));
}

float HalfToFloat(std::uint16_t bits) {
  const std::uint32_t sign = std::uint32_t(bits & 0x8000u) << 16;
  const std::uint32_t exponent = (bits >> 10) & 0x1fu;
  const std::uint32_t mantissa = bits & 0x3ffu;
  if (exponent == 0) {
    const float value = float(mantissa) * (1.0f / 16777216.0f);
    return sign ? -value : value;
  }
  if (exponent == 31) return std::bit_cast<float>(sign | 0x7f800000u | (mantissa << 13));
  return std::bit_cast<float>(sign | ((exponent + 112u) << 23) | (mantissa << 13));
}

} // namespace AnvilUsd
