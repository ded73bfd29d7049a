#pragma once
// Checks that a subject can go to calibration: its parameters must be of forms the calibrator can
// estimate, and it must have one target per marker. Each problem is logged on channel
// "SubjectParametrisedUtils"; every rule runs and reports.

#include "River/CoreOstraTypes/VSubject.h"
#include "River/CoreOstraTypes/VSubjectParametrised.h"

namespace CoreOstraTypesUtils {

inline constexpr const char* SubjectParametrisedUtilsChannel = "SubjectParametrisedUtils";

/// Pre-translations and point-target positions are either driven by dynamic parameters or zero;
/// a dynamic parameter of a pre-rotation drives no translation and no marker position.
bool CheckParametersForCalibration(const CoreOstraTypes::VSubjectParametrised& subject);

/// Every marker has exactly one target, every target one marker, and every target is of a kind
/// the calibrator estimates (points, rotations, directions).
bool CheckTargetsForCalibration(const CoreOstraTypes::VSubject& subject);

} // namespace CoreOstraTypesUtils
