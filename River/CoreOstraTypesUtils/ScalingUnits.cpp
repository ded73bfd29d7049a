#include "River/CoreOstraTypesUtils/ScalingUnits.h"

#include <cmath>

namespace CoreOstraTypesUtils::ScalingDetail {

using CoreOstraTypes::VJointTypeBase;
using CoreOstraTypes::VTargetTypeBase;

void ScaleVector(std::vector<double>& v, const Units& units, double factor) {
  for (std::size_t i = 0; i < v.size() && i < units.size(); ++i)
    if (units[i]) v[i] *= factor;
}

void ScaleCovariance(std::vector<double>& m, std::size_t offset, const Units& units,
                     double factor) {
  const std::size_t n = units.size();
  if (m.size() < offset + n * n) return;
  for (std::size_t i = 0; i < n; ++i)
    for (std::size_t j = 0; j < n; ++j)
      m[offset + i * n + j] *= std::pow(factor, units[i] + units[j]);
}

void ScaleRangeMatrix(std::vector<double>& m, const Units& units, double factor) {
  const std::size_t n = units.size();
  if (m.size() != n * n) return;
  for (std::size_t i = 0; i < n; ++i)
    for (std::size_t j = 0; j < n; ++j)
      if (units[j]) m[i * n + j] /= factor;
}

void ScaleJointStatistics(std::vector<double>& mean, std::vector<double>& covariance,
                          std::vector<double>& centre, std::vector<double>& range,
                          const Units& units, double factor) {
  ScaleVector(mean, units, factor);
  ScaleCovariance(covariance, 0, units, factor);
  ScaleVector(centre, units, factor);
  ScaleRangeMatrix(range, units, factor);
}

EUnitsResult JointUnits(VJointTypeBase::EJointType type, Units& o_rUnits) {
  switch (type) {
  case VJointTypeBase::EFree:
    o_rUnits = {0, 0, 0, 1, 1, 1};
    return EUnitsResult::EKnown;
  case VJointTypeBase::EBall:
    o_rUnits = {0, 0, 0};
    return EUnitsResult::EKnown;
  case VJointTypeBase::EHardySpicer:
    o_rUnits = {0, 0};
    return EUnitsResult::EKnown;
  case VJointTypeBase::EHinge:
    o_rUnits = {0};
    return EUnitsResult::EKnown;
  case VJointTypeBase::ESlider:
    o_rUnits = {1};
    return EUnitsResult::EKnown;
  case VJointTypeBase::EDummy:
    o_rUnits = {};
    return EUnitsResult::EKnown;
  case VJointTypeBase::EBadJointType:
    return EUnitsResult::EBad;
  default:
    return EUnitsResult::EUnknown;
  }
}

EUnitsResult TargetUnits(VTargetTypeBase::ETargetType type, std::size_t stateSize, Units& o_rState,
                         Units& o_rCovariance, Units& o_rRepeatBlock,
                         std::size_t& o_rRepeatOffset) {
  o_rRepeatBlock.clear();
  o_rRepeatOffset = 0;
  switch (type) {
  case VTargetTypeBase::ELocalPointToWorldPoint:
  case VTargetTypeBase::ELocalPointToWorldPointGaussian:
    o_rState = {1, 1, 1};
    o_rCovariance = {1, 1, 1};
    return EUnitsResult::EKnown;
  case VTargetTypeBase::ELocalPlaneToWorldPoint:
  case VTargetTypeBase::ELocalPlaneToWorldPointGaussian:
    o_rState = {1, 1, 1, 0, 0, 0}; // origin, then the normal
    o_rCovariance = {1};           // distance to the plane
    return EUnitsResult::EKnown;
  case VTargetTypeBase::ELocalLineToWorldPoint:
  case VTargetTypeBase::ELocalLineToWorldPointGaussian:
    o_rState = {1, 1, 1, 0, 0, 0}; // origin, then the direction
    o_rCovariance = {1, 1};        // offsets across the line
    return EUnitsResult::EKnown;
  case VTargetTypeBase::ERigidBody:
    // Orientation, position, then the marker positions; the body block is read alike.
    o_rState = {0, 0, 0, 1, 1, 1};
    o_rState.resize(std::max<std::size_t>(stateSize, 6), 1);
    o_rCovariance = {0, 0, 0, 1, 1, 1};
    o_rRepeatBlock = {1, 1, 1};
    o_rRepeatOffset = 36;
    return EUnitsResult::EKnown;
  case VTargetTypeBase::ELocalRotationToWorldRotation:
  case VTargetTypeBase::ELocalDirectionToWorldDirection:
    o_rState = {0, 0, 0}; // angles and unit vectors
    o_rCovariance = {};
    return EUnitsResult::EKnown;
  case VTargetTypeBase::EBadTargetType:
    return EUnitsResult::EBad;
  default:
    return EUnitsResult::EUnknown;
  }
}

void ScaleTargetCovariance(std::vector<double>& covariance, const Units& first,
                           const Units& repeatBlock, std::size_t repeatOffset, double factor) {
  ScaleCovariance(covariance, 0, first, factor);
  const std::size_t block = repeatBlock.size() * repeatBlock.size();
  if (block == 0) return;
  for (std::size_t offset = repeatOffset; offset + block <= covariance.size(); offset += block)
    ScaleCovariance(covariance, offset, repeatBlock, factor);
}

} // namespace CoreOstraTypesUtils::ScalingDetail
