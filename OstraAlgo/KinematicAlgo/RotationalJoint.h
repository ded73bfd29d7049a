#pragma once
// What the Free and Ball joints share: their rotation part is a rotation vector, blended,
// normalised and averaged on the rotation group, and their statistics live in the tangent space
// at the mean pose.

#include "OstraAlgo/KinematicAlgo/JointGaussian.h"
#include "OstraAlgo/KinematicAlgo/RotationMath.h"

#include <Eigen/Core>

namespace KinematicAlgo::Detail {

/// Rotation part of Blend: a step of wb / (wa + wb) of the way from a to b, taken on the right of
/// a. The quaternion is negated when its w falls below -0.9.
void BlendRotation(double* io_pA, const double* pB, double wa, double wb);
/// Folds the rotation vector only when its quaternion's w is below -0.9.
void NormaliseRotation(double* io_pR);

/// The pose of rotation-vector samples (first three rows) with optional translations (rows 3..5).
VPose SamplePose(const Eigen::MatrixXd& samples, Eigen::Index column, bool withTranslation);
/// δ = mean⁻¹ ∘ pose(sample) as (wrapped rotation vector[, translation]) for every column.
Eigen::MatrixXd Residuals(const Eigen::MatrixXd& samples, const VPose& mean, bool withTranslation);

struct MeanIteration {
  double m_Threshold;
  int m_MaxIterations;
};
/// Iterates M = M ∘ exp(average residual) from `start` until the average is small.
VPose IterateMean(const Eigen::MatrixXd& samples, VPose start, bool withTranslation,
                  const MeanIteration& rule);

/// Iterates M = M ∘ exp(centre of the covering ellipsoid of the residuals); returns the
/// ellipsoid's covariance-form shape in o_rRange and logs on `channel` as the joints do.
VPose IterateCentre(const Eigen::MatrixXd& samples, VPose start, bool withTranslation,
                    const MeanIteration& rule, double ellipsoidTolerance, const char* channel,
                    Eigen::MatrixXd& o_rRange);

/// Parameters of a pose: (log R[, T]).
void PoseToParams(const VPose& pose, bool withTranslation, Eigen::VectorXd& o_rParams);

/// FromNormalised, ToNormalised and their derivatives on the rotation (and translation) manifold.
void FromNormalised(double* o_pX, const double* pZ, const JointGaussian& g, bool withTranslation);
void ToNormalised(double* o_pZ, const double* pX, const JointGaussian& g, bool withTranslation);
void FromNormalisedJacobian(const double* pZ, const JointGaussian& g, bool withTranslation,
                            Eigen::MatrixXd& o_rJ);
void ToNormalisedJacobian(const double* pX, const JointGaussian& g, bool withTranslation,
                          Eigen::MatrixXd& o_rJ);

} // namespace KinematicAlgo::Detail
