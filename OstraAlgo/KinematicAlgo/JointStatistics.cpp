#include "OstraAlgo/KinematicAlgo/JointStatistics.h"

#include "DebugServices/AssertFail.h"
#include "DebugServices/GlobalLog.h"

#include <Eigen/Cholesky>
#include <Eigen/Eigenvalues>
#include <Eigen/QR>

#include <algorithm>
#include <cmath>

namespace KinematicAlgo {

Quaternion PrincipalQuaternionMean(const Eigen::Matrix4Xd& quaternions) {
  const Eigen::Index n = quaternions.cols();
  if (n == 0) return Quaternion::Zero();
  if (n == 1) return quaternions.col(0);
  Eigen::Matrix4d outer = Eigen::Matrix4d::Zero();
  for (Eigen::Index i = 0; i < n; ++i) {
    const Quaternion q = quaternions.col(i).normalized();
    outer += q * q.transpose();
  }
  outer /= double(n);
  Eigen::SelfAdjointEigenSolver<Eigen::Matrix4d> eigen(outer);
  return eigen.eigenvectors().col(3).normalized(); // eigenvalues ascend
}

Quaternion RobustQuaternionMean(const Eigen::Matrix4Xd& quaternions) {
  const Eigen::Index count = quaternions.cols();
  if (count == 0) return Quaternion::Zero();
  Eigen::Index reference = 0;
  const Eigen::Vector4d squares = quaternions.array().square().rowwise().sum();
  for (Eigen::Index c = 1; c < 4; ++c)
    if (squares[c] > squares[reference]) reference = c;
  std::vector<Quaternion> kept;
  kept.reserve(size_t(count));
  for (Eigen::Index i = 0; i < count; ++i)
    kept.push_back(quaternions(reference, i) < 0.0 ? Quaternion(-quaternions.col(i))
                                                   : Quaternion(quaternions.col(i)));
  for (int c = 0; c < 4; ++c) {
    const size_t trim = kept.size() / 10;
    if (trim == 0) continue;
    auto byComponent = [c](const Quaternion& a, const Quaternion& b) { return a[c] < b[c]; };
    // Lowest tenth to the front, highest tenth to the back, then drop both ends.
    std::nth_element(kept.begin(), kept.begin() + long(trim), kept.end(), byComponent);
    std::nth_element(kept.begin() + long(trim), kept.end() - long(trim), kept.end(), byComponent);
    kept.erase(kept.end() - long(trim), kept.end());
    kept.erase(kept.begin(), kept.begin() + long(trim));
  }
  Quaternion sum = Quaternion::Zero();
  for (const Quaternion& q : kept)
    sum += q;
  if (!kept.empty()) sum /= double(kept.size());
  const double norm = sum.norm();
  return norm > 0.0 ? Quaternion(sum / norm) : sum;
}

double ArcCentre(std::vector<double> angles) {
  ANVIL_ASSERT(angles.size() > 2);
  if (angles.empty()) return 0.0;
  std::sort(angles.begin(), angles.end());
  const double first = angles.front(), last = angles.back();
  double bestGap = first - (last - TwoPi); // the gap across the ±π seam
  double lower = 0.0, upper = 0.0;
  bool seam = true;
  for (size_t i = 0; i + 1 < angles.size(); ++i) {
    const double gap = angles[i + 1] - angles[i];
    if (gap > bestGap) {
      bestGap = gap;
      lower = angles[i];
      upper = angles[i + 1];
      seam = false;
    }
  }
  double minimum = first, maximum = last;
  if (!seam) {
    // The occupied arc runs from the gap's upper end round to its lower end.
    minimum = upper;
    maximum = lower;
    if (upper >= 0.0)
      minimum -= TwoPi;
    else
      maximum += TwoPi;
  }
  ANVIL_ASSERT(minimum <= maximum);
  double centre = 0.5 * (minimum + maximum);
  WrapAngle(centre);
  return centre;
}

CoveringEllipsoid MinEllipsoidSolver(const Eigen::MatrixXd& points, double tolerance,
                                     unsigned maxIterations) {
  CoveringEllipsoid result;
  const Eigen::Index d = points.rows(), n = points.cols();
  if (n == 0) {
    ZMT_LOG("MinEllipsoidSolver", ZMT::ELogVerbose, "Empty input data");
    return result;
  }
  Eigen::MatrixXd q(d + 1, n);
  q.topRows(d) = points;
  q.row(d).setOnes();
  Eigen::VectorXd u = Eigen::VectorXd::Constant(n, 1.0 / double(n));
  if (tolerance < 1.0) {
    Eigen::VectorXd next(n);
    while (unsigned(result.m_Iterations) < maxIterations) {
      ++result.m_Iterations;
      const Eigen::MatrixXd X = q * u.asDiagonal() * q.transpose();
      const Eigen::MatrixXd solved = X.ldlt().solve(q);
      Eigen::Index winner = 0;
      double best = -1e10;
      for (Eigen::Index i = 0; i < n; ++i) {
        const double m = q.col(i).dot(solved.col(i));
        if (m > best) {
          best = m;
          winner = i;
        }
      }
      const double dd = double(d + 1);
      const double beta = (best - dd) / (dd * (best - 1.0));
      next = (1.0 - beta) * u;
      next[winner] += beta;
      const double change = (next - u).norm();
      u = next;
      if (!(change > tolerance)) break;
    }
    ZMT_LOG("MinEllipsoidSolver", ZMT::ELogVerbose, "Iterations: %1%", result.m_Iterations);
  }
  result.m_Centre = points * u;
  const Eigen::MatrixXd spread =
      points * u.asDiagonal() * points.transpose() - result.m_Centre * result.m_Centre.transpose();
  result.m_Cover = double(d) * spread;
  result.m_Shape = spread.completeOrthogonalDecomposition().pseudoInverse() / double(d);
  return result;
}

} // namespace KinematicAlgo
