#pragma once

#include <Eigen/Core>

namespace CoreOstraTypesUtils {

/// A rigid transform: x -> m_Rotation * x + m_Translation. The rotation is row-major.
struct VPose {
  Eigen::Matrix<double, 3, 3, Eigen::RowMajor> m_Rotation =
      Eigen::Matrix<double, 3, 3, Eigen::RowMajor>::Identity();
  Eigen::Vector3d m_Translation = Eigen::Vector3d::Zero();

  /// This transform applied after `other`.
  VPose operator*(const VPose& other) const {
    return {m_Rotation * other.m_Rotation, m_Rotation * other.m_Translation + m_Translation};
  }
  VPose Inverse() const {
    VPose inverse;
    inverse.m_Rotation = m_Rotation.transpose();
    inverse.m_Translation = -(inverse.m_Rotation * m_Translation);
    return inverse;
  }
};

} // namespace CoreOstraTypesUtils
