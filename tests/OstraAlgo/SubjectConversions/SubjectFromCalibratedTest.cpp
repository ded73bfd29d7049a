#include "../../River/CoreOstraTypesUtils/ValidSubject.h"
#include "SubjectCompare.h"

#include "DebugServices/LogCapture.h"
#include "OstraAlgo/KinematicAlgo/SubjectCalibratedFromRecord.h"
#include "OstraAlgo/KinematicAlgo/VCalibratedTargets.h"
#include "OstraAlgo/SubjectConversions/SubjectFromCalibrated.h"
#include "River/CoreOstraTypesUtils/SubjectCheck.h"
#include "River/CoreOstraTypesUtils/SubjectEvaluation.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

using namespace SubjectConversions;
using namespace KinematicAlgo;
using CoreOstraTypes::VSubject;
using CoreOstraTypes::VSubjectApplicationData;
using testing::ElementsAre;

namespace {

std::shared_ptr<VTargetPosition> Point(const std::string& name, std::int32_t id,
                                       std::uint32_t parent, const Eigen::Vector3d& position) {
  auto point = std::make_shared<VTargetPositionWithCovariance>(parent);
  point->SetName(name);
  point->SetIdentifier(id);
  point->SetPositionInParent(position);
  return point;
}

/// A class the record has no form for.
class VTargetElsewhere : public VTargetPosition {
public:
  using VTargetPosition::VTargetPosition;
  const char* Key() const override { return "TargetElsewhere"; }
};

} // namespace

TEST(SubjectFromCalibrated, TheRecordOfEveryKindComesBackFromItsModel) {
  VSubject original;
  ASSERT_TRUE(CoreOstraTypesUtils::SubjectFromParametrised(MakeValidSubject().m_Subject, original));
  original.m_Segments[2].m_InversePostRotation = {0, 0.3, 0};
  original.m_Segments[2].m_InversePostTranslation = {1, 2, 3};
  std::vector<std::string> errors, notes;
  const auto model = SubjectCalibratedFromRecord(original, errors, notes);
  ASSERT_NE(model, nullptr);

  VSubject back;
  VSubjectApplicationData appData;
  ZMT::VLogCapture capture;
  ASSERT_TRUE(SubjectFromCalibrated(*model, back, &appData));
  EXPECT_TRUE(capture.Records().empty());
  EXPECT_TRUE(CoreOstraTypesUtils::SubjectCheck(back));
  EXPECT_EQ(back.m_Name, original.m_Name);
  EXPECT_EQ(back.m_SubjectId, original.m_SubjectId);

  ASSERT_EQ(back.m_Segments.size(), original.m_Segments.size());
  for (std::size_t i = 0; i < back.m_Segments.size(); ++i) {
    SCOPED_TRACE(original.m_Segments[i].m_Name);
    const auto &b = back.m_Segments[i], &o = original.m_Segments[i];
    EXPECT_EQ(b.m_Name, o.m_Name);
    EXPECT_EQ(b.m_SegmentIndex, o.m_SegmentIndex);
    EXPECT_EQ(b.m_TreeDepth, o.m_TreeDepth);
    ExpectSegmentPoseNear(b, o);
    EXPECT_EQ(b.m_Bounds, o.m_Bounds);
    EXPECT_EQ(b.m_Joint.m_Name, o.m_Name); // the model names joints after their segments
    EXPECT_EQ(b.m_Joint.m_JointType, o.m_Joint.m_JointType);
    ExpectNear(b.m_Joint.m_JointOrientation, o.m_Joint.m_JointOrientation);
    EXPECT_EQ(b.m_Joint.m_Mean, o.m_Joint.m_Mean);
    EXPECT_EQ(b.m_Joint.m_Covariance, o.m_Joint.m_Covariance);
    EXPECT_EQ(b.m_Joint.m_RangeCentringState, o.m_Joint.m_RangeCentringState);
    EXPECT_EQ(b.m_Joint.m_RangeMatrix, o.m_Joint.m_RangeMatrix);
  }

  ASSERT_EQ(back.m_Markers.size(), original.m_Markers.size());
  for (std::size_t m = 0; m < back.m_Markers.size(); ++m) {
    EXPECT_EQ(back.m_Markers[m].m_Name, original.m_Markers[m].m_Name);
    EXPECT_EQ(back.m_Markers[m].m_MarkerId, original.m_Markers[m].m_MarkerId);
    EXPECT_EQ(back.m_Markers[m].m_Radius, 10.0);
  }

  ASSERT_EQ(back.m_Targets.size(), original.m_Targets.size());
  for (std::size_t t = 0; t < back.m_Targets.size(); ++t) {
    SCOPED_TRACE("target " + std::to_string(t));
    const auto &b = back.m_Targets[t], &o = original.m_Targets[t];
    EXPECT_EQ(b.m_Type, o.m_Type);
    EXPECT_EQ(b.m_MarkerIndices, o.m_MarkerIndices);
    EXPECT_EQ(b.m_SegmentIndices, o.m_SegmentIndices);
    ExpectNear(b.m_State, o.m_State);
    // The model keeps no marker blocks for a rigid body's members; the rest comes back.
    if (o.m_Type != VSubject::VTarget::ERigidBody)
      EXPECT_EQ(b.m_Covariance, o.m_Covariance);
    else
      EXPECT_EQ(b.m_Covariance, std::vector<double>(63, 0.0));
  }
  // Rotations and directions observe a rotation of their own, named after the target.
  EXPECT_THAT(back.m_Targets[4].m_RotationObservationIndices, ElementsAre(0));
  EXPECT_THAT(back.m_Targets[5].m_RotationObservationIndices, ElementsAre(1));
  ASSERT_EQ(back.m_Rotations.size(), 2u);
  EXPECT_EQ(back.m_Rotations[1].m_Name, "Target_5");
  ASSERT_EQ(appData.m_Targets.size(), 6u);
  EXPECT_EQ(appData.m_Targets[0].m_Name + appData.m_Targets[3].m_Name, "LASITarget_3");
}

TEST(SubjectFromCalibrated, AMarkersOwnCovarianceWinsWithAWarning) {
  VSubjectCalibrated model;
  model.SetName("Wand");
  model.Segments()[0].m_Value->SetName("Root");
  model.Segments()[0].m_Value->SetIdentifier(0);
  auto target = Point("Tip", 7, 0, {1, 2, 3});
  std::dynamic_pointer_cast<VTargetPositionWithCovariance>(target)->SetCovariance(
      Eigen::Matrix3d::Identity());
  auto marker = Point("Tip", 7, 0, {1, 2, 3});
  std::dynamic_pointer_cast<VTargetPositionWithCovariance>(marker)->SetCovariance(
      2 * Eigen::Matrix3d::Identity());
  model.AddTarget(target, false);
  model.AddTarget(marker, true);

  VSubject subject;
  ZMT::VLogCapture capture;
  ASSERT_TRUE(SubjectFromCalibrated(model, subject));
  EXPECT_THAT(capture.Messages(SubjectConversionChannel),
              ElementsAre("Overriding target covariance value with marker covariance"));
  ASSERT_EQ(subject.m_Targets.size(), 2u);
  EXPECT_EQ(subject.m_Targets[0].m_Covariance, Identity(3, 2.0));
  EXPECT_THAT(subject.m_Targets[0].m_MarkerIndices, ElementsAre(0));
  EXPECT_THAT(subject.m_Targets[0].m_State, ElementsAre(1, 2, 3));
  EXPECT_EQ(subject.m_SubjectId, CoreOstraTypes::NameHash("Wand"));
}

TEST(SubjectFromCalibrated, RefusalsNameTheTargetAndLeaveTheOutput) {
  struct Case {
    std::function<void(VSubjectCalibrated&)> m_Build;
    std::string m_Message;
  };
  const std::vector<Case> cases = {
      {[](auto& model) {
         model.AddTarget(Point("Tip", 1, 0, {0, 0, 0}), false);
       },
       "Target Tip observes no marker of the subject"},
      {[](auto& model) {
         model.AddTarget(Point("Tip", 1, 5, {0, 0, 0}), true);
       },
       "Target Tip is on segment 5, which the subject does not hold"},
      {[](auto& model) {
         auto body = std::make_shared<VTargetRigidBody>(0);
         body->SetName("Cluster");
         body->AddMember(Point("A", 0, 0, {1, 0, 0}));
         body->AddMember(Point("B", 1, 0, {0, 1, 0}));
         model.AddTarget(body, false);
       },
       "Rigid body Cluster has 2 markers, at least 3 are needed"},
      {[](auto& model) { model.AddTarget(std::make_shared<VTargetElsewhere>(0), false); },
       "Target Target_0 of class TargetElsewhere has no record form"},
  };
  for (const auto& c : cases) {
    SCOPED_TRACE(c.m_Message);
    VSubjectCalibrated model;
    model.SetName("Wand");
    model.Segments()[0].m_Value->SetIdentifier(0);
    c.m_Build(model);
    VSubject subject;
    subject.m_Name = "untouched";
    ZMT::VLogCapture capture;
    EXPECT_FALSE(SubjectFromCalibrated(model, subject));
    EXPECT_EQ(subject.m_Name, "untouched");
    EXPECT_THAT(capture.Messages(SubjectConversionChannel),
                ElementsAre(c.m_Message, "Cannot convert the model of subject Wand to a record"));
  }
}
