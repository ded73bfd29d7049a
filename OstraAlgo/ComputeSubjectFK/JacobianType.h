#pragma once
// What an evaluation of a compute subject differentiates. Every Jacobian block is the derivative
// of a segment's world pose, expressed in world coordinates.

#include <cstdint>
#include <exception>
#include <string>

namespace ComputeSubject {

enum EJacobianType : std::uint32_t {
  ENone = 0,      ///< forward kinematics only
  EChain = 1,     ///< one block per segment on the path to the root, the segment's own first
  EJoint = 2,     ///< one block: the segment's own joint
  EFree = 3,      ///< one block of six: the segment's free pose P (see VComputeSegment)
  EChainOnly = 4, ///< as EChain; the poses are current, forward kinematics is skipped
  EJointOnly = 5, ///< as EJoint, likewise
  EFreeOnly = 6   ///< as EFree, likewise
};

/// Construction modes of a compute subject. Any other value behaves as EJointsMode.
enum ESubjectMode : std::uint32_t {
  EJointsMode = 1,      ///< segments move by their joints; the state is joint parameters
  EFreeSegmentsMode = 2 ///< each segment is placed by six free parameters (calibration)
};

/// Thrown where a model can't be turned into a computation.
class VConstructionException : public std::exception {
public:
  explicit VConstructionException(std::string text) : m_Text(std::move(text)) {}
  const char* what() const noexcept override { return m_Text.c_str(); }

private:
  std::string m_Text;
};

} // namespace ComputeSubject
