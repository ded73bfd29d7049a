#pragma once
#include <ostream>

namespace AnvilCore {

/// Prints a short summary of the scene: rate, ranges, and the counts and names of markers,
/// subjects, cameras and audio sources.
void describeScene(std::ostream& o_rOut);

} // namespace AnvilCore
