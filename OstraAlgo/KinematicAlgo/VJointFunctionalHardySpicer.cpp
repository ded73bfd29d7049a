#include "OstraAlgo/KinematicAlgo/VJointFunctionalHardySpicer.h"

#include "OstraAlgo/KinematicAlgo/AngleStatistics.h"
#include "OstraAlgo/KinematicAlgo/JointStatistics.h"

#include <cmath>

namespace KinematicAlgo {

namespace {
Matrix3r RotationZ(double c, double s) {
  Matrix3r R;
  R << c, -s, 0.0, s, c, 0.0, 0.0, 0.0, 1.0;
  return R;
}
Matrix3r RotationY(double c, double s) {
  Matrix3r R;
  R << c, 0.0, s, 0.0, 1.0, 0.0, -s, 0.0, c;
  return R;
}
} // namespace

std::unique_ptr<VJointFunctional> VJointFunctionalHardySpicer::Clone() const {
  return std::make_unique<VJointFunctionalHardySpicer>();
}

void VJointFunctionalHardySpicer::ComputePose(ConstView p, ConstView, VPose& o_rPose) const {
  const double ca = std::cos(p[0]), sa = std::sin(p[0]);
  const double cb = std::cos(p[1]), sb = std::sin(p[1]);
  o_rPose.m_Rotation << ca * cb, -sa, ca * sb, sa * cb, ca, sa * sb, -sb, 0.0, cb;
  o_rPose.m_Translation.setZero();
}

bool VJointFunctionalHardySpicer::ComputeParams(View o_rDynamic, View, const VPose& pose,
                                                double) const {
  const Matrix3r& R = pose.m_Rotation;
  o_rDynamic[0] = std::atan2(-R(0, 1), R(1, 1));
  o_rDynamic[1] = std::atan2(-R(2, 0), R(2, 2));
  return true;
}

void VJointFunctionalHardySpicer::ComputeJacobian(ConstView p, ConstView,
                                                  JointJacobian& o_rJ) const {
  const double ca = std::cos(p[0]), sa = std::sin(p[0]);
  const double cb = std::cos(p[1]), sb = std::sin(p[1]);
  Matrix3r dRz;
  dRz << -sa, -ca, 0.0, ca, -sa, 0.0, 0.0, 0.0, 0.0;
  Matrix3r dRy;
  dRy << -sb, 0.0, cb, 0.0, 0.0, 0.0, -cb, 0.0, -sb;
  o_rJ.m_dR[0] = dRz * RotationY(cb, sb);
  o_rJ.m_dR[1] = RotationZ(ca, sa) * dRy;
  o_rJ.m_dT[0].setZero();
  o_rJ.m_dT[1].setZero();
}

void VJointFunctionalHardySpicer::ComputeRates(std::span<const ConstView> d, ConstView,
                                               JointRates& o_rRates) const {
  const Matrix3r M = Exp(Eigen::Vector3d::UnitZ());
  const Eigen::Vector3d z = Eigen::Vector3d::UnitZ(), y = Eigen::Vector3d::UnitY();
  const Eigen::Vector3d turnB = M * (d[1][1] * y);
  o_rRates[0].setZero();
  o_rRates[1].setZero();
  o_rRates[0].head<3>() = d[1][0] * z + turnB;
  o_rRates[1].head<3>() = d[2][0] * z + M * (d[2][1] * y) + turnB.cross(d[1][0] * z);
}

void VJointFunctionalHardySpicer::Blend(View a, ConstView b, double wa, double wb) const {
  a[0] = wa * a[0] + wb * b[0];
  a[1] = wa * a[1] + wb * b[1];
}

void VJointFunctionalHardySpicer::NormaliseParams(View p) const {
  WrapAngle(p[0]);
  WrapAngle(p[1]);
}

void VJointFunctionalHardySpicer::MeanAndCovariance(SampleMatrix samples,
                                                    Eigen::MatrixXd& o_rCovariance,
                                                    Eigen::VectorXd& o_rMean) const {
  o_rCovariance = Eigen::MatrixXd::Zero(2, 2);
  o_rMean = Eigen::VectorXd::Zero(2);
  if (samples.cols() < 3) return;
  Detail::AngleMeanAndCovariance(samples.topRows(2), o_rMean, o_rCovariance);
}

void VJointFunctionalHardySpicer::CentreAndRange(SampleMatrix samples, Eigen::MatrixXd& o_rRange,
                                                 Eigen::VectorXd& o_rCentre) const {
  o_rRange = Eigen::MatrixXd::Zero(2, 2);
  o_rCentre = Eigen::VectorXd::Zero(2);
  if (samples.cols() < 3) return;
  auto residuals = samples.topRows(2);
  o_rCentre = Detail::CentreAngles(residuals);
  for (int iteration = 0; iteration < 50; ++iteration) {
    const CoveringEllipsoid ellipse = MinEllipsoidSolver(residuals, 0.005, 1000);
    o_rRange = ellipse.m_Cover;
    o_rCentre += ellipse.m_Centre;
    for (Eigen::Index row = 0; row < 2; ++row)
      for (Eigen::Index i = 0; i < residuals.cols(); ++i)
        residuals(row, i) = SubtractAngles(residuals(row, i), ellipse.m_Centre[row]);
    if (!(ellipse.m_Centre.norm() > 1e-4)) break;
  }
  WrapAngle(o_rCentre[0]);
  WrapAngle(o_rCentre[1]);
}

bool VJointFunctionalHardySpicer::PreMultiply(const VPose& pose, ConstView, View io_rParams,
                                              double tolerance) const {
  double offset[2] = {0.0, 0.0};
  const bool ok = ComputeParams(View(offset, 2), View(), pose, tolerance);
  io_rParams[0] += offset[0];
  io_rParams[1] += offset[1];
  return ok && std::abs(offset[1]) < 1e-10;
}

} // namespace KinematicAlgo
