#pragma once
// Shared by the joint tests: every kind (plain and turned by a fixed rotation), random states
// from a fixed seed, and the states where the parametrisations are delicate.

#include "OstraAlgo/KinematicAlgo/VJointFunctional.h"
#include "OstraAlgo/KinematicAlgo/VJointFunctionalRotator.h"

#include <random>
#include <string>
#include <vector>

namespace KinematicTest {

using namespace KinematicAlgo;

inline std::vector<std::unique_ptr<VJointFunctional>> AllJoints() {
  std::vector<std::unique_ptr<VJointFunctional>> joints;
  for (int code = 0; code <= 5; ++code)
    joints.push_back(MakeJointFunctional(code));
  const Matrix3r A = Exp(Eigen::Vector3d(0.3, -1.1, 0.7));
  for (int code = 0; code <= 5; ++code)
    joints.push_back(std::make_unique<VJointFunctionalRotator>(MakeJointFunctional(code), A));
  return joints;
}

/// Random parameters: angles and rotation vectors up to about one and a half turns,
/// translations up to a metre.
inline Eigen::VectorXd RandomState(const VJointFunctional& joint, std::mt19937& gen) {
  std::uniform_real_distribution<double> angle(-4.5, 4.5), length(-1000.0, 1000.0);
  const std::uint32_t n = joint.NumDynamicParams();
  Eigen::VectorXd x(n);
  for (std::uint32_t i = 0; i < n; ++i)
    x[i] = i < joint.NumRotationParams() ? angle(gen) : length(gen);
  return x;
}

/// States near the places where a parametrisation needs care: zero rotation and the small-angle
/// series switch, a half turn, a whole turn, and the Hardy-Spicer gimbal at b = ±pi/2.
inline std::vector<Eigen::VectorXd> DelicateStates(const VJointFunctional& joint) {
  const std::uint32_t n = joint.NumDynamicParams();
  std::vector<Eigen::VectorXd> states;
  const Eigen::Vector3d axis = Eigen::Vector3d(0.48, -0.6, 0.64).normalized();
  const double lengths[] = {0.0,     1e-16,     3e-15,     1e-9,         9.9e-5,
                            1.01e-4, Pi - 1e-7, Pi + 1e-7, TwoPi - 1e-6, TwoPi + 1e-6};
  for (double l : lengths) {
    Eigen::VectorXd x = Eigen::VectorXd::Constant(n, 0.25);
    if (n >= 3) x.head<3>() = axis * l;
    if (n == 1 || n == 2) x[0] = l;
    if (n == 2) x[1] = Pi / 2 - l * 1e-3;
    states.push_back(x);
  }
  if (n == 2) {
    Eigen::VectorXd x(2);
    x << 0.7, Pi / 2;
    states.push_back(x);
    x << -2.0, -Pi / 2;
    states.push_back(x);
  }
  return states;
}

inline ConstView Span(const Eigen::VectorXd& v) {
  return {v.data(), size_t(v.size())};
}
inline View Span(Eigen::VectorXd& v) {
  return {v.data(), size_t(v.size())};
}

} // namespace KinematicTest
