#include "River/CoreOstraTypesUtils/AngleAxis.h"

#include <Eigen/Geometry>

#include <cmath>

namespace CoreOstraTypesUtils {

Eigen::Matrix3d AngleAxisToRotation(const Vector3& angleAxis) {
  const Eigen::Vector3d v(angleAxis[0], angleAxis[1], angleAxis[2]);
  const double angle = v.norm();
  if (angle < 2.220446049250313e-14) return Eigen::Matrix3d::Identity();
  return Eigen::AngleAxisd(angle, v / angle).toRotationMatrix();
}

Vector3 RotationToAngleAxis(const Eigen::Matrix3d& rotation) {
  Eigen::Quaterniond q(rotation);
  q.normalize();
  // q and -q are the same rotation; w >= 0 gives the rotation vector of angle at most pi.
  if (q.w() < 0) q.coeffs() = -q.coeffs();
  const Eigen::Vector3d v = q.vec();
  const double length = v.norm();
  if (length < 2.220446049250313e-15) return {v.x(), v.y(), v.z()};
  const Eigen::Vector3d result = v * (2.0 * std::atan2(length, q.w()) / length);
  return {result.x(), result.y(), result.z()};
}

VPose PoseFromAngleAxis(const Vector3& rotation, const Vector3& translation) {
  VPose pose;
  pose.m_Rotation = AngleAxisToRotation(rotation);
  pose.m_Translation = Eigen::Vector3d(translation[0], translation[1], translation[2]);
  return pose;
}

void InvertAngleAxisPose(const Vector3& rotation, const Vector3& translation, Vector3& o_rRotation,
                         Vector3& o_rTranslation) {
  const VPose inverse = PoseFromAngleAxis(rotation, translation).Inverse();
  // The inverse rotation is the negated vector: exact, so inverting twice gives it back.
  o_rRotation = {-rotation[0], -rotation[1], -rotation[2]};
  o_rTranslation = {inverse.m_Translation.x(), inverse.m_Translation.y(),
                    inverse.m_Translation.z()};
}

} // namespace CoreOstraTypesUtils
