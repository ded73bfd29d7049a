// Analytic derivatives of every joint kind against central finite differences: the transform
// (at random and at delicate states) and the whitening maps.

#include "JointTestSupport.h"

#include <gtest/gtest.h>

namespace KinematicTest {
namespace {

// Largest error of dJ/dθ_i over the parameters, relative to the derivative's size (at least 1).
double TransformDerivativeError(const VJointFunctional& joint, const Eigen::VectorXd& x) {
  const std::uint32_t n = joint.NumDynamicParams();
  JointJacobian analytic(n);
  joint.ComputeJacobian(Span(x), ConstView(), analytic);
  double worst = 0.0;
  for (std::uint32_t i = 0; i < n; ++i) {
    const double h = 1e-6 * std::max(1.0, std::abs(x[i]));
    Eigen::VectorXd plus = x, minus = x;
    plus[i] += h;
    minus[i] -= h;
    VPose p, m;
    joint.ComputePose(Span(plus), ConstView(), p);
    joint.ComputePose(Span(minus), ConstView(), m);
    const Matrix3r dR = (p.m_Rotation - m.m_Rotation) / (2 * h);
    const Eigen::Vector3d dT = (p.m_Translation - m.m_Translation) / (2 * h);
    const double size = std::max(1.0, analytic.m_dR[i].norm() + analytic.m_dT[i].norm());
    const double error = ((dR - analytic.m_dR[i]).norm() + (dT - analytic.m_dT[i]).norm()) / size;
    worst = std::max(worst, error);
  }
  return worst;
}

TEST(JointDerivatives, TransformDerivativesMatchFiniteDifferencesAtRandomStates) {
  std::mt19937 gen(1234);
  for (const auto& joint : AllJoints())
    for (int trial = 0; trial < 300; ++trial) {
      const Eigen::VectorXd x = RandomState(*joint, gen);
      ASSERT_LT(TransformDerivativeError(*joint, x), 1e-6)
          << joint->Name() << " at " << x.transpose();
    }
}

TEST(JointDerivatives, TransformDerivativesMatchFiniteDifferencesNearSingularStates) {
  for (const auto& joint : AllJoints())
    for (const Eigen::VectorXd& x : DelicateStates(*joint))
      EXPECT_LT(TransformDerivativeError(*joint, x), 1e-6)
          << joint->Name() << " at " << x.transpose();
}

TEST(JointDerivatives, ExpDerivativeIsTheGeneratorsAtZero) {
  Matrix3r R;
  std::array<Matrix3r, 3> dR;
  ExpAndDerivatives(Eigen::Vector3d::Zero(), R, dR);
  EXPECT_EQ(R, Matrix3r::Identity());
  for (int i = 0; i < 3; ++i)
    EXPECT_EQ(dR[size_t(i)], Skew(Eigen::Vector3d::Unit(i)));
}

// A Gaussian whose samples stay clear of the half-turn seam of rotation vectors.
JointGaussian RandomGaussian(const VJointFunctional& joint, std::mt19937& gen) {
  const Eigen::Index n = joint.NumDynamicParams();
  std::uniform_real_distribution<double> u(-1.0, 1.0);
  Eigen::VectorXd mean(n);
  for (Eigen::Index i = 0; i < n; ++i)
    mean[i] = std::uint32_t(i) < joint.NumRotationParams() ? 0.8 * u(gen) : 100.0 * u(gen);
  Eigen::MatrixXd B(n, n);
  for (Eigen::Index r = 0; r < n; ++r)
    for (Eigen::Index c = 0; c < n; ++c)
      B(r, c) = 0.15 * u(gen);
  Eigen::MatrixXd covariance = B * B.transpose();
  covariance.diagonal().array() += 0.01;
  return JointGaussian(mean, covariance);
}

double MatrixError(const Eigen::MatrixXd& analytic, const Eigen::MatrixXd& numeric) {
  return (analytic - numeric).norm() / std::max(1.0, analytic.norm());
}

TEST(JointDerivatives, WhiteningDerivativesMatchFiniteDifferences) {
  std::mt19937 gen(99);
  std::normal_distribution<double> normal;
  for (const auto& joint : AllJoints()) {
    const Eigen::Index n = joint->NumDynamicParams();
    if (n == 0) continue;
    for (int trial = 0; trial < 100; ++trial) {
      const JointGaussian g = RandomGaussian(*joint, gen);
      Eigen::VectorXd z(n), x(n);
      for (Eigen::Index i = 0; i < n; ++i)
        z[i] = normal(gen);
      joint->FromNormalised(Span(x), Span(z), g);

      Eigen::MatrixXd dxdz, dzdx, numericFrom(n, n), numericTo(n, n);
      joint->FromNormalisedJacobian(Span(z), g, dxdz);
      joint->ToNormalisedJacobian(Span(x), g, dzdx);
      for (Eigen::Index i = 0; i < n; ++i) {
        const double hz = 1e-6, hx = 1e-6 * std::max(1.0, std::abs(x[i]));
        Eigen::VectorXd zp = z, zm = z, xp = x, xm = x, out(n), out2(n);
        zp[i] += hz;
        zm[i] -= hz;
        joint->FromNormalised(Span(out), Span(zp), g);
        joint->FromNormalised(Span(out2), Span(zm), g);
        numericFrom.col(i) = (out - out2) / (2 * hz);
        xp[i] += hx;
        xm[i] -= hx;
        joint->ToNormalised(Span(out), Span(xp), g);
        joint->ToNormalised(Span(out2), Span(xm), g);
        numericTo.col(i) = (out - out2) / (2 * hx);
      }
      ASSERT_LT(MatrixError(dxdz, numericFrom), 1e-6) << joint->Name() << " z=" << z.transpose();
      ASSERT_LT(MatrixError(dzdx, numericTo), 1e-6) << joint->Name() << " x=" << x.transpose();
    }
  }
}

TEST(JointDerivatives, WhiteningRoundTrips) {
  std::mt19937 gen(7);
  std::normal_distribution<double> normal;
  for (const auto& joint : AllJoints()) {
    const Eigen::Index n = joint->NumDynamicParams();
    for (int trial = 0; trial < 50; ++trial) {
      const JointGaussian g = RandomGaussian(*joint, gen);
      Eigen::VectorXd z(n), x(n), back(n);
      for (Eigen::Index i = 0; i < n; ++i)
        z[i] = normal(gen);
      joint->FromNormalised(Span(x), Span(z), g);
      joint->ToNormalised(Span(back), Span(x), g);
      ASSERT_LT((back - z).norm(), 1e-9) << joint->Name();
    }
  }
}

} // namespace
} // namespace KinematicTest
