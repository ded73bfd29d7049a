#pragma once
// Value types of the attributes a skeleton stage holds, laid out as the USD data model has them.

#include <array>
#include <cstdint>
#include <string>
#include <variant>
#include <vector>

namespace AnvilUsd {

using Vec3f = std::array<float, 3>;
/// Three half-precision floats, as their IEEE 754 binary16 bits.
using Vec3h = std::array<std::uint16_t, 3>;
/// A quaternion of floats, real part first, as USD prints it.
struct Quatf {
  float w = 1.0f, x = 0.0f, y = 0.0f, z = 0.0f;
  bool operator==(const Quatf&) const = default;
};
/// A 4 by 4 matrix of doubles, row by row; USD multiplies row vectors, so the translation is
/// the last row.
using Matrix4d = std::array<std::array<double, 4>, 4>;

using TokenArray = std::vector<std::string>;
using Matrix4dArray = std::vector<Matrix4d>;
using Vec3fArray = std::vector<Vec3f>;
using QuatfArray = std::vector<Quatf>;
using Vec3hArray = std::vector<Vec3h>;

/// One attribute value.
using VValue = std::variant<TokenArray, Matrix4dArray, Vec3fArray, QuatfArray, Vec3hArray>;

/// The type name of a value as written in a layer ("token[]", "matrix4d[]", ...).
const char* TypeName(const VValue& value);

/// Round to nearest even, as USD's half type does; overflow gives infinity.
std::uint16_t FloatToHalf(float value);
float HalfToFloat(std::uint16_t bits);

} // namespace AnvilUsd
