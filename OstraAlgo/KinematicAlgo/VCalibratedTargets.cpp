#include "OstraAlgo/KinematicAlgo/VCalibratedTargets.h"

namespace KinematicAlgo {

bool VTargetPointDirection::Equals(const ITargetCalibrated& o) const {
  const auto* other = dynamic_cast<const VTargetPointDirection*>(&o);
  if (!other || !VTargetPosition::Equals(o) || m_Direction != other->m_Direction) return false;
  const Eigen::MatrixXd& c = other->m_ResidualCovariance;
  return c.rows() == m_ResidualCovariance.rows() && c.cols() == m_ResidualCovariance.cols() &&
         c == m_ResidualCovariance;
}

bool VTargetOrientation::Equals(const ITargetCalibrated& o) const {
  const auto* other = dynamic_cast<const VTargetOrientation*>(&o);
  return other && VTargetPosition::Equals(o) && m_Orientation == other->m_Orientation;
}

void VTargetRigidBody::SetBodyPoseInParent(const VPose& pose) {
  m_Body = pose;
  SetPositionInParent(pose.m_Translation);
}

std::shared_ptr<ITargetCalibrated> VTargetRigidBody::Clone() const {
  auto copy = std::make_shared<VTargetRigidBody>(*this);
  for (auto& member : copy->m_Members)
    member = std::static_pointer_cast<VTargetPosition>(member->Clone());
  return copy;
}

bool VTargetRigidBody::Equals(const ITargetCalibrated& o) const {
  const auto* other = dynamic_cast<const VTargetRigidBody*>(&o);
  if (!other || !VTargetPosition::Equals(o) || m_Body.m_Rotation != other->m_Body.m_Rotation ||
      m_Body.m_Translation != other->m_Body.m_Translation ||
      m_Members.size() != other->m_Members.size())
    return false;
  for (size_t i = 0; i < m_Members.size(); ++i)
    if (!m_Members[i]->Equals(*other->m_Members[i])) return false;
  return true;
}

bool VTargetPlane::Equals(const ITargetCalibrated& o) const {
  const auto* other = dynamic_cast<const VTargetPlane*>(&o);
  return other && VTargetPosition::Equals(o) && m_Normal == other->m_Normal &&
         m_Offset == other->m_Offset;
}

bool VTargetBetweenSegments::Equals(const ITargetCalibrated& o) const {
  const auto* other = dynamic_cast<const VTargetBetweenSegments*>(&o);
  return other && std::string(Key()) == o.Key() && m_Name == other->m_Name &&
         m_Parents == other->m_Parents && m_Positions[0] == other->m_Positions[0] &&
         m_Positions[1] == other->m_Positions[1];
}

} // namespace KinematicAlgo
