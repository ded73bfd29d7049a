#pragma once
#include "plugin/host/Vec3.h"
#include <string>
#include <vector>

namespace AnvilCore {

/// Names of the demo walker's markers, in the order `demoWalkPose` fills them.
const std::vector<std::string>& demoWalkMarkerNames();
/// Index of a marker name in that list, or -1.
int demoWalkMarkerIndex(const std::string& i_rName);
/// Marker positions (millimetres, Z up) of a person walking along +X at time `i_seconds`.
void demoWalkPose(double i_seconds, std::vector<Vec3>& o_rPositions);

} // namespace AnvilCore
