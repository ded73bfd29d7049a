#include "../../River/CoreOstraTypesUtils/ValidSubject.h"
#include "SubjectCompare.h"

#include "DebugServices/LogCapture.h"
#include "OstraAlgo/KinematicAlgo/SubjectCalibratedFromRecord.h"
#include "OstraAlgo/SubjectConversions/CalibratedFromParametrised.h"
#include "OstraAlgo/SubjectConversions/ParametrisedFromCalibrated.h"
#include "OstraAlgo/SubjectConversions/SubjectFromCalibrated.h"
#include "River/CoreOstraTypesUtils/AngleAxis.h"
#include "River/CoreOstraTypesUtils/SubjectCheck.h"
#include "River/CoreOstraTypesUtils/SubjectEvaluation.h"

#include <Eigen/Geometry>
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <cstdio>
#include <functional>

using namespace SubjectConversions;
using namespace KinematicAlgo;
using CoreOstraTypes::VSubject;
using CoreOstraTypes::VSubjectParametrised;
using testing::ElementsAre;

namespace {

constexpr const char* Incompatible =
    "Calibration paramenter information not compatible with input subject";

// Values go through expression texts and back, so they agree to rounding, not bit for bit.
constexpr double Near = 1e-9;

std::string Text(double v) {
  char buffer[32];
  std::snprintf(buffer, sizeof buffer, "%.17g", v);
  return buffer;
}

/// The walker's calibrated model, with a pose in the shank that is not the identity, and the
/// skeleton parameters that describe it.
struct VFixture {
  std::shared_ptr<VSubjectCalibrated> m_Model;
  VSkeletonParameters m_Parameters;
};

VFixture MakeFixture() {
  VSubject solved;
  EXPECT_TRUE(CoreOstraTypesUtils::SubjectFromParametrised(MakeValidSubject().m_Subject, solved));
  solved.m_Segments[2].m_InversePostRotation = {0, 0.3, 0};
  solved.m_Segments[2].m_InversePostTranslation = {1, 2, 3};
  std::vector<std::string> errors, notes;
  VFixture f;
  f.m_Model = SubjectCalibratedFromRecord(solved, errors, notes);
  EXPECT_NE(f.m_Model, nullptr);

  // The shank's pose in itself: the inverse of a rotation of 0.3 about Y, then (1, 2, 3).
  const Eigen::Matrix3d r = Eigen::AngleAxisd(0.3, Eigen::Vector3d::UnitY()).toRotationMatrix();
  const Eigen::Vector3d t = -(r.transpose() * Eigen::Vector3d(1, 2, 3));
  f.m_Parameters.SetName("Walker");
  f.m_Parameters.Parameters() = {{"Height", "", 1800, 1750, 0, false, true, true, true},
                                 {"Leg Length", "Height*0.5", 900, 0, 0, true, false, true, true},
                                 {"ThighLength", "", 400, 380, 5, false, false, true, false},
                                 {"HipWidth", "", 100, 90, 0, false, false, false, false}};
  f.m_Parameters.SegmentLinks() = {
      {"Thigh",
       {"0.1", "0", "-0.25", "HipWidth/2", "0", "-'Leg Length'*0.1", "0", "0", "0", "0", "0", "0"}},
      {"Shank",
       {"0", "0", "0", "0", "0", "-ThighLength", "0", Text(-0.3), "0", Text(t.x()), Text(t.y()),
        Text(t.z())}}};
  f.m_Parameters.MarkerLinks() = {{"LASI", {"HipWidth", "20", "30"}},
                                  {"RASI", {"-HipWidth", "20", "30"}},
                                  {"KNE", {"0", "0", "-ThighLength/2"}},
                                  {"RB2", {"0", "HipWidth/10", "0"}}}; // a rigid body member
  return f;
}

} // namespace

TEST(ParametrisedFromCalibrated, TheRecordEvaluatesToTheModelAndFollowsItsParameters) {
  const VFixture f = MakeFixture();
  VSubjectParametrised subject;
  ZMT::VLogCapture capture;
  ASSERT_TRUE(ParametrisedFromCalibrated(*f.m_Model, f.m_Parameters, subject));
  // Unlinked segments and markers keep their numbers and are named.
  EXPECT_THAT(capture.Messages(SubjectConversionChannel),
              ElementsAre("Missing expressions for segments: Pelvis, Head",
                          "Missing expressions for markers: RB1, RB3"));
  EXPECT_TRUE(CoreOstraTypesUtils::SubjectParametrisedCheck(subject));

  // Parameters: statics keep expression, value, prior and flags; dynamics value, prior, SD.
  ASSERT_EQ(subject.m_StaticParameters.size(), 2u);
  const auto& leg = subject.m_StaticParameters[1];
  EXPECT_EQ(leg.m_DefaultExpression, "Height*0.5");
  EXPECT_EQ(leg.m_UserValue.Value(), 900.0);
  EXPECT_TRUE(leg.m_Advanced);
  EXPECT_TRUE(subject.m_StaticParameters[0].m_ReadOnly);
  EXPECT_EQ(subject.m_StaticParameters[0].m_Prior.Value(), 1750.0);
  ASSERT_EQ(subject.m_DynamicParameters.size(), 2u);
  EXPECT_EQ(subject.m_DynamicParameters[0].m_Prior, 380.0);
  EXPECT_EQ(subject.m_DynamicParameters[0].m_StandardDeviation.Value(), 5.0);
  EXPECT_FALSE(subject.m_DynamicParameters[1].m_StandardDeviation.IsSet());
  EXPECT_FALSE(subject.m_DynamicParameters[1].m_Visible);

  // At the parameters' values the record is the model's subject.
  VSubject fromModel, evaluated;
  ASSERT_TRUE(SubjectFromCalibrated(*f.m_Model, fromModel));
  CoreOstraTypesUtils::VSubjectEvaluator evaluator;
  ASSERT_TRUE(evaluator.SetSubject(subject));
  ASSERT_TRUE(evaluator.Evaluate(evaluated));
  ASSERT_EQ(evaluated.m_Segments.size(), fromModel.m_Segments.size());
  for (std::size_t i = 0; i < evaluated.m_Segments.size(); ++i) {
    SCOPED_TRACE(fromModel.m_Segments[i].m_Name);
    ExpectSegmentPoseNear(evaluated.m_Segments[i], fromModel.m_Segments[i], Near);
    EXPECT_EQ(evaluated.m_Segments[i].m_Joint, fromModel.m_Segments[i].m_Joint);
  }
  ExpectNear(evaluated.m_Segments[1].m_PreTranslation, std::array{50.0, 0.0, -90.0}, Near);
  ExpectNear(evaluated.m_Segments[2].m_InversePostRotation, std::array{0.0, 0.3, 0.0}, Near);
  ExpectNear(evaluated.m_Segments[2].m_InversePostTranslation, std::array{1.0, 2.0, 3.0}, Near);
  ASSERT_EQ(evaluated.m_Targets.size(), fromModel.m_Targets.size());
  for (std::size_t t = 0; t < evaluated.m_Targets.size(); ++t)
    ExpectNear(evaluated.m_Targets[t].m_State, fromModel.m_Targets[t].m_State, Near);

  // Other values move exactly what the links tie to them.
  ASSERT_TRUE(evaluator.SetParameter("HipWidth", 120.0));
  ASSERT_TRUE(evaluator.SetParameter("ThighLength", 410.0));
  ASSERT_TRUE(evaluator.Evaluate(evaluated));
  ExpectNear(evaluated.m_Segments[1].m_PreTranslation, std::array{60.0, 0.0, -90.0}, Near);
  ExpectNear(evaluated.m_Segments[2].m_PreTranslation, std::array{0.0, 0.0, -410.0}, Near);
  ExpectNear(evaluated.m_Targets[0].m_State, std::vector{120.0, 20.0, 30.0}, Near);
  ExpectNear(evaluated.m_Targets[1].m_State, std::vector{-120.0, 20.0, 30.0}, Near);
  EXPECT_NEAR(evaluated.m_Targets[2].m_State[2], -205.0, 1e-9);
  std::vector<double> body = fromModel.m_Targets[3].m_State; // only RB2 is linked
  body[6 + 3 + 1] = 12.0;
  ExpectNear(evaluated.m_Targets[3].m_State, body, Near);
}

TEST(ParametrisedFromCalibrated, EachBrokenRuleIsNamedAndTheOutputKept) {
  struct Case {
    std::function<void(VSkeletonParameters&)> m_Break;
    std::string m_Message;
  };
  const std::vector<Case> cases = {
      {[](auto& p) {
         p.SegmentLinks().push_back({"Femur", {}});
       },
       "Cannot match segment link with name: Femur"},
      {[](auto& p) {
         p.MarkerLinks().push_back({"TOE", {"0", "0", "0"}});
       },
       "Cannot match marker link with name: TOE"},
      // Zero at every value, but not a constant the record can hold.
      {[](auto& p) { p.SegmentLinks()[0].m_Expressions[9] = "HipWidth*0"; },
       "Unexpected post-transform expression: HipWidth*0"},
      {[](auto& p) { p.SegmentLinks()[1].m_Expressions[5] = "-ThighLength*1.01"; },
       "The link of segment Shank does not give its pose"},
      {[](auto& p) { p.SegmentLinks()[1].m_Expressions[7] = "0.3"; }, // the post pose inverted
       "The link of segment Shank does not give its pose"},
      {[](auto& p) { p.MarkerLinks()[0].m_Expressions[0] = "HipWidth+1"; },
       "The link of marker LASI does not give its position"},
      {[](auto& p) { p.Parameters()[2].m_Expression = "HipWidth*4"; },
       "Skeleton parameter ThighLength is not static and has an expression"},
      {[](auto& p) { p.Parameters()[3].m_Name = "Height"; },
       "Skeleton parameter name 'Height' is empty or used twice"},
  };
  for (const auto& c : cases) {
    SCOPED_TRACE(c.m_Message);
    VFixture f = MakeFixture();
    c.m_Break(f.m_Parameters);
    VSubjectParametrised subject;
    subject.m_Name = "untouched";
    ZMT::VLogCapture capture(ZMT::ELogError);
    EXPECT_FALSE(ParametrisedFromCalibrated(*f.m_Model, f.m_Parameters, subject));
    EXPECT_EQ(subject.m_Name, "untouched");
    EXPECT_THAT(capture.Messages(SubjectConversionChannel), ElementsAre(c.m_Message, Incompatible));
  }

  // A link over a parameter the skeleton lacks says which text failed.
  VFixture f = MakeFixture();
  f.m_Parameters.MarkerLinks()[2].m_Expressions[2] = "-ShinLength";
  VSubjectParametrised subject;
  ZMT::VLogCapture capture(ZMT::ELogError);
  EXPECT_FALSE(ParametrisedFromCalibrated(*f.m_Model, f.m_Parameters, subject));
  const auto messages = capture.Messages(SubjectConversionChannel);
  ASSERT_EQ(messages.size(), 2u);
  EXPECT_THAT(messages[0], testing::StartsWith("Cannot evaluate '-ShinLength' of the link of "
                                               "marker KNE"));
  EXPECT_EQ(messages[1], Incompatible);
}

TEST(ParametrisedFromCalibrated, CalibratedToParametrisedAndBackKeepsModelAndParameters) {
  const VFixture f = MakeFixture();
  VSubjectParametrised subject;
  ASSERT_TRUE(ParametrisedFromCalibrated(*f.m_Model, f.m_Parameters, subject));
  VSkeletonParameters back;
  const auto model = CalibratedFromParametrised(subject, back);
  ASSERT_NE(model, nullptr);

  EXPECT_EQ(back.Name(), "Walker");
  EXPECT_EQ(back.Parameters(), f.m_Parameters.Parameters());
  EXPECT_EQ(back.MarkerLinks(), f.m_Parameters.MarkerLinks());
  ASSERT_EQ(back.SegmentLinks().size(), 2u);
  for (std::size_t l = 0; l < 2; ++l) {
    const auto &b = back.SegmentLinks()[l], &o = f.m_Parameters.SegmentLinks()[l];
    SCOPED_TRACE(o.m_Segment);
    EXPECT_EQ(b.m_Segment, o.m_Segment);
    for (std::size_t i = 0; i < 12; ++i) {
      if (i < 6)
        EXPECT_EQ(b.m_Expressions[i], o.m_Expressions[i]);
      else
        EXPECT_NEAR(std::stod(b.m_Expressions[i]), std::stod(o.m_Expressions[i]), 1e-12);
    }
  }

  // The model's numbers come back, and converting again gives the same record.
  VSubject before, after;
  ASSERT_TRUE(SubjectFromCalibrated(*f.m_Model, before));
  ASSERT_TRUE(SubjectFromCalibrated(*model, after));
  ASSERT_EQ(after.m_Segments.size(), before.m_Segments.size());
  for (std::size_t i = 0; i < after.m_Segments.size(); ++i) {
    SCOPED_TRACE(before.m_Segments[i].m_Name);
    const auto &a = after.m_Segments[i], &b = before.m_Segments[i];
    ExpectSegmentPoseNear(a, b, Near);
    EXPECT_EQ(a.m_Joint, b.m_Joint);
  }
  ASSERT_EQ(after.m_Targets.size(), before.m_Targets.size());
  for (std::size_t t = 0; t < after.m_Targets.size(); ++t) {
    EXPECT_EQ(after.m_Targets[t].m_Type, before.m_Targets[t].m_Type);
    ExpectNear(after.m_Targets[t].m_State, before.m_Targets[t].m_State, Near);
  }
  VSubjectParametrised again;
  ASSERT_TRUE(ParametrisedFromCalibrated(*model, back, again));
  EXPECT_EQ(again.m_StaticParameters, subject.m_StaticParameters);
  EXPECT_EQ(again.m_DynamicParameters, subject.m_DynamicParameters);
  for (std::size_t i = 0; i < again.m_Segments.size(); ++i)
    EXPECT_EQ(again.m_Segments[i].m_PreTranslation, subject.m_Segments[i].m_PreTranslation);

  // A record that does not evaluate has no model, and the parameters given stay as they were.
  VSubjectParametrised broken = subject;
  broken.m_Segments[1].m_PreTranslation[0] = "HipWidth/";
  VSkeletonParameters kept = back;
  ZMT::VLogCapture capture(ZMT::ELogError);
  EXPECT_EQ(CalibratedFromParametrised(broken, kept), nullptr);
  EXPECT_TRUE(kept.Equals(back));
  EXPECT_THAT(capture.Messages(SubjectConversionChannel),
              ElementsAre("Cannot evaluate subject Walker for its calibrated model"));
}
