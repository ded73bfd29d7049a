#pragma once
// What scales by how much when a subject is scaled by a length factor; shared by the solved and
// the parametrised scaling so that both read a joint or target the same way.

#include "River/CoreOstraTypes/SubjectEnums.h"

#include <cstddef>
#include <vector>

namespace CoreOstraTypesUtils::ScalingDetail {

/// Power of the factor of each parameter: 1 for lengths, 0 for angles and unit vectors.
using Units = std::vector<int>;

/// Multiplies the length entries of `v` by `factor`; entries beyond `units` stay.
void ScaleVector(std::vector<double>& v, const Units& units, double factor);

/// Scales the n by n matrix at `offset` (n the size of `units`) as a covariance: entry (i, j)
/// takes factor^(ui + uj). A matrix too short for the block stays.
void ScaleCovariance(std::vector<double>& m, std::size_t offset, const Units& units, double factor);

/// Scales a range matrix M of the ellipsoid |M (x - c)| <= 1: with x' = S x, M' = M S^-1, so
/// length columns are divided by the factor. Left alone unless it is n by n.
void ScaleRangeMatrix(std::vector<double>& m, const Units& units, double factor);

/// Scales one set of joint statistics: mean and centre as states, covariance and range matrix.
void ScaleJointStatistics(std::vector<double>& mean, std::vector<double>& covariance,
                          std::vector<double>& centre, std::vector<double>& range,
                          const Units& units, double factor);

enum class EUnitsResult { EKnown, EBad, EUnknown };

/// Units of a joint type's parameters: free is rotation vector then translation, a slider is a
/// length, every other parameter an angle.
EUnitsResult JointUnits(CoreOstraTypes::VJointTypeBase::EJointType type, Units& o_rUnits);

/// Units of a target's state (of `stateSize` entries) and of the blocks of its covariance: the
/// first block at offset 0, then `o_rRepeatBlock` from offset `o_rRepeatOffset` on as long as
/// the covariance holds whole blocks (a rigid body's marker blocks; empty otherwise).
EUnitsResult TargetUnits(CoreOstraTypes::VTargetTypeBase::ETargetType type, std::size_t stateSize,
                         Units& o_rState, Units& o_rCovariance, Units& o_rRepeatBlock,
                         std::size_t& o_rRepeatOffset);

/// Scales a target covariance laid out as TargetUnits says.
void ScaleTargetCovariance(std::vector<double>& covariance, const Units& first,
                           const Units& repeatBlock, std::size_t repeatOffset, double factor);

} // namespace CoreOstraTypesUtils::ScalingDetail
