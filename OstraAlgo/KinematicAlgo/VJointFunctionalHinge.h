#pragma once
// Hinge: one angle a about the joint's Z axis; J = (Rz(a), 0).

#include "OstraAlgo/KinematicAlgo/VJointFunctional.h"

namespace KinematicAlgo {

class VJointFunctionalHinge : public VJointFunctionalLinear {
public:
  VJointFunctionalHinge() : VJointFunctionalLinear("Hinge") {}
  std::unique_ptr<VJointFunctional> Clone() const override;
  std::uint32_t NumDynamicParams() const override { return 1; }
  std::uint32_t NumRotationParams() const override { return 1; }
  std::uint32_t NumTranslationParams() const override { return 0; }

  void ComputePose(ConstView dynamic, ConstView statics, VPose& o_rPose) const override;
  /// a is the Z part of log R; true when the rest of log R is shorter than the tolerance. The
  /// translation is not looked at.
  bool ComputeParams(View o_rDynamic, View o_rStatic, const VPose& pose,
                     double tolerance) const override;
  void ComputeJacobian(ConstView dynamic, ConstView statics,
                       JointJacobian& o_rJacobian) const override;
  void ComputeRates(std::span<const ConstView> derivatives, ConstView statics,
                    JointRates& o_rRates) const override;
  /// Both angles wrapped, then wa a + wb b.
  void Blend(View io_rA, ConstView b, double wa, double wb) const override;
  void NormaliseParams(View io_rParams) const override;
  /// At least three samples.
  void MeanAndCovariance(SampleMatrix samples, Eigen::MatrixXd& o_rCovariance,
                         Eigen::VectorXd& o_rMean) const override;
  /// At least three samples; the range is the squared half-width of the occupied arc.
  void CentreAndRange(SampleMatrix samples, Eigen::MatrixXd& o_rRange,
                      Eigen::VectorXd& o_rCentre) const override;
  /// Adds the pose's angle; the result of ComputeParams on the pose.
  bool PreMultiply(const VPose& pose, ConstView statics, View io_rParams,
                   double tolerance) const override;
};

} // namespace KinematicAlgo
