#include "OstraAlgo/KinematicAlgo/VJointFunctionalRotator.h"

namespace KinematicAlgo {

VJointFunctionalRotator::VJointFunctionalRotator(std::unique_ptr<VJointFunctional> wrapped,
                                                 const Matrix3r& rotation)
    : VJointFunctionalDynamic("Rotated_" + wrapped->Name()), m_pWrapped(std::move(wrapped)),
      m_A(rotation), m_At(rotation.transpose()), m_Scratch(m_pWrapped->NumDynamicParams()) {}

std::unique_ptr<VJointFunctional> VJointFunctionalRotator::Clone() const {
  return std::make_unique<VJointFunctionalRotator>(m_pWrapped->Clone(), m_A);
}

void VJointFunctionalRotator::ComputePose(ConstView dynamic, ConstView statics,
                                          VPose& o_rPose) const {
  VPose inner;
  m_pWrapped->ComputePose(dynamic, statics, inner);
  o_rPose.m_Rotation = m_A * inner.m_Rotation * m_At;
  o_rPose.m_Translation = m_A * inner.m_Translation;
}

bool VJointFunctionalRotator::ComputeParams(View o_rDynamic, View o_rStatic, const VPose& pose,
                                            double tolerance) const {
  VPose inner;
  inner.m_Rotation = m_At * pose.m_Rotation * m_A;
  inner.m_Translation = m_At * pose.m_Translation;
  return m_pWrapped->ComputeParams(o_rDynamic, o_rStatic, inner, tolerance);
}

void VJointFunctionalRotator::ComputeJacobian(ConstView dynamic, ConstView statics,
                                              JointJacobian& o_rJacobian) const {
  m_pWrapped->ComputeJacobian(dynamic, statics, m_Scratch);
  for (std::uint32_t i = 0; i < m_pWrapped->NumDynamicParams(); ++i) {
    o_rJacobian.m_dR[i] = m_A * m_Scratch.m_dR[i] * m_At;
    o_rJacobian.m_dT[i] = m_A * m_Scratch.m_dT[i];
  }
}

void VJointFunctionalRotator::ComputeRates(std::span<const ConstView> derivatives,
                                           ConstView statics, JointRates& o_rRates) const {
  m_pWrapped->ComputeRates(derivatives, statics, o_rRates);
  for (Vector6d& rate : o_rRates) {
    rate.head<3>() = m_A * rate.head<3>();
    rate.tail<3>() = m_A * rate.tail<3>();
  }
}

void VJointFunctionalRotator::Blend(View a, ConstView b, double wa, double wb) const {
  m_pWrapped->Blend(a, b, wa, wb);
}
void VJointFunctionalRotator::NormaliseParams(View p) const {
  m_pWrapped->NormaliseParams(p);
}
void VJointFunctionalRotator::ComposeParams(View o_rOut, ConstView a, ConstView b) const {
  m_pWrapped->ComposeParams(o_rOut, a, b);
}
void VJointFunctionalRotator::MeanAndCovariance(SampleMatrix samples, Eigen::MatrixXd& o_rC,
                                                Eigen::VectorXd& o_rM) const {
  m_pWrapped->MeanAndCovariance(samples, o_rC, o_rM);
}
void VJointFunctionalRotator::CentreAndRange(SampleMatrix samples, Eigen::MatrixXd& o_rR,
                                             Eigen::VectorXd& o_rC) const {
  m_pWrapped->CentreAndRange(samples, o_rR, o_rC);
}
void VJointFunctionalRotator::FromNormalised(View o_rX, ConstView z, const JointGaussian& g) const {
  m_pWrapped->FromNormalised(o_rX, z, g);
}
void VJointFunctionalRotator::ToNormalised(View o_rZ, ConstView x, const JointGaussian& g) const {
  m_pWrapped->ToNormalised(o_rZ, x, g);
}
void VJointFunctionalRotator::FromNormalisedJacobian(ConstView z, const JointGaussian& g,
                                                     Eigen::MatrixXd& o_rJ) const {
  m_pWrapped->FromNormalisedJacobian(z, g, o_rJ);
}
void VJointFunctionalRotator::ToNormalisedJacobian(ConstView x, const JointGaussian& g,
                                                   Eigen::MatrixXd& o_rJ) const {
  m_pWrapped->ToNormalisedJacobian(x, g, o_rJ);
}
bool VJointFunctionalRotator::PreMultiply(const VPose& pose, ConstView statics, View io_rParams,
                                          double tolerance) const {
  return m_pWrapped->PreMultiply(pose, statics, io_rParams, tolerance);
}

} // namespace KinematicAlgo
