#pragma once
// Radial lens distortion of a calibrated camera.

#include <array>
#include <cstdint>
#include <vector>

namespace CoreOstraTypes {

/// Distortion models. Values are stored in files; never renumber.
enum class ECameraDistortionModel : std::int32_t {
  Ostra2Parameter = 0,
  Ostra3Parameter = 1,
};

/// Name of a model as files spell it; "<Unknown>" for a value outside the enumeration.
inline const char* CameraDistortionModelName(ECameraDistortionModel i_model) {
  switch (i_model) {
  case ECameraDistortionModel::Ostra2Parameter:
    return "Ostra2Parameter";
  case ECameraDistortionModel::Ostra3Parameter:
    return "Ostra3Parameter";
  }
  return "<Unknown>";
}

class VCameraLensDistortion {
public:
  ECameraDistortionModel m_Model = ECameraDistortionModel::Ostra2Parameter;
  /// Radial coefficients: two for the two-parameter model, three for the three-parameter one.
  std::vector<double> m_RadialParameters;
  /// Centre of the radial distortion in pixels.
  std::array<double, 2> m_RadialDistortionCentre{0.0, 0.0};

  bool operator==(const VCameraLensDistortion&) const = default;
  static constexpr const char* FlowClassName = "LensDistortionCalibration";
  template <class S, class V> static void FlowFields(S& s, V&& v) {
    v("RadialParameters", "", s.m_RadialParameters);
    v("RadialDistortionCentre", "", s.m_RadialDistortionCentre);
    v("Model", "", s.m_Model);
  }
};

} // namespace CoreOstraTypes
