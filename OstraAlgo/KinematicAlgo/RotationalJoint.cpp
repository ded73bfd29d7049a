#include "OstraAlgo/KinematicAlgo/RotationalJoint.h"

#include "OstraAlgo/KinematicAlgo/JointStatistics.h"

#include "DebugServices/GlobalLog.h"

#include <cmath>

namespace KinematicAlgo::Detail {

namespace {
Eigen::Vector3d Vec3(const double* p) {
  return {p[0], p[1], p[2]};
}

VPose MeanPose(const JointGaussian& g, bool withTranslation) {
  VPose pose;
  pose.m_Rotation = Exp(g.Mean().head<3>());
  if (withTranslation) pose.m_Translation = g.Mean().segment<3>(3);
  return pose;
}
} // namespace

void BlendRotation(double* io_pA, const double* pB, double wa, double wb) {
  const Quaternion qa = QuaternionFromRotationVector(Vec3(io_pA));
  const Quaternion qb = QuaternionFromRotationVector(Vec3(pB));
  const Quaternion qr = QuaternionMultiply(qb, QuaternionConjugate(qa));
  const double theta = QuaternionAngle(qr);
  // Equal rotations keep a bit for bit, unless a needs folding.
  if (!(std::abs(theta) > 1e-10) && !(qa[3] < -0.9)) return;
  Quaternion result = qa;
  if (std::abs(theta) > 1e-10) {
    const double step = (theta - std::rint(theta / TwoPi) * TwoPi) * wb / (wa + wb);
    const Eigen::Vector3d axis = qr.head<3>().normalized();
    // qr = qb qa⁻¹, so the step goes on the left: step = theta gives qb.
    result = QuaternionMultiply(QuaternionFromRotationVector(axis * step), qa);
  }
  if (result[3] < -0.9) result = -result;
  const Eigen::Vector3d r = QuaternionLog(result);
  io_pA[0] = r.x();
  io_pA[1] = r.y();
  io_pA[2] = r.z();
}

void NormaliseRotation(double* io_pR) {
  Quaternion q = QuaternionFromRotationVector(Vec3(io_pR));
  if (q[3] < -0.9) q = -q;
  const Eigen::Vector3d r = QuaternionLog(q);
  io_pR[0] = r.x();
  io_pR[1] = r.y();
  io_pR[2] = r.z();
}

VPose SamplePose(const Eigen::MatrixXd& samples, Eigen::Index column, bool withTranslation) {
  VPose pose;
  pose.m_Rotation = Exp(samples.col(column).head<3>());
  if (withTranslation) pose.m_Translation = samples.col(column).segment<3>(3);
  return pose;
}

Eigen::MatrixXd Residuals(const Eigen::MatrixXd& samples, const VPose& mean, bool withTranslation) {
  const Eigen::Index n = withTranslation ? 6 : 3;
  Eigen::MatrixXd residuals(n, samples.cols());
  const VPose inverse = mean.Inverse();
  for (Eigen::Index i = 0; i < samples.cols(); ++i) {
    const VPose delta = inverse * SamplePose(samples, i, withTranslation);
    Eigen::Vector3d r = Log(delta.m_Rotation);
    WrapRotationVector(r);
    residuals.col(i).head<3>() = r;
    if (withTranslation) residuals.col(i).segment<3>(3) = delta.m_Translation;
  }
  return residuals;
}

namespace {
void StepBy(VPose& io_rMean, Eigen::VectorXd epsilon, bool withTranslation) {
  VPose step;
  step.m_Rotation = Exp(epsilon.head<3>());
  if (withTranslation) step.m_Translation = epsilon.segment<3>(3);
  io_rMean = io_rMean * step;
}
} // namespace

VPose IterateMean(const Eigen::MatrixXd& samples, VPose mean, bool withTranslation,
                  const MeanIteration& rule) {
  const Eigen::Index n = withTranslation ? 6 : 3;
  Eigen::VectorXd epsilon = Eigen::VectorXd::Ones(n);
  for (int iteration = 0; epsilon.norm() > rule.m_Threshold && iteration < rule.m_MaxIterations;
       ++iteration) {
    epsilon = Residuals(samples, mean, withTranslation).rowwise().mean();
    Eigen::Vector3d r = epsilon.head<3>();
    WrapRotationVector(r);
    epsilon.head<3>() = r;
    StepBy(mean, epsilon, withTranslation);
  }
  return mean;
}

VPose IterateCentre(const Eigen::MatrixXd& samples, VPose centre, bool withTranslation,
                    const MeanIteration& rule, double ellipsoidTolerance, const char* channel,
                    Eigen::MatrixXd& o_rRange) {
  const Eigen::Index n = withTranslation ? 6 : 3;
  Eigen::VectorXd epsilon = Eigen::VectorXd::Ones(n);
  o_rRange = Eigen::MatrixXd::Zero(n, n);
  for (int iteration = 0; epsilon.norm() > rule.m_Threshold && iteration < rule.m_MaxIterations;
       ++iteration) {
    const CoveringEllipsoid ellipsoid =
        MinEllipsoidSolver(Residuals(samples, centre, withTranslation), ellipsoidTolerance, 1000);
    if (ellipsoid.m_Centre.size() != n) break;
    epsilon = ellipsoid.m_Centre;
    o_rRange = ellipsoid.m_Cover;
    StepBy(centre, epsilon, withTranslation);
  }
  // Written when the centre settled; kept for the log readers that expect it there.
  if (epsilon.norm() < rule.m_Threshold)
    ZMT_LOG(channel, ZMT::ELogVerbose, "Range calculation failed to converge");
  return centre;
}

void PoseToParams(const VPose& pose, bool withTranslation, Eigen::VectorXd& o_rParams) {
  o_rParams.resize(withTranslation ? 6 : 3);
  Eigen::Vector3d r = Log(pose.m_Rotation);
  WrapRotationVector(r);
  o_rParams.head<3>() = r;
  if (withTranslation) o_rParams.segment<3>(3) = pose.m_Translation;
}

void FromNormalised(double* o_pX, const double* pZ, const JointGaussian& g, bool withTranslation) {
  const Eigen::Index n = withTranslation ? 6 : 3;
  const Eigen::VectorXd d = g.Root() * Eigen::Map<const Eigen::VectorXd>(pZ, n);
  const VPose mean = MeanPose(g, withTranslation);
  const Eigen::Vector3d r = Log(mean.m_Rotation * Exp(d.head<3>()));
  for (int i = 0; i < 3; ++i)
    o_pX[i] = r[i];
  if (withTranslation) {
    const Eigen::Vector3d t = mean.m_Rotation * d.segment<3>(3) + mean.m_Translation;
    for (int i = 0; i < 3; ++i)
      o_pX[3 + i] = t[i];
  }
}

void ToNormalised(double* o_pZ, const double* pX, const JointGaussian& g, bool withTranslation) {
  const Eigen::Index n = withTranslation ? 6 : 3;
  const VPose mean = MeanPose(g, withTranslation);
  Eigen::VectorXd delta(n);
  delta.head<3>() = Log(mean.m_Rotation.transpose() * Exp(Vec3(pX)));
  if (withTranslation)
    delta.segment<3>(3) = mean.m_Rotation.transpose() * (Vec3(pX + 3) - mean.m_Translation);
  Eigen::Map<Eigen::VectorXd>(o_pZ, n) = g.InverseRoot() * delta;
}

void FromNormalisedJacobian(const double* pZ, const JointGaussian& g, bool withTranslation,
                            Eigen::MatrixXd& o_rJ) {
  // R(x) = Rm exp(d): a change e of d moves R(x) by exp(Jr(d) e) on the right, which x meets
  // with Jr(x) dx.
  const Eigen::Index n = withTranslation ? 6 : 3;
  const Eigen::VectorXd d = g.Root() * Eigen::Map<const Eigen::VectorXd>(pZ, n);
  Eigen::VectorXd x(n);
  FromNormalised(x.data(), pZ, g, withTranslation);
  Eigen::MatrixXd dxdd = Eigen::MatrixXd::Zero(n, n);
  dxdd.topLeftCorner<3, 3>() = RightJacobianInverse(x.head<3>()) * RightJacobian(d.head<3>());
  if (withTranslation) dxdd.bottomRightCorner<3, 3>() = Exp(g.Mean().head<3>());
  o_rJ = dxdd * g.Root();
}

void ToNormalisedJacobian(const double* pX, const JointGaussian& g, bool withTranslation,
                          Eigen::MatrixXd& o_rJ) {
  const Eigen::Index n = withTranslation ? 6 : 3;
  const Matrix3r meanRotation = Exp(g.Mean().head<3>());
  const Eigen::Vector3d x = Vec3(pX);
  const Eigen::Vector3d delta = Log(meanRotation.transpose() * Exp(x));
  Eigen::MatrixXd ddeltadx = Eigen::MatrixXd::Zero(n, n);
  ddeltadx.topLeftCorner<3, 3>() = RightJacobianInverse(delta) * RightJacobian(x);
  if (withTranslation) ddeltadx.bottomRightCorner<3, 3>() = meanRotation.transpose();
  o_rJ = g.InverseRoot() * ddeltadx;
}

} // namespace KinematicAlgo::Detail
