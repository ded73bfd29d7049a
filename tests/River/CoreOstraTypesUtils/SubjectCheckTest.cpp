#include "ValidSubject.h"

#include "DebugServices/LogCapture.h"
#include "River/CoreOstraTypesUtils/CovarianceTest.h"
#include "River/CoreOstraTypesUtils/SubjectCheck.h"
#include "River/CoreOstraTypesUtils/SubjectEvaluation.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <functional>

using namespace CoreOstraTypesUtils;
using CoreOstraTypes::VSubject;
using CoreOstraTypes::VSubjectParametrised;
using CoreOstraTypes::VTargetTypeBase;
using testing::ElementsAre;
using testing::ElementsAreArray;
using Strings = std::vector<std::string>;

namespace {

// Target indices of MakeValidSubject.
enum { EPoint, EGaussian, ELine, EBody, ERotation, EDirection };

VSubject ValidSolved() {
  VSubject solved;
  EXPECT_TRUE(SubjectFromParametrised(MakeValidSubject().m_Subject, solved));
  return solved;
}

/// Runs SubjectCheck on the valid subject after `edit`; the messages of the check's channel.
Strings CheckAfter(const std::function<void(VSubject&)>& edit, bool* pResult = nullptr) {
  VSubject subject = ValidSolved();
  edit(subject);
  ZMT::VLogCapture capture;
  const bool result = SubjectCheck(subject);
  if (pResult) *pResult = result;
  for (const auto& record : capture.Records()) {
    EXPECT_EQ(record.Level, ZMT::ELogError) << record.Message;
    EXPECT_EQ(record.Channel, SubjectCheckChannel) << record.Message;
  }
  const Strings messages = capture.Messages(SubjectCheckChannel);
  EXPECT_EQ(result, messages.empty());
  return messages;
}

// Breaks the first segment after the targets so that a test can see the segment stage not run.
void BreakSegments(VSubject& s) {
  s.m_Segments[1].m_TreeDepth = 7;
}

} // namespace

TEST(CovarianceTest, SquareSymmetricPositiveDefiniteOrZero) {
  EXPECT_TRUE(IsValidCovariance(Identity(3)));
  EXPECT_TRUE(IsValidCovariance(std::vector<double>(9, 0.0))); // no information
  EXPECT_FALSE(IsValidCovariance({}));
  EXPECT_FALSE(IsValidCovariance({1, 0, 0, 1, 0}));          // not square
  EXPECT_FALSE(IsValidCovariance({1, 1, 1, 1}));             // singular
  EXPECT_FALSE(IsValidCovariance({-1, 0, 0, 1}));            // negative eigenvalue
  EXPECT_FALSE(IsValidCovariance({1, 0.5, 0.5 + 1e-11, 1})); // beyond the symmetry tolerance
  EXPECT_TRUE(IsValidCovariance({1, 0.5, 0.5 + 1e-13, 1}));  // within it
  auto rigid = std::vector<double>(36 + 9, 0.0);
  EXPECT_TRUE(IsValidRigidBodyCovariance(rigid));
  rigid[36] = -1.0;
  EXPECT_FALSE(IsValidRigidBodyCovariance(rigid));
  EXPECT_FALSE(IsValidRigidBodyCovariance(std::vector<double>(40, 0.0)));
}

TEST(SubjectCheck, ValidSubjectsPassSilently) {
  EXPECT_TRUE(CheckAfter([](VSubject&) {}).empty());
  // No segments at all is no segment failure; with no targets, nothing else to check.
  bool result = false;
  EXPECT_TRUE(
      CheckAfter([](VSubject& s) { s.m_Segments.clear(), s.m_Targets.clear(); }, &result).empty());
  EXPECT_TRUE(result);
  // An all-zero target covariance is "no information" and valid.
  EXPECT_TRUE(
      CheckAfter([](VSubject& s) { s.m_Targets[EGaussian].m_Covariance.assign(9, 0.0); }).empty());
}

TEST(SubjectCheck, DuplicateMarkersEndTheCheckAtOnce) {
  const auto id = CoreOstraTypes::NameHash("LASI");
  EXPECT_THAT(CheckAfter([&](VSubject& s) {
                s.m_Markers[2].m_MarkerId = id;
                s.m_Targets[EPoint].m_State.clear(); // targets would fail too
              }),
              ElementsAre("Marker duplicate id: " + std::to_string(id)));
  // The same name gives the same id, which is found first.
  EXPECT_THAT(CheckAfter([&](VSubject& s) { s.m_Markers[2] = s.m_Markers[0]; }),
              ElementsAre("Marker duplicate id: " + std::to_string(id)));
  EXPECT_THAT(CheckAfter([](VSubject& s) { s.m_Markers[2].m_Name = "LASI"; }),
              ElementsAre("Marker duplicate name: LASI"));
}

struct VTargetCase {
  const char* m_pWhat;
  std::function<void(VSubject&)> m_Edit;
  Strings m_Expected;
};

TEST(SubjectCheck, EachTargetRuleReportsAndStopsBeforeSegments) {
  const std::vector<VTargetCase> cases = {
      {"point with two markers",
       [](VSubject& s) {
         s.m_Targets[EPoint].m_MarkerIndices = {0, 1};
       },
       {"Incorrect number of markers, ELocalPointToWorldPoint type expects 1 marker"}},
      {"direction with a marker",
       [](VSubject& s) { s.m_Targets[EDirection].m_MarkerIndices = {0}; },
       {"Incorrect number of markers, ELocalDirectionToWorldDirection type expects no markers"}},
      {"rigid body with two markers, state and covariance follow the count",
       [](VSubject& s) {
         s.m_Targets[EBody].m_MarkerIndices = {3, 4};
       },
       {"Incorrect number of markers, ERigidBody type expects at least 3 markers",
        "Incorrect state size, ERigidBody type expects size 3*(MarkerCount+2)",
        "Incorrect covariance size, ERigidBody type expects size 36 + 9*MarkerCount"}},
      {"point with a rotation observation",
       [](VSubject& s) { s.m_Targets[EPoint].m_RotationObservationIndices = {0}; },
       {"Incorrect number of rotation observations, ELocalPointToWorldPoint type expects no "
        "rotation observations"}},
      {"rotation without observation, spelled with a lower-case l",
       [](VSubject& s) { s.m_Targets[ERotation].m_RotationObservationIndices.clear(); },
       {"Incorrect number of rotation observations, ElocalRotationToWorldRotation type expects 1 "
        "rotation observation"}},
      {"two parent segments",
       [](VSubject& s) {
         s.m_Targets[ELine].m_SegmentIndices = {1, 2};
       },
       {"Incorrect number of parent segments, ELocalLineToWorldPointGaussian type expects 1 "
        "segment"}},
      {"point state of 4",
       [](VSubject& s) { s.m_Targets[EPoint].m_State.push_back(1.0); },
       {"Incorrect state size, ELocalPointToWorldPoint type expects size 3"}},
      {"gaussian covariance of 8",
       [](VSubject& s) { s.m_Targets[EGaussian].m_Covariance.pop_back(); },
       {"Incorrect covariance size, ELocalPointToWorldPointGaussian type expects size 9"}},
      {"line covariance of 9",
       [](VSubject& s) { s.m_Targets[ELine].m_Covariance = Identity(3); },
       {"Incorrect covariance size, ELocalLineToWorldPointGaussian type expects size 4"}},
      {"rotation with a covariance",
       [](VSubject& s) { s.m_Targets[ERotation].m_Covariance = {1}; },
       {"Incorrect covariance size, ElocalRotationToWorldRotation type expects size 0"}},
      {"asymmetric gaussian covariance",
       [](VSubject& s) { s.m_Targets[EGaussian].m_Covariance[1] = 0.5; },
       {"Invalid target covariance matrix"}},
      {"negative rigid body marker block",
       [](VSubject& s) { s.m_Targets[EBody].m_Covariance[36 + 9] = -5.0; },
       {"Invalid target covariance matrix"}},
      {"bad rotation behaviour",
       [](VSubject& s) {
         s.m_Targets[ERotation].m_RotationCalibrationBehaviour = VTargetTypeBase::EBadBehaviourType;
       },
       {"Invalid rotation calibration behaviour"}},
      {"hinge-like without orientation",
       [](VSubject& s) { s.m_Targets[ERotation].m_RotationTargetOrientation.clear(); },
       {"Incorrect rotation target orientation size. Expected 3. Actual 0 "}},
      {"other behaviour with an orientation",
       [](VSubject& s) {
         s.m_Targets[ERotation].m_RotationCalibrationBehaviour = VTargetTypeBase::EOther;
       },
       {"Incorrect rotation target orientation size. Expected 0. Actual 3"}},
      {"direction not unit",
       [](VSubject& s) {
         s.m_Targets[EDirection].m_State = {0, 0, 2};
       },
       {"Direction should be a unit vector"}},
      {"indices out of range",
       [](VSubject& s) {
         s.m_Targets[EPoint].m_MarkerIndices = {6};
         s.m_Targets[ERotation].m_RotationObservationIndices = {2};
         s.m_Targets[ELine].m_SegmentIndices = {4};
       },
       {"Out of range marker index 6", "Out of range segment index 4",
        "Out of range rotation observation index 2"}},
      {"view normal of length 3",
       [](VSubject& s) {
         s.m_Targets[EGaussian].m_ViewNormals = {{0, 3, 0}};
       },
       {"Invalid target view normals"}},
      {"view normals not one per marker",
       [](VSubject& s) {
         s.m_Targets[EBody].m_ViewNormals = {{0, 0, 1}};
       },
       {"Invalid target view normals"}},
      {"unknown type",
       [](VSubject& s) { s.m_Targets[EPoint].m_Type = VTargetTypeBase::EBadTargetType; },
       {"Unknown target type"}},
  };
  for (const auto& c : cases) {
    bool result = true;
    const Strings messages = CheckAfter(
        [&c](VSubject& s) {
          c.m_Edit(s);
          BreakSegments(s);
        },
        &result);
    EXPECT_FALSE(result) << c.m_pWhat;
    EXPECT_THAT(messages, ElementsAreArray(c.m_Expected)) << c.m_pWhat;
  }
  // Every target is checked before the stage fails.
  EXPECT_THAT(CheckAfter([](VSubject& s) {
                s.m_Targets[EPoint].m_State.clear();
                s.m_Targets[EDirection].m_State = {1, 1, 0};
              }),
              ElementsAre("Incorrect state size, ELocalPointToWorldPoint type expects size 3",
                          "Direction should be a unit vector"));
  ZMT::VLogCapture capture;
  EXPECT_FALSE(CheckTarget(ValidSolved(), 6));
  EXPECT_THAT(capture.Messages(SubjectCheckChannel), ElementsAre("Out-of-range target index 6"));
}

TEST(SubjectCheck, JointAndSegmentRules) {
  const std::vector<VTargetCase> cases = {
      {"mean size",
       [](VSubject& s) { s.m_Segments[1].m_Joint.m_Mean.pop_back(); },
       {"Incorrent 'Mean' vector size."}},
      {"covariance size",
       [](VSubject& s) { s.m_Segments[1].m_Joint.m_Covariance.push_back(0); },
       {"Incorrect 'Covariance' vector size."}},
      {"covariance not positive",
       [](VSubject& s) { s.m_Segments[1].m_Joint.m_Covariance[0] = -1; },
       {"Invalid joint covariance matrix"}},
      {"range centring size",
       [](VSubject& s) {
         s.m_Segments[1].m_Joint.m_RangeCentringState = {0, 0};
       },
       {"Incorrect 'RangeCenteringState' vector size."}},
      {"range matrix size",
       [](VSubject& s) { s.m_Segments[1].m_Joint.m_RangeMatrix = Identity(2); },
       {"Incorrect 'RangeMatrix' size."}},
      {"range matrix singular",
       [](VSubject& s) { s.m_Segments[1].m_Joint.m_RangeMatrix.assign(9, 1.0); },
       {"Invalid joint range matrix"}},
      {"range centring without matrix",
       [](VSubject& s) { s.m_Segments[1].m_Joint.m_RangeMatrix.clear(); },
       {"Inconsistent range information."}},
      {"dummy joint with a mean and a covariance (the later break lands here too)",
       [](VSubject& s) { s.m_Segments[3].m_Joint.m_Mean = {0}; },
       {"Incorrent 'Mean' vector size.", "Incorrect 'Covariance' vector size."}},
      {"segment index",
       [](VSubject& s) { s.m_Segments[2].m_SegmentIndex = 5; },
       {"Inconsistent segment index."}},
      {"root depth and parent",
       [](VSubject& s) {
         s.m_Segments[0].m_TreeDepth = 1;
         s.m_Segments[0].m_ParentSegmentIndex = 0u;
       },
       {"The tree depth of the root must be equal to 0.",
        "The parent segment of the root segment must not be set."}},
      {"child without parent",
       [](VSubject& s) { s.m_Segments[2].m_ParentSegmentIndex = {}; },
       {"The parent segment of a child segment must be set."}},
      {"parent out of range",
       [](VSubject& s) { s.m_Segments[2].m_ParentSegmentIndex = 9u; },
       {"Out-of-range parent segment index."}},
      {"parent after child",
       [](VSubject& s) { s.m_Segments[2].m_ParentSegmentIndex = 3u; },
       {"The segments are not in depth-first order."}},
      {"child depth",
       [](VSubject& s) { s.m_Segments[2].m_TreeDepth = 1; },
       {"The tree depth of a child must be equal to the parent depth + 1"}},
      {"joint and segment rules of one segment both report",
       [](VSubject& s) {
         s.m_Segments[2].m_Joint.m_Mean.clear();
         s.m_Segments[2].m_TreeDepth = 1;
       },
       {"Incorrent 'Mean' vector size.",
        "The tree depth of a child must be equal to the parent depth + 1"}},
  };
  for (const auto& c : cases) {
    // A later segment is broken too: the first failing segment ends the check.
    const Strings messages = CheckAfter([&c](VSubject& s) {
      c.m_Edit(s);
      s.m_Segments[3].m_Joint.m_Covariance = {1};
    });
    EXPECT_THAT(messages, ElementsAreArray(c.m_Expected)) << c.m_pWhat;
  }
}

TEST(SubjectCheck, SuppressedChannelKeepsTheResult) {
  VSubject subject = ValidSolved();
  subject.m_Targets[EPoint].m_State.clear();
  ZMT::VLogCapture capture;
  ZMT::GlobalLog().SetLevel(SubjectCheckChannel, ZMT::ELogFatal);
  EXPECT_FALSE(SubjectCheck(subject));
  ZMT::GlobalLog().ResetLevels();
  EXPECT_TRUE(capture.Records().empty());
}
