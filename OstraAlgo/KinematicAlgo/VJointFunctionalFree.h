#pragma once
// Free joint: six parameters, a rotation vector r then a translation t; J = (exp(r), t).

#include "OstraAlgo/KinematicAlgo/VJointFunctional.h"

namespace KinematicAlgo {

class VJointFunctionalFree : public VJointFunctionalDynamic {
public:
  VJointFunctionalFree() : VJointFunctionalDynamic("Free") {}
  std::unique_ptr<VJointFunctional> Clone() const override;
  std::uint32_t NumDynamicParams() const override { return 6; }
  std::uint32_t NumRotationParams() const override { return 3; }
  std::uint32_t NumTranslationParams() const override { return 3; }

  void ComputePose(ConstView dynamic, ConstView statics, VPose& o_rPose) const override;
  /// Always true.
  bool ComputeParams(View o_rDynamic, View o_rStatic, const VPose& pose,
                     double tolerance) const override;
  void ComputeJacobian(ConstView dynamic, ConstView statics,
                       JointJacobian& o_rJacobian) const override;
  void ComputeRates(std::span<const ConstView> derivatives, ConstView statics,
                    JointRates& o_rRates) const override;
  /// Rotation on the group; translation wa ta + wb tb (weights not normalised).
  void Blend(View io_rA, ConstView b, double wa, double wb) const override;
  void NormaliseParams(View io_rParams) const override;
  /// (Ra Rb, Ra tb + ta).
  void ComposeParams(View o_rOut, ConstView a, ConstView b) const override;
  /// At least two samples; diagonal floored at 1e-6.
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
  /// Always true.
  bool PreMultiply(const VPose& pose, ConstView statics, View io_rParams,
                   double tolerance) const override;
};

} // namespace KinematicAlgo
