#pragma once
// New store ids from 16 random bytes.

#include <array>
#include <cstdint>

namespace Flow2Store {

/// The bytes made a version 4 uuid (byte 6's high nibble 4, byte 8's top bits 10), read as two
/// big-endian 64-bit numbers, and those xored.
std::uint64_t FlowStoreIdFromBytes(std::array<std::uint8_t, 16> bytes);

/// 16 bytes from the platform's random source; raises boost::uuids::entropy_error if it fails.
std::array<std::uint8_t, 16> RandomBytes16();

/// A new random store id, never zero.
std::uint64_t NewFlowStoreId();

} // namespace Flow2Store
