// Statistics on each joint's manifold: means and covariances of samples drawn from a known
// Gaussian, centres and ranges of samples filling a known region, and the small-sample rules.

#include "JointTestSupport.h"

#include "OstraAlgo/KinematicAlgo/JointStatistics.h"
#include "OstraAlgo/KinematicAlgo/VJointFunctionalHinge.h"
#include "OstraAlgo/KinematicAlgo/VJointFunctionalSlider.h"

#include <Eigen/LU>
#include <gtest/gtest.h>

namespace KinematicTest {
namespace {

Eigen::MatrixXd DrawSamples(const VJointFunctional& joint, const JointGaussian& g, int count,
                            std::mt19937& gen) {
  const Eigen::Index n = joint.NumDynamicParams();
  std::normal_distribution<double> normal;
  Eigen::MatrixXd samples(n, count);
  Eigen::VectorXd z(n), x(n);
  for (int i = 0; i < count; ++i) {
    for (Eigen::Index k = 0; k < n; ++k)
      z[k] = normal(gen);
    joint.FromNormalised(Span(x), Span(z), g);
    samples.col(i) = x;
  }
  return samples;
}

struct KnownGaussian {
  int code;
  Eigen::VectorXd mean;
  Eigen::MatrixXd covariance;
};

std::vector<KnownGaussian> KnownGaussians() {
  std::vector<KnownGaussian> cases;
  Eigen::VectorXd m6(6);
  m6 << 0.4, -1.2, 0.9, 300.0, -20.0, 950.0;
  Eigen::MatrixXd c6 = Eigen::MatrixXd::Identity(6, 6) * 0.02;
  c6(0, 1) = c6(1, 0) = 0.01;
  c6.bottomRightCorner<3, 3>() = Eigen::Matrix3d::Identity() * 400.0;
  c6(3, 4) = c6(4, 3) = 150.0;
  cases.push_back({0, m6, c6});
  cases.push_back({1, m6.head<3>(), c6.topLeftCorner<3, 3>()});
  Eigen::VectorXd m2(2);
  m2 << 3.0, -0.5; // the first angle straddles the ±pi seam
  Eigen::Matrix2d c2;
  c2 << 0.04, 0.01, 0.01, 0.02;
  cases.push_back({2, m2, c2});
  cases.push_back({3, m2.head<1>(), c2.topLeftCorner<1, 1>()});
  cases.push_back({4, Eigen::VectorXd::Constant(1, 42.0), Eigen::MatrixXd::Constant(1, 1, 9.0)});
  return cases;
}

TEST(JointStatistics, MeanAndCovarianceOfGaussianSamplesComeBackWithinSamplingError) {
  std::mt19937 gen(2024);
  const int count = 4000;
  for (const KnownGaussian& known : KnownGaussians()) {
    const auto joint = MakeJointFunctional(known.code);
    const JointGaussian truth(known.mean, known.covariance);
    Eigen::MatrixXd samples = DrawSamples(*joint, truth, count, gen);
    Eigen::MatrixXd covariance;
    Eigen::VectorXd mean;
    joint->MeanAndCovariance(samples, covariance, mean);
    const Eigen::Index n = known.mean.size();
    // The estimated mean, whitened by the true Gaussian, is a draw of N(0, I / count).
    Eigen::VectorXd z(n);
    joint->ToNormalised(Span(z), Span(mean), truth);
    EXPECT_LT(z.norm(), 5.0 * std::sqrt(double(n) / count)) << joint->Name();
    // Whitened, the covariance is the identity up to about sqrt(2 / count) per element.
    const Eigen::MatrixXd white = truth.InverseRoot() * covariance * truth.InverseRoot();
    EXPECT_LT((white - Eigen::MatrixXd::Identity(n, n)).cwiseAbs().maxCoeff(),
              6.0 * std::sqrt(2.0 / count))
        << joint->Name() << "\n"
        << white;
  }
}

TEST(JointStatistics, TooFewSamplesGiveZeros) {
  for (int code = 0; code <= 4; ++code) {
    const auto joint = MakeJointFunctional(code);
    const Eigen::Index n = joint->NumDynamicParams();
    const int minimum = (code == 2 || code == 3) ? 3 : 2;
    Eigen::MatrixXd samples = Eigen::MatrixXd::Constant(n, minimum - 1, 0.3);
    Eigen::MatrixXd covariance;
    Eigen::VectorXd mean;
    joint->MeanAndCovariance(samples, covariance, mean);
    EXPECT_EQ(covariance, Eigen::MatrixXd::Zero(n, n)) << joint->Name();
    if (code != 4) {
      EXPECT_EQ(mean, Eigen::VectorXd::Zero(n)) << joint->Name();
    }
  }
  // A slider's single sample is its mean.
  Eigen::MatrixXd one = Eigen::MatrixXd::Constant(1, 1, 7.0);
  Eigen::MatrixXd covariance;
  Eigen::VectorXd mean;
  VJointFunctionalSlider().MeanAndCovariance(one, covariance, mean);
  EXPECT_EQ(mean[0], 7.0);
}

TEST(JointStatistics, SliderDividesByNWhereAngularKindsDivideByNMinusOne) {
  Eigen::MatrixXd covariance;
  Eigen::VectorXd mean;
  Eigen::MatrixXd two(1, 2);
  two << 0.0, 2.0;
  VJointFunctionalSlider().MeanAndCovariance(two, covariance, mean);
  EXPECT_DOUBLE_EQ(covariance(0, 0), 1.0);
  EXPECT_DOUBLE_EQ(mean[0], 1.0);
  Eigen::MatrixXd three(1, 3);
  three << 0.0, 1.0, 2.0;
  VJointFunctionalHinge().MeanAndCovariance(three, covariance, mean);
  EXPECT_NEAR(covariance(0, 0), 1.0, 1e-12);
  EXPECT_NEAR(mean[0], 1.0, 1e-12);
}

TEST(JointStatistics, HingeMeanAcrossTheSeamStaysNearPi) {
  Eigen::MatrixXd samples(1, 3);
  samples << 3.1, -3.1, 3.0;
  Eigen::MatrixXd covariance;
  Eigen::VectorXd mean;
  VJointFunctionalHinge().MeanAndCovariance(samples, covariance, mean);
  EXPECT_GT(std::abs(mean[0]), 3.0);
  EXPECT_NEAR(mean[0], (3.1 + (TwoPi - 3.1) + 3.0) / 3.0, 1e-9);
  EXPECT_LT(covariance(0, 0), 0.02);
  EXPECT_GT(std::abs(ArcCentre({3.1, -3.1, 3.0})), 3.0);
}

TEST(JointStatistics, HingeAndSliderRangesAreHalfWidthsSquared) {
  Eigen::MatrixXd angles(1, 41);
  for (int i = 0; i <= 40; ++i) { // 2.7 .. 3.5, across the seam
    double a = 2.7 + 0.02 * i;
    WrapAngle(a);
    angles(0, i) = a;
  }
  Eigen::MatrixXd range;
  Eigen::VectorXd centre;
  VJointFunctionalHinge().CentreAndRange(angles, range, centre);
  double expected = 3.1;
  EXPECT_NEAR(centre[0], expected, 1e-9);
  EXPECT_NEAR(range(0, 0), 0.16, 1e-9);

  Eigen::MatrixXd distances(1, 3);
  distances << 1.0, 5.0, 3.0;
  VJointFunctionalSlider().CentreAndRange(distances, range, centre);
  EXPECT_EQ(centre[0], 3.0);
  EXPECT_EQ(range(0, 0), 4.0);
}

// Samples on and inside the ellipsoid centre ⊕ (M u), |u| <= 1.
Eigen::MatrixXd FillRegion(const VJointFunctional& joint, const JointGaussian& region, int count,
                           std::mt19937& gen) {
  const Eigen::Index n = joint.NumDynamicParams();
  std::normal_distribution<double> normal;
  std::uniform_real_distribution<double> inside(0.0, 1.0);
  Eigen::MatrixXd samples(n, count);
  Eigen::VectorXd u(n), x(n);
  for (int i = 0; i < count; ++i) {
    for (Eigen::Index k = 0; k < n; ++k)
      u[k] = normal(gen);
    u.normalize();
    if (i % 3 == 2) u *= inside(gen);
    joint.FromNormalised(Span(x), Span(u), region);
    samples.col(i) = x;
  }
  return samples;
}

TEST(JointStatistics, CentreAndRangeRecoverTheCoveredRegion) {
  std::mt19937 gen(5);
  struct Case {
    int code;
    int count;
    double volumeFloor;
  };
  for (const Case& c : {Case{1, 400, 0.8}, Case{2, 300, 0.9}, Case{0, 600, 0.4}}) {
    const auto joint = MakeJointFunctional(c.code);
    const Eigen::Index n = joint->NumDynamicParams();
    Eigen::VectorXd middle(n);
    Eigen::MatrixXd shape = Eigen::MatrixXd::Identity(n, n) * 0.09;
    if (n == 6) {
      middle << 0.3, 0.2, -0.5, 10.0, 20.0, 30.0;
      shape.bottomRightCorner<3, 3>() *= 1000.0;
    } else if (n == 3) {
      middle << 0.3, 0.2, -0.5;
      shape(0, 0) = 0.25;
    } else {
      middle << -3.0, 0.4; // across the seam in the first angle
      shape(0, 1) = shape(1, 0) = 0.05;
    }
    const JointGaussian region(middle, shape);
    Eigen::MatrixXd samples = FillRegion(*joint, region, c.count, gen);
    const Eigen::MatrixXd original = samples;
    Eigen::MatrixXd range;
    Eigen::VectorXd centre;
    joint->CentreAndRange(samples, range, centre);
    ASSERT_EQ(range.rows(), n);
    // The found region covers every sample...
    const JointGaussian found(centre, range);
    double farthest = 0.0;
    for (Eigen::Index i = 0; i < original.cols(); ++i) {
      Eigen::VectorXd u(n);
      joint->ToNormalised(Span(u), ConstView(original.col(i).data(), size_t(n)), found);
      farthest = std::max(farthest, u.norm());
    }
    EXPECT_LT(farthest, 1.02) << joint->Name();
    // ...and is no bigger than the true one, nor much smaller.
    const double volumeRatio = std::sqrt(range.determinant() / shape.determinant());
    EXPECT_LT(volumeRatio, 1.01) << joint->Name();
    EXPECT_GT(volumeRatio, c.volumeFloor) << joint->Name();
    Eigen::VectorXd offset(n);
    joint->ToNormalised(Span(offset), Span(centre), region);
    EXPECT_LT(offset.norm(), 0.2) << joint->Name();
  }
}

TEST(JointStatistics, QuaternionMeansIgnoreSignAndOutliers) {
  const Quaternion q = QuaternionFromRotationVector(Eigen::Vector3d(0.2, -0.4, 1.0));
  Eigen::Matrix4Xd set(4, 20);
  std::mt19937 gen(3);
  std::normal_distribution<double> noise(0.0, 1e-3);
  for (int i = 0; i < 20; ++i) {
    Quaternion p = q + Quaternion(noise(gen), noise(gen), noise(gen), noise(gen));
    set.col(i) = (i % 2 ? -1.0 : 1.0) * p.normalized();
  }
  const Quaternion principal = PrincipalQuaternionMean(set);
  EXPECT_NEAR(std::abs(principal.dot(q)), 1.0, 1e-5);
  set.col(0) = Quaternion(1, 0, 0, 0); // an outlier the trimming removes
  set.col(1) = Quaternion(0, -1, 0, 0);
  const Quaternion robust = RobustQuaternionMean(set);
  EXPECT_NEAR(std::abs(robust.dot(q)), 1.0, 1e-4);
}

TEST(JointStatistics, CoveringEllipsoidOfASquareIsItsCircumcircle) {
  Eigen::MatrixXd corners(2, 4);
  corners << 1, -1, 1, -1, 1, 1, -1, -1;
  const CoveringEllipsoid e = MinEllipsoidSolver(corners, 1e-9, 1000);
  EXPECT_LT(e.m_Centre.norm(), 1e-9);
  EXPECT_LT((e.m_Cover - 2.0 * Eigen::Matrix2d::Identity()).norm(), 1e-6);
  EXPECT_LT((e.m_Shape - 0.5 * Eigen::Matrix2d::Identity()).norm(), 1e-6);
  EXPECT_EQ(MinEllipsoidSolver(Eigen::MatrixXd(2, 0), 1e-3, 10).m_Centre.size(), 0);
}

} // namespace
} // namespace KinematicTest
