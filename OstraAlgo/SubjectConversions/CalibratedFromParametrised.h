#pragma once
// A calibrated subject model and its skeleton parameters from a parametrised subject record:
// the way back from ParametrisedFromCalibrated.

#include "OstraAlgo/KinematicAlgo/VCalibrated.h"
#include "OstraAlgo/KinematicAlgo/VSkeletonParameters.h"

#include "River/CoreOstraTypes/VSubjectParametrised.h"

#include <memory>

namespace SubjectConversions {

/// The model of `subject` evaluated at its own parameter values (SubjectFromParametrised, then
/// SubjectCalibratedFromRecord), and in `o_rParameters` the record's parameters
/// (SkeletonParametersFromRecord, named after the subject) with:
///
/// - a segment link for each segment whose pre-rotation or pre-translation expressions name a
///   parameter: those six texts, then the pose in the segment (the inverse of the stored
///   inverse post transform) as numbers;
/// - a marker link for each marker whose position names a parameter in the first target that
///   places it (a point, plane or ray's origin, a rigid body's member): those three texts.
///
/// What else depends on parameters (bounds, directions and normals, a rigid body's own pose,
/// masses) has no link and is kept at its value. Null, with the reasons logged ("SubjectUtils"
/// for the evaluation, "SubjectConversion" for the rest), when the subject does not evaluate or
/// its evaluation has no model; `o_rParameters` is then untouched.
std::shared_ptr<KinematicAlgo::VSubjectCalibrated>
CalibratedFromParametrised(const CoreOstraTypes::VSubjectParametrised& subject,
                           KinematicAlgo::VSkeletonParameters& o_rParameters);

} // namespace SubjectConversions
