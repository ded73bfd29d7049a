#pragma once
// Where a camera stands and how it images: one calibration result.

#include "River/CoreOstraTypes/VCameraLensDistortion.h"

#include <array>
#include <cmath>
#include <string>

namespace CoreOstraTypes {

class VCameraCalibration {
public:
  std::string m_Name;
  /// Rotation vector (axis times angle in radians) taking camera axes to world axes. The camera
  /// looks along its local -Z with +Y up.
  std::array<double, 3> m_Orientation{0.0, 0.0, 0.0};
  std::array<double, 3> m_Position{0.0, 0.0, 0.0};  ///< world millimetres
  std::array<double, 2> m_PrincipalPoint{0.0, 0.0}; ///< pixels
  VCameraLensDistortion m_LensDistortionCalibration;
  double m_FocalLength = 0.0; ///< pixels
  double m_ImageError = 0.0;  ///< mean reprojection error, pixels

  bool operator==(const VCameraCalibration&) const = default;
  static constexpr const char* FlowClassName = "CameraCalibration";
  template <class S, class V> static void FlowFields(S& s, V&& v) {
    v("PrincipalPoint", "", s.m_PrincipalPoint);
    v("LensDistortionCalibration", "", s.m_LensDistortionCalibration);
    v("Name", "", s.m_Name);
    v("Orientation", "", s.m_Orientation);
    v("Position", "", s.m_Position);
    v("FocalLength", "", s.m_FocalLength);
    v("ImageError", "", s.m_ImageError);
  }
};

/// Quaternion (x, y, z, w) of a rotation vector v: w = cos(a / 2) and (x, y, z) = v sin(a / 2) / a
/// with a = |v|. Below a = 2.220446049250313e-15, (x, y, z) is v as it stands. Readers that must
/// reproduce a file's quaternion bit for bit invert exactly this function.
inline std::array<double, 4> CameraOrientationQuaternion(const std::array<double, 3>& i_rV) {
  const double a = std::sqrt(i_rV[0] * i_rV[0] + i_rV[1] * i_rV[1] + i_rV[2] * i_rV[2]);
  const double w = std::cos(a / 2.0);
  if (a < 2.220446049250313e-15) return {i_rV[0], i_rV[1], i_rV[2], w};
  const double s = std::sin(a / 2.0);
  return {i_rV[0] * s / a, i_rV[1] * s / a, i_rV[2] * s / a, w};
}

} // namespace CoreOstraTypes
