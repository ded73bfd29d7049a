#pragma once
// Conversions between the forms of a joint's statistics: mean and covariance of its state, rest
// pose and stiffness, and a range given as minimum and maximum or as centring state and range
// matrix. A state x is in range when |RangeMatrix * (x - RangeCentringState)| <= 1. Refusals are
// logged on channel "SubjectConversions".

#include "River/CoreOstraTypes/SubjectEnums.h"

#include <vector>

namespace CoreOstraTypesUtils {

inline constexpr const char* SubjectConversionsChannel = "SubjectConversions";

using JointType = CoreOstraTypes::VJointTypeBase::EJointType;

/// Rest pose = mean; stiffness_i = 1 / covariance_ii. Refused for joints without parameters,
/// for sizes other than DoF and DoF * DoF, and for a variance that isn't positive.
bool StatisticsToRestPoseStiffness(JointType type, const std::vector<double>& mean,
                                   const std::vector<double>& covariance,
                                   std::vector<double>& o_rRestPose,
                                   std::vector<double>& o_rStiffness);

/// Mean = rest pose; covariance = diag(1 / stiffness_i). Refused as above.
bool RestPoseStiffnessToStatistics(JointType type, const std::vector<double>& restPose,
                                   const std::vector<double>& stiffness,
                                   std::vector<double>& o_rMean,
                                   std::vector<double>& o_rCovariance);

/// Centring state (min + max) / 2 and range matrix diag(2 / (max - min)). Ball and free joints
/// have rotation-vector states whose ranges don't separate by component: refused and asserted.
bool RangeMinMaxToCentring(JointType type, const std::vector<double>& minimum,
                           const std::vector<double>& maximum, std::vector<double>& o_rCentring,
                           std::vector<double>& o_rRangeMatrix);

/// The box around the range ellipsoid: centre -/+ sqrt(((M^T M)^-1)_ii).
bool RangeCentringToMinMax(JointType type, const std::vector<double>& centring,
                           const std::vector<double>& rangeMatrix, std::vector<double>& o_rMinimum,
                           std::vector<double>& o_rMaximum);

} // namespace CoreOstraTypesUtils
