#pragma once
// The solved subject record of a calibrated subject model: the way back from
// SubjectCalibratedFromRecord, for a model that calibration or editing has changed.

#include "OstraAlgo/KinematicAlgo/ICalibrated.h"

#include "River/CoreOstraTypes/VSubject.h"
#include "River/CoreOstraTypes/VSubjectApplicationData.h"

namespace SubjectConversions {

inline constexpr const char* SubjectConversionChannel = "SubjectConversion";

/// Fills `o_rSubject` (and, when given, `o_pAppData` with one entry per segment, marker and
/// target, targets named after the model's targets or "Target_<index>") from `model`.
///
/// Segments come in the tree's pre-order, with the root's parent unset; each joint takes the
/// segment's name, and an all-zero range matrix means no range. Markers are the model's markers
/// in order, then the members of rigid bodies that are not markers already, each with radius
/// 10. Targets by class: "TargetPosition" and "TargetPositionWithCovariance" (points, which must
/// be markers), "TargetRigidBody", "TargetSegmentPlane" and "TargetSegmentRay" (Gaussian forms
/// when they carry a residual covariance; they must be markers too), "TargetOrientation" and
/// "TargetDirection" (each with a rotation observation of its own, named after it). When a
/// marker is a separate object from its target and both carry a covariance, the marker's is
/// taken, with the warning "Overriding target covariance value with marker covariance".
///
/// False, with the reasons logged on "SubjectConversion" and the outputs untouched, for an
/// empty tree, an invalid joint type, a target of another class, a target on a segment the tree
/// does not hold, a point, plane or ray that is not a marker, or a rigid body of fewer than 3
/// members.
bool SubjectFromCalibrated(const KinematicAlgo::ISubjectCalibrated& model,
                           CoreOstraTypes::VSubject& o_rSubject,
                           CoreOstraTypes::VSubjectApplicationData* o_pAppData = nullptr);

} // namespace SubjectConversions
