#include "OstraAlgo/KinematicAlgo/VJointFunctionalBall.h"

#include "OstraAlgo/KinematicAlgo/JointStatistics.h"
#include "OstraAlgo/KinematicAlgo/RotationalJoint.h"

namespace KinematicAlgo {

std::unique_ptr<VJointFunctional> VJointFunctionalBall::Clone() const {
  return std::make_unique<VJointFunctionalBall>();
}

void VJointFunctionalBall::ComputePose(ConstView p, ConstView, VPose& o_rPose) const {
  o_rPose.m_Rotation = Exp(Eigen::Vector3d(p[0], p[1], p[2]));
  o_rPose.m_Translation.setZero();
}

bool VJointFunctionalBall::ComputeParams(View o_rDynamic, View, const VPose& pose,
                                         double tolerance) const {
  const Eigen::Vector3d r = Log(pose.m_Rotation);
  for (int i = 0; i < 3; ++i)
    o_rDynamic[size_t(i)] = r[i];
  return tolerance > pose.m_Translation.norm();
}

void VJointFunctionalBall::ComputeJacobian(ConstView p, ConstView, JointJacobian& o_rJ) const {
  Matrix3r R;
  std::array<Matrix3r, 3> dR;
  ExpAndDerivatives(Eigen::Vector3d(p[0], p[1], p[2]), R, dR);
  for (size_t i = 0; i < 3; ++i) {
    o_rJ.m_dR[i] = dR[i];
    o_rJ.m_dT[i].setZero();
  }
}

void VJointFunctionalBall::ComputeRates(std::span<const ConstView> d, ConstView,
                                        JointRates& o_rRates) const {
  for (int k = 0; k < 2; ++k) {
    o_rRates[size_t(k)].setZero();
    for (int i = 0; i < 3; ++i)
      o_rRates[size_t(k)][i] = d[size_t(k + 1)][size_t(i)];
  }
}

void VJointFunctionalBall::Blend(View a, ConstView b, double wa, double wb) const {
  Detail::BlendRotation(a.data(), b.data(), wa, wb);
}

void VJointFunctionalBall::NormaliseParams(View p) const {
  Detail::NormaliseRotation(p.data());
}

void VJointFunctionalBall::ComposeParams(View o_rOut, ConstView a, ConstView b) const {
  const Eigen::Vector3d r =
      Log(Exp(Eigen::Vector3d(a[0], a[1], a[2])) * Exp(Eigen::Vector3d(b[0], b[1], b[2])));
  for (size_t i = 0; i < 3; ++i)
    o_rOut[i] = r[Eigen::Index(i)];
}

void VJointFunctionalBall::MeanAndCovariance(SampleMatrix samples, Eigen::MatrixXd& o_rCovariance,
                                             Eigen::VectorXd& o_rMean) const {
  o_rCovariance = Eigen::MatrixXd::Zero(3, 3);
  o_rMean = Eigen::VectorXd::Zero(3);
  const Eigen::Index count = samples.cols();
  if (count < 2) return;
  Eigen::Matrix4Xd quaternions(4, count);
  for (Eigen::Index i = 0; i < count; ++i) {
    Eigen::Vector3d r = samples.col(i).head<3>();
    WrapRotationVector(r);
    samples.col(i).head<3>() = r;
    quaternions.col(i) = QuaternionFromRotationVector(r);
  }
  VPose start;
  start.m_Rotation = QuaternionToMatrix(RobustQuaternionMean(quaternions));
  const Eigen::MatrixXd data = samples.topRows(3);
  const VPose mean = Detail::IterateMean(data, start, false, {1e-4, 50});
  Detail::PoseToParams(mean, false, o_rMean);
  const Eigen::MatrixXd residuals = Detail::Residuals(data, mean, false);
  o_rCovariance = residuals * residuals.transpose() / double(count - 1);
}

void VJointFunctionalBall::CentreAndRange(SampleMatrix samples, Eigen::MatrixXd& o_rRange,
                                          Eigen::VectorXd& o_rCentre) const {
  o_rRange = Eigen::MatrixXd::Zero(3, 3);
  o_rCentre = Eigen::VectorXd::Zero(3);
  const Eigen::Index count = samples.cols();
  if (count == 0) return;
  Eigen::Matrix4Xd quaternions(4, count);
  for (Eigen::Index i = 0; i < count; ++i)
    quaternions.col(i) = QuaternionFromRotationVector(samples.col(i).head<3>());
  VPose start;
  start.m_Rotation = QuaternionToMatrix(RobustQuaternionMean(quaternions));
  const Eigen::MatrixXd data = samples.topRows(3);
  const VPose centre = Detail::IterateCentre(data, start, false, {0.001, 50}, 0.001,
                                             "JointFunctionalBall", o_rRange);
  ComputeParams(View(o_rCentre.data(), 3), View(), centre, 1e10);
}

void VJointFunctionalBall::FromNormalised(View o_rX, ConstView z, const JointGaussian& g) const {
  Detail::FromNormalised(o_rX.data(), z.data(), g, false);
}
void VJointFunctionalBall::ToNormalised(View o_rZ, ConstView x, const JointGaussian& g) const {
  Detail::ToNormalised(o_rZ.data(), x.data(), g, false);
}
void VJointFunctionalBall::FromNormalisedJacobian(ConstView z, const JointGaussian& g,
                                                  Eigen::MatrixXd& o_rJ) const {
  Detail::FromNormalisedJacobian(z.data(), g, false, o_rJ);
}
void VJointFunctionalBall::ToNormalisedJacobian(ConstView x, const JointGaussian& g,
                                                Eigen::MatrixXd& o_rJ) const {
  Detail::ToNormalisedJacobian(x.data(), g, false, o_rJ);
}

bool VJointFunctionalBall::PreMultiply(const VPose& pose, ConstView statics, View io_rParams,
                                       double tolerance) const {
  VPose joint;
  ComputePose(io_rParams, statics, joint);
  return ComputeParams(io_rParams, View(), pose * joint, tolerance);
}

} // namespace KinematicAlgo
