#pragma once
// The test every covariance-like matrix of a subject passes: square, not empty, symmetric within
// a tolerance and positive definite; an all-zero matrix stands for "no information" and passes.

#include <cstddef>
#include <vector>

namespace CoreOstraTypesUtils {

inline constexpr double CovarianceTolerance = 1e-12;

/// Tests the `n` by `n` row-major matrix at `data`.
bool IsValidCovarianceBlock(const double* data, std::size_t n);

/// Tests a row-major matrix held as a vector; false unless its size is a non-zero square.
bool IsValidCovariance(const std::vector<double>& matrix);

/// Tests the covariance of a rigid-body target: its first 6 by 6 block, then one 3 by 3 block
/// per marker. False unless the size is 36 + 9 * MarkerCount for some MarkerCount.
bool IsValidRigidBodyCovariance(const std::vector<double>& covariance);

} // namespace CoreOstraTypesUtils
