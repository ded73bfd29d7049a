#pragma once
// Scaling a solved subject by a length factor (a unit change or a size guess): every length and
// translation is multiplied by the factor, every angle and direction stays, and statistics follow
// their units. Refusals are logged on channel "SubjectUtils" and leave the subject untouched.

#include "River/CoreOstraTypes/VSubject.h"
#include "River/CoreOstraTypes/VSubjectParametrised.h"

#include <string>

namespace CoreOstraTypesUtils {

/// Scales one joint's statistics: the translational parameters (slider, the last three of a free
/// joint) of mean and range centring by `factor`, covariance entries by the factor once per
/// translational index, and range matrix columns of translational parameters by 1 / factor.
bool ScaleJoint(CoreOstraTypes::VSubject::VJoint& io_rJoint, double factor);

/// Scales one target: positions and origins (not normals, directions or rotations) by `factor`,
/// residual covariances of lengths by its square; a rigid body's body block as a free joint's.
bool ScaleTarget(CoreOstraTypes::VSubject::VTarget& io_rTarget, double factor);

/// Scales pre and inverse post translations, bounds, marker radii, joints and targets.
/// `factor` must be positive and finite.
bool ScaleSubject(CoreOstraTypes::VSubject& io_rSubject, double factor);

/// An expression whose value is `factor` times that of `expression`: a plain number is
/// multiplied out ("10" by 2 gives "20"), anything else becomes "(expression)*factor"; an empty
/// expression (worth 0) and a factor of 1 leave the text as it is.
std::string ScaleExpression(const std::string& expression, double factor);

/// The parametrised forms scale what evaluates to lengths, so that evaluating the scaled subject
/// gives the scaled solved subject for any parameter values; the parameters themselves stay.
/// A joint's template statistics and bind pose scale as its statistics do. T-pose statistics
/// are not expected here (asserted) and, when present, scale alike.
bool ScaleJoint(CoreOstraTypes::VSubjectParametrised::VJoint& io_rJoint, double factor);

/// State expressions, covariance, template covariance and placement covariance as for the solved
/// target. A type outside the known kinds is kept as it is with the warning "Target type not
/// implemented yet. Scaling may be incorrect" and does not fail the scaling.
bool ScaleTarget(CoreOstraTypes::VSubjectParametrised::VTarget& io_rTarget, double factor);

/// Pre-translation, bound, mass centre and radius of gyration expressions, inverse post
/// translations, marker radii, joints, T-pose constraints of length parameters and targets.
/// `factor` must be positive and finite; a refusal leaves the subject untouched.
bool ScaleSubject(CoreOstraTypes::VSubjectParametrised& io_rSubject, double factor);

} // namespace CoreOstraTypesUtils
