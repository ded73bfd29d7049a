#pragma once
// The derivative of a joint's transform: for each of its n parameters the derivative of the
// rotation (a 3x3 matrix) and of the translation (a 3-vector), in the frame the transform is
// expressed in. Fixed capacity of six parameters, so filling one never allocates.

#include "OstraAlgo/KinematicAlgo/RotationMath.h"

#include <array>
#include <cstdint>

namespace KinematicAlgo {

struct JointJacobian {
  static constexpr std::uint32_t MaxParams = 6;

  std::array<Matrix3r, MaxParams> m_dR;
  std::array<Eigen::Vector3d, MaxParams> m_dT;
  std::uint32_t m_NumParams = 0;
  /// Index of the joint's first parameter in the state vector.
  std::uint32_t m_FirstParam = 0;

  explicit JointJacobian(std::uint32_t numParams = 0) : m_NumParams(numParams) { SetZero(); }
  void SetZero() {
    for (std::uint32_t i = 0; i < MaxParams; ++i) {
      m_dR[i].setZero();
      m_dT[i].setZero();
    }
  }
};

} // namespace KinematicAlgo
