#include "OstraAlgo/ComputeSubjectFK/VComputeTarget.h"

namespace ComputeSubject {

using namespace KinematicAlgo;

VComputeTargetPosition::VComputeTargetPosition(const ITargetCalibrated& target,
                                               const VComputeSegment* parent)
    : m_pTarget(&target), m_pParent(parent) {
  if (const auto* single = dynamic_cast<const ITargetSingleParent*>(&target))
    m_Local = single->PositionInParent();
  if (const auto* covariance = dynamic_cast<const ITargetCovariance3*>(&target))
    m_Covariance = covariance->Covariance();
  if (!parent) m_Errors = "VComputeTargetPosition cannot find segment. ";
  m_World = m_Local;
}

void VComputeTargetPosition::Update() {
  if (!m_pParent) return;
  const VPose& W = m_pParent->WorldPose();
  m_World.noalias() = W.m_Rotation * m_Local;
  m_World += W.m_Translation;
}

Eigen::Matrix3d VComputeTargetPosition::WorldCovariance() const {
  if (!m_pParent) return m_Covariance;
  const Eigen::Matrix3d R = m_pParent->WorldPose().m_Rotation;
  return R * m_Covariance * R.transpose();
}

void VComputeTargetPosition::Jacobian(Eigen::Ref<Eigen::MatrixXd> o_rJacobian) const {
  o_rJacobian.setZero();
  if (!m_pParent) return;
  const auto& blocks = m_pParent->JacobianBlocks();
  for (std::uint32_t b = 0; b < m_pParent->NumJacobianBlocks(); ++b) {
    const JointJacobian& block = blocks[b];
    for (std::uint32_t i = 0; i < block.m_NumParams; ++i)
      o_rJacobian.col(block.m_FirstParam + i) += block.m_dR[i] * m_Local + block.m_dT[i];
  }
}

} // namespace ComputeSubject
