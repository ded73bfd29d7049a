#pragma once
// Rotation functions the joint functionals rest on: the exponential and logarithm of rotation
// vectors (axis times angle, radians), quaternions stored (x, y, z, w), and angle wrapping. The
// thresholds are part of the behaviour: they decide where a result is exactly the identity.

#include "River/CoreOstraTypesUtils/VPose.h"

#include <Eigen/Core>
#include <Eigen/Geometry>

#include <array>

namespace KinematicAlgo {

using Matrix3r = Eigen::Matrix<double, 3, 3, Eigen::RowMajor>;
using Vector6d = Eigen::Matrix<double, 6, 1>;
using Quaternion = Eigen::Vector4d; ///< x, y, z, w
using VPose = CoreOstraTypesUtils::VPose;

inline constexpr double Pi = 3.14159265358979323846;
inline constexpr double TwoPi = 2.0 * Pi;
/// Below this rotation-vector length exp gives exactly the identity.
inline constexpr double ExpIdentityThreshold = 2.220446049250313e-14;
/// Below this length the derivative of exp is the generators of the three axes, and the log of
/// a quaternion returns its vector part unscaled.
inline constexpr double SmallAngleThreshold = 2.220446049250313e-15;

/// The skew matrix of v: Skew(v) * x == v.cross(x).
Matrix3r Skew(const Eigen::Vector3d& v);

/// Rotation of a rotation vector (Rodrigues); exactly the identity below ExpIdentityThreshold.
Matrix3r Exp(const Eigen::Vector3d& r);

/// exp(r) and its three partial derivatives dR/dr_i, from one evaluation of the trigonometry.
/// Series forms are used for small angles, so the derivative is smooth through zero.
void ExpAndDerivatives(const Eigen::Vector3d& r, Matrix3r& o_rR, std::array<Matrix3r, 3>& o_rD);

/// The right Jacobian of exp: exp(r + e) ~ exp(r) exp(RightJacobian(r) e) for small e.
Eigen::Matrix3d RightJacobian(const Eigen::Vector3d& r);
/// Its inverse; finite for |r| < 2 pi.
Eigen::Matrix3d RightJacobianInverse(const Eigen::Vector3d& r);

/// Unit quaternion of a rotation matrix (any sign).
Quaternion QuaternionFromMatrix(const Matrix3r& R);
Matrix3r QuaternionToMatrix(const Quaternion& q);
/// q = exp(r) as a quaternion.
Quaternion QuaternionFromRotationVector(const Eigen::Vector3d& r);
/// Log of a quaternion: (x, y, z) * 2 atan2(|xyz|, w) / |xyz|, or (x, y, z) unchanged when |xyz|
/// is below SmallAngleThreshold.
Eigen::Vector3d QuaternionLog(const Quaternion& q);
/// Hamilton product a * b.
Quaternion QuaternionMultiply(const Quaternion& a, const Quaternion& b);
inline Quaternion QuaternionConjugate(const Quaternion& q) {
  return {-q[0], -q[1], -q[2], q[3]};
}
/// 2 atan2(|xyz|, w).
double QuaternionAngle(const Quaternion& q);

/// Log of a rotation matrix, through its quaternion with w >= 0 (angle at most pi).
Eigen::Vector3d Log(const Matrix3r& R);

/// x - rint(x / 2 pi) 2 pi, in place; returns the number of turns taken off.
int WrapAngle(double& io_rX);
/// Scales r so that its length lies in [-pi, pi] modulo whole turns, when |r| exceeds pi.
void WrapRotationVector(Eigen::Ref<Eigen::Vector3d> io_rR);
/// a - b with one correction of 2 pi into [-pi, pi].
double SubtractAngles(double a, double b);

/// A ∘ B⁻¹ in one step.
VPose ComposeInverse(const VPose& a, const VPose& b);

} // namespace KinematicAlgo
