#include "ValidSubject.h"

#include "DebugServices/LogCapture.h"
#include "River/CoreOstraTypesUtils/CalibrationChecks.h"
#include "River/CoreOstraTypesUtils/SubjectEvaluation.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <functional>

using namespace CoreOstraTypesUtils;
using CoreOstraTypes::VSubject;
using CoreOstraTypes::VSubjectParametrised;
using testing::ElementsAre;
using Strings = std::vector<std::string>;

namespace {

/// The valid subject with every translation and point position driven by a parameter or zero.
VSubjectParametrised CalibrationReady() {
  VSubjectParametrised s = MakeValidSubject().m_Subject;
  s.m_Segments[1].m_PreTranslation[2] = "0";
  s.m_Targets[0].m_StateExpressions = {"HipWidth", "0", "0"};
  s.m_Targets[1].m_StateExpressions = {"-HipWidth", "0", ""};
  return s;
}

Strings Parameters(const std::function<void(VSubjectParametrised&)>& edit) {
  VSubjectParametrised s = CalibrationReady();
  edit(s);
  ZMT::VLogCapture capture;
  const bool ok = CheckParametersForCalibration(s);
  const auto messages = capture.Messages(SubjectParametrisedUtilsChannel);
  EXPECT_EQ(ok, messages.empty());
  return messages;
}

Strings Targets(const std::function<void(VSubject&)>& edit) {
  VSubject s;
  EXPECT_TRUE(SubjectFromParametrised(MakeValidSubject().m_Subject, s));
  edit(s);
  ZMT::VLogCapture capture;
  const bool ok = CheckTargetsForCalibration(s);
  const auto messages = capture.Messages(SubjectParametrisedUtilsChannel);
  EXPECT_EQ(ok, messages.empty());
  return messages;
}

/// Keeps the two point targets and the rotation and direction targets, and markers 0 and 1.
void PointsOnly(VSubject& s) {
  s.m_Targets.erase(s.m_Targets.begin() + 2, s.m_Targets.begin() + 4);
  s.m_Markers.resize(2);
}

} // namespace

TEST(CalibrationChecks, ParameterForms) {
  EXPECT_TRUE(Parameters([](VSubjectParametrised&) {}).empty());
  EXPECT_THAT(
      Parameters([](VSubjectParametrised& s) { s.m_Segments[1].m_PreTranslation[2] = "5"; }),
      ElementsAre("Non zero translation constant"));
  EXPECT_THAT(Parameters([](VSubjectParametrised& s) {
                s.m_Targets[0].m_StateExpressions[1] = "'Leg Length'/100";
              }),
              ElementsAre("Non zero marker constant"));
  EXPECT_THAT(Parameters([](VSubjectParametrised& s) {
                s.m_Segments[0].m_PreRotation[2] = "ThighLength*0.001";
              }),
              ElementsAre("Shared rotation and translation parameter"));
  EXPECT_THAT(Parameters([](VSubjectParametrised& s) {
                s.m_Segments[2].m_PreRotation[0] = "HipWidth/1000";
              }),
              ElementsAre("Shared rotation and marker parameter",
                          "Shared rotation and translation parameter"));
}

TEST(CalibrationChecks, OneTargetPerMarker) {
  EXPECT_TRUE(Targets(PointsOnly).empty());
  EXPECT_THAT(Targets([](VSubject&) {}),
              ElementsAre("Cannot calibrate target type", "Cannot calibrate target type",
                          "Cannot calibrate all the markers, some markers have no associated "
                          "target"));
  EXPECT_THAT(Targets([](VSubject& s) {
                PointsOnly(s);
                s.m_Targets.push_back(s.m_Targets[0]);
              }),
              ElementsAre("There cannot be more than one target per marker"));
  EXPECT_THAT(Targets([](VSubject& s) {
                PointsOnly(s);
                s.m_Targets[0].m_MarkerIndices = {0, 1};
              }),
              ElementsAre("The calibrator can only use subjects with one target per marker.",
                          "There cannot be more than one target per marker"));
}
