#include "OstraAlgo/KinematicAlgo/VCalibratedRelativeTargets.h"

#include "OstraAlgo/KinematicAlgo/CalibratedText.h"

#include <ostream>

namespace KinematicAlgo {

bool VTargetRelativeOrientation::Equals(const ITargetCalibrated& o) const {
  const auto* other = dynamic_cast<const VTargetRelativeOrientation*>(&o);
  return other && VTargetBetweenSegments::Equals(o) &&
         m_Orientations[0] == other->m_Orientations[0] &&
         m_Orientations[1] == other->m_Orientations[1];
}

void VTargetRelativeOrientation::Write(std::ostream& o) const {
  VTargetBetweenSegments::Write(o);
  Text::Matrix3(o, " OrientInParent1: ", m_Orientations[0]);
  Text::Matrix3(o, " OrientInParent2: ", m_Orientations[1]);
}

bool VTargetRelativeOrientation::Read(VTextReader& r) {
  return VTargetBetweenSegments::Read(r) && r.Matrix3(" OrientInParent1: ", m_Orientations[0]) &&
         r.Matrix3(" OrientInParent2: ", m_Orientations[1]);
}

bool VTargetRelativeRay::Equals(const ITargetCalibrated& o) const {
  const auto* other = dynamic_cast<const VTargetRelativeRay*>(&o);
  return other && VTargetBetweenSegments::Equals(o) && m_Direction == other->m_Direction;
}

void VTargetRelativeRay::Write(std::ostream& o) const {
  VTargetBetweenSegments::Write(o);
  Text::Numbers(o, "DirInParent1: ", m_Direction.data(), 3);
  o << '\n';
}

bool VTargetRelativeRay::Read(VTextReader& r) {
  return VTargetBetweenSegments::Read(r) && r.Label("DirInParent1: ") &&
         r.Numbers(m_Direction.data(), 3);
}

} // namespace KinematicAlgo
