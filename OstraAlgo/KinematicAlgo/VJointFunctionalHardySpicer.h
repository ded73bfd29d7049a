#pragma once
// Hardy-Spicer (universal) joint: angles a about Z, then b about the turned Y axis;
// J = (Rz(a) Ry(b), 0). Its parameters are singular for reading back at b = ±pi/2.

#include "OstraAlgo/KinematicAlgo/VJointFunctional.h"

namespace KinematicAlgo {

class VJointFunctionalHardySpicer : public VJointFunctionalLinear {
public:
  VJointFunctionalHardySpicer() : VJointFunctionalLinear("Hardy-Spicer") {}
  std::unique_ptr<VJointFunctional> Clone() const override;
  std::uint32_t NumDynamicParams() const override { return 2; }
  std::uint32_t NumRotationParams() const override { return 2; }
  std::uint32_t NumTranslationParams() const override { return 0; }

  void ComputePose(ConstView dynamic, ConstView statics, VPose& o_rPose) const override;
  /// a = atan2(-R01, R11), b = atan2(-R20, R22); always true, the rest of R is not checked.
  bool ComputeParams(View o_rDynamic, View o_rStatic, const VPose& pose,
                     double tolerance) const override;
  void ComputeJacobian(ConstView dynamic, ConstView statics,
                       JointJacobian& o_rJacobian) const override;
  /// Velocity a' z + M (b' y) with M the fixed rotation of one radian about Z, whatever the
  /// joint's angle; acceleration a'' z + M (b'' y) + (M (b' y)) x (a' z).
  void ComputeRates(std::span<const ConstView> derivatives, ConstView statics,
                    JointRates& o_rRates) const override;
  /// Element-wise wa a + wb b, no wrapping.
  void Blend(View io_rA, ConstView b, double wa, double wb) const override;
  void NormaliseParams(View io_rParams) const override;
  /// At least three samples.
  void MeanAndCovariance(SampleMatrix samples, Eigen::MatrixXd& o_rCovariance,
                         Eigen::VectorXd& o_rMean) const override;
  /// At least three samples; the range is the covering ellipse of the angle pairs.
  void CentreAndRange(SampleMatrix samples, Eigen::MatrixXd& o_rRange,
                      Eigen::VectorXd& o_rCentre) const override;
  /// Accepts only an offset about the first axis (|b| of the pose below 1e-10).
  bool PreMultiply(const VPose& pose, ConstView statics, View io_rParams,
                   double tolerance) const override;
};

} // namespace KinematicAlgo
