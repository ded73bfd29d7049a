#include "OstraAlgo/KinematicAlgo/AngleStatistics.h"

#include "OstraAlgo/KinematicAlgo/JointStatistics.h"

#include "DebugServices/AssertFail.h"

namespace KinematicAlgo::Detail {

Eigen::VectorXd CentreAngles(Eigen::Ref<Eigen::MatrixXd> angles) {
  ANVIL_ASSERT(angles.cols() > 2);
  Eigen::VectorXd centre(angles.rows());
  for (Eigen::Index row = 0; row < angles.rows(); ++row) {
    std::vector<double> values(size_t(angles.cols()));
    for (Eigen::Index i = 0; i < angles.cols(); ++i) {
      WrapAngle(angles(row, i));
      values[size_t(i)] = angles(row, i);
    }
    centre[row] = ArcCentre(std::move(values));
    for (Eigen::Index i = 0; i < angles.cols(); ++i)
      angles(row, i) = SubtractAngles(angles(row, i), centre[row]);
  }
  return centre;
}

void AngleMeanAndCovariance(Eigen::Ref<Eigen::MatrixXd> angles, Eigen::VectorXd& o_rMean,
                            Eigen::MatrixXd& o_rCovariance) {
  const Eigen::Index n = angles.rows(), count = angles.cols();
  o_rMean = CentreAngles(angles);
  for (int iteration = 0; iteration < 50; ++iteration) {
    const Eigen::VectorXd shift = angles.rowwise().mean();
    o_rMean += shift;
    for (Eigen::Index row = 0; row < n; ++row)
      for (Eigen::Index i = 0; i < count; ++i)
        angles(row, i) = SubtractAngles(angles(row, i), shift[row]);
    if (!(shift.norm() > 1e-4)) break;
  }
  for (Eigen::Index row = 0; row < n; ++row)
    WrapAngle(o_rMean[row]);
  o_rCovariance = angles * angles.transpose() / double(count - 1);
}

} // namespace KinematicAlgo::Detail
