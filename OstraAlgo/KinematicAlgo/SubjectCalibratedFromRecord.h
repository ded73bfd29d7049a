#pragma once
// The calibrated model of a solved subject record.

#include "OstraAlgo/KinematicAlgo/VCalibrated.h"

#include "River/CoreOstraTypes/VSubject.h"

#include <string>
#include <vector>

namespace KinematicAlgo {

/// Segments in record order (which is depth first) with identifiers equal to their indices;
/// P from PreRotation and PreTranslation, Q the inverse of the stored inverse post transform;
/// joint type, orientation and statistics copied where their sizes fit the type. Point targets
/// become "TargetPosition" (or "TargetPositionWithCovariance" for the Gaussian kind), named after
/// their marker and counted as markers; other target kinds are skipped with a note in
/// `o_rNotes`. Null, with the reasons in `o_rErrors`, when a parent index is not an earlier
/// segment, a joint type is invalid, or a point target has no segment or a short state.
std::shared_ptr<VSubjectCalibrated>
SubjectCalibratedFromRecord(const CoreOstraTypes::VSubject& subject,
                            std::vector<std::string>& o_rErrors,
                            std::vector<std::string>& o_rNotes);

} // namespace KinematicAlgo
