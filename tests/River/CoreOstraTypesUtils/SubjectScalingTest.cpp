#include "ValidSubject.h"

#include "DebugServices/LogCapture.h"
#include "River/CoreOstraTypesUtils/SubjectCheck.h"
#include "River/CoreOstraTypesUtils/SubjectEvaluation.h"
#include "River/CoreOstraTypesUtils/SubjectScaling.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

using namespace CoreOstraTypesUtils;
using CoreOstraTypes::VJointTypeBase;
using CoreOstraTypes::VSubject;
using CoreOstraTypes::VTargetTypeBase;
using testing::ElementsAre;

TEST(SubjectScaling, LengthsScaleAnglesStayAndTheSubjectStaysValid) {
  VSubject subject;
  ASSERT_TRUE(SubjectFromParametrised(MakeValidSubject().m_Subject, subject));
  subject.m_Segments[0].m_Joint.m_Covariance = Identity(6, 1.0);
  subject.m_Segments[0].m_Joint.m_Covariance[1 * 6 + 4] = 0.5; // rotation-translation term
  subject.m_Segments[0].m_Joint.m_Covariance[4 * 6 + 1] = 0.5;
  const VSubject before = subject;
  ASSERT_TRUE(ScaleSubject(subject, 2.0));
  EXPECT_TRUE(SubjectCheck(subject));

  EXPECT_THAT(subject.m_Segments[1].m_PreTranslation, ElementsAre(100, 0, -180));
  EXPECT_EQ(subject.m_Segments[1].m_PreRotation, before.m_Segments[1].m_PreRotation);
  EXPECT_EQ(subject.m_Segments[0].m_Bounds[0], -200.0);
  const auto& free = subject.m_Segments[0].m_Joint.m_Covariance;
  EXPECT_EQ(free[0], 1.0);         // rotation variance
  EXPECT_EQ(free[5 * 6 + 5], 4.0); // translation variance
  EXPECT_EQ(free[1 * 6 + 4], 1.0); // rotation-translation covariance
  EXPECT_EQ(subject.m_Segments[1].m_Joint.m_RangeMatrix, Identity(3, 2.0)); // ball: angles
  EXPECT_EQ(subject.m_Markers[0].m_Radius, 14.0);

  const auto& t = subject.m_Targets;
  EXPECT_THAT(t[0].m_State, ElementsAre(200, 40, 60));
  EXPECT_EQ(t[1].m_Covariance, Identity(3, 8.0));
  EXPECT_THAT(t[2].m_State, ElementsAre(0, 0, -400, 0, 0, 1)); // direction of the line stays
  EXPECT_EQ(t[2].m_Covariance, Identity(2, 4.0));
  EXPECT_THAT(std::vector<double>(t[3].m_State.begin(), t[3].m_State.begin() + 7),
              ElementsAre(0.1, 0.2, 0.3, 2, 4, 6, 20));
  EXPECT_EQ(t[3].m_Covariance[36], 20.0);
  EXPECT_EQ(t[4].m_State, before.m_Targets[4].m_State); // rotation
  EXPECT_EQ(t[5].m_State, before.m_Targets[5].m_State); // direction
}

TEST(SubjectScaling, SliderRangeKeepsScaledStatesInRange) {
  VSubject::VJoint slider;
  slider.m_JointType = VJointTypeBase::ESlider;
  slider.m_Mean = {5};
  slider.m_Covariance = {4};
  slider.m_RangeCentringState = {10};
  slider.m_RangeMatrix = {0.25}; // 6 to 14
  ASSERT_TRUE(ScaleJoint(slider, 3.0));
  EXPECT_THAT(slider.m_Mean, ElementsAre(15));
  EXPECT_THAT(slider.m_Covariance, ElementsAre(36));
  // The range edges 6 and 14 become 18 and 42.
  EXPECT_DOUBLE_EQ(slider.m_RangeMatrix[0] * (42 - slider.m_RangeCentringState[0]), 1.0);
  EXPECT_DOUBLE_EQ(slider.m_RangeMatrix[0] * (18 - slider.m_RangeCentringState[0]), -1.0);
}

TEST(SubjectScaling, RefusalsLeaveTheSubjectUntouched) {
  VSubject subject;
  ASSERT_TRUE(SubjectFromParametrised(MakeValidSubject().m_Subject, subject));
  const VSubject before = subject;
  ZMT::VLogCapture capture;
  EXPECT_FALSE(ScaleSubject(subject, 0.0));
  subject.m_Segments[3].m_Joint.m_JointType = VJointTypeBase::EBadJointType;
  EXPECT_FALSE(ScaleSubject(subject, 2.0));
  subject.m_Segments[3].m_Joint.m_JointType = static_cast<VJointTypeBase::EJointType>(42);
  EXPECT_FALSE(ScaleSubject(subject, 2.0));
  subject.m_Segments[3] = before.m_Segments[3];
  subject.m_Targets[5].m_Type = VTargetTypeBase::EBadTargetType;
  EXPECT_FALSE(ScaleSubject(subject, 2.0));
  subject.m_Targets[5].m_Type = static_cast<VTargetTypeBase::ETargetType>(12);
  EXPECT_FALSE(ScaleSubject(subject, 2.0));
  subject.m_Targets[5] = before.m_Targets[5];
  EXPECT_EQ(subject, before);
  EXPECT_THAT(capture.Messages(SubjectUtilsChannel),
              ElementsAre("Cannot scale subject Walker by 0", "Cannot scale bad joint",
                          "Cannot scale unknown joint", "Cannot scale bad target",
                          "Unknown target type"));
}
