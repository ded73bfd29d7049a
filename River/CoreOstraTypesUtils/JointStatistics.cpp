#include "River/CoreOstraTypesUtils/JointStatistics.h"

#include "DebugServices/AssertFail.h"
#include "DebugServices/GlobalLog.h"

#include <Eigen/Dense>

#include <cmath>

namespace CoreOstraTypesUtils {

using CoreOstraTypes::JointParameterCount;
using CoreOstraTypes::VJointTypeBase;

#define CONVERSIONS_LOG(...) ZMT_LOG(SubjectConversionsChannel, ZMT::ELogError, __VA_ARGS__)

namespace {

using RowMatrix = Eigen::Matrix<double, Eigen::Dynamic, Eigen::Dynamic, Eigen::RowMajor>;

bool Sized(const std::vector<double>& v, std::size_t n) {
  return v.size() == n;
}

} // namespace

bool StatisticsToRestPoseStiffness(JointType type, const std::vector<double>& mean,
                                   const std::vector<double>& covariance,
                                   std::vector<double>& o_rRestPose,
                                   std::vector<double>& o_rStiffness) {
  const std::size_t n = JointParameterCount(type);
  if (n == 0) {
    CONVERSIONS_LOG("Cannot convert statistics: unsupported joint type");
    return false;
  }
  if (type == VJointTypeBase::EBall) ANVIL_ASSERT(covariance.size() == 9);
  if (!Sized(mean, n) || !Sized(covariance, n * n)) {
    CONVERSIONS_LOG("Cannot convert statistics: %1% parameters need a mean of %1% and a "
                    "covariance of %2% entries",
                    n, n * n);
    return false;
  }
  std::vector<double> stiffness(n);
  for (std::size_t i = 0; i < n; ++i) {
    const double variance = covariance[i * n + i];
    if (!(variance > 0.0)) {
      CONVERSIONS_LOG("Cannot convert statistics: variance %1% is not positive", i);
      return false;
    }
    stiffness[i] = 1.0 / variance;
  }
  o_rRestPose = mean;
  o_rStiffness = std::move(stiffness);
  return true;
}

bool RestPoseStiffnessToStatistics(JointType type, const std::vector<double>& restPose,
                                   const std::vector<double>& stiffness,
                                   std::vector<double>& o_rMean,
                                   std::vector<double>& o_rCovariance) {
  const std::size_t n = JointParameterCount(type);
  if (n == 0) {
    CONVERSIONS_LOG("Cannot convert stats: unsupported joint type");
    return false;
  }
  if (type == VJointTypeBase::EFree) {
    ANVIL_ASSERT(restPose.size() == 6);
    ANVIL_ASSERT(stiffness.size() == 6);
  }
  if (!Sized(restPose, n) || !Sized(stiffness, n)) {
    CONVERSIONS_LOG("Cannot convert stats: %1% parameters need a rest pose and a stiffness of %1% "
                    "entries",
                    n);
    return false;
  }
  std::vector<double> covariance(n * n, 0.0);
  for (std::size_t i = 0; i < n; ++i) {
    if (!(stiffness[i] > 0.0) || std::isinf(stiffness[i])) {
      CONVERSIONS_LOG("Cannot convert stats: stiffness %1% is not positive and finite", i);
      return false;
    }
    covariance[i * n + i] = 1.0 / stiffness[i];
  }
  o_rMean = restPose;
  o_rCovariance = std::move(covariance);
  return true;
}

bool RangeMinMaxToCentring(JointType type, const std::vector<double>& minimum,
                           const std::vector<double>& maximum, std::vector<double>& o_rCentring,
                           std::vector<double>& o_rRangeMatrix) {
  const std::size_t n = JointParameterCount(type);
  const bool rotationVector = type == VJointTypeBase::EBall || type == VJointTypeBase::EFree;
  ANVIL_ASSERT(!rotationVector);
  if (n == 0 || rotationVector) {
    CONVERSIONS_LOG("Cannot convert ranges: unsupported joint type");
    return false;
  }
  if (!Sized(minimum, n) || !Sized(maximum, n)) {
    CONVERSIONS_LOG("Cannot convert ranges: %1% parameters need %1% minima and maxima", n);
    return false;
  }
  std::vector<double> centring(n), matrix(n * n, 0.0);
  for (std::size_t i = 0; i < n; ++i) {
    if (!(maximum[i] > minimum[i]) || !std::isfinite(maximum[i] - minimum[i])) {
      CONVERSIONS_LOG("Cannot convert ranges: the maximum of parameter %1% is not above its "
                      "minimum",
                      i);
      return false;
    }
    centring[i] = 0.5 * (minimum[i] + maximum[i]);
    matrix[i * n + i] = 2.0 / (maximum[i] - minimum[i]);
  }
  o_rCentring = std::move(centring);
  o_rRangeMatrix = std::move(matrix);
  return true;
}

bool RangeCentringToMinMax(JointType type, const std::vector<double>& centring,
                           const std::vector<double>& rangeMatrix, std::vector<double>& o_rMinimum,
                           std::vector<double>& o_rMaximum) {
  const std::size_t n = JointParameterCount(type);
  if (n == 0) {
    CONVERSIONS_LOG("Cannot convert ranges: unsupported joint type");
    return false;
  }
  if (!Sized(centring, n) || !Sized(rangeMatrix, n * n)) {
    CONVERSIONS_LOG("Cannot convert ranges: %1% parameters need a centring state of %1% and a "
                    "range matrix of %2% entries",
                    n, n * n);
    return false;
  }
  const auto size = static_cast<Eigen::Index>(n);
  const Eigen::Map<const RowMatrix> m(rangeMatrix.data(), size, size);
  const Eigen::MatrixXd gram = m.transpose() * m;
  const Eigen::LDLT<Eigen::MatrixXd> ldlt(gram);
  if (ldlt.info() != Eigen::Success || !ldlt.isPositive() || !(ldlt.vectorD().minCoeff() > 0.0)) {
    CONVERSIONS_LOG("Cannot convert ranges: the range matrix is singular");
    return false;
  }
  const Eigen::MatrixXd inverse = ldlt.solve(Eigen::MatrixXd::Identity(size, size));
  std::vector<double> minimum(n), maximum(n);
  for (std::size_t i = 0; i < n; ++i) {
    const double half = std::sqrt(inverse(Eigen::Index(i), Eigen::Index(i)));
    minimum[i] = centring[i] - half;
    maximum[i] = centring[i] + half;
  }
  o_rMinimum = std::move(minimum);
  o_rMaximum = std::move(maximum);
  return true;
}

} // namespace CoreOstraTypesUtils
