#include "OstraAlgo/KinematicAlgo/RotationMath.h"

#include "River/CoreOstraTypesUtils/AngleAxis.h"

#include <Eigen/Geometry>

#include <cmath>

namespace KinematicAlgo {

namespace {
// Below this angle the coefficient functions of exp use their Taylor series.
constexpr double SeriesThreshold = 1e-4;

// exp(r) = I + a K + b K², K = Skew(r).
struct ExpCoefficients {
  double a, b;
};
ExpCoefficients Coefficients(double theta2) {
  if (theta2 < SeriesThreshold * SeriesThreshold)
    return {1.0 - theta2 / 6.0 + theta2 * theta2 / 120.0,
            0.5 - theta2 / 24.0 + theta2 * theta2 / 720.0};
  const double theta = std::sqrt(theta2);
  return {std::sin(theta) / theta, (1.0 - std::cos(theta)) / theta2};
}
} // namespace

Matrix3r Skew(const Eigen::Vector3d& v) {
  Matrix3r K;
  K << 0.0, -v.z(), v.y(), v.z(), 0.0, -v.x(), -v.y(), v.x(), 0.0;
  return K;
}

Matrix3r Exp(const Eigen::Vector3d& r) {
  const double theta2 = r.squaredNorm();
  if (theta2 < ExpIdentityThreshold * ExpIdentityThreshold) return Matrix3r::Identity();
  const ExpCoefficients c = Coefficients(theta2);
  // I + a K + b K² with K² = r rᵀ - θ² I.
  Matrix3r R = (r * r.transpose()) * c.b;
  const double diagonal = 1.0 - c.b * theta2;
  R(0, 0) += diagonal;
  R(1, 1) += diagonal;
  R(2, 2) += diagonal;
  const Eigen::Vector3d s = c.a * r;
  R(0, 1) -= s.z();
  R(1, 0) += s.z();
  R(0, 2) += s.y();
  R(2, 0) -= s.y();
  R(1, 2) -= s.x();
  R(2, 1) += s.x();
  return R;
}

void ExpAndDerivatives(const Eigen::Vector3d& r, Matrix3r& o_rR, std::array<Matrix3r, 3>& o_rD) {
  const double theta2 = r.squaredNorm();
  if (theta2 < SmallAngleThreshold * SmallAngleThreshold) {
    o_rR.setIdentity();
    for (int i = 0; i < 3; ++i)
      o_rD[size_t(i)] = Skew(Eigen::Vector3d::Unit(i));
    return;
  }
  const ExpCoefficients c = Coefficients(theta2);
  // Derivatives of a and b with respect to θ, divided by θ.
  double da, db;
  if (theta2 < SeriesThreshold * SeriesThreshold) {
    da = -1.0 / 3.0 + theta2 / 30.0;
    db = -1.0 / 12.0 + theta2 / 180.0;
  } else {
    da = (std::cos(std::sqrt(theta2)) - c.a) / theta2;
    db = (c.a - 2.0 * c.b) / theta2;
  }
  const Matrix3r K = Skew(r);
  const Matrix3r K2 = K * K;
  o_rR = theta2 < ExpIdentityThreshold * ExpIdentityThreshold
             ? Matrix3r::Identity()
             : Matrix3r(Matrix3r::Identity() + c.a * K + c.b * K2);
  for (int i = 0; i < 3; ++i) {
    const Matrix3r E = Skew(Eigen::Vector3d::Unit(i));
    o_rD[size_t(i)] = (da * r[i]) * K + (db * r[i]) * K2 + c.a * E + c.b * (E * K + K * E);
  }
}

Eigen::Matrix3d RightJacobian(const Eigen::Vector3d& r) {
  const double theta2 = r.squaredNorm();
  const ExpCoefficients c = Coefficients(theta2);
  const double third = theta2 < SeriesThreshold * SeriesThreshold ? 1.0 / 6.0 - theta2 / 120.0
                                                                  : (1.0 - c.a) / theta2;
  const Eigen::Matrix3d K = Skew(r);
  return Eigen::Matrix3d::Identity() - c.b * K + third * K * K;
}

Eigen::Matrix3d RightJacobianInverse(const Eigen::Vector3d& r) {
  const double theta2 = r.squaredNorm();
  double e;
  if (theta2 < SeriesThreshold * SeriesThreshold) {
    e = 1.0 / 12.0 + theta2 / 720.0;
  } else {
    const double theta = std::sqrt(theta2);
    e = 1.0 / theta2 - (1.0 + std::cos(theta)) / (2.0 * theta * std::sin(theta));
  }
  const Eigen::Matrix3d K = Skew(r);
  return Eigen::Matrix3d::Identity() + 0.5 * K + e * K * K;
}

Quaternion QuaternionFromMatrix(const Matrix3r& R) {
  Eigen::Quaterniond q{Eigen::Matrix3d(R)};
  q.normalize();
  return {q.x(), q.y(), q.z(), q.w()};
}

Matrix3r QuaternionToMatrix(const Quaternion& q) {
  return Eigen::Quaterniond(q[3], q[0], q[1], q[2]).toRotationMatrix();
}

Quaternion QuaternionFromRotationVector(const Eigen::Vector3d& r) {
  const double theta = r.norm();
  if (theta < ExpIdentityThreshold) return {0.0, 0.0, 0.0, 1.0};
  const double s = std::sin(0.5 * theta) / theta;
  return {r.x() * s, r.y() * s, r.z() * s, std::cos(0.5 * theta)};
}

Eigen::Vector3d QuaternionLog(const Quaternion& q) {
  const Eigen::Vector3d v = q.head<3>();
  const double y = v.norm();
  if (y < SmallAngleThreshold) return v;
  return v * (2.0 * std::atan2(y, q[3]) / y);
}

Quaternion QuaternionMultiply(const Quaternion& a, const Quaternion& b) {
  const Eigen::Vector3d av = a.head<3>(), bv = b.head<3>();
  Quaternion r;
  r.head<3>() = a[3] * bv + b[3] * av + av.cross(bv);
  r[3] = a[3] * b[3] - av.dot(bv);
  return r;
}

double QuaternionAngle(const Quaternion& q) {
  return 2.0 * std::atan2(q.head<3>().norm(), q[3]);
}

Eigen::Vector3d Log(const Matrix3r& R) {
  const auto r = CoreOstraTypesUtils::RotationToAngleAxis(Eigen::Matrix3d(R));
  return {r[0], r[1], r[2]};
}

int WrapAngle(double& io_rX) {
  const double turns = std::rint(io_rX / TwoPi);
  io_rX -= turns * TwoPi;
  return static_cast<int>(turns);
}

void WrapRotationVector(Eigen::Ref<Eigen::Vector3d> io_rR) {
  const double length = io_rR.norm();
  if (length <= Pi) return;
  io_rR *= (length - std::rint(length / TwoPi) * TwoPi) / length;
}

double SubtractAngles(double a, double b) {
  double d = a - b;
  if (d > Pi)
    d -= TwoPi;
  else if (d < -Pi)
    d += TwoPi;
  return d;
}

VPose ComposeInverse(const VPose& a, const VPose& b) {
  VPose result;
  result.m_Rotation = a.m_Rotation * b.m_Rotation.transpose();
  result.m_Translation = a.m_Translation - result.m_Rotation * b.m_Translation;
  return result;
}

} // namespace KinematicAlgo
