#include "River/CoreOstraTypesUtils/RadialDistortion.h"

#include "DebugServices/AssertFail.h"

#include <algorithm>
#include <cmath>

namespace CoreOstraTypesUtils {

namespace {
// (1 / 1.05)^2: one growth step of the search taken back, on squared radii.
constexpr double StepBackSquared = 0.9070294784580498;
constexpr double Growth = 1.05;
} // namespace

RadialDistortion::RadialDistortion(const CoreOstraTypes::VCameraLensDistortion& lens)
    : RadialDistortion(static_cast<int>(lens.m_Model), lens.m_RadialParameters,
                       lens.m_RadialDistortionCentre) {}

RadialDistortion::RadialDistortion(int model, const std::vector<double>& parameters,
                                   const std::array<double, 2>& centre) {
  std::size_t count = 0;
  if (model == 0) {
    count = 2;
  } else if (model == 1) {
    count = 3;
  } else {
    DebugServices::CallAssertFailHandler("Bad Radial Model", __FILE__, __LINE__);
    return;
  }
  ANVIL_ASSERT(parameters.size() == count);
  for (std::size_t i = 0; i < count && i < parameters.size(); ++i)
    m_K[i] = parameters[i];
  FindLimits(centre);
}

void RadialDistortion::FindLimits(const std::array<double, 2>& centre) {
  const std::size_t used = m_K[2] != 0.0 ? 3 : 2;
  if (*std::min_element(m_K.begin(), m_K.begin() + static_cast<std::ptrdiff_t>(used)) >= 0.0)
    return; // monotonic everywhere
  const double d = std::hypot(centre[0], centre[1]);
  const auto slope = [this](double r) {
    const double r2 = r * r;
    return 3.0 * m_K[0] * r2 + 5.0 * m_K[1] * r2 * r2 + 7.0 * m_K[2] * r2 * r2 * r2;
  };
  double r = 0.2 * d;
  while (r < 40.0 * d && slope(r) >= -1.0)
    r *= Growth;
  m_MaxUndistortedSquared = r * r * StepBackSquared;
  const double distorted = Factor(m_MaxUndistortedSquared) * r;
  m_MaxDistortedSquared = distorted * distorted * StepBackSquared;
}

} // namespace CoreOstraTypesUtils
