#include "DebugServices/LogCapture.h"
#include "River/CoreOstraTypesUtils/DecimalRounding.h"
#include "River/CoreOstraTypesUtils/GenericDynamicSubspace.h"
#include "River/CoreOstraTypesUtils/JointAxes.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <cmath>
#include <random>

using namespace CoreOstraTypesUtils;
using CoreOstraTypes::VSubjectParametrised;
using testing::ElementsAre;

namespace {

void ExpectNear(const Vector3& a, const Vector3& b, double tolerance = 1e-12) {
  for (int i = 0; i < 3; ++i)
    EXPECT_NEAR(a[i], b[i], tolerance) << i;
}

Vector3 RandomRotationVector(std::mt19937& gen) {
  std::uniform_real_distribution<double> u(-1.0, 1.0);
  Eigen::Vector3d v(u(gen), u(gen), u(gen));
  v = v.normalized() * (3.0 * std::abs(u(gen))); // angle below pi
  return {v.x(), v.y(), v.z()};
}

} // namespace

TEST(AngleAxis, RoundTripsAndTinyVectors) {
  std::mt19937 gen(7);
  for (int i = 0; i < 50; ++i) {
    const Vector3 v = RandomRotationVector(gen);
    ExpectNear(RotationToAngleAxis(AngleAxisToRotation(v)), v, 1e-12);
  }
  EXPECT_TRUE(AngleAxisToRotation({1e-15, 0, 0}).isIdentity(0.0));
  const Eigen::Matrix3d quarter = AngleAxisToRotation({0, 0, M_PI / 2});
  EXPECT_TRUE((quarter * Eigen::Vector3d::UnitX()).isApprox(Eigen::Vector3d::UnitY()));
  ExpectNear(RotationToAngleAxis(Eigen::Matrix3d::Identity()), {0, 0, 0}, 0.0);
}

TEST(AngleAxis, InvertedPoseComposesToIdentity) {
  const Vector3 r{0.3, -0.2, 1.1}, t{10, -5, 2};
  Vector3 ri, ti;
  InvertAngleAxisPose(r, t, ri, ti);
  const VPose identity = PoseFromAngleAxis(r, t) * PoseFromAngleAxis(ri, ti);
  EXPECT_TRUE(identity.m_Rotation.isIdentity(1e-12));
  EXPECT_LT(identity.m_Translation.norm(), 1e-12);
  ExpectNear(ri, {-0.3, 0.2, -1.1});
}

TEST(JointAxes, HingeAxisRoundTrips) {
  ExpectNear(AxisFromJointOrientation({0, 0, 0}), {0, 0, 1}, 0.0);
  for (const Vector3 axis : {Vector3{1, 0, 0}, Vector3{0, 0, -2}, Vector3{0.2, -0.5, 0.1},
                             Vector3{0, 0, 1}, Vector3{1e-9, 0, -1}}) {
    Vector3 orientation{9, 9, 9};
    ASSERT_TRUE(JointOrientationFromAxis(axis, orientation));
    const Eigen::Vector3d n = Eigen::Vector3d(axis[0], axis[1], axis[2]).normalized();
    ExpectNear(AxisFromJointOrientation(orientation), {n.x(), n.y(), n.z()}, 1e-12);
  }
  Vector3 untouched{1, 2, 3};
  EXPECT_FALSE(JointOrientationFromAxis({0, 0.0005, 0}, untouched));
  ExpectNear(untouched, {1, 2, 3}, 0.0);
}

TEST(JointAxes, AxisPairRoundTripsBothWays) {
  const AxisPair defaults = AxisPairFromJointOrientation({0, 0, 0});
  EXPECT_THAT(defaults, ElementsAre(0, 0, 1, 0, 1, 0));
  std::mt19937 gen(11);
  for (int i = 0; i < 50; ++i) {
    const Vector3 orientation = RandomRotationVector(gen);
    Vector3 back;
    ASSERT_TRUE(JointOrientationFromAxisPair(AxisPairFromJointOrientation(orientation), back));
    ExpectNear(back, orientation, 1e-10);
  }
  Vector3 o;
  ASSERT_TRUE(JointOrientationFromAxisPair({1, 0, 0, 0, 0, 1}, o));
  const AxisPair pair = AxisPairFromJointOrientation(o);
  for (int i = 0; i < 6; ++i)
    EXPECT_NEAR(pair[i], (AxisPair{1, 0, 0, 0, 0, 1})[i], 1e-12);
  EXPECT_FALSE(JointOrientationFromAxisPair({0, 0, 1, 0, 0, 3}, o)); // parallel
  EXPECT_FALSE(JointOrientationFromAxisPair({0, 0, 0, 0, 1, 0}, o)); // zero axis
}

// An axis read from a file becomes an orientation, which is written as an axis again: an exact
// axis must come back as the same doubles, and what came back must stay as it is.
TEST(JointAxes, ExactAxesComeBackExactly) {
  const Vector3 hinges[] = {{0, 1, 0},  {1, 0, 0},     {0, 0, -1},      {-1, 0, 0},
                            {0, -1, 0}, {0.6, 0.8, 0}, {0, -0.6, -0.8}, {0.5, -0.5, 0.70710678}};
  for (const Vector3& axis : hinges) {
    Vector3 orientation;
    ASSERT_TRUE(JointOrientationFromAxis(axis, orientation));
    const Vector3 back = AxisFromJointOrientation(orientation);
    if (axis[2] == 0.70710678) { // not unit: normalised, and stable from then on
      Vector3 again;
      ASSERT_TRUE(JointOrientationFromAxis(back, again));
      EXPECT_EQ(AxisFromJointOrientation(again), back);
      continue;
    }
    EXPECT_EQ(back, axis) << axis[0] << " " << axis[1] << " " << axis[2];
    EXPECT_FALSE(std::signbit(back[0]) && back[0] == 0) << "no negative zero";
  }
  const AxisPair pairs[] = {{0, 1, 0, 1, 0, 0},
                            {1, 0, 0, 0, 0, 1},
                            {0, 0, -1, 0, -1, 0},
                            {0, 0, 1, 0.6, 0.8, 0},
                            {0.8, 0, 0.6, -0.6, 0, 0.8}};
  for (const AxisPair& pair : pairs) {
    Vector3 orientation;
    ASSERT_TRUE(JointOrientationFromAxisPair(pair, orientation));
    EXPECT_EQ(AxisPairFromJointOrientation(orientation), pair) << pair[0] << " " << pair[3];
  }
  // Arbitrary orientations (of a solver, say): from the first file on, reading and writing
  // again keeps the axes as they were written, nearly always (when no axis within one unit in
  // the last place gives the orientation back, the last bits may still move).
  std::mt19937 gen(5);
  int stableAxes = 0, stablePairs = 0;
  for (int i = 0; i < 200; ++i) {
    const Vector3 solved = RandomRotationVector(gen);
    Vector3 read, again;
    ASSERT_TRUE(JointOrientationFromAxis(AxisFromJointOrientation(solved), read));
    const Vector3 axis = AxisFromJointOrientation(read);
    ASSERT_TRUE(JointOrientationFromAxis(axis, again));
    stableAxes += AxisFromJointOrientation(again) == axis;
    ASSERT_TRUE(JointOrientationFromAxisPair(AxisPairFromJointOrientation(solved), read));
    const AxisPair pair = AxisPairFromJointOrientation(read);
    ASSERT_TRUE(JointOrientationFromAxisPair(pair, again));
    stablePairs += AxisPairFromJointOrientation(again) == pair;
  }
  EXPECT_GE(stableAxes, 190);
  EXPECT_GE(stablePairs, 190);
}

TEST(DecimalRounding, RemovesNoiseRelativeToTheVectorsSize) {
  EXPECT_EQ(RoundedToDecimals(Vector3{2.8327694488239898e-16, 1.0000000000000002, -0.0}),
            (Vector3{0, 1, 0}));
  EXPECT_EQ(RoundedToDecimals(Vector3{299.99999999999994, 10.000000000000002, 0}),
            (Vector3{300, 10, 0}));
  EXPECT_EQ(RoundedToDecimals(Vector3{0.1 + 0.2, 0, 0})[0], 0.3) << "the double nearest 0.3";
  const Vector3 tiny{1e-9, 2e-10, 0};
  EXPECT_EQ(RoundedToDecimals(tiny), tiny);
  const Vector3 unusable{1e-20, 0, std::nan("")};
  const Vector3 rounded = RoundedToDecimals(unusable);
  EXPECT_EQ(rounded[0], 1e-20);
  EXPECT_TRUE(std::isnan(rounded[2]));
}

TEST(AngleAxis, PoseInvertedTwiceKeepsItsRotationExactly) {
  const Vector3 r{0, 0, 1.5707963267948966}, t{10, 0, 0};
  Vector3 ri, ti, rr, tt;
  InvertAngleAxisPose(r, t, ri, ti);
  InvertAngleAxisPose(ri, ti, rr, tt);
  EXPECT_EQ(rr, r);
  ExpectNear(tt, t, 1e-12);
}

namespace {

VSubjectParametrised ChainSubject() {
  using J = VSubjectParametrised::VJoint;
  VSubjectParametrised subject;
  const std::pair<const char*, J::EJointType> joints[] = {{"Root", J::EFree},
                                                          {"Hip", J::EBall},
                                                          {"Knee", J::EHinge},
                                                          {"Tip", J::EDummy},
                                                          {"Ankle", J::EHardySpicer}};
  for (const auto& [name, type] : joints) {
    VSubjectParametrised::VSegment segment;
    segment.m_Joint.m_Name = name;
    segment.m_Joint.m_JointType = type;
    subject.m_Segments.push_back(segment);
  }
  return subject;
}

} // namespace

TEST(GenericDynamicSubspace, ChunksMapToWholeJointsAndBack) {
  const auto subject = ChainSubject();
  EXPECT_THAT(JointParameterOffsets(subject), ElementsAre(0, 6, 9, 10, 10, 12));
  CoreOstraTypes::VSubjectDynamicSubspace::VPcaControlledParams chunk;
  chunk.m_Name = "Leg";
  chunk.m_JointParametersIndices = {6, 7, 8, 9, 10, 11};
  chunk.m_JointParametersMean = {1, 2, 3, 4, 5, 6};
  chunk.m_PrincipalComponents.resize(1);
  chunk.m_PrincipalComponents[0].m_JointParams = {1, 0, 0, 0, 0, 0};
  VGenericDynamicSubspace generic;
  ASSERT_TRUE(BuildGenericDynamicSubspace(subject, chunk, generic));
  EXPECT_THAT(generic.m_JointNames, ElementsAre("Hip", "Knee", "Ankle"));
  CoreOstraTypes::VSubjectDynamicSubspace::VPcaControlledParams back;
  ASSERT_TRUE(BuildPcaControlledParams(subject, generic, back));
  EXPECT_EQ(back, chunk);

  for (const std::vector<std::uint32_t>& bad :
       {std::vector<std::uint32_t>{6, 7}, std::vector<std::uint32_t>{7, 8, 9},
        std::vector<std::uint32_t>{9, 6, 7, 8, 99}}) {
    chunk.m_JointParametersIndices = bad;
    EXPECT_FALSE(BuildGenericDynamicSubspace(subject, chunk, generic));
  }
  generic.m_JointNames = {"Hip", "Elbow"};
  EXPECT_FALSE(BuildPcaControlledParams(subject, generic, back));
}

TEST(GenericDynamicSubspace, ValidationMessages) {
  using J = VSubjectParametrised::VJoint;
  ZMT::VLogCapture capture;
  VGenericDynamicSubspace s;
  s.m_JointNames = {"Hip", "Knee"};
  s.m_JointTypes = {J::EBall, J::EHinge};
  s.m_JointParamsForMeanPose = {0, 0, 0, 0};
  // 1.0004 long: its sum of squares (1.0008) is within the tolerance.
  s.m_RemarkableActions = {{"a", {1.0004, 0, 0, 0}}, {"b", {0, 0.6, 0.8, 0}}};
  EXPECT_EQ(ValidateGenericDynamicSubspace(s), ESubspaceValidation::EValid);
  EXPECT_TRUE(capture.Messages("SubjectDynamicSubspaceUtils").empty());

  s.m_RemarkableActions = {{"a", {1, 0, 0, 0}}, {"b", {0.1, 0, 0, 0.9}}};
  EXPECT_EQ(ValidateGenericDynamicSubspace(s), ESubspaceValidation::EInvalid);
  s.m_JointTypes = {J::EFree, J::EDummy};
  EXPECT_EQ(ValidateGenericDynamicSubspace(s), ESubspaceValidation::EInvalid);
  s.m_JointNames = {"Knee"};
  s.m_JointTypes = {J::EHinge};
  s.m_JointParamsForMeanPose = {0, 0};
  s.m_RemarkableActions.clear();
  EXPECT_EQ(ValidateGenericDynamicSubspace(s), ESubspaceValidation::EInvalid);
  s.m_JointTypes = {};
  EXPECT_EQ(ValidateGenericDynamicSubspace(s), ESubspaceValidation::EInvalid);
  EXPECT_THAT(
      capture.Messages("SubjectDynamicSubspaceUtils"),
      ElementsAre(
          "Orthogonality constraint violated at basis vector 1. Dot product value: 0.820000",
          "Orthogonality constraint violated at basis vector pair 0;1. Dot product value: 0.1",
          "Dummy joints are not allowed in m_JointTypes",
          "Free joints in m_JointTypes. Free joints involve parameters of different units, hence "
          "not recommended",
          "Single-element subspace encountered. Characterisation of a single joint parameter "
          "with a subspace is redundant.",
          "m_JointParamsForMeanPose has 2 elements, but expecting 1",
          "m_JointTypes has 0 elements, but expecting 1"));
}
