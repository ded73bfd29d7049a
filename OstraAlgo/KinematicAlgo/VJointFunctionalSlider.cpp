#include "OstraAlgo/KinematicAlgo/VJointFunctionalSlider.h"

#include <algorithm>

namespace KinematicAlgo {

std::unique_ptr<VJointFunctional> VJointFunctionalSlider::Clone() const {
  return std::make_unique<VJointFunctionalSlider>();
}

void VJointFunctionalSlider::ComputePose(ConstView p, ConstView, VPose& o_rPose) const {
  o_rPose.m_Rotation.setIdentity();
  o_rPose.m_Translation = Eigen::Vector3d(0.0, 0.0, p[0]);
}

bool VJointFunctionalSlider::ComputeParams(View o_rDynamic, View, const VPose& pose, double) const {
  o_rDynamic[0] = pose.m_Translation.z();
  return true;
}

void VJointFunctionalSlider::ComputeJacobian(ConstView, ConstView, JointJacobian& o_rJ) const {
  o_rJ.m_dR[0].setZero();
  o_rJ.m_dT[0] = Eigen::Vector3d::UnitZ();
}

void VJointFunctionalSlider::ComputeRates(std::span<const ConstView> d, ConstView,
                                          JointRates& o_rRates) const {
  for (int k = 0; k < 2; ++k) {
    o_rRates[size_t(k)].setZero();
    o_rRates[size_t(k)][5] = d[size_t(k + 1)][0];
  }
}

void VJointFunctionalSlider::Blend(View a, ConstView b, double wa, double wb) const {
  a[0] = wa * a[0] + wb * b[0];
}

void VJointFunctionalSlider::MeanAndCovariance(SampleMatrix samples, Eigen::MatrixXd& o_rCovariance,
                                               Eigen::VectorXd& o_rMean) const {
  o_rCovariance = Eigen::MatrixXd::Zero(1, 1);
  o_rMean = Eigen::VectorXd::Zero(1);
  const Eigen::Index count = samples.cols();
  if (count == 1) o_rMean[0] = samples(0, 0);
  if (count < 2) return;
  o_rMean[0] = samples.row(0).mean();
  o_rCovariance(0, 0) = (samples.row(0).array() - o_rMean[0]).square().sum() / double(count);
}

void VJointFunctionalSlider::CentreAndRange(SampleMatrix samples, Eigen::MatrixXd& o_rRange,
                                            Eigen::VectorXd& o_rCentre) const {
  o_rRange = Eigen::MatrixXd::Zero(1, 1);
  o_rCentre = Eigen::VectorXd::Zero(1);
  if (samples.cols() == 0) return;
  double minimum = 1e10, maximum = -1e10;
  for (Eigen::Index i = 0; i < samples.cols(); ++i) {
    minimum = std::min(minimum, samples(0, i));
    maximum = std::max(maximum, samples(0, i));
  }
  o_rCentre[0] = 0.5 * (maximum + minimum);
  o_rRange(0, 0) = (maximum - minimum) * (maximum - minimum) / 4.0;
}

bool VJointFunctionalSlider::PreMultiply(const VPose& pose, ConstView, View io_rParams,
                                         double) const {
  io_rParams[0] += pose.m_Translation.z();
  return true;
}

} // namespace KinematicAlgo
