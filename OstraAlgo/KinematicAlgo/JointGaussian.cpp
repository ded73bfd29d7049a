#include "OstraAlgo/KinematicAlgo/JointGaussian.h"

#include <Eigen/Eigenvalues>

#include <cmath>
#include <iostream>

namespace KinematicAlgo {

JointGaussian::JointGaussian(std::span<const double> mean, std::span<const double> covariance,
                             double diagonalLoad) {
  const Eigen::Index n = Eigen::Index(mean.size());
  m_Mean = Eigen::Map<const Eigen::VectorXd>(mean.data(), n);
  if (Eigen::Index(covariance.size()) == n * n && n > 0)
    m_Covariance =
        Eigen::Map<const Eigen::Matrix<double, Eigen::Dynamic, Eigen::Dynamic, Eigen::RowMajor>>(
            covariance.data(), n, n);
  else
    m_Covariance.resize(0, 0);
  Decompose(diagonalLoad);
}

JointGaussian::JointGaussian(const Eigen::VectorXd& mean, const Eigen::MatrixXd& covariance,
                             double diagonalLoad)
    : m_Mean(mean), m_Covariance(covariance) {
  Decompose(diagonalLoad);
}

void JointGaussian::Decompose(double diagonalLoad) {
  const Eigen::Index n = m_Covariance.rows();
  if (n == 0) {
    m_Root.resize(0, 0);
    m_InverseRoot.resize(0, 0);
    m_Determinant = 0.0;
    return;
  }
  Eigen::MatrixXd loaded = m_Covariance;
  loaded.diagonal().array() += diagonalLoad;
  Eigen::SelfAdjointEigenSolver<Eigen::MatrixXd> eigen(loaded);
  const Eigen::VectorXd& values = eigen.eigenvalues();
  const Eigen::MatrixXd& vectors = eigen.eigenvectors();
  Eigen::VectorXd root(n), inverseRoot(n);
  m_Determinant = 1.0;
  for (Eigen::Index i = 0; i < n; ++i) {
    const double value = values[i];
    m_Determinant *= value;
    if (!(value > 0.0))
      std::cerr << "Eigenvalue " << i << " of the joint covariance is non-positive (" << value
                << ").\n";
    root[i] = std::sqrt(std::abs(value));
    inverseRoot[i] = value > 0.0 ? 1.0 / root[i] : -1.0 / root[i];
  }
  m_Root = vectors * root.asDiagonal() * vectors.transpose();
  m_InverseRoot = vectors * inverseRoot.asDiagonal() * vectors.transpose();
}

} // namespace KinematicAlgo
