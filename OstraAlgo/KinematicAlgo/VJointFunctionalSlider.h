#pragma once
// Slider: one distance d along the joint's Z axis; J = (I, (0, 0, d)).

#include "OstraAlgo/KinematicAlgo/VJointFunctional.h"

namespace KinematicAlgo {

class VJointFunctionalSlider : public VJointFunctionalLinear {
public:
  VJointFunctionalSlider() : VJointFunctionalLinear("Slider") {}
  std::unique_ptr<VJointFunctional> Clone() const override;
  std::uint32_t NumDynamicParams() const override { return 1; }
  std::uint32_t NumRotationParams() const override { return 0; }
  std::uint32_t NumTranslationParams() const override { return 1; }

  void ComputePose(ConstView dynamic, ConstView statics, VPose& o_rPose) const override;
  /// d is the translation's Z; always true.
  bool ComputeParams(View o_rDynamic, View o_rStatic, const VPose& pose,
                     double tolerance) const override;
  void ComputeJacobian(ConstView dynamic, ConstView statics,
                       JointJacobian& o_rJacobian) const override;
  void ComputeRates(std::span<const ConstView> derivatives, ConstView statics,
                    JointRates& o_rRates) const override;
  void Blend(View io_rA, ConstView b, double wa, double wb) const override;
  void NormaliseParams(View) const override {}
  /// Arithmetic mean; the variance divides by N, not N - 1.
  void MeanAndCovariance(SampleMatrix samples, Eigen::MatrixXd& o_rCovariance,
                         Eigen::VectorXd& o_rMean) const override;
  /// Mid-range and squared half-range.
  void CentreAndRange(SampleMatrix samples, Eigen::MatrixXd& o_rRange,
                      Eigen::VectorXd& o_rCentre) const override;
  /// Adds the pose's Z translation; true.
  bool PreMultiply(const VPose& pose, ConstView statics, View io_rParams,
                   double tolerance) const override;
};

} // namespace KinematicAlgo
