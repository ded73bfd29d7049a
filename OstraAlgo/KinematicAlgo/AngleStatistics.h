#pragma once
// Statistics of angles on the circle, shared by the Hinge and Hardy-Spicer joints. Each row of
// `angles` is one angle, each column one sample; the rows are wrapped and then replaced by their
// residuals around the result.

#include <Eigen/Core>

namespace KinematicAlgo::Detail {

/// Mean by iterated averaging of residuals from the arc centres (at most 50 steps, until the
/// norm of the shift is at most 1e-4); the covariance of the residuals over N - 1.
void AngleMeanAndCovariance(Eigen::Ref<Eigen::MatrixXd> angles, Eigen::VectorXd& o_rMean,
                            Eigen::MatrixXd& o_rCovariance);

/// Wraps every angle and replaces each row by its residual around the row's arc centre; returns
/// the centres.
Eigen::VectorXd CentreAngles(Eigen::Ref<Eigen::MatrixXd> angles);

} // namespace KinematicAlgo::Detail
