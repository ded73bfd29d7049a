#pragma once
// Dummy joint: no parameters; J is the identity.

#include "OstraAlgo/KinematicAlgo/VJointFunctional.h"

namespace KinematicAlgo {

class VJointFunctionalDummy : public VJointFunctionalLinear {
public:
  VJointFunctionalDummy() : VJointFunctionalLinear("Dummy") {}
  std::unique_ptr<VJointFunctional> Clone() const override {
    return std::make_unique<VJointFunctionalDummy>();
  }
  std::uint32_t NumDynamicParams() const override { return 0; }
  std::uint32_t NumRotationParams() const override { return 0; }
  std::uint32_t NumTranslationParams() const override { return 0; }

  void ComputePose(ConstView, ConstView, VPose& o_rPose) const override { o_rPose = VPose(); }
  bool ComputeParams(View, View, const VPose&, double) const override { return true; }
  void ComputeJacobian(ConstView, ConstView, JointJacobian&) const override {}
  void ComputeRates(std::span<const ConstView>, ConstView, JointRates& o_rRates) const override {
    o_rRates[0].setZero();
    o_rRates[1].setZero();
  }
  void Blend(View, ConstView, double, double) const override {}
  void NormaliseParams(View) const override {}
  void MeanAndCovariance(SampleMatrix, Eigen::MatrixXd&, Eigen::VectorXd&) const override {}
  void CentreAndRange(SampleMatrix, Eigen::MatrixXd&, Eigen::VectorXd&) const override {}
  bool PreMultiply(const VPose&, ConstView, View, double) const override { return true; }
};

} // namespace KinematicAlgo
