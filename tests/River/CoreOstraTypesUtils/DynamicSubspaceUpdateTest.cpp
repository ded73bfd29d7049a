#include "ValidSubject.h"

#include "DebugServices/LogCapture.h"
#include "River/CoreOstraTypesUtils/DynamicSubspaceUpdate.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

using namespace CoreOstraTypesUtils;
using CoreOstraTypes::VJointTypeBase;
using CoreOstraTypes::VSubjectDynamicSubspace;
using CoreOstraTypes::VSubjectParametrised;
using testing::ElementsAre;

namespace {

// The walker's joint parameters: Pelvis 0-5 (free), Thigh 6-8 (ball), Shank 9 (hinge), Head none.
VSubjectDynamicSubspace LegSubspace(const VSubjectParametrised& subject) {
  VSubjectDynamicSubspace subspace;
  subspace.m_NumJointParameters = 10;
  subspace.m_SubjectId = subject.m_SubjectId;
  VSubjectDynamicSubspace::VPcaControlledParams leg;
  leg.m_Name = "Leg";
  leg.m_NumEffectivePrincipalComponents = 2;
  leg.m_JointParametersIndices = {6, 7, 8, 9};
  leg.m_JointParametersMean = {0.1, 0.2, 0.3, 0.4};
  leg.m_PrincipalComponents = {{"Swing", {1, 0, 0, 0}, 0.5, -1, 1, 0.1},
                               {"Bend", {0, 0.6, 0, 0.8}, 0.25, -2, 2, 0.2}};
  subspace.m_PcaControlledParams = {leg};
  return subspace;
}

// The walker with a slider segment "Spine" put between the pelvis and the thigh, so every later
// joint parameter moves up by one.
VSubjectParametrised WithSpine(VSubjectParametrised subject) {
  VSubjectParametrised::VSegment spine = subject.m_Segments[3];
  spine.m_Name = "Spine";
  spine.m_Joint.m_Name = "SpineJoint";
  spine.m_Joint.m_JointType = VJointTypeBase::ESlider;
  spine.m_ParentSegmentIndex = 0u;
  subject.m_Segments.insert(subject.m_Segments.begin() + 1, spine);
  for (std::uint32_t i = 0; i < subject.m_Segments.size(); ++i) {
    auto& segment = subject.m_Segments[i];
    segment.m_SegmentIndex = i;
    if (i > 1 && segment.m_ParentSegmentIndex.Value() >= 1)
      segment.m_ParentSegmentIndex = segment.m_ParentSegmentIndex.Value() + 1;
  }
  subject.m_Name = "Walker2";
  subject.m_SubjectId = CoreOstraTypes::NameHash("Walker2");
  return subject;
}

} // namespace

TEST(DynamicSubspaceUpdate, ChunksFollowTheirJointsThroughAnEdit) {
  const VSubjectParametrised before = MakeValidSubject().m_Subject;
  const VSubjectParametrised after = WithSpine(before);
  VSubjectDynamicSubspace subspace = LegSubspace(before);
  const VSubjectDynamicSubspace original = subspace;
  ZMT::VLogCapture capture;
  ASSERT_TRUE(UpdateDynamicSubspace(before, after, subspace));
  EXPECT_TRUE(capture.Records().empty());
  EXPECT_EQ(subspace.m_NumJointParameters, 11u);
  EXPECT_EQ(subspace.m_SubjectId, after.m_SubjectId);
  const auto& leg = subspace.m_PcaControlledParams.at(0);
  EXPECT_THAT(leg.m_JointParametersIndices, ElementsAre(7, 8, 9, 10));
  // Everything but the positions is carried over as it was.
  auto expected = original.m_PcaControlledParams[0];
  expected.m_JointParametersIndices = leg.m_JointParametersIndices;
  EXPECT_EQ(leg, expected);

  // And back again.
  ASSERT_TRUE(UpdateDynamicSubspace(after, before, subspace));
  EXPECT_EQ(subspace, original);

  // A subspace without chunks has nothing to follow.
  VSubjectDynamicSubspace empty;
  EXPECT_TRUE(UpdateDynamicSubspace(before, after, empty));
  EXPECT_EQ(empty, VSubjectDynamicSubspace{});
}

TEST(DynamicSubspaceUpdate, EachRefusalSaysWhyAndLeavesTheSubspace) {
  const VSubjectParametrised before = MakeValidSubject().m_Subject;
  const VSubjectDynamicSubspace original = LegSubspace(before);
  const std::string cannot = "Subspace update cannot be performed";

  // Each case: an edit of the subject after (or of the subspace), and the reason logged.
  struct Case {
    std::function<void(VSubjectParametrised&, VSubjectDynamicSubspace&)> m_Edit;
    std::vector<std::string> m_Messages;
  };
  const std::vector<Case> cases = {
      {[](auto& after, auto&) { after.m_Segments[2].m_Joint.m_Name = "Knee"; },
       {"Joint 'ShankJoint' of subspace chunk 'Leg' is not in subject Walker", cannot}},
      {[](auto& after, auto&) { after.m_Segments[3].m_Joint.m_Name = "ThighJoint"; },
       {"Joint 'ThighJoint' of subspace chunk 'Leg' is named more than once in subject Walker",
        cannot}},
      {[](auto& after, auto&) {
         after.m_Segments[2].m_Joint.m_JointType = VJointTypeBase::ESlider;
       },
       {"Joint 'ShankJoint' of subspace chunk 'Leg' changed type", cannot}},
      {[](auto&, auto& subspace) { subspace.m_NumJointParameters = 9; },
       {"The subspace has 9 joint parameters, subject Walker has 10", cannot}},
      {[](auto&, auto& subspace) {
         subspace.m_PcaControlledParams[0].m_JointParametersIndices = {7, 8, 9};
         subspace.m_PcaControlledParams[0].m_JointParametersMean.resize(3);
       },
       {"Subspace chunk 'Leg' does not cover whole joints of subject Walker", cannot}},
      {[](auto&, auto& subspace) {
         subspace.m_PcaControlledParams[0].m_PrincipalComponents[1].m_JointParams = {0, 0.6, 0,
                                                                                     0.9};
       },
       {"Orthogonality constraint violated at basis vector 1. Dot product value: 1.170000",
        cannot}},
      {[](auto&, auto& subspace) {
         auto shank = subspace.m_PcaControlledParams[0];
         shank.m_Name = "Knee";
         shank.m_JointParametersIndices = {9};
         shank.m_JointParametersMean = {0};
         shank.m_PrincipalComponents = {{"Flex", {1}, 1, -1, 1, 0}};
         subspace.m_PcaControlledParams.push_back(shank);
       },
       {"Single-element subspace encountered. Characterisation of a single joint parameter with "
        "a subspace is redundant.",
        "Subspace chunk 'Knee' shares joint parameter 9 with another chunk", cannot}},
  };
  for (std::size_t i = 0; i < cases.size(); ++i) {
    SCOPED_TRACE(i);
    VSubjectParametrised after = before;
    VSubjectDynamicSubspace subspace = original;
    cases[i].m_Edit(after, subspace);
    const VSubjectDynamicSubspace given = subspace;
    ZMT::VLogCapture capture;
    EXPECT_FALSE(UpdateDynamicSubspace(before, after, subspace));
    EXPECT_EQ(subspace, given);
    EXPECT_EQ(capture.Messages(SubjectDynamicSubspaceUtilsChannel), cases[i].m_Messages);
    const auto records = capture.Records();
    ASSERT_FALSE(records.empty());
    EXPECT_EQ(records.back().Level, ZMT::ELogError);
  }
}
