#include "ValidSubject.h"

#include "DebugServices/AssertFail.h"
#include "DebugServices/LogCapture.h"
#include "River/CoreOstraTypesUtils/SubjectCheck.h"
#include "River/CoreOstraTypesUtils/SubjectEvaluation.h"
#include "River/CoreOstraTypesUtils/SubjectScaling.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

using namespace CoreOstraTypesUtils;
using CoreOstraTypes::VJointTypeBase;
using CoreOstraTypes::VSubject;
using CoreOstraTypes::VSubjectParametrised;
using CoreOstraTypes::VTargetTypeBase;
using testing::ElementsAre;

namespace {

// The walker with statistics on its free root that have lengths in them.
VSubjectParametrised Walker() {
  VSubjectParametrised s = MakeValidSubject().m_Subject;
  auto& pelvis = s.m_Segments[0];
  pelvis.m_Joint.m_BindPose = {0.1, 0.2, 0.3, 1, 2, 3};
  pelvis.m_Joint.m_TemplateRangeCentringState = {0, 0, 0, 10, 20, 30};
  pelvis.m_Joint.m_TemplateRangeMatrix = Identity(6);
  pelvis.m_InversePostTranslation = {1, 2, 3};
  pelvis.m_InversePostRotation = {0.5, 0, 0};
  pelvis.m_MassCentreExpressions = {"0", "", "HipWidth"};
  s.m_TPoseConstraints.assign(10, {});
  s.m_TPoseConstraints[3] = 5.0; // pelvis x
  s.m_TPoseConstraints[6] = 0.5; // thigh angle
  s.m_Targets[0].m_PlacementCovariance = Identity(3);
  return s;
}

void ExpectNear(const std::vector<double>& a, const std::vector<double>& b) {
  ASSERT_EQ(a.size(), b.size());
  for (std::size_t i = 0; i < a.size(); ++i)
    EXPECT_NEAR(a[i], b[i], 1e-9 * (1.0 + std::abs(b[i]))) << "entry " << i;
}

template <std::size_t N> std::vector<double> V(const std::array<double, N>& a) {
  return {a.begin(), a.end()};
}

} // namespace

TEST(SubjectParametrisedScaling, ExpressionsEvaluateToScaledLengths) {
  VSubjectParametrised subject = Walker();
  const VSubjectParametrised before = subject;
  ASSERT_TRUE(ScaleSubject(subject, 2.0));
  EXPECT_TRUE(SubjectParametrisedCheck(subject));

  // Texts: numbers multiplied out, the rest wrapped, empties kept.
  EXPECT_THAT(subject.m_Segments[1].m_PreTranslation,
              ElementsAre("(HipWidth/2)*2", "0", "(-'Leg Length'*0.1)*2"));
  EXPECT_EQ(subject.m_Segments[1].m_PreRotation, before.m_Segments[1].m_PreRotation);
  EXPECT_THAT(subject.m_Segments[0].m_MassCentreExpressions, ElementsAre("0", "", "(HipWidth)*2"));
  EXPECT_EQ(subject.m_StaticParameters, before.m_StaticParameters);
  EXPECT_EQ(subject.m_DynamicParameters, before.m_DynamicParameters);

  // Values at the subject's own parameters: HipWidth 100, ThighLength 400, Leg Length 900.
  VSubject solved;
  ASSERT_TRUE(SubjectFromParametrised(subject, solved));
  EXPECT_THAT(solved.m_Segments[1].m_PreTranslation, ElementsAre(100, 0, -180));
  EXPECT_THAT(solved.m_Segments[2].m_PreTranslation, ElementsAre(0, 0, -800));
  EXPECT_THAT(solved.m_Targets[0].m_State, ElementsAre(200, 40, 60));
  EXPECT_THAT(std::vector<double>(solved.m_Targets[3].m_State.begin(),
                                  solved.m_Targets[3].m_State.begin() + 7),
              ElementsAre(0.1, 0.2, 0.3, 2, 4, 6, 20)); // body orientation stays

  // What the solved subject doesn't carry: free-joint translations are lengths, angles stay.
  const auto& pelvis = subject.m_Segments[0].m_Joint;
  EXPECT_THAT(pelvis.m_BindPose, ElementsAre(0.1, 0.2, 0.3, 2, 4, 6));
  EXPECT_THAT(pelvis.m_TemplateRangeCentringState, ElementsAre(0, 0, 0, 20, 40, 60));
  EXPECT_EQ(pelvis.m_TemplateRangeMatrix[0], 1.0);
  EXPECT_EQ(pelvis.m_TemplateRangeMatrix[3 * 6 + 3], 0.5);
  EXPECT_EQ(subject.m_Targets[0].m_TemplateCovariance, Identity(3, 4.0));
  EXPECT_EQ(subject.m_Targets[0].m_PlacementCovariance, Identity(3, 4.0));
  EXPECT_EQ(subject.m_TPoseConstraints[3].Value(), 10.0);
  EXPECT_EQ(subject.m_TPoseConstraints[6].Value(), 0.5);
  EXPECT_FALSE(subject.m_TPoseConstraints[0].IsSet());

  // A factor of 1 changes nothing, not even a text.
  VSubjectParametrised same = before;
  ASSERT_TRUE(ScaleSubject(same, 1.0));
  EXPECT_EQ(same, before);
}

TEST(SubjectParametrisedScaling, AgreesWithScalingTheSolvedSubjectAtOtherParameters) {
  const VSubjectParametrised original = Walker();
  VSubjectParametrised scaled = original;
  ASSERT_TRUE(ScaleSubject(scaled, 0.001)); // millimetres to metres
  const std::vector<std::pair<std::string, double>> values = {{"ThighLength", 350.0},
                                                              {"HipWidth", 120.0}};
  VSubject fromScaled, fromOriginal;
  ASSERT_TRUE(SubjectFromParametrised(scaled, values, fromScaled));
  ASSERT_TRUE(SubjectFromParametrised(original, values, fromOriginal));
  ASSERT_TRUE(ScaleSubject(fromOriginal, 0.001));
  ASSERT_EQ(fromScaled.m_Segments.size(), fromOriginal.m_Segments.size());
  for (std::size_t i = 0; i < fromScaled.m_Segments.size(); ++i) {
    SCOPED_TRACE("segment " + std::to_string(i));
    const auto &a = fromScaled.m_Segments[i], &b = fromOriginal.m_Segments[i];
    ExpectNear(V(a.m_PreTranslation), V(b.m_PreTranslation));
    ExpectNear(V(a.m_Bounds), V(b.m_Bounds));
    ExpectNear(V(a.m_InversePostTranslation), V(b.m_InversePostTranslation));
    ExpectNear(a.m_Joint.m_Covariance, b.m_Joint.m_Covariance);
    ExpectNear(a.m_Joint.m_RangeMatrix, b.m_Joint.m_RangeMatrix);
  }
  for (std::size_t i = 0; i < fromScaled.m_Targets.size(); ++i) {
    SCOPED_TRACE("target " + std::to_string(i));
    ExpectNear(fromScaled.m_Targets[i].m_State, fromOriginal.m_Targets[i].m_State);
    ExpectNear(fromScaled.m_Targets[i].m_Covariance, fromOriginal.m_Targets[i].m_Covariance);
  }
}

TEST(SubjectParametrisedScaling, RefusalsWarningsAndTheTPoseAssertion) {
  const VSubjectParametrised before = Walker();
  VSubjectParametrised subject = before;
  ZMT::VLogCapture capture;
  EXPECT_FALSE(ScaleSubject(subject, -1.0));
  subject.m_Segments[2].m_Joint.m_JointType = VJointTypeBase::EBadJointType;
  EXPECT_FALSE(ScaleSubject(subject, 2.0));
  subject.m_Segments[2].m_Joint.m_JointType = static_cast<VJointTypeBase::EJointType>(9);
  EXPECT_FALSE(ScaleSubject(subject, 2.0));
  subject.m_Segments[2] = before.m_Segments[2];
  subject.m_Targets[4].m_Type = VTargetTypeBase::EBadTargetType;
  EXPECT_FALSE(ScaleSubject(subject, 2.0));
  EXPECT_EQ(subject.m_Targets[4].m_Type, VTargetTypeBase::EBadTargetType);
  subject.m_Targets[4] = before.m_Targets[4];
  EXPECT_EQ(subject, before);

  // A kind the scaling does not know is carried over unscaled, with a warning.
  subject.m_Targets[0].m_Type = static_cast<VTargetTypeBase::ETargetType>(12);
  ASSERT_TRUE(ScaleSubject(subject, 2.0));
  EXPECT_EQ(subject.m_Targets[0].m_StateExpressions, before.m_Targets[0].m_StateExpressions);
  EXPECT_THAT(subject.m_Targets[1].m_StateExpressions, ElementsAre("(-HipWidth)*2", "40", "60"));
  EXPECT_THAT(capture.Messages(SubjectUtilsChannel),
              ElementsAre("Cannot scale subject Walker by -1", "Cannot scale bad joint",
                          "Cannot scale unknown joint", "Cannot scale bad target",
                          "Target type not implemented yet. Scaling may be incorrect"));
  EXPECT_EQ(capture.Records().back().Level, ZMT::ELogWarning);

  // T-pose statistics are asserted against; the scaling still goes through on them.
  std::vector<std::string> asserted;
  auto previous = DebugServices::SetAssertFailHandler(
      [&](const char* expression, const char*, int) { asserted.push_back(expression); });
  VSubjectParametrised::VJoint slider;
  slider.m_JointType = VJointTypeBase::ESlider;
  slider.m_TPoseMean = {3};
  slider.m_TPoseCovariance = {1};
  EXPECT_TRUE(ScaleJoint(slider, 2.0));
  DebugServices::SetAssertFailHandler(previous);
  ASSERT_EQ(asserted.size(), 1u);
  EXPECT_THAT(asserted[0], testing::HasSubstr("m_TPoseCovariance.empty()"));
  EXPECT_THAT(slider.m_TPoseMean, ElementsAre(6));
  EXPECT_THAT(slider.m_TPoseCovariance, ElementsAre(4));
}

TEST(SubjectParametrisedScaling, ExpressionTexts) {
  EXPECT_EQ(ScaleExpression("12.5", 2.0), "25");
  EXPECT_EQ(ScaleExpression(" -3 ", 0.5), "-1.5");
  EXPECT_EQ(ScaleExpression("", 2.0), "");
  // Names strtod would read as numbers are names here.
  EXPECT_EQ(ScaleExpression("nan", 2.0), "(nan)*2");
  EXPECT_EQ(ScaleExpression("a+b", 0.1), "(a+b)*0.10000000000000001");
}
