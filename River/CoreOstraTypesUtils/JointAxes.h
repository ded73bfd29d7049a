#pragma once
// Joint axes and JointOrientation. A hinge or slider moves about or along its local Z axis; a
// Hardy-Spicer joint turns about its local Z axis, then its local Y axis. JointOrientation is
// the angle-axis rotation R that takes those local axes to the axes a subject file states.

#include "River/CoreOstraTypesUtils/AngleAxis.h"

#include <array>

namespace CoreOstraTypesUtils {

using AxisPair = std::array<double, 6>;

/// Shortest axis accepted; anything shorter has no direction.
inline constexpr double MinimumAxisLength = 0.001;

/// The hinge or slider axis: R * (0, 0, 1), rounded as RoundToDecimals does unless only the
/// unrounded axis gives `jointOrientation` back through JointOrientationFromAxis. So an axis
/// read from a file comes back as it was read when it was exact or when the conversion was.
Vector3 AxisFromJointOrientation(const Vector3& jointOrientation);

/// A rotation taking (0, 0, 1) to the normalised `axis`: the shortest one for axes with z >= 0,
/// else a half turn about X followed by the shortest one from (0, 0, -1). False, with the output
/// untouched, when the axis is shorter than MinimumAxisLength.
bool JointOrientationFromAxis(const Vector3& axis, Vector3& o_rJointOrientation);

/// The two Hardy-Spicer axes: R * (0, 0, 1) then R * (0, 1, 0), each rounded as for
/// AxisFromJointOrientation.
AxisPair AxisPairFromJointOrientation(const Vector3& jointOrientation);

/// The rotation taking (0, 0, 1) to the first axis and (0, 1, 0) to the second, after the second
/// is made orthogonal to the first. False, with the output untouched, when either axis (the
/// second after orthogonalisation) is shorter than MinimumAxisLength.
bool JointOrientationFromAxisPair(const AxisPair& axes, Vector3& o_rJointOrientation);

} // namespace CoreOstraTypesUtils
