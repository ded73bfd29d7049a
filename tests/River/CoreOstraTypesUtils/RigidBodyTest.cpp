#include "ValidSubject.h"

#include "DebugServices/AssertFail.h"
#include "DebugServices/LogCapture.h"
#include "River/CoreOstraTypesUtils/AngleAxis.h"
#include "River/CoreOstraTypesUtils/RigidBodyUtils.h"
#include "River/CoreOstraTypesUtils/SubjectCheck.h"
#include "River/CoreOstraTypesUtils/SubjectEvaluation.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <cmath>
#include <cstring>

using namespace CoreOstraTypesUtils;
using CoreOstraTypes::VJointTypeBase;
using CoreOstraTypes::VSubject;
using CoreOstraTypes::VSubjectApplicationData;
using CoreOstraTypes::VSubjectParametrised;
using CoreOstraTypes::VTargetTypeBase;
using testing::ElementsAre;

namespace {

VSubject::VTarget BodyTarget(std::size_t markers) {
  VSubject::VTarget target;
  target.m_Type = VTargetTypeBase::ERigidBody;
  target.m_SegmentIndices = {0};
  for (std::uint32_t i = 0; i < markers; ++i)
    target.m_MarkerIndices.push_back(i);
  return target;
}

std::vector<RigidVector> Positions(std::size_t n) {
  std::vector<RigidVector> p;
  for (std::size_t i = 0; i < n; ++i)
    p.push_back({0.1 * double(i) + 1.0 / 3.0, -2.0 / 7.0, 1e-17 * double(i)});
  return p;
}

std::vector<RigidCovariance> Covariances(std::size_t n) {
  std::vector<RigidCovariance> c;
  for (std::size_t i = 0; i < n; ++i)
    c.push_back({1.0 / 3.0 + double(i), 0.1, 0, 0.1, 2, 0, 0, 0, 3});
  return c;
}

bool SameBits(const std::vector<double>& a, const std::vector<double>& b) {
  return a.size() == b.size() && std::memcmp(a.data(), b.data(), a.size() * sizeof(double)) == 0;
}

/// A three-marker rigid body subject: one free segment with one ERigidBody target.
struct VBody {
  VSubject m_Subject;
  VSubjectApplicationData m_AppData;
};

VBody MakeBody(const std::string& prefix) {
  VBody body;
  auto& s = body.m_Subject;
  s.m_Name = prefix + "Wand";
  VSubject::VSegment segment;
  segment.m_Name = prefix + "WandBody";
  segment.m_Joint.m_JointType = VJointTypeBase::EFree;
  segment.m_Joint.m_Mean.assign(6, 0.0);
  segment.m_Joint.m_Covariance = Identity(6);
  s.m_Segments = {segment};
  for (int i = 0; i < 3; ++i) {
    VSubject::VMarker marker;
    marker.m_Name = prefix + "W" + std::to_string(i);
    marker.m_MarkerId = CoreOstraTypes::NameHash(marker.m_Name);
    s.m_Markers.push_back(marker);
  }
  auto target = BodyTarget(3);
  EXPECT_TRUE(WriteRigidBodyInformation(target, {0.1, 0.2, 0.3}, {1, 2, 3}, Positions(3),
                                        Covariances(3), {}));
  s.m_Targets = {target};
  body.m_AppData.m_Segments.resize(1);
  body.m_AppData.m_Markers.resize(3);
  body.m_AppData.m_Targets.resize(1);
  return body;
}

} // namespace

TEST(RigidBodyPacking, RoundTripsBitForBit) {
  auto target = BodyTarget(4);
  const RigidVector orientation{0.1, 1.0 / 3.0, -0.7}, position{1e300, -0.0, 5e-324};
  const std::vector<RigidVector> normals = {{0, 0, 1}, {0, 0, 0}, {1, 0, 0}, {0, 1, 0}};
  ASSERT_TRUE(WriteRigidBodyInformation(target, orientation, position, Positions(4), Covariances(4),
                                        normals));
  EXPECT_EQ(target.m_State.size(), 18u);
  EXPECT_EQ(target.m_Covariance.size(), 72u);
  EXPECT_EQ(target.m_ViewNormals, normals);
  RigidVector o{}, p{};
  std::vector<RigidVector> positions;
  std::vector<RigidCovariance> covariances;
  ASSERT_TRUE(ReadRigidBodyInformation(target, o, p, positions, covariances));
  EXPECT_EQ(std::memcmp(&o, &orientation, sizeof o), 0);
  EXPECT_EQ(std::memcmp(&p, &position, sizeof p), 0);
  EXPECT_EQ(positions, Positions(4));
  EXPECT_EQ(covariances, Covariances(4));
  auto again = target;
  ASSERT_TRUE(WriteRigidBodyInformation(again, o, p, positions, covariances, normals));
  EXPECT_TRUE(SameBits(again.m_State, target.m_State));
  EXPECT_TRUE(SameBits(again.m_Covariance, target.m_Covariance));
  // The marker-only write keeps the body triples and the normals.
  auto markersOnly = target;
  ASSERT_TRUE(WriteRigidBodyMarkers(markersOnly, Positions(4), Covariances(4)));
  EXPECT_EQ(markersOnly, target);

  // Parametrised: numbers as expression texts that evaluate back to the same bits.
  VSubjectParametrised::VTarget parametrised;
  parametrised.m_Type = VTargetTypeBase::ERigidBody;
  parametrised.m_MarkerIndices = {0, 1, 2, 3};
  ASSERT_TRUE(WriteRigidBodyInformation(parametrised, orientation, position, Positions(4),
                                        Covariances(4), normals));
  ASSERT_EQ(parametrised.m_StateExpressions.size(), 18u);
  VDynamicExpressionParserSimple parser;
  std::vector<std::string> errors;
  parser.SetParameters({}, errors);
  std::vector<double> values;
  for (const auto& text : parametrised.m_StateExpressions) {
    double v = 0;
    ASSERT_TRUE(parser.Evaluate(text, v)) << text;
    values.push_back(v);
  }
  // Expression texts keep every bit but the sign of a zero.
  EXPECT_EQ(values, target.m_State);
  EXPECT_FALSE(std::signbit(values[4]));
}

TEST(RigidBodyPacking, RefusalsLeaveTheTargetUntouched) {
  ZMT::VLogCapture capture;
  RigidVector o{}, p{};
  std::vector<RigidVector> positions;
  std::vector<RigidCovariance> covariances;
  auto two = BodyTarget(2);
  two.m_State.assign(12, 0.0);
  const auto before = two;
  EXPECT_FALSE(WriteRigidBodyInformation(two, o, p, Positions(2), Covariances(2), {}));
  EXPECT_FALSE(ReadRigidBodyInformation(two, o, p, positions, covariances));
  EXPECT_FALSE(WriteRigidBodyInformation(two, o, p, Positions(3), Covariances(2), {}));
  auto point = BodyTarget(3);
  point.m_Type = VTargetTypeBase::ELocalPointToWorldPoint;
  EXPECT_FALSE(WriteRigidBodyInformation(point, o, p, Positions(3), Covariances(3), {}));
  EXPECT_FALSE(ReadRigidBodyInformation(point, o, p, positions, covariances));
  EXPECT_EQ(two, before);
  // The state is looked at before the covariance.
  auto three = BodyTarget(3);
  three.m_State.assign(14, 0.0);
  three.m_Covariance.assign(62, 0.0);
  EXPECT_FALSE(ReadRigidBodyInformation(three, o, p, positions, covariances));
  three.m_State.assign(15, 0.0);
  EXPECT_FALSE(ReadRigidBodyInformation(three, o, p, positions, covariances));
  EXPECT_FALSE(WriteRigidBodyMarkers(three, Positions(2), Covariances(2)));
  EXPECT_THAT(
      capture.Messages(RigidBodyUtilsChannel),
      ElementsAre(
          "Cannot write rigid body information, the rigid body does not define a sufficient number "
          "of markers!",
          "Cannot read rigid body information, the rigid body does not define a sufficient number "
          "of markers!",
          "Cannot write rigid body information, different number of marker positions and "
          "covariances!",
          "Cannot write rigid body information, this target is not a rigid body!",
          "Cannot read rigid body information, this target is not a rigid body!",
          "Cannot read rigid body information, Incorrect state size!",
          "Cannot read rigid body information, Incorrect covariance size!",
          "Cannot write marker position and covariances to the rigid body target!"));
}

TEST(RigidBodyPacking, EmptyOrZeroMarkerCovarianceReadsAsDefault) {
  auto target = BodyTarget(3);
  target.m_State.assign(15, 1.0);
  ZMT::VLogCapture capture;
  RigidVector o{}, p{};
  std::vector<RigidVector> positions;
  std::vector<RigidCovariance> covariances;
  ASSERT_TRUE(ReadRigidBodyInformation(target, o, p, positions, covariances));
  const RigidCovariance def{5, 0, 0, 0, 5, 0, 0, 0, 5};
  EXPECT_THAT(covariances, ElementsAre(def, def, def));
  const auto records = capture.Records();
  ASSERT_EQ(records.size(), 3u);
  for (const auto& r : records) {
    EXPECT_EQ(r.Level, ZMT::ELogWarning);
    EXPECT_EQ(r.Message, "Zero covariance on rigid body marker, filling up with default!");
  }
  // Written back, the defaults are stored, in a covariance of 63 entries.
  ASSERT_TRUE(WriteRigidBodyInformation(target, o, p, positions, covariances, {}));
  EXPECT_EQ(target.m_Covariance.size(), 63u);
  EXPECT_EQ(target.m_Covariance[36 + 9 + 4], 5.0);
}

TEST(RigidBodyTest, RulesInOrder) {
  auto run = [](const std::function<void(VSubject&)>& edit) {
    VSubject s = MakeBody("").m_Subject;
    edit(s);
    ZMT::VLogCapture capture;
    const bool result = IsRigidBody(s);
    const auto messages = capture.Messages(RigidBodyUtilsChannel);
    EXPECT_EQ(result, messages.empty());
    return messages;
  };
  EXPECT_TRUE(run([](VSubject&) {}).empty());
  EXPECT_THAT(run([](VSubject& s) { s.m_Markers.pop_back(); }),
              ElementsAre("A rigid body must have at least 3 markers!"));
  EXPECT_THAT(run([](VSubject& s) { s.m_Segments.clear(); }),
              ElementsAre("A rigid body must have at least 1 segment!"));
  EXPECT_THAT(run([](VSubject& s) { s.m_Segments[0].m_Joint.m_JointType = VJointTypeBase::EBall; }),
              ElementsAre("A rigid body must have a free joint as root!"));
  EXPECT_THAT(run([](VSubject& s) { s.m_Segments.push_back(s.m_Segments[0]); }),
              ElementsAre("All but the root segment must be of dummy type!"));
  EXPECT_THAT(run([](VSubject& s) { s.m_Targets.push_back(s.m_Targets[0]); }),
              ElementsAre("In a rigid body there must be either one target of RigidBody type or "
                          "several targets parented to the root segment!"));
  // The second form: point targets on the root, which must name 3 markers among them.
  auto points = [](VSubject& s, std::vector<std::uint32_t> markers) {
    s.m_Targets.clear();
    for (auto m : markers) {
      VSubject::VTarget t;
      t.m_Type = VTargetTypeBase::ELocalPointToWorldPoint;
      t.m_MarkerIndices = {m};
      t.m_SegmentIndices = {0};
      s.m_Targets.push_back(t);
    }
  };
  EXPECT_TRUE(run([&](VSubject& s) { points(s, {0, 1, 2}); }).empty());
  EXPECT_THAT(run([&](VSubject& s) {
                points(s, {0, 1, 1});
              }),
              ElementsAre("A rigid body must have at least 3 markers!"));
}

TEST(RigidBodyEdits, AddThenRemoveKeepsTheSubjectValid) {
  const auto valid = MakeValidSubject();
  VSubject subject;
  ASSERT_TRUE(SubjectFromParametrised(valid.m_Subject, subject));
  auto appData = valid.m_AppData;
  const VBody body = MakeBody("");
  ZMT::VLogCapture capture;
  ASSERT_TRUE(AddRigidBody(subject, appData, body.m_Subject, body.m_AppData, "Thigh"));
  EXPECT_TRUE(SubjectCheck(subject));
  ASSERT_EQ(subject.m_Segments.size(), 5u);
  EXPECT_EQ(subject.m_Segments[4].m_ParentSegmentIndex.Value(), 1u);
  EXPECT_EQ(subject.m_Segments[4].m_TreeDepth, 2u);
  EXPECT_THAT(subject.m_Targets.back().m_MarkerIndices, ElementsAre(6, 7, 8));
  EXPECT_EQ(subject.m_Targets.back().m_State, body.m_Subject.m_Targets[0].m_State);
  EXPECT_EQ(appData.m_Markers.size(), subject.m_Markers.size());

  ASSERT_TRUE(RemoveRigidBody(subject, subject.m_Targets.size() - 1, &appData));
  VSubject original;
  ASSERT_TRUE(SubjectFromParametrised(valid.m_Subject, original));
  EXPECT_EQ(subject, original);
  EXPECT_EQ(appData.m_Markers.size(), original.m_Markers.size());
  EXPECT_TRUE(capture.Records().empty());

  // Removing the subject's own rigid body (on the dummy Head, kept) renumbers nothing before it.
  ASSERT_TRUE(RemoveRigidBody(subject, 3, &appData));
  EXPECT_TRUE(SubjectCheck(subject));
  EXPECT_EQ(subject.m_Markers.size(), 3u);
  EXPECT_EQ(subject.m_Segments.size(), 4u);
  EXPECT_EQ(appData.m_Targets.size(), subject.m_Targets.size());
}

TEST(RigidBodyEdits, RemovalRenumbersMarkersOfLaterTargets) {
  VSubject subject;
  ASSERT_TRUE(SubjectFromParametrised(MakeValidSubject().m_Subject, subject));
  // Move the rigid body's markers to the front: later targets' indices must follow.
  std::rotate(subject.m_Markers.begin(), subject.m_Markers.begin() + 3, subject.m_Markers.end());
  for (auto& t : subject.m_Targets)
    for (auto& m : t.m_MarkerIndices)
      m = (m + 3) % 6;
  ASSERT_TRUE(SubjectCheck(subject));
  ASSERT_TRUE(RemoveRigidBody(subject, 3));
  EXPECT_THAT(subject.m_Targets[0].m_MarkerIndices, ElementsAre(0));
  EXPECT_THAT(subject.m_Targets[2].m_MarkerIndices, ElementsAre(2));
  EXPECT_EQ(subject.m_Markers[2].m_Name, "KNE");
  EXPECT_TRUE(SubjectCheck(subject));
}

TEST(RigidBodyEdits, Refusals) {
  VSubject subject;
  ASSERT_TRUE(SubjectFromParametrised(MakeValidSubject().m_Subject, subject));
  auto appData = MakeValidSubject().m_AppData;
  const VSubject before = subject;
  VBody body = MakeBody("");
  ZMT::VLogCapture capture;
  EXPECT_FALSE(AddRigidBody(subject, appData, body.m_Subject, body.m_AppData, "Tail"));
  VBody clash = MakeBody("");
  clash.m_Subject.m_Markers[1].m_Name = "KNE";
  EXPECT_FALSE(AddRigidBody(subject, appData, clash.m_Subject, clash.m_AppData, "Thigh"));
  VBody noApp = MakeBody("");
  noApp.m_AppData.m_Markers.pop_back();
  EXPECT_FALSE(AddRigidBody(subject, appData, noApp.m_Subject, noApp.m_AppData, "Thigh"));
  VBody ball = MakeBody("");
  ball.m_Subject.m_Segments[0].m_Joint.m_JointType = VJointTypeBase::EBall;
  EXPECT_FALSE(AddRigidBody(subject, appData, ball.m_Subject, ball.m_AppData, "Thigh"));
  EXPECT_FALSE(RemoveRigidBody(subject, 9));
  EXPECT_FALSE(RemoveRigidBody(subject, 0));
  // A point target that uses a marker of the body.
  subject.m_Targets[0].m_MarkerIndices = {4};
  EXPECT_FALSE(RemoveRigidBody(subject, 3));
  subject.m_Targets[0] = before.m_Targets[0];
  // A segment hung below the body's segment.
  subject.m_Segments.push_back(subject.m_Segments[3]);
  subject.m_Segments.back().m_ParentSegmentIndex = 3u;
  EXPECT_FALSE(RemoveRigidBody(subject, 3));
  subject.m_Segments.pop_back();
  EXPECT_EQ(subject, before);
  EXPECT_THAT(capture.Messages(RigidBodyUtilsChannel),
              ElementsAre("Cannot attach rigid body to segment Tail the segment does not exist!",
                          "Cannot add this marker, duplicate name: KNE",
                          "RigidBodyAppData does not match RigidBody for cluster Wand",
                          "A rigid body must have a free joint as root!",
                          "Invalid inptut, subject Wand is not a rigid body!",
                          "Cannot remove ERigidBody target, out of range target index!",
                          "Cannot remove a non RigidBody target!",
                          "No other target should be associated with a target that is part of a "
                          "RigidBody!",
                          "No other segment should be parented to a RigidBody segment!"));
}

TEST(RigidBodyForms, PointsToOneTargetAndBack) {
  VSubject subject = MakeBody("").m_Subject;
  ZMT::VLogCapture capture;
  // The body's offset moves and turns its markers; the point form carries that.
  ASSERT_TRUE(ConvertToPointTargets(subject));
  ASSERT_EQ(subject.m_Targets.size(), 3u);
  const VPose offset = PoseFromAngleAxis({0.1, 0.2, 0.3}, {1, 2, 3});
  const auto p1 = Positions(3)[1];
  const Eigen::Vector3d expected =
      offset.m_Rotation * Eigen::Vector3d(p1[0], p1[1], p1[2]) + offset.m_Translation;
  EXPECT_NEAR(subject.m_Targets[1].m_State[0], expected.x(), 1e-12);
  EXPECT_NEAR(subject.m_Targets[1].m_State[2], expected.z(), 1e-12);
  EXPECT_TRUE(SubjectCheck(subject));
  EXPECT_TRUE(IsRigidBody(subject));

  VSubject twoPoints = subject;
  twoPoints.m_Targets.pop_back();

  ASSERT_TRUE(ConvertToRigidBodyTarget(subject));
  ASSERT_EQ(subject.m_Targets.size(), 1u);
  EXPECT_TRUE(SubjectCheck(subject));
  // Back to points: with an identity offset now, the same points as before.
  VSubject again = subject;
  ASSERT_TRUE(ConvertToPointTargets(again));
  EXPECT_NEAR(again.m_Targets[1].m_State[0], expected.x(), 1e-12);
  EXPECT_TRUE(capture.Messages(RigidBodyUtilsChannel).empty());

  // Already in the wanted form; not a rigid body; two points naming two markers.
  ASSERT_TRUE(ConvertToRigidBodyTarget(subject));
  VSubject hinge = subject;
  hinge.m_Segments[0].m_Joint.m_JointType = VJointTypeBase::EHinge;
  EXPECT_FALSE(ConvertToPointTargets(hinge));
  EXPECT_FALSE(ConvertToRigidBodyTarget(twoPoints));
  EXPECT_THAT(capture.Messages(RigidBodyUtilsChannel),
              ElementsAre("No conversion needed for subject Wand!",
                          "A rigid body must have a free joint as root!",
                          "Invalid input, subject Wand is not a rigid body!",
                          "A rigid body must have at least 3 markers!",
                          "Invalid input, subject Wand is not a rigid body!"));
}
