#include "River/CoreOstraTypesUtils/CovarianceTest.h"

#include <Eigen/Eigenvalues>

#include <algorithm>
#include <cmath>

namespace CoreOstraTypesUtils {

bool IsValidCovarianceBlock(const double* data, std::size_t n) {
  if (n == 0) return false;
  using Matrix = Eigen::Matrix<double, Eigen::Dynamic, Eigen::Dynamic, Eigen::RowMajor>;
  const Eigen::Map<const Matrix> m(data, static_cast<Eigen::Index>(n),
                                   static_cast<Eigen::Index>(n));
  if (std::all_of(data, data + n * n, [](double v) { return v == 0.0; })) return true;
  if (!m.allFinite()) return false;
  if ((m - m.transpose()).cwiseAbs().maxCoeff() > CovarianceTolerance) return false;
  const Eigen::SelfAdjointEigenSolver<Eigen::MatrixXd> solver(m, Eigen::EigenvaluesOnly);
  if (solver.info() != Eigen::Success) return false;
  return solver.eigenvalues().minCoeff() > 0.0;
}

bool IsValidCovariance(const std::vector<double>& matrix) {
  const auto n = static_cast<std::size_t>(std::llround(std::sqrt(double(matrix.size()))));
  if (n * n != matrix.size()) return false;
  return IsValidCovarianceBlock(matrix.data(), n);
}

bool IsValidRigidBodyCovariance(const std::vector<double>& covariance) {
  if (covariance.size() < 36 || (covariance.size() - 36) % 9 != 0) return false;
  if (!IsValidCovarianceBlock(covariance.data(), 6)) return false;
  for (std::size_t offset = 36; offset < covariance.size(); offset += 9)
    if (!IsValidCovarianceBlock(covariance.data() + offset, 3)) return false;
  return true;
}

} // namespace CoreOstraTypesUtils
