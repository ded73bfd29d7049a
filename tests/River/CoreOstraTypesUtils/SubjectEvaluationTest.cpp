#include "ValidSubject.h"

#include "DebugServices/LogCapture.h"
#include "River/CoreOstraTypesUtils/SubjectCheck.h"
#include "River/CoreOstraTypesUtils/SubjectEvaluation.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

using namespace CoreOstraTypesUtils;
using CoreOstraTypes::VJointTypeBase;
using CoreOstraTypes::VSubject;
using CoreOstraTypes::VSubjectParametrised;
using testing::ElementsAre;
using testing::ElementsAreArray;
using Strings = std::vector<std::string>;

TEST(SubjectEvaluation, GivenParametersGiveTheExpressionsValues) {
  const auto valid = MakeValidSubject();
  VSubject solved;
  ZMT::VLogCapture capture;
  ASSERT_TRUE(
      SubjectFromParametrised(valid.m_Subject, {{"ThighLength", 420.5}, {"HipWidth", 88}}, solved));
  EXPECT_TRUE(capture.Records().empty());
  // Height 1800 (user value), Leg Length = Height*0.5 = 900.
  const auto& seg = solved.m_Segments;
  ASSERT_EQ(seg.size(), 4u);
  EXPECT_THAT(seg[0].m_Bounds, ElementsAre(-88, -50, -50, 88, 50, 90));
  EXPECT_THAT(seg[1].m_PreTranslation, ElementsAre(44, 0, -90));
  EXPECT_THAT(seg[1].m_PreRotation, ElementsAre(0.1, 0, -0.25));
  EXPECT_THAT(seg[2].m_PreTranslation, ElementsAre(0, 0, -420.5));
  EXPECT_EQ(seg[2].m_Joint.m_JointOrientation,
            valid.m_Subject.m_Segments[2].m_Joint.m_JointOrientation);
  EXPECT_EQ(seg[1].m_Joint.m_RangeMatrix, Identity(3, 2.0));
  EXPECT_EQ(seg[2].m_ParentSegmentIndex.Value(), 1u);
  EXPECT_EQ(seg[2].m_TreeDepth, 2u);
  const auto& targets = solved.m_Targets;
  EXPECT_THAT(targets[0].m_State, ElementsAre(88, 20, 30));
  EXPECT_THAT(targets[1].m_State, ElementsAre(-88, 20, 30));
  EXPECT_THAT(targets[2].m_State, ElementsAre(0, 0, -210.25, 0, 0, 1));
  EXPECT_EQ(targets[3].m_State.size(), 15u);
  EXPECT_EQ(targets[1].m_Covariance, valid.m_Subject.m_Targets[1].m_Covariance);
  EXPECT_EQ(targets[4].m_RotationObservationIndices, std::vector<std::uint32_t>{0});
  ASSERT_EQ(solved.m_Markers.size(), 6u);
  EXPECT_EQ(solved.m_Markers[2].m_Name, "KNE");
  EXPECT_EQ(solved.m_Markers[2].m_MarkerId, CoreOstraTypes::NameHash("KNE"));
  EXPECT_EQ(solved.m_Markers[2].m_Radius, 7.0);
  EXPECT_EQ(solved.m_Rotations, valid.m_Subject.m_Rotations);
  EXPECT_EQ(solved.m_SubjectId, valid.m_Subject.m_SubjectId);

  // Own values and priors.
  ASSERT_TRUE(SubjectFromParametrised(valid.m_Subject, solved));
  EXPECT_THAT(solved.m_Segments[2].m_PreTranslation, ElementsAre(0, 0, -400));
  ASSERT_TRUE(SubjectFromParametrised(valid.m_Subject, solved, EParameterValues::EPrior));
  EXPECT_THAT(solved.m_Segments[2].m_PreTranslation, ElementsAre(0, 0, -380));
  EXPECT_THAT(solved.m_Segments[1].m_PreTranslation, ElementsAre(45, 0, -90));
}

TEST(SubjectEvaluation, EvaluatorReusesItsRecordForNewValues) {
  VSubjectEvaluator evaluator;
  ASSERT_TRUE(evaluator.SetSubject(MakeValidSubject().m_Subject));
  VSubject reused;
  ASSERT_TRUE(evaluator.Evaluate(reused));
  ASSERT_TRUE(evaluator.SetParameter(std::size_t{0}, 333.0)); // ThighLength
  ASSERT_TRUE(evaluator.Evaluate(reused));
  VSubject fresh;
  ASSERT_TRUE(
      SubjectFromParametrised(MakeValidSubject().m_Subject, {{"ThighLength", 333.0}}, fresh));
  EXPECT_EQ(reused, fresh);
  EXPECT_FALSE(evaluator.SetParameter(std::size_t{2}, 1.0));
}

TEST(SubjectEvaluation, EveryBadSegmentAndTargetIsNamed) {
  auto valid = MakeValidSubject();
  auto& s = valid.m_Subject;
  s.m_Segments[1].m_PreRotation[2] = "sin(";
  s.m_Segments[2].m_Bounds[4] = "Unknown*2";
  s.m_Segments[2].m_PreTranslation[0] = "1/";
  s.m_Segments[3].m_Joint.m_JointType = VJointTypeBase::EBadJointType;
  s.m_Targets[1].m_StateExpressions[0] = "HipWidth +";
  ZMT::VLogCapture capture;
  VSubject solved;
  EXPECT_FALSE(SubjectFromParametrised(s, solved));
  EXPECT_THAT(capture.Messages(SubjectUtilsChannel),
              ElementsAre("Could not evaluate m_PreRotation expressions in segment 'Thigh'",
                          "Could not evaluate m_PreTranslation expressions in segment 'Shank'",
                          "Could not evaluate m_Bounds expressions in segment 'Shank'",
                          "Could not generate joint for segment 'Head'",
                          "Could not evaluate state expressions in target"));
}

TEST(SubjectEvaluation, RefusalsOfParametersAndTargets) {
  VSubject solved;
  {
    ZMT::VLogCapture capture;
    EXPECT_FALSE(SubjectFromParametrised(MakeValidSubject().m_Subject, {{"Femur", 1.0}}, solved));
    EXPECT_THAT(capture.Messages(SubjectUtilsChannel), ElementsAre("Missing parameter Femur"));
  }
  {
    auto valid = MakeValidSubject();
    valid.m_Subject.m_StaticParameters[1].m_DefaultExpression = "Nope*2";
    ZMT::VLogCapture capture;
    EXPECT_FALSE(SubjectFromParametrised(valid.m_Subject, solved));
    EXPECT_THAT(capture.Messages(SubjectUtilsChannel),
                ElementsAre("Error parsing subject static parameter expressions"));
  }
  {
    auto valid = MakeValidSubject();
    auto& target = valid.m_Subject.m_Targets[0];
    target.m_NumberOfDegreesOfFreedom = 1;
    target.m_StateExpressions[1] = "ThighLength"; // one parameter: fine
    VSubject one;
    EXPECT_TRUE(SubjectFromParametrised(valid.m_Subject, one));
    target.m_StateExpressions[1] = "ThighLength - HipWidth*2"; // two
    ZMT::VLogCapture capture;
    EXPECT_FALSE(SubjectFromParametrised(valid.m_Subject, solved));
    EXPECT_THAT(capture.Messages(SubjectUtilsChannel),
                ElementsAre("Multiple parameters in target not handled."));
  }
}

namespace {

struct VCase {
  const char* m_pWhat;
  std::function<void(VSubjectParametrised&)> m_Edit;
  Strings m_Expected;
};

Strings CheckParametrised(const std::function<void(VSubjectParametrised&)>& edit, bool withNames,
                          Strings* pUtils = nullptr) {
  auto valid = MakeValidSubject();
  edit(valid.m_Subject);
  ZMT::VLogCapture capture;
  const bool result =
      SubjectParametrisedCheck(valid.m_Subject, withNames ? &valid.m_AppData : nullptr);
  if (pUtils) *pUtils = capture.Messages(SubjectUtilsChannel);
  const auto messages = capture.Messages(SubjectCheckChannel);
  EXPECT_EQ(result, capture.Records().empty());
  return messages;
}

} // namespace

TEST(SubjectParametrisedCheck, ValidSubjectPassesSilently) {
  EXPECT_TRUE(CheckParametrised([](VSubjectParametrised&) {}, true).empty());
}

TEST(SubjectParametrisedCheck, EvaluationAndSolvedCheckComeFirst) {
  Strings utils;
  // A failed evaluation ends the check before the template rules (also broken here) run.
  EXPECT_TRUE(CheckParametrised(
                  [](VSubjectParametrised& s) {
                    s.m_Segments[2].m_PreTranslation[2] = "-Thigh Length";
                    s.m_Segments[1].m_Joint.m_BindPose = {1};
                  },
                  true, &utils)
                  .empty());
  EXPECT_THAT(utils,
              ElementsAre("Could not evaluate m_PreTranslation expressions in segment 'Shank'"));
  EXPECT_THAT(CheckParametrised(
                  [](VSubjectParametrised& s) {
                    s.m_Targets[0].m_StateExpressions.pop_back();
                    s.m_Segments[1].m_Joint.m_BindPose = {1};
                  },
                  true),
              ElementsAre("Incorrect state size, ELocalPointToWorldPoint type expects size 3"));
}

TEST(SubjectParametrisedCheck, JointTemplateRules) {
  using S = VSubjectParametrised;
  const std::vector<VCase> cases = {
      {"template mean size",
       [](S& s) {
         s.m_Segments[1].m_Joint.m_TemplateMean = {0, 0};
       },
       {"Incorrect 'TemplateMean' vector size."}},
      {"template covariance size",
       [](S& s) { s.m_Segments[1].m_Joint.m_TemplateCovariance = Identity(2); },
       {"Incorrect 'TemplateCovariance' size."}},
      {"template covariance invalid",
       [](S& s) { s.m_Segments[1].m_Joint.m_TemplateCovariance[4] = -1; },
       {"Invalid joint template covariance matrix"}},
      {"template mean without covariance",
       [](S& s) { s.m_Segments[1].m_Joint.m_TemplateCovariance.clear(); },
       {"Inconsistent template stats information."}},
      {"template range centring size",
       [](S& s) {
         s.m_Segments[1].m_Joint.m_TemplateRangeCentringState = {0};
         s.m_Segments[1].m_Joint.m_TemplateRangeMatrix = Identity(3);
       },
       {"Incorrect 'TemplateRangeCentringState' vector size."}},
      {"template range matrix size",
       [](S& s) {
         s.m_Segments[1].m_Joint.m_TemplateRangeCentringState = {0, 0, 0};
         s.m_Segments[1].m_Joint.m_TemplateRangeMatrix = Identity(2);
       },
       {"Incorrect 'TemplateRangeMatrix' size."}},
      {"template range matrix invalid",
       [](S& s) {
         s.m_Segments[1].m_Joint.m_TemplateRangeCentringState = {0, 0, 0};
         s.m_Segments[1].m_Joint.m_TemplateRangeMatrix.assign(9, 1.0);
       },
       {"Invalid joint range matrix"}},
      {"template range centring alone",
       [](S& s) {
         s.m_Segments[1].m_Joint.m_TemplateRangeCentringState = {0, 0, 0};
       },
       {"Inconsistent template range information."}},
      {"bind pose size",
       [](S& s) { s.m_Segments[1].m_Joint.m_BindPose = {0}; },
       {"Incorrect 'BindPose' vector size."}},
  };
  for (const auto& c : cases) {
    Strings expected = c.m_Expected;
    expected.push_back("Segment Thigh, invalid template values");
    // A target template is broken too: that stage must not run.
    EXPECT_THAT(CheckParametrised(
                    [&c](S& s) {
                      c.m_Edit(s);
                      s.m_Targets[0].m_TemplateCovariance = {1};
                    },
                    true),
                ElementsAreArray(expected))
        << c.m_pWhat;
  }
  // Every segment is checked before the stage fails.
  EXPECT_THAT(CheckParametrised(
                  [](S& s) {
                    s.m_Segments[0].m_Joint.m_BindPose = {0};
                    s.m_Segments[2].m_Joint.m_TemplateMean = {0};
                  },
                  true),
              ElementsAre("Incorrect 'BindPose' vector size.",
                          "Segment Pelvis, invalid template values",
                          "Inconsistent template stats information.",
                          "Segment Shank, invalid template values"));
}

TEST(SubjectParametrisedCheck, TargetTemplateRules) {
  using S = VSubjectParametrised;
  const std::vector<VCase> cases = {
      {"point template covariance size",
       [](S& s) { s.m_Targets[0].m_TemplateCovariance = Identity(2); },
       {"Incorrect template covariance size, ELocalPointToWorldPoint type expects size 9"}},
      {"rotation template covariance",
       [](S& s) { s.m_Targets[4].m_TemplateCovariance = {1}; },
       {"Incorrect template covariance size, ELocalRotationToWorldRotation type expects size 0"}},
      {"rigid template covariance size",
       [](S& s) { s.m_Targets[3].m_TemplateCovariance.assign(62, 0.0); },
       {"Incorrect template covariance size, ERigidBody type expects size 36 + 9*MarkerCount"}},
      {"rigid template covariance by blocks",
       [](S& s) {
         s.m_Targets[3].m_TemplateCovariance.assign(63, 0.0);
         s.m_Targets[3].m_TemplateCovariance[37] = 1.0;
       },
       {"Invalid target template covariance matrix"}},
      {"line template covariance invalid",
       [](S& s) {
         s.m_Targets[2].m_TemplateCovariance = {1, 2, 2, 1};
       },
       {"Invalid target template covariance matrix"}},
      {"negative calibration weight",
       [](S& s) { s.m_Targets[1].m_CalibrationWeight = -0.5; },
       {"Invalid target calibration weight"}},
  };
  const char* const names[] = {"T0", "T4", "T3", "T3", "T2", "T1"};
  for (std::size_t i = 0; i < cases.size(); ++i) {
    Strings expected = cases[i].m_Expected;
    expected.push_back(std::string("Target ") + names[i] + ", invalid weights or template values");
    EXPECT_THAT(CheckParametrised(cases[i].m_Edit, true), ElementsAreArray(expected))
        << cases[i].m_pWhat;
  }
  // Without application data a target is named by its index; a negative weight on a line
  // target is no fault.
  EXPECT_THAT(CheckParametrised(
                  [](S& s) {
                    s.m_Targets[2].m_CalibrationWeight = -1;
                    s.m_Targets[5].m_TemplateCovariance = {1};
                  },
                  false),
              ElementsAre("Incorrect template covariance size, ELocalDirectionToWorldDirection "
                          "type expects size 0",
                          "Target 5, invalid weights or template values"));
}

TEST(SubjectEvaluation, MissingStatisticsBecomeZerosOfTheRightSize) {
  auto valid = MakeValidSubject();
  auto& s = valid.m_Subject;
  s.m_Segments[1].m_Joint.m_Mean.clear();
  s.m_Segments[1].m_Joint.m_Covariance.clear();
  s.m_Segments[2].m_Joint.m_Mean = {0.5, 1}; // wrong, and kept so that the check sees it
  s.m_Targets[1].m_Covariance.clear();
  VSubject solved;
  ASSERT_TRUE(SubjectFromParametrised(s, solved));
  EXPECT_EQ(solved.m_Segments[1].m_Joint.m_Mean, std::vector<double>(3, 0.0));
  EXPECT_EQ(solved.m_Segments[1].m_Joint.m_Covariance, std::vector<double>(9, 0.0));
  EXPECT_EQ(solved.m_Segments[3].m_Joint.m_Covariance.size(), 0u); // dummy
  EXPECT_EQ(solved.m_Targets[1].m_Covariance, std::vector<double>(9, 0.0));
  EXPECT_EQ(solved.m_Targets[0].m_Covariance.size(), 0u); // not Gaussian
  ZMT::VLogCapture capture;
  EXPECT_FALSE(SubjectCheck(solved));
  EXPECT_THAT(capture.Messages(SubjectCheckChannel), ElementsAre("Incorrent 'Mean' vector size."));
}
