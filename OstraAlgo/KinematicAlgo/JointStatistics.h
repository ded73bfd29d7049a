#pragma once
// Building blocks of the joint statistics: quaternion means, the centre of a set of angles on
// the circle, and the smallest ellipsoid covering a point set.

#include "OstraAlgo/KinematicAlgo/RotationMath.h"

#include <Eigen/Core>

#include <vector>

namespace KinematicAlgo {

/// Eigenvector of the largest eigenvalue of the mean outer product of the normalised
/// quaternions (columns of `quaternions`, x y z w). Zero for none, the quaternion for one.
Quaternion PrincipalQuaternionMean(const Eigen::Matrix4Xd& quaternions);

/// Sign-aligned, trimmed mean: the component with the largest sum of squares (lowest index on a
/// tie) decides the sign of each quaternion; then, component by component, the lowest and
/// highest tenth of what remains are dropped; the rest is averaged and normalised.
Quaternion RobustQuaternionMean(const Eigen::Matrix4Xd& quaternions);

/// Centre of the occupied arc of wrapped angles: the middle of the complement of the largest
/// empty gap between neighbours on the circle, wrapped. Needs at least three angles.
double ArcCentre(std::vector<double> wrappedAngles);

/// The smallest ellipsoid covering points (columns of `points`), by Khachiyan's method.
struct CoveringEllipsoid {
  Eigen::VectorXd m_Centre;
  /// Precision form A: (x - c)ᵀ A (x - c) <= 1 on the ellipsoid.
  Eigen::MatrixXd m_Shape;
  /// Covariance form, A⁻¹: x = c + root(A⁻¹) u for |u| <= 1. Finite for flat point sets too.
  Eigen::MatrixXd m_Cover;
  int m_Iterations = 0;
};
/// Empty outputs for an empty point set (logged on "MinEllipsoidSolver" at verbose level). A
/// tolerance of 1 or more skips the iteration and keeps equal weights.
CoveringEllipsoid MinEllipsoidSolver(const Eigen::MatrixXd& points, double tolerance,
                                     unsigned maxIterations);

} // namespace KinematicAlgo
