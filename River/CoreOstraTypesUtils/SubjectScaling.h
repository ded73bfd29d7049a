#pragma once
// Scaling a solved subject by a length factor (a unit change or a size guess): every length and
// translation is multiplied by the factor, every angle and direction stays, and statistics follow
// their units. Refusals are logged on channel "SubjectUtils" and leave the subject untouched.

#include "River/CoreOstraTypes/VSubject.h"

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

} // namespace CoreOstraTypesUtils
