#include "OstraAlgo/KinematicAlgo/VJointFunctionalFree.h"

#include "OstraAlgo/KinematicAlgo/JointStatistics.h"
#include "OstraAlgo/KinematicAlgo/RotationalJoint.h"

namespace KinematicAlgo {

std::unique_ptr<VJointFunctional> VJointFunctionalFree::Clone() const {
  return std::make_unique<VJointFunctionalFree>();
}

void VJointFunctionalFree::ComputePose(ConstView p, ConstView, VPose& o_rPose) const {
  o_rPose.m_Rotation = Exp(Eigen::Vector3d(p[0], p[1], p[2]));
  o_rPose.m_Translation = Eigen::Vector3d(p[3], p[4], p[5]);
}

bool VJointFunctionalFree::ComputeParams(View o_rDynamic, View, const VPose& pose, double) const {
  const Eigen::Vector3d r = Log(pose.m_Rotation);
  for (int i = 0; i < 3; ++i) {
    o_rDynamic[size_t(i)] = r[i];
    o_rDynamic[size_t(3 + i)] = pose.m_Translation[i];
  }
  return true;
}

void VJointFunctionalFree::ComputeJacobian(ConstView p, ConstView, JointJacobian& o_rJ) const {
  Matrix3r R;
  std::array<Matrix3r, 3> dR;
  ExpAndDerivatives(Eigen::Vector3d(p[0], p[1], p[2]), R, dR);
  for (int i = 0; i < 3; ++i) {
    o_rJ.m_dR[size_t(i)] = dR[size_t(i)];
    o_rJ.m_dT[size_t(i)].setZero();
    o_rJ.m_dR[size_t(3 + i)].setZero();
    o_rJ.m_dT[size_t(3 + i)] = Eigen::Vector3d::Unit(i);
  }
}

void VJointFunctionalFree::ComputeRates(std::span<const ConstView> d, ConstView,
                                        JointRates& o_rRates) const {
  for (int k = 0; k < 2; ++k)
    for (int i = 0; i < 6; ++i)
      o_rRates[size_t(k)][i] = d[size_t(k + 1)][size_t(i)];
}

void VJointFunctionalFree::Blend(View a, ConstView b, double wa, double wb) const {
  Detail::BlendRotation(a.data(), b.data(), wa, wb);
  for (size_t i = 3; i < 6; ++i) {
    if (wa != 1.0) a[i] *= wa;
    a[i] += wb * b[i];
  }
}

void VJointFunctionalFree::NormaliseParams(View p) const {
  Detail::NormaliseRotation(p.data());
}

void VJointFunctionalFree::ComposeParams(View o_rOut, ConstView a, ConstView b) const {
  const Matrix3r Ra = Exp(Eigen::Vector3d(a[0], a[1], a[2]));
  const Eigen::Vector3d r = Log(Ra * Exp(Eigen::Vector3d(b[0], b[1], b[2])));
  const Eigen::Vector3d t =
      Ra * Eigen::Vector3d(b[3], b[4], b[5]) + Eigen::Vector3d(a[3], a[4], a[5]);
  for (size_t i = 0; i < 3; ++i) {
    o_rOut[i] = r[Eigen::Index(i)];
    o_rOut[3 + i] = t[Eigen::Index(i)];
  }
}

void VJointFunctionalFree::MeanAndCovariance(SampleMatrix samples, Eigen::MatrixXd& o_rCovariance,
                                             Eigen::VectorXd& o_rMean) const {
  o_rCovariance = Eigen::MatrixXd::Zero(6, 6);
  o_rMean = Eigen::VectorXd::Zero(6);
  const Eigen::Index count = samples.cols();
  if (count < 2) return;
  Eigen::Matrix4Xd quaternions(4, count);
  for (Eigen::Index i = 0; i < count; ++i)
    quaternions.col(i) = QuaternionFromRotationVector(samples.col(i).head<3>());
  VPose start;
  start.m_Rotation = QuaternionToMatrix(PrincipalQuaternionMean(quaternions));
  start.m_Translation = samples.bottomRows<3>().rowwise().mean();
  const Eigen::MatrixXd data = samples;
  const VPose mean = Detail::IterateMean(data, start, true, {1e-6, 50});
  Detail::PoseToParams(mean, true, o_rMean);
  const Eigen::MatrixXd residuals = Detail::Residuals(data, mean, true);
  o_rCovariance = residuals * residuals.transpose() / double(count - 1);
  o_rCovariance.diagonal() = o_rCovariance.diagonal().cwiseMax(1e-6);
}

void VJointFunctionalFree::CentreAndRange(SampleMatrix samples, Eigen::MatrixXd& o_rRange,
                                          Eigen::VectorXd& o_rCentre) const {
  o_rRange = Eigen::MatrixXd::Zero(6, 6);
  o_rCentre = Eigen::VectorXd::Zero(6);
  const Eigen::Index count = samples.cols();
  if (count == 0) return;
  Eigen::Matrix4Xd quaternions(4, count);
  for (Eigen::Index i = 0; i < count; ++i)
    quaternions.col(i) = QuaternionFromRotationVector(samples.col(i).head<3>());
  VPose start;
  start.m_Rotation = QuaternionToMatrix(RobustQuaternionMean(quaternions));
  start.m_Translation = samples.bottomRows<3>().rowwise().mean();
  const VPose centre = Detail::IterateCentre(samples, start, true, {0.001, 15}, 0.0001,
                                             "JointFunctionalFree", o_rRange);
  ComputeParams(View(o_rCentre.data(), 6), View(), centre, 1e10);
}

void VJointFunctionalFree::FromNormalised(View o_rX, ConstView z, const JointGaussian& g) const {
  Detail::FromNormalised(o_rX.data(), z.data(), g, true);
}
void VJointFunctionalFree::ToNormalised(View o_rZ, ConstView x, const JointGaussian& g) const {
  Detail::ToNormalised(o_rZ.data(), x.data(), g, true);
}
void VJointFunctionalFree::FromNormalisedJacobian(ConstView z, const JointGaussian& g,
                                                  Eigen::MatrixXd& o_rJ) const {
  Detail::FromNormalisedJacobian(z.data(), g, true, o_rJ);
}
void VJointFunctionalFree::ToNormalisedJacobian(ConstView x, const JointGaussian& g,
                                                Eigen::MatrixXd& o_rJ) const {
  Detail::ToNormalisedJacobian(x.data(), g, true, o_rJ);
}

bool VJointFunctionalFree::PreMultiply(const VPose& pose, ConstView statics, View io_rParams,
                                       double tolerance) const {
  VPose joint;
  ComputePose(io_rParams, statics, joint);
  ComputeParams(io_rParams, View(), pose * joint, tolerance);
  return true;
}

} // namespace KinematicAlgo
