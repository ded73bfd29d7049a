#include "OstraAlgo/KinematicAlgo/VJointFunctionalHinge.h"

#include "OstraAlgo/KinematicAlgo/AngleStatistics.h"

#include <cmath>

namespace KinematicAlgo {

std::unique_ptr<VJointFunctional> VJointFunctionalHinge::Clone() const {
  return std::make_unique<VJointFunctionalHinge>();
}

void VJointFunctionalHinge::ComputePose(ConstView p, ConstView, VPose& o_rPose) const {
  const double c = std::cos(p[0]), s = std::sin(p[0]);
  o_rPose.m_Rotation << c, -s, 0.0, s, c, 0.0, 0.0, 0.0, 1.0;
  o_rPose.m_Translation.setZero();
}

bool VJointFunctionalHinge::ComputeParams(View o_rDynamic, View, const VPose& pose,
                                          double tolerance) const {
  const Eigen::Vector3d r = Log(pose.m_Rotation);
  o_rDynamic[0] = r.z();
  return tolerance * tolerance > r.squaredNorm() - r.z() * r.z();
}

void VJointFunctionalHinge::ComputeJacobian(ConstView p, ConstView, JointJacobian& o_rJ) const {
  // -sin(a) (I - z zᵀ) + cos(a) [z]x
  const double c = std::cos(p[0]), s = std::sin(p[0]);
  o_rJ.m_dR[0] << -s, -c, 0.0, c, -s, 0.0, 0.0, 0.0, 0.0;
  o_rJ.m_dT[0].setZero();
}

void VJointFunctionalHinge::ComputeRates(std::span<const ConstView> d, ConstView,
                                         JointRates& o_rRates) const {
  for (int k = 0; k < 2; ++k) {
    o_rRates[size_t(k)].setZero();
    o_rRates[size_t(k)][2] = d[size_t(k + 1)][0];
  }
}

void VJointFunctionalHinge::Blend(View a, ConstView b, double wa, double wb) const {
  double other = b[0];
  WrapAngle(a[0]);
  WrapAngle(other);
  a[0] = wa * a[0] + wb * other;
}

void VJointFunctionalHinge::NormaliseParams(View p) const {
  WrapAngle(p[0]);
}

void VJointFunctionalHinge::MeanAndCovariance(SampleMatrix samples, Eigen::MatrixXd& o_rCovariance,
                                              Eigen::VectorXd& o_rMean) const {
  o_rCovariance = Eigen::MatrixXd::Zero(1, 1);
  o_rMean = Eigen::VectorXd::Zero(1);
  if (samples.cols() < 3) return;
  Detail::AngleMeanAndCovariance(samples.topRows(1), o_rMean, o_rCovariance);
}

void VJointFunctionalHinge::CentreAndRange(SampleMatrix samples, Eigen::MatrixXd& o_rRange,
                                           Eigen::VectorXd& o_rCentre) const {
  o_rRange = Eigen::MatrixXd::Zero(1, 1);
  o_rCentre = Eigen::VectorXd::Zero(1);
  if (samples.cols() < 3) return;
  auto residuals = samples.topRows(1);
  o_rCentre = Detail::CentreAngles(residuals);
  double minimum = 0.0, maximum = 0.0;
  for (int iteration = 0; iteration < 50; ++iteration) {
    minimum = Pi;
    maximum = -Pi;
    for (Eigen::Index i = 0; i < residuals.cols(); ++i) {
      minimum = std::min(minimum, residuals(0, i));
      maximum = std::max(maximum, residuals(0, i));
    }
    const double mid = 0.5 * (maximum + minimum);
    o_rCentre[0] += mid;
    for (Eigen::Index i = 0; i < residuals.cols(); ++i)
      residuals(0, i) = SubtractAngles(residuals(0, i), mid);
    if (!(std::abs(mid) > 1e-4)) break;
  }
  WrapAngle(o_rCentre[0]);
  const double halfWidth = 0.5 * (maximum - minimum);
  o_rRange(0, 0) = halfWidth * halfWidth;
}

bool VJointFunctionalHinge::PreMultiply(const VPose& pose, ConstView, View io_rParams,
                                        double tolerance) const {
  double angle = 0.0;
  const bool ok = ComputeParams(View(&angle, 1), View(), pose, tolerance);
  io_rParams[0] += angle;
  return ok;
}

} // namespace KinematicAlgo
