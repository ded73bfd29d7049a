#pragma once
// Identifiers of subjects, markers and rotation observations: a 32-bit hash of the name that is
// the same from run to run.

#include <cstddef>
#include <cstdint>
#include <string_view>

namespace CoreOstraTypes {

/// The id of the empty name, and the unset value of every id.
inline constexpr std::uint32_t InvalidId = 0xFFFFFFFFu;

/// MurmurHash3, x86 32-bit variant, over `length` bytes.
std::uint32_t MurmurHash3_x86_32(const void* data, std::size_t length, std::uint32_t seed);

/// Id of a name: MurmurHash3 x86 32-bit of its bytes with seed 0, clamped to at most 0xFFFFFFFE
/// so that a non-empty name never gives the unset id. The empty name gives 0xFFFFFFFF.
std::uint32_t NameHash(std::string_view name);

} // namespace CoreOstraTypes
