#pragma once
// Conversions between angle-axis vectors (axis times angle, radians) and rotations.

#include "River/CoreOstraTypesUtils/VPose.h"

#include <Eigen/Core>

#include <array>

namespace CoreOstraTypesUtils {

using Vector3 = std::array<double, 3>;

/// Rotation matrix of an angle-axis vector; a vector shorter than 2.220446049250313e-14 gives the
/// identity.
Eigen::Matrix3d AngleAxisToRotation(const Vector3& angleAxis);

/// Angle-axis vector of a rotation, through its quaternion (x, y, z, w) taken with w >= 0: a
/// vector part shorter than 2.220446049250313e-15 is returned as it is, otherwise the angle is
/// 2 atan2(|v|, w), at most pi.
Vector3 RotationToAngleAxis(const Eigen::Matrix3d& rotation);

/// The pose of an angle-axis rotation and a translation.
VPose PoseFromAngleAxis(const Vector3& rotation, const Vector3& translation);

/// Inverts a pose given as angle-axis rotation and translation, in the same form. The rotation
/// is the negated vector, so it takes no rounding.
void InvertAngleAxisPose(const Vector3& rotation, const Vector3& translation, Vector3& o_rRotation,
                         Vector3& o_rTranslation);

} // namespace CoreOstraTypesUtils
