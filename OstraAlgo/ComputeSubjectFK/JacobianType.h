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
  EFree = 3,      ///< two blocks of six: the segment's free pose (not built yet)
  EChainOnly = 4, ///< as EChain; the poses are current, forward kinematics is skipped
  EJointOnly = 5, ///< as EJoint, likewise
  EFreeOnly = 6   ///< as EFree, likewise
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
