#pragma once
// The calibrated model of a solved subject record.

#include "OstraAlgo/KinematicAlgo/VCalibrated.h"

#include "River/CoreOstraTypes/VSubject.h"

#include <string>
#include <vector>

namespace KinematicAlgo {

/// Segments in record order (which is depth first) with identifiers equal to their indices;
/// P from PreRotation and PreTranslation, Q the inverse of the stored inverse post transform;
/// joint type, orientation and statistics copied where their sizes fit the type.
///
/// Targets, each on exactly one segment and with exactly the state size of its kind:
/// points become "TargetPosition" (Gaussian: "TargetPositionWithCovariance"), named after their
/// marker and counted as markers; planes (origin, normal) "TargetSegmentPlane", lines (origin,
/// direction) "TargetSegmentRay", their Gaussian kinds with a 1x1 or 2x2 residual covariance;
/// rotations (angle-axis) "TargetOrientation"; directions "TargetDirection"; rigid bodies
/// (orientation, position, then each marker's position in the body) "TargetRigidBody" with one
/// member per marker. Normals and directions are normalised. Kinds without a calibrated form are
/// skipped with a note in `o_rNotes`. Null, with the reasons in `o_rErrors`, when a parent index
/// is not an earlier segment, a joint type is invalid, or a target is malformed.
std::shared_ptr<VSubjectCalibrated>
SubjectCalibratedFromRecord(const CoreOstraTypes::VSubject& subject,
                            std::vector<std::string>& o_rErrors,
                            std::vector<std::string>& o_rNotes);

} // namespace KinematicAlgo
