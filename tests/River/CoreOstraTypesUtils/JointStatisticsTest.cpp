#include "River/CoreOstraTypesUtils/JointStatistics.h"
#include "DebugServices/AssertFail.h"
#include "DebugServices/LogCapture.h"
#include "River/CoreOstraTypesUtils/RadialDistortion.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <cmath>
#include <limits>

using namespace CoreOstraTypesUtils;
using CoreOstraTypes::VJointTypeBase;
using testing::DoubleNear;
using testing::ElementsAre;
using testing::Pointwise;

namespace {

/// Counts assertion failures for as long as it lives.
struct VAssertCounter {
  VAssertCounter() {
    m_Previous = DebugServices::SetAssertFailHandler(
        [this](const char* expression, const char*, int) { m_Expressions.push_back(expression); });
  }
  ~VAssertCounter() { DebugServices::SetAssertFailHandler(m_Previous); }
  std::vector<std::string> m_Expressions;
  DebugServices::AssertFailHandler m_Previous;
};

} // namespace

TEST(JointStatistics, StiffnessAndCovarianceRoundTrip) {
  std::vector<double> rest, stiffness, mean, covariance;
  ASSERT_TRUE(StatisticsToRestPoseStiffness(VJointTypeBase::EHardySpicer, {0.1, -0.2},
                                            {0.25, 0.1, 0.1, 4.0}, rest, stiffness));
  EXPECT_THAT(rest, ElementsAre(0.1, -0.2));
  EXPECT_THAT(stiffness, ElementsAre(4.0, 0.25));
  ASSERT_TRUE(RestPoseStiffnessToStatistics(VJointTypeBase::EHardySpicer, rest, stiffness, mean,
                                            covariance));
  EXPECT_THAT(mean, ElementsAre(0.1, -0.2));
  EXPECT_THAT(covariance, ElementsAre(0.25, 0, 0, 4.0)); // correlations are not kept

  ZMT::VLogCapture capture;
  EXPECT_FALSE(StatisticsToRestPoseStiffness(VJointTypeBase::EDummy, {}, {}, rest, stiffness));
  EXPECT_FALSE(
      RestPoseStiffnessToStatistics(VJointTypeBase::EBadJointType, {}, {}, mean, covariance));
  EXPECT_FALSE(StatisticsToRestPoseStiffness(VJointTypeBase::EHinge, {0}, {0}, rest, stiffness));
  EXPECT_FALSE(StatisticsToRestPoseStiffness(VJointTypeBase::EHinge, {0, 1}, {1}, rest, stiffness));
  EXPECT_THAT(stiffness, ElementsAre(4.0, 0.25)); // untouched by the refusals
  const auto messages = capture.Messages(SubjectConversionsChannel);
  ASSERT_EQ(messages.size(), 4u);
  EXPECT_EQ(messages[0], "Cannot convert statistics: unsupported joint type");
  EXPECT_EQ(messages[1], "Cannot convert stats: unsupported joint type");
}

TEST(JointStatistics, RangesBetweenBoundsAndCentredForm) {
  std::vector<double> centre, matrix, lo, hi;
  ASSERT_TRUE(
      RangeMinMaxToCentring(VJointTypeBase::EHardySpicer, {-1, 0}, {3, 0.5}, centre, matrix));
  EXPECT_THAT(centre, ElementsAre(1, 0.25));
  EXPECT_THAT(matrix, ElementsAre(0.5, 0, 0, 4));
  ASSERT_TRUE(RangeCentringToMinMax(VJointTypeBase::EHardySpicer, centre, matrix, lo, hi));
  EXPECT_THAT(lo, Pointwise(DoubleNear(1e-15), std::vector<double>{-1, 0}));
  EXPECT_THAT(hi, Pointwise(DoubleNear(1e-15), std::vector<double>{3, 0.5}));
  // A rotated ellipse: the box around it, checked against points of its boundary.
  const double c = std::cos(0.5), s = std::sin(0.5);
  const std::vector<double> rotated = {c / 2, s / 2, -s / 0.5, c / 0.5}; // rows: axes 2 and 0.5
  ASSERT_TRUE(RangeCentringToMinMax(VJointTypeBase::EHardySpicer, {0, 0}, rotated, lo, hi));
  double maxX = 0, maxY = 0;
  for (int i = 0; i < 100000; ++i) {
    const double t = 2 * M_PI * i / 100000.0;
    // x = M^-1 (cos t, sin t)
    const double u = std::cos(t), v = std::sin(t);
    const double x = (c * 2) * u + (-s * 0.5) * v, y = (s * 2) * u + (c * 0.5) * v;
    maxX = std::max(maxX, x), maxY = std::max(maxY, y);
  }
  EXPECT_NEAR(hi[0], maxX, 1e-6);
  EXPECT_NEAR(hi[1], maxY, 1e-6);
  EXPECT_NEAR(lo[0], -maxX, 1e-6);

  VAssertCounter asserts;
  ZMT::VLogCapture capture;
  EXPECT_FALSE(RangeMinMaxToCentring(VJointTypeBase::EBall, {0, 0, 0}, {1, 1, 1}, centre, matrix));
  EXPECT_FALSE(RangeMinMaxToCentring(VJointTypeBase::EFree, {}, {}, centre, matrix));
  EXPECT_EQ(asserts.m_Expressions.size(), 2u);
  EXPECT_FALSE(RangeMinMaxToCentring(VJointTypeBase::EHinge, {1}, {1}, centre, matrix));
  EXPECT_FALSE(RangeCentringToMinMax(VJointTypeBase::EHinge, {0}, {0}, lo, hi));
  EXPECT_FALSE(RangeCentringToMinMax(VJointTypeBase::EDummy, {}, {}, lo, hi));
  const auto messages = capture.Messages(SubjectConversionsChannel);
  ASSERT_EQ(messages.size(), 5u);
  EXPECT_EQ(messages[0], "Cannot convert ranges: unsupported joint type");
  EXPECT_EQ(messages[4], "Cannot convert ranges: unsupported joint type");
}

TEST(RadialDistortion, LimitsWhereTheDistortionTurns) {
  const double none = std::numeric_limits<double>::max();
  const RadialDistortion monotonic(0, {1e-8, 0.0}, {500, 300});
  EXPECT_EQ(monotonic.MaxUndistortedRadiusSquared(), none);
  EXPECT_EQ(monotonic.MaxDistortedRadiusSquared(), none);

  const std::vector<double> k = {-2e-7, 1e-14, -1e-21};
  const RadialDistortion barrel(1, k, {600, 800}); // d = 1000
  // Independent search: the first r (0.2 d times powers of 1.05) where the slope drops below -1.
  double r = 200.0;
  while (r < 40000.0 &&
         3 * k[0] * r * r + 5 * k[1] * std::pow(r, 4) + 7 * k[2] * std::pow(r, 6) >= -1)
    r *= 1.05;
  const double rho = r * r / (1.05 * 1.05);
  EXPECT_NEAR(barrel.MaxUndistortedRadiusSquared(), rho, rho * 1e-14);
  const double factor = 1 + k[0] * rho + k[1] * rho * rho + k[2] * rho * rho * rho;
  EXPECT_NEAR(barrel.MaxDistortedRadiusSquared(), factor * factor * r * r / (1.05 * 1.05),
              rho * 1e-13);
  EXPECT_LT(barrel.MaxUndistortedRadiusSquared(), 40000.0 * 40000.0);

  CoreOstraTypes::VCameraLensDistortion lens;
  lens.m_Model = CoreOstraTypes::ECameraDistortionModel::Ostra2Parameter;
  lens.m_RadialParameters = {-2e-7, 1e-14};
  lens.m_RadialDistortionCentre = {600, 800};
  EXPECT_LT(RadialDistortion(lens).MaxUndistortedRadiusSquared(), none);

  VAssertCounter asserts;
  const RadialDistortion bad(7, k, {0, 0});
  EXPECT_THAT(asserts.m_Expressions, ElementsAre("Bad Radial Model"));
  EXPECT_EQ(bad.MaxUndistortedRadiusSquared(), none);
}
