#include "River/CoreOstraTypesUtils/JointAxes.h"

#include "River/CoreOstraTypesUtils/DecimalRounding.h"

#include <Eigen/Geometry>

namespace CoreOstraTypesUtils {

namespace {

Vector3 ToArray(const Eigen::Vector3d& v) {
  return {v.x(), v.y(), v.z()};
}

} // namespace

Vector3 AxisFromJointOrientation(const Vector3& jointOrientation) {
  const Vector3 raw = ToArray(AngleAxisToRotation(jointOrientation).col(2));
  return PreferReproducing(raw, RoundedToDecimals(raw), [&jointOrientation](const Vector3& axis) {
    Vector3 back;
    return JointOrientationFromAxis(axis, back) && back == jointOrientation;
  });
}

bool JointOrientationFromAxis(const Vector3& axis, Vector3& o_rJointOrientation) {
  const Eigen::Vector3d a(axis[0], axis[1], axis[2]);
  if (!(a.norm() >= MinimumAxisLength)) return false;
  Eigen::Matrix3d r;
  if (a.z() >= 0) {
    r = Eigen::Quaterniond::FromTwoVectors(Eigen::Vector3d::UnitZ(), a).toRotationMatrix();
  } else {
    // Near -Z the shortest rotation is ill-conditioned: turn Z to -Z about X first.
    r = Eigen::Quaterniond::FromTwoVectors(-Eigen::Vector3d::UnitZ(), a).toRotationMatrix() *
        Eigen::AngleAxisd(M_PI, Eigen::Vector3d::UnitX()).toRotationMatrix();
  }
  o_rJointOrientation = RotationToAngleAxis(r);
  return true;
}

AxisPair AxisPairFromJointOrientation(const Vector3& jointOrientation) {
  const Eigen::Matrix3d r = AngleAxisToRotation(jointOrientation);
  const AxisPair raw{r(0, 2), r(1, 2), r(2, 2), r(0, 1), r(1, 1), r(2, 1)};
  AxisPair rounded = raw;
  RoundToDecimals(rounded.data(), 3);
  RoundToDecimals(rounded.data() + 3, 3);
  return PreferReproducing(raw, rounded, [&jointOrientation](const AxisPair& axes) {
    Vector3 back;
    return JointOrientationFromAxisPair(axes, back) && back == jointOrientation;
  });
}

bool JointOrientationFromAxisPair(const AxisPair& axes, Vector3& o_rJointOrientation) {
  Eigen::Vector3d z(axes[0], axes[1], axes[2]);
  Eigen::Vector3d y(axes[3], axes[4], axes[5]);
  if (!(z.norm() >= MinimumAxisLength) || !(y.norm() >= MinimumAxisLength)) return false;
  z.normalize();
  y -= z * z.dot(y);
  if (!(y.norm() >= MinimumAxisLength)) return false;
  y.normalize();
  Eigen::Matrix3d r;
  r.col(0) = y.cross(z);
  r.col(1) = y;
  r.col(2) = z;
  o_rJointOrientation = RotationToAngleAxis(r);
  return true;
}

} // namespace CoreOstraTypesUtils
