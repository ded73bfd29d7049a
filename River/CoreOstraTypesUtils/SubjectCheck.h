#pragma once
// Whole-subject checks. Each rule that a record breaks is logged at error level on channel
// "SubjectCheck"; the records are never changed. A failing stage ends the check, but every rule
// of a stage runs and reports first.

#include "River/CoreOstraTypes/VSubject.h"
#include "River/CoreOstraTypes/VSubjectApplicationData.h"
#include "River/CoreOstraTypes/VSubjectParametrised.h"

#include <cstddef>

namespace CoreOstraTypesUtils {

inline constexpr const char* SubjectCheckChannel = "SubjectCheck";

/// Checks a solved subject: markers (unique ids and names), targets, then segments (joint rules,
/// indices, parents, tree depths). True when every rule holds.
bool SubjectCheck(const CoreOstraTypes::VSubject& subject);

/// The joint rules: sizes of mean, covariance, range centring state and range matrix for the
/// joint's type, the matrices' validity and the consistency of the range information.
bool CheckJoint(const CoreOstraTypes::VSubject::VJoint& joint);

/// The rules of target `index` of `subject`; an index beyond the targets fails.
bool CheckTarget(const CoreOstraTypes::VSubject& subject, std::size_t index);

/// Checks a parametrised subject: its evaluation at its own parameter values must pass
/// SubjectCheck, then the template values of joints and targets, then every static parameter,
/// pre transform and target state expression must parse. Targets are named in messages by
/// `pAppData` when it has an entry for them, else by their index.
bool SubjectParametrisedCheck(const CoreOstraTypes::VSubjectParametrised& subject,
                              const CoreOstraTypes::VSubjectApplicationData* pAppData = nullptr);

/// The template rules of one joint (each broken rule logged).
bool CheckJointTemplate(const CoreOstraTypes::VSubjectParametrised::VJoint& joint);

/// The template rules of one target (each broken rule logged).
bool CheckTargetTemplate(const CoreOstraTypes::VSubjectParametrised::VTarget& target);

} // namespace CoreOstraTypesUtils
