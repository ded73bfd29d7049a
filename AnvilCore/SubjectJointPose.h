#pragma once
// Joint parameters and the node motion of a bone. A segment's pose in its parent is
// P A J A^-1 Q^-1 (P the pre transform, A the joint orientation, J the joint, Q^-1 the inverse
// post transform); a bone's node holds P as its pre-translation and pre-rotation, A J A^-1 as its
// animated translation (in the parent's axes) and rotation, and the rotation of Q^-1 as its
// post-rotation.
#include "River/CoreOstraTypes/VSubjectParametrised.h"
#include "plugin/host/AnvilRotation.h"
#include <array>
#include <vector>

namespace AnvilCore {

/// Rotation of an angle-axis vector (radians) and back (angle at most pi).
AnvilRotation rotationFromAngleAxis(const std::array<double, 3>& i_rAngleAxis);
std::array<double, 3> angleAxisFromRotation(const AnvilRotation& i_rRotation);

/// The node translation and rotation of joint parameters: free joints take a rotation vector
/// then a translation, ball joints a rotation vector, Hardy-Spicer joints the angles about Z then
/// Y, hinges the angle about Z, sliders the distance along Z, all in the joint's own axes. Missing
/// parameters count as 0.
void jointToBoneMotion(const CoreOstraTypes::VSubjectParametrised::VJoint& i_rJoint,
                       const AnvilRotation& i_rPreRotation, const std::vector<double>& i_rParams,
                       Vec3& o_rTranslation, AnvilRotation& o_rRotation);

/// The joint parameters that best give a node motion: the inverse of `jointToBoneMotion` for
/// motions the joint can make; other motions are projected on the joint's freedoms.
std::vector<double> boneMotionToJoint(const CoreOstraTypes::VSubjectParametrised::VJoint& i_rJoint,
                                      const AnvilRotation& i_rPreRotation,
                                      const Vec3& i_rTranslation, const AnvilRotation& i_rRotation);

} // namespace AnvilCore
