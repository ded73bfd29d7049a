#pragma once
// A joint turned by a fixed rotation A: J' = A J A⁻¹. Parameters and statistics stay those of
// the wrapped joint, in its own axes. Holds a scratch Jacobian, so one instance must not be
// differentiated from two threads at once; clones are independent.

#include "OstraAlgo/KinematicAlgo/VJointFunctional.h"

namespace KinematicAlgo {

class VJointFunctionalRotator : public VJointFunctionalDynamic {
public:
  VJointFunctionalRotator(std::unique_ptr<VJointFunctional> wrapped, const Matrix3r& rotation);
  std::unique_ptr<VJointFunctional> Clone() const override;
  const VJointFunctional& Wrapped() const { return *m_pWrapped; }
  const Matrix3r& Rotation() const { return m_A; }

  std::uint32_t NumDynamicParams() const override { return m_pWrapped->NumDynamicParams(); }
  std::uint32_t NumRotationParams() const override { return m_pWrapped->NumRotationParams(); }
  std::uint32_t NumTranslationParams() const override { return m_pWrapped->NumTranslationParams(); }

  /// (A R Aᵀ, A T) of the wrapped (R, T).
  void ComputePose(ConstView dynamic, ConstView statics, VPose& o_rPose) const override;
  bool ComputeParams(View o_rDynamic, View o_rStatic, const VPose& pose,
                     double tolerance) const override;
  void ComputeJacobian(ConstView dynamic, ConstView statics,
                       JointJacobian& o_rJacobian) const override;
  void ComputeRates(std::span<const ConstView> derivatives, ConstView statics,
                    JointRates& o_rRates) const override;
  void Blend(View io_rA, ConstView b, double wa, double wb) const override;
  void NormaliseParams(View io_rParams) const override;
  void ComposeParams(View o_rOut, ConstView a, ConstView b) const override;
  void MeanAndCovariance(SampleMatrix samples, Eigen::MatrixXd& o_rCovariance,
                         Eigen::VectorXd& o_rMean) const override;
  void CentreAndRange(SampleMatrix samples, Eigen::MatrixXd& o_rRange,
                      Eigen::VectorXd& o_rCentre) const override;
  void FromNormalised(View o_rX, ConstView z, const JointGaussian& gaussian) const override;
  void ToNormalised(View o_rZ, ConstView x, const JointGaussian& gaussian) const override;
  void FromNormalisedJacobian(ConstView z, const JointGaussian& gaussian,
                              Eigen::MatrixXd& o_rJacobian) const override;
  void ToNormalisedJacobian(ConstView x, const JointGaussian& gaussian,
                            Eigen::MatrixXd& o_rJacobian) const override;
  bool PreMultiply(const VPose& pose, ConstView statics, View io_rParams,
                   double tolerance) const override;

private:
  std::unique_ptr<VJointFunctional> m_pWrapped;
  Matrix3r m_A;
  Matrix3r m_At;
  mutable JointJacobian m_Scratch;
};

} // namespace KinematicAlgo
