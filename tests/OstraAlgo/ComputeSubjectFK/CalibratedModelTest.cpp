// The calibrated model: joints sized by type, deep copies that keep markers shared with their
// targets, equality, the target factory, and the model of a subject record.

#include "OstraAlgo/KinematicAlgo/SubjectCalibratedFromRecord.h"

#include <gtest/gtest.h>

namespace KinematicTest {
namespace {

using namespace KinematicAlgo;
using CoreOstraTypes::VSubject;

TEST(CalibratedModel, SettingAJointTypeResizesAndClearsItsStatistics) {
  VJointCalibrated joint;
  EXPECT_EQ(joint.Type(), 0);
  EXPECT_EQ(joint.MeanDynamic().size(), 6);
  joint.SetMeanDynamic(Eigen::VectorXd::Ones(6));
  joint.SetType(2);
  EXPECT_EQ(joint.TypeName(), "HardySpicer");
  EXPECT_EQ(joint.MeanDynamic(), Eigen::VectorXd::Zero(2));
  EXPECT_EQ(joint.CovDynamic().rows(), 2);
  joint.SetType(9);
  EXPECT_EQ(joint.TypeName(), "InvalidJointType");
  EXPECT_EQ(joint.NumDynamicParams(), 0u);
}

TEST(CalibratedModel, ACopySharesNothingAndKeepsMarkersTiedToTheirTargets) {
  VSubjectCalibrated subject;
  subject.SetName("S");
  auto target = std::make_shared<VTargetPosition>(0u);
  target->SetIdentifier(7);
  subject.AddTarget(target, true);
  VSubjectCalibrated copy(subject);
  EXPECT_TRUE(copy.Equals(subject));
  EXPECT_NE(copy.Target(0).get(), subject.Target(0).get());
  EXPECT_EQ(copy.Marker(0).get(), copy.Target(0).get());
  EXPECT_NE(copy.Segments()[0].m_Value.get(), subject.Segments()[0].m_Value.get());
  std::dynamic_pointer_cast<VTargetPosition>(copy.Target(0))
      ->SetPositionInParent(Eigen::Vector3d(0, 0, 1));
  EXPECT_FALSE(copy.Equals(subject));
  EXPECT_EQ(target->PositionInParent(), Eigen::Vector3d::Zero());
}

TEST(CalibratedModel, FactoryKnowsTargetsByKeyInRegistrationOrder) {
  EXPECT_EQ(VTargetPosition().Type(), 0);
  EXPECT_EQ(VTargetPositionWithCovariance().Type(), 5);
  EXPECT_EQ(VTargetFactory::Factory().Index("NoSuchTarget"), -1);
  EXPECT_EQ(VTargetFactory::Factory().Create("NoSuchTarget"), nullptr);
  EXPECT_STREQ(VTargetFactory::Factory().Create("TargetPositionWithCovariance")->Key(),
               "TargetPositionWithCovariance");
}

VSubject TwoSegmentRecord() {
  VSubject subject;
  subject.m_Name = "Arm";
  VSubject::VSegment upper;
  upper.m_Name = "Upper";
  upper.m_Joint.m_JointType = VSubject::VJoint::EBall;
  upper.m_Joint.m_Mean = {0.1, 0.2, 0.3};
  upper.m_PreTranslation = {0, 0, 100};
  VSubject::VSegment lower = upper;
  lower.m_Name = "Lower";
  lower.m_SegmentIndex = 1;
  lower.m_ParentSegmentIndex = 0u;
  lower.m_Joint.m_JointType = VSubject::VJoint::EHinge;
  lower.m_Joint.m_Mean = {0.5};
  lower.m_InversePostTranslation = {0, 0, -10};
  subject.m_Segments = {upper, lower};
  subject.m_Markers.push_back({"ELB", 1, 7.0, false, 0.0});
  VSubject::VTarget target;
  target.m_Type = VSubject::VTarget::ELocalPointToWorldPoint;
  target.m_MarkerIndices = {0};
  target.m_SegmentIndices = {1};
  target.m_State = {1, 2, 3};
  subject.m_Targets.push_back(target);
  target.m_Type = VSubject::VTarget::ELocalRotationToWorldRotation;
  subject.m_Targets.push_back(target);
  return subject;
}

TEST(CalibratedModel, ARecordBecomesATreeWithItsTargets) {
  std::vector<std::string> errors, notes;
  const auto model = SubjectCalibratedFromRecord(TwoSegmentRecord(), errors, notes);
  ASSERT_TRUE(model) << errors.front();
  ASSERT_EQ(model->Segments().Size(), 2);
  EXPECT_EQ(model->Segments()[1].m_Parent, 0);
  const ISegmentCalibrated& lower = *model->Segments()[1].m_Value;
  EXPECT_EQ(lower.Joint()->MeanDynamic(), Eigen::VectorXd::Constant(1, 0.5));
  // The record holds Q⁻¹; the model holds Q.
  EXPECT_EQ(lower.PoseInThis().m_Translation, Eigen::Vector3d(0, 0, 10));
  ASSERT_EQ(model->NumTargets(), 2u);
  ASSERT_EQ(model->NumMarkers(), 1u);
  EXPECT_EQ(model->Marker(0)->Name(), "ELB");
  EXPECT_STREQ(model->Target(1)->Key(), "TargetOrientation");
  EXPECT_TRUE(notes.empty());
}

TEST(CalibratedModel, RecordsThatAreNotATreeAreRefused) {
  VSubject record = TwoSegmentRecord();
  record.m_Segments[1].m_ParentSegmentIndex = 1u; // its own parent
  std::vector<std::string> errors, notes;
  EXPECT_EQ(SubjectCalibratedFromRecord(record, errors, notes), nullptr);
  ASSERT_EQ(errors.size(), 1u);
  EXPECT_NE(errors[0].find("Lower"), std::string::npos);
  record = TwoSegmentRecord();
  record.m_Segments[1].m_ParentSegmentIndex.Reset(); // a second root
  record.m_Targets[0].m_State = {1, 2};              // and a short state
  errors.clear();
  EXPECT_EQ(SubjectCalibratedFromRecord(record, errors, notes), nullptr);
  EXPECT_EQ(errors.size(), 2u);
}

TEST(CalibratedModel, TreeInsertionKeepsDepthFirstOrder) {
  VTree<int> tree;
  tree.Add(VTree<int>::NoParent, 0);
  const auto a = tree.Add(0, 1);
  tree.Add(0, 2);
  tree.Add(a, 3); // goes between 1 and 2
  std::vector<int> order;
  for (const auto& node : tree.Nodes())
    order.push_back(node.m_Value);
  EXPECT_EQ(order, (std::vector<int>{0, 1, 3, 2}));
  EXPECT_EQ(tree[3].m_Parent, 0);
  EXPECT_EQ(tree[2].m_Parent, 1);
  EXPECT_EQ(tree[0].m_Children, (std::vector<std::int32_t>{1, 3}));
  EXPECT_EQ(tree.Depth(2), 2);
}

} // namespace
} // namespace KinematicTest
