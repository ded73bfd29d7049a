#pragma once
// Radial lens distortion with the radii up to which it stays monotonic. The distortion factor at
// squared radius rho is 1 + k1 rho + k2 rho^2 + k3 rho^3 (k3 = 0 for the two-parameter model).

#include "River/CoreOstraTypes/VCameraLensDistortion.h"

#include <array>
#include <limits>
#include <vector>

namespace CoreOstraTypesUtils {

class RadialDistortion {
public:
  /// From a lens calibration. A model other than 0 or 1 is asserted ("Bad Radial Model") and
  /// treated as having no distortion; missing parameters count as 0.
  explicit RadialDistortion(const CoreOstraTypes::VCameraLensDistortion& lens);
  RadialDistortion(int model, const std::vector<double>& parameters,
                   const std::array<double, 2>& centre);

  /// The factor at squared radius `rho`.
  double Factor(double rho) const {
    return 1.0 + m_K[0] * rho + m_K[1] * rho * rho + m_K[2] * rho * rho * rho;
  }
  /// Largest squared undistorted radius where the distortion is still monotonic; the largest
  /// finite double when it is monotonic everywhere.
  double MaxUndistortedRadiusSquared() const { return m_MaxUndistortedSquared; }
  /// The same limit on the squared distorted radius.
  double MaxDistortedRadiusSquared() const { return m_MaxDistortedSquared; }
  const std::array<double, 3>& Parameters() const { return m_K; }

private:
  void FindLimits(const std::array<double, 2>& centre);

  std::array<double, 3> m_K{0.0, 0.0, 0.0};
  double m_MaxUndistortedSquared = std::numeric_limits<double>::max();
  double m_MaxDistortedSquared = std::numeric_limits<double>::max();
};

} // namespace CoreOstraTypesUtils
