#pragma once
#include "AnvilCore/SubjectSetupBuilder.h"
#include <string>
#include <vector>

namespace AnvilCore {

/// Names of the demo walker's markers, in the order of its marker records.
const std::vector<std::string>& demoWalkMarkerNames();
/// Index of a marker name in that list, or -1.
int demoWalkMarkerIndex(const std::string& i_rName);
/// The walker as subject records: 20 segments (a free pelvis; ball, hinge and Hardy-Spicer
/// joints down the limbs), its markers, one point target per marker. Millimetres, Z up, facing +X.
SubjectRecords demoWalkRecords();
/// Joint parameters of every segment, in segment order, of a person walking along +X at time
/// `i_seconds`: the pelvis travels with a vertical bob, legs and arms swing in opposition.
void demoWalkJoints(double i_seconds, std::vector<std::vector<double>>& o_rParams);

} // namespace AnvilCore
