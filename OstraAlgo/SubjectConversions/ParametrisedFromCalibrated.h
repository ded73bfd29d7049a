#pragma once
// The parametrised subject record of a calibrated subject model and its skeleton parameters:
// the model's numbers, with the poses of linked segments and the positions of linked markers
// written as expressions over the parameters.

#include "OstraAlgo/KinematicAlgo/ICalibrated.h"
#include "OstraAlgo/KinematicAlgo/VSkeletonParameters.h"

#include "River/CoreOstraTypes/VSubjectApplicationData.h"
#include "River/CoreOstraTypes/VSubjectParametrised.h"

namespace SubjectConversions {

/// Fills `o_rSubject` (and `o_pAppData`) from `model` as SubjectFromCalibrated does, every
/// number written as an expression text, then ties it to `parameters`:
///
/// - the skeleton's parameters become the record's (RecordParametersFromSkeleton);
/// - a segment link, matched to a segment by name, gives its pre-rotation (angle-axis) and
///   pre-translation expressions; its post-rotation and post-translation describe the pose in
///   the segment (the model's PoseInThis, whose inverse the record stores) and must be plain
///   numbers;
/// - a marker link, matched to a marker by name, gives the position expressions of that marker
///   in every target that places it (a point, plane or ray's origin, a rigid body's member).
///
/// Segments and markers without a link keep their numbers, with the warnings "Missing
/// expressions for segments: " and "Missing expressions for markers: " and the names, comma
/// separated. Refusals, on "SubjectConversion" at error level: "Cannot match segment link with
/// name: ", "Cannot match marker link with name: ", "Unexpected post-transform expression: "
/// (with the text), a link that does not evaluate, or whose values at the parameters' values
/// are not the model's (within 1e-9, relative above 1), or parameters that have no record form;
/// each reason is logged and then "Calibration paramenter information not compatible with input
/// subject". On failure the outputs are untouched.
bool ParametrisedFromCalibrated(const KinematicAlgo::ISubjectCalibrated& model,
                                const KinematicAlgo::ISkeletonParameters& parameters,
                                CoreOstraTypes::VSubjectParametrised& o_rSubject,
                                CoreOstraTypes::VSubjectApplicationData* o_pAppData = nullptr);

} // namespace SubjectConversions
