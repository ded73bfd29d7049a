#pragma once
// The scene clock's timecode modes and the standards they count in.
#include <cstdint>

namespace AnvilCore {

/// The timecode mode (`HTimeManager::setTimecodeMode`) that counts in `i_standard`, or -1.
int timecodeModeOfStandard(std::uint32_t i_standard);

} // namespace AnvilCore
