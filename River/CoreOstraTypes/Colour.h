#pragma once

#include <array>
#include <cstdint>

namespace CoreOstraTypes {

/// Red, green, blue, alpha.
using Colour = std::array<std::uint8_t, 4>;

/// The colour of a default-constructed record: grey 93, opaque (0xFF5D5D5D little-endian).
inline constexpr Colour DefaultColour{93, 93, 93, 255};

} // namespace CoreOstraTypes
