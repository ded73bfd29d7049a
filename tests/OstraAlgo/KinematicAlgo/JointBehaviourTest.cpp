// Reading parameters back from transforms, blending, normalising, composing, pre-multiplying,
// rates, and the turned joint.

#include "JointTestSupport.h"

#include "OstraAlgo/KinematicAlgo/VJointFunctionalBall.h"
#include "OstraAlgo/KinematicAlgo/VJointFunctionalFree.h"
#include "OstraAlgo/KinematicAlgo/VJointFunctionalHardySpicer.h"
#include "OstraAlgo/KinematicAlgo/VJointFunctionalHinge.h"

#include <gtest/gtest.h>

namespace KinematicTest {
namespace {

TEST(JointBehaviour, ParamsComeBackFromTheirTransform) {
  std::mt19937 gen(11);
  for (const auto& joint : AllJoints()) {
    const std::uint32_t n = joint->NumDynamicParams();
    for (int trial = 0; trial < 100; ++trial) {
      Eigen::VectorXd x = RandomState(*joint, gen);
      // Canonical ranges: rotation vectors under a half turn, angles in (-pi, pi), and the
      // second Hardy-Spicer angle away from its gimbal.
      if (n >= 3) x.head<3>() = x.head<3>().normalized() * std::fmod(x.head<3>().norm(), 3.1);
      if (n == 2) x[1] *= 0.3;
      joint->NormaliseParams(Span(x));
      VPose pose;
      joint->ComputePose(Span(x), ConstView(), pose);
      Eigen::VectorXd back = Eigen::VectorXd::Zero(n);
      ASSERT_TRUE(joint->ComputeParams(Span(back), View(), pose, 1e-6)) << joint->Name();
      ASSERT_LT((back - x).norm(), 1e-9 * std::max(1.0, x.norm())) << joint->Name();
    }
  }
}

TEST(JointBehaviour, TransformsAJointCannotMakeAreRefused) {
  VPose offAxis;
  offAxis.m_Rotation = Exp(Eigen::Vector3d(0.01, 0.0, 0.5));
  double angle = 0.0;
  EXPECT_FALSE(VJointFunctionalHinge().ComputeParams(View(&angle, 1), View(), offAxis, 1e-3));
  EXPECT_TRUE(VJointFunctionalHinge().ComputeParams(View(&angle, 1), View(), offAxis, 0.02));
  EXPECT_DOUBLE_EQ(angle, 0.5);
  VPose shifted;
  shifted.m_Translation = Eigen::Vector3d(0.0, 0.0, 0.5);
  double r[3];
  EXPECT_FALSE(VJointFunctionalBall().ComputeParams(View(r, 3), View(), shifted, 0.1));
  EXPECT_TRUE(VJointFunctionalBall().ComputeParams(View(r, 3), View(), shifted, 1.0));
}

TEST(JointBehaviour, ZeroRotationVectorIsExactlyTheIdentity) {
  EXPECT_EQ(Exp(Eigen::Vector3d::Zero()), Matrix3r::Identity());
  EXPECT_EQ(Exp(Eigen::Vector3d(1e-15, 0, 0)), Matrix3r::Identity());
  EXPECT_NE(Exp(Eigen::Vector3d(1e-13, 0, 0)), Matrix3r::Identity());
}

TEST(JointBehaviour, NormaliseFoldsOnlyRotationsBeyondTheThreshold) {
  const Eigen::Vector3d axis = Eigen::Vector3d(1, 2, 2).normalized();
  for (double length : {5.0, 6.0}) {
    Eigen::VectorXd r = axis * length;
    VJointFunctionalBall().NormaliseParams(Span(r));
    if (length == 5.0)
      EXPECT_NEAR((r - axis * 5.0).norm(), 0.0, 1e-12);
    else
      EXPECT_NEAR((r - axis * (6.0 - TwoPi)).norm(), 0.0, 1e-12);
  }
  double a = 3.5;
  VJointFunctionalHinge().NormaliseParams(View(&a, 1));
  EXPECT_DOUBLE_EQ(a, 3.5 - TwoPi);
}

TEST(JointBehaviour, BlendMovesAlongTheRotationAndLeavesEqualRotationsAlone) {
  const Eigen::Vector3d axis = Eigen::Vector3d(0, 0.6, 0.8);
  Eigen::VectorXd a(6), b(6);
  a << axis * 0.2, 1.0, 2.0, 3.0;
  b << axis * 1.0, 3.0, 2.0, 1.0;
  Eigen::VectorXd same = a;
  VJointFunctionalFree().Blend(Span(same), Span(a), 1.0, 1.0);
  EXPECT_EQ(same.head<3>(), a.head<3>()); // untouched, not merely close
  VJointFunctionalFree().Blend(Span(a), Span(b), 1.0, 3.0);
  EXPECT_LT((a.head<3>() - axis * 0.8).norm(), 1e-12);
  // Translation weights are not normalised.
  EXPECT_LT((a.tail<3>() - Eigen::Vector3d(10.0, 8.0, 6.0)).norm(), 1e-12);
  // Rotations about different axes: all weight on b gives b, equal weights the geodesic
  // midpoint, as far from a as from b.
  Eigen::Vector3d c(0.3, -0.9, 0.4), d(-1.1, 0.2, 0.7);
  Eigen::Vector3d toB = c;
  VJointFunctionalBall().Blend(View(toB.data(), 3), ConstView(d.data(), 3), 0.0, 1.0);
  EXPECT_LT((Exp(toB) - Exp(d)).norm(), 1e-12);
  Eigen::Vector3d middle = c;
  VJointFunctionalBall().Blend(View(middle.data(), 3), ConstView(d.data(), 3), 1.0, 1.0);
  EXPECT_NEAR(Log(Exp(c).transpose() * Exp(middle)).norm(),
              Log(Exp(middle).transpose() * Exp(d)).norm(), 1e-12);
  double h = 3.0, other = -3.0;
  VJointFunctionalHinge().Blend(View(&h, 1), ConstView(&other, 1), 0.5, 0.5);
  EXPECT_DOUBLE_EQ(h, 0.0);
}

TEST(JointBehaviour, FreeComposeMatchesPoseComposition) {
  std::mt19937 gen(8);
  VJointFunctionalFree free;
  for (int trial = 0; trial < 20; ++trial) {
    Eigen::VectorXd a = RandomState(free, gen), b = RandomState(free, gen), c(6);
    a.head<3>() *= 0.3;
    b.head<3>() *= 0.3;
    free.ComposeParams(Span(c), Span(a), Span(b));
    VPose pa, pb, pc;
    free.ComputePose(Span(a), ConstView(), pa);
    free.ComputePose(Span(b), ConstView(), pb);
    free.ComputePose(Span(c), ConstView(), pc);
    const VPose expected = pa * pb;
    EXPECT_LT((pc.m_Rotation - expected.m_Rotation).norm(), 1e-12);
    EXPECT_LT((pc.m_Translation - expected.m_Translation).norm(), 1e-9);
  }
}

TEST(JointBehaviour, PreMultiplyAcceptsOnlyWhatTheJointCanMake) {
  VPose aboutZ;
  aboutZ.m_Rotation = Exp(Eigen::Vector3d(0, 0, 0.3));
  double hinge = 0.5;
  EXPECT_TRUE(VJointFunctionalHinge().PreMultiply(aboutZ, ConstView(), View(&hinge, 1), 1e-6));
  EXPECT_DOUBLE_EQ(hinge, 0.8);
  double hs[2] = {0.1, 0.2};
  EXPECT_TRUE(VJointFunctionalHardySpicer().PreMultiply(aboutZ, ConstView(), View(hs, 2), 1e-6));
  EXPECT_NEAR(hs[0], 0.4, 1e-15);
  VPose aboutY;
  aboutY.m_Rotation = Exp(Eigen::Vector3d(0, 0.3, 0));
  EXPECT_FALSE(VJointFunctionalHardySpicer().PreMultiply(aboutY, ConstView(), View(hs, 2), 1e-6));
  Eigen::VectorXd ball(3);
  ball << 0.1, 0.2, 0.3;
  VJointFunctionalBall().PreMultiply(aboutY, ConstView(), Span(ball), 1e-6);
  EXPECT_LT((Exp(ball) - aboutY.m_Rotation * Exp(Eigen::Vector3d(0.1, 0.2, 0.3))).norm(), 1e-12);
}

TEST(JointBehaviour, HardySpicerRatesDoNotDependOnTheAngle) {
  const double rates[2] = {0.7, -1.3}, accelerations[2] = {0.2, 0.5};
  JointRates first, second;
  for (double angle : {0.0, 1.9}) {
    const double params[2] = {angle, -angle};
    const ConstView d[3] = {ConstView(params, 2), ConstView(rates, 2), ConstView(accelerations, 2)};
    VJointFunctionalHardySpicer().ComputeRates(d, ConstView(), angle == 0.0 ? first : second);
  }
  EXPECT_EQ(first[0], second[0]);
  EXPECT_EQ(first[1], second[1]);
  EXPECT_DOUBLE_EQ(first[0][2], 0.7);
}

TEST(JointBehaviour, QuarterTurnAboutXTurnsTheHingeAxisToMinusY) {
  Matrix3r A = Exp(Eigen::Vector3d(Pi / 2, 0, 0));
  VJointFunctionalRotator rotated(std::make_unique<VJointFunctionalHinge>(), A);
  EXPECT_EQ(rotated.Name(), "Rotated_Hinge");
  const double angle = 0.4;
  VPose pose;
  rotated.ComputePose(ConstView(&angle, 1), ConstView(), pose);
  EXPECT_LT((pose.m_Rotation - Exp(Eigen::Vector3d(0, -angle, 0))).norm(), 1e-12);
  double back = 0.0;
  EXPECT_TRUE(rotated.ComputeParams(View(&back, 1), View(), pose, 1e-9));
  EXPECT_NEAR(back, angle, 1e-12);
  const auto clone = rotated.Clone();
  VPose clonePose;
  clone->ComputePose(ConstView(&angle, 1), ConstView(), clonePose);
  EXPECT_EQ(clonePose.m_Rotation, pose.m_Rotation);
}

TEST(JointBehaviour, AngleWrappingRules) {
  double x = 3 * Pi;
  EXPECT_EQ(WrapAngle(x), 2); // rint rounds the tie 1.5 to even
  EXPECT_NEAR(x, -Pi, 1e-12);
  EXPECT_NEAR(SubtractAngles(3.0, -3.0), 6.0 - TwoPi, 1e-15);
  Eigen::Vector3d r(0, 0, 4.0);
  WrapRotationVector(r);
  EXPECT_NEAR(r.z(), 4.0 - TwoPi, 1e-15);
}

} // namespace
} // namespace KinematicTest
