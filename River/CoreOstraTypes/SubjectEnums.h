#pragma once
// Enumerations shared by VSubject and VSubjectParametrised. The values are stored in files and
// Flow items and must not change.

#include <cstdint>

namespace CoreOstraTypes {

/// Base of both joint records, so VSubject::VJoint::EFree and VSubjectParametrised::VJoint::EFree
/// are one type.
struct VJointTypeBase {
  enum EJointType : std::uint32_t {
    EFree = 0,        ///< 6 parameters: rotation vector then translation
    EBall = 1,        ///< 3 rotational parameters
    EHardySpicer = 2, ///< 2 intersecting axes of rotation
    EHinge = 3,       ///< 1 axis of rotation
    ESlider = 4,      ///< 1 axis of translation
    EDummy = 5,       ///< no degrees of freedom
    EBadJointType = 6 ///< invalid; fails validation
  };
  bool operator==(const VJointTypeBase&) const = default;
};

/// Number of joint parameters of a joint type; 0 for EDummy and invalid types.
constexpr std::uint32_t JointParameterCount(VJointTypeBase::EJointType type) {
  switch (type) {
  case VJointTypeBase::EFree:
    return 6;
  case VJointTypeBase::EBall:
    return 3;
  case VJointTypeBase::EHardySpicer:
    return 2;
  case VJointTypeBase::EHinge:
  case VJointTypeBase::ESlider:
    return 1;
  default:
    return 0;
  }
}

/// Base of both target records.
struct VTargetTypeBase {
  enum ETargetType : std::uint32_t {
    EBadTargetType = 0,
    ELocalPointToWorldPoint = 1,         ///< state: local offset (3)
    ELocalPointToWorldPointGaussian = 2, ///< as above with a 3x3 covariance
    ELocalPlaneToWorldPoint = 3,         ///< state: plane origin and normal (6)
    ELocalPlaneToWorldPointGaussian = 4, ///< as above with a 1x1 covariance
    ELocalLineToWorldPoint = 5,          ///< state: line origin and direction (6)
    ELocalLineToWorldPointGaussian = 6,  ///< as above with a 2x2 covariance
    ERigidBody = 7,                      ///< state: 3 * (MarkerCount + 2)
    ELocalRotationToWorldRotation = 8,   ///< state: local angle-axis offset (3)
    ELocalDirectionToWorldDirection = 9  ///< state: unit vector (3)
  };
  enum ERotationCalibrationBehaviourType : std::uint32_t {
    EBadBehaviourType = 0,
    EOther = 1,          ///< ball-like or dummy-like
    EHingeLike = 2,      ///< from an AXIS, one degree of freedom
    EHardySpicerLike = 3 ///< from an AXIS-PAIR, two degrees of freedom
  };
  bool operator==(const VTargetTypeBase&) const = default;
};

} // namespace CoreOstraTypes
