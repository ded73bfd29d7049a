#pragma once
// A Gaussian on a joint's parameters: mean, covariance, and the symmetric square root, inverse
// square root and determinant of the covariance, all from one eigen decomposition.

#include <Eigen/Core>

#include <span>

namespace KinematicAlgo {

class JointGaussian {
public:
  JointGaussian() = default;
  /// `covariance` is n x n row-major (or empty); `diagonalLoad` is added to its diagonal before
  /// the decomposition. A non-positive eigenvalue is reported on stderr; the roots then use its
  /// magnitude, with the inverse root negated for that direction.
  JointGaussian(std::span<const double> mean, std::span<const double> covariance,
                double diagonalLoad = 1e-20);
  JointGaussian(const Eigen::VectorXd& mean, const Eigen::MatrixXd& covariance,
                double diagonalLoad = 1e-20);

  Eigen::Index Size() const { return m_Mean.size(); }
  const Eigen::VectorXd& Mean() const { return m_Mean; }
  const Eigen::MatrixXd& Covariance() const { return m_Covariance; }
  const Eigen::MatrixXd& Root() const { return m_Root; }
  const Eigen::MatrixXd& InverseRoot() const { return m_InverseRoot; }
  double Determinant() const { return m_Determinant; }
  /// Replaces the mean; the covariance and its roots stay.
  void SetMean(const Eigen::VectorXd& mean) { m_Mean = mean; }

private:
  void Decompose(double diagonalLoad);

  Eigen::VectorXd m_Mean;
  Eigen::MatrixXd m_Covariance;
  Eigen::MatrixXd m_Root;
  Eigen::MatrixXd m_InverseRoot;
  double m_Determinant = 0.0;
};

} // namespace KinematicAlgo
