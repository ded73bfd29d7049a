// Converting characters built in the scene (without records) to subject records.
#include "../../support/HostFixture.h"
#include "../../support/SubjectTestRecords.h"
#include "AnvilCore/SubjectJointPose.h"
#include "plugin/host/AnvilSubjectCoreTypesConversion.h"
#include "plugin/host/LabelingBone.h"
#include "plugin/host/LabelingCluster.h"
#include "plugin/host/LabelingConstraint.h"
#include "plugin/host/LabelingSetup.h"
#include "plugin/host/SolvingBone.h"
#include "plugin/host/SolvingConstraint.h"
#include "plugin/host/SolvingSetup.h"
#include <cmath>
#include <gtest/gtest.h>

namespace {

using namespace CoreOstraTypes;

class SubjectConversionTest : public ::testing::Test {
protected:
  // "Rig": a free root with a hinge child; a marker on each; a cluster of three on the child.
  void SetUp() override {
    HostTest::resetScene();
    m_pRig = new Character("Rig");
    g_db->addToScene(m_pRig, false, nullptr, false, false);
    LabelingSetup* pSetup = m_pRig->getLabelingSetup(true);
    auto* pRoot = new LabelingBone("Root");
    pRoot->setJoint(VJointTypeBase::EFree);
    g_db->addChild(pSetup, pRoot);
    m_pChild = new LabelingBone("Child");
    m_pChild->setJoint(VJointTypeBase::EHinge);
    m_pChild->setPreTranslation(Vec3(0, 0, 250));
    m_pChild->setPreRotation(AnvilRotation(Vec3(1, 0, 0), 90.0));
    g_db->addChild(pRoot, m_pChild);
    auto* pTop = new LabelingConstraint("TOP");
    pTop->setStaticTransform(Vec3(1, 2, 3), AnvilRotation(), Vec3(1, 1, 1));
    g_db->addChild(pRoot, pTop);
    auto* pCluster = new LabelingCluster("Plate");
    pCluster->setStaticTransform(Vec3(0, 0, 10), AnvilRotation(), Vec3(1, 1, 1));
    g_db->addChild(m_pChild, pCluster);
    const double places[3][3] = {{10, 0, 0}, {0, 10, 0}, {-10, 0, 0}};
    for (int i = 0; i < 3; ++i) {
      auto* pMarker = new LabelingConstraint(HString("P") + HString(std::to_string(i + 1)));
      pMarker->setStaticTransform(Vec3(places[i][0], places[i][1], places[i][2]), AnvilRotation(),
                                  Vec3(1, 1, 1));
      g_db->addChild(pCluster, pMarker);
    }
  }
  void TearDown() override { g_db->clearScene(); }

  Character* m_pRig = nullptr;
  LabelingBone* m_pChild = nullptr;
};

TEST_F(SubjectConversionTest, NodesWithoutRecordsGiveNumbersAndDefaults) {
  AnvilSubjectCoreTypesConversion conversion(AnvilSubjectCoreTypesConversion::ELabeling);
  ASSERT_TRUE(conversion.characterToVSubject2(m_pRig, false));
  const VSubjectParametrised& s = conversion.getSubjectParametrised();
  EXPECT_EQ(s.m_Name, "Rig");
  EXPECT_EQ(s.m_SubjectId, NameHash("Rig"));
  ASSERT_EQ(s.m_Segments.size(), 2u);
  EXPECT_FALSE(s.m_Segments[0].m_ParentSegmentIndex.IsSet());
  EXPECT_EQ(s.m_Segments[1].m_ParentSegmentIndex.Value(), 0u);
  EXPECT_EQ(s.m_Segments[1].m_TreeDepth, 1u);
  EXPECT_EQ(s.m_Segments[0].m_Joint.m_Name, "World_Root");
  EXPECT_EQ(s.m_Segments[1].m_Joint.m_Name, "Root_Child");
  EXPECT_EQ(s.m_Segments[1].m_PreTranslation, (std::array<std::string, 3>{"0", "0", "250"}));
  EXPECT_EQ(s.m_Segments[1].m_PreRotation[1], "0");
  EXPECT_NEAR(std::stod(s.m_Segments[1].m_PreRotation[0]), M_PI / 2, 1e-12);

  // Markers in tree order: the point target's, then the cluster's.
  std::vector<std::string> markers;
  for (const auto& m : s.m_Markers)
    markers.push_back(m.m_Name);
  EXPECT_EQ(markers, (std::vector<std::string>{"TOP", "P1", "P2", "P3"}));
  EXPECT_EQ(s.m_Markers[0].m_Radius, 14.0);
  EXPECT_EQ(s.m_Markers[3].m_MarkerId, NameHash("P3"));
  ASSERT_EQ(s.m_Targets.size(), 2u);
  EXPECT_EQ(s.m_Targets[0].m_Type, VTargetTypeBase::ELocalPointToWorldPoint);
  EXPECT_EQ(s.m_Targets[0].m_StateExpressions, (std::vector<std::string>{"1", "2", "3"}));
  EXPECT_EQ(s.m_Targets[0].m_SegmentIndices, std::vector<uint32_t>{0});
  const VSubjectParametrised::VTarget& body = s.m_Targets[1];
  EXPECT_EQ(body.m_Type, VTargetTypeBase::ERigidBody);
  EXPECT_EQ(body.m_MarkerIndices, (std::vector<uint32_t>{1, 2, 3}));
  EXPECT_EQ(body.m_SegmentIndices, std::vector<uint32_t>{1});
  EXPECT_EQ(body.m_StateExpressions,
            (std::vector<std::string>{"0", "0", "0", "0", "0", "10", "10", "0", "0", "0", "10", "0",
                                      "-10", "0", "0"}));
  ASSERT_EQ(body.m_Covariance.size(), 36u + 27u);
  EXPECT_EQ(body.m_Covariance[36], 5.0);
  EXPECT_EQ(body.m_Covariance[40], 5.0);
  EXPECT_EQ(body.m_Covariance[37], 0.0);
  EXPECT_EQ(body.m_ViewNormals.size(), 3u);
  const VSubjectApplicationData& app = conversion.getSubjectApplicationData();
  EXPECT_EQ(app.m_Markers.size(), 4u);
  EXPECT_EQ(app.m_Targets[1].m_Name, "Plate");
  EXPECT_EQ(app.m_SubjectId, s.m_SubjectId);
}

TEST_F(SubjectConversionTest, KeptExpressionsGiveWayWhenBaked) {
  m_pChild->segmentRecord().m_PreTranslation = {"0", "0", "Length"};
  AnvilSubjectCoreTypesConversion conversion(0);
  ASSERT_TRUE(conversion.characterToVSubject2(m_pRig, false));
  EXPECT_EQ(conversion.getSubjectParametrised().m_Segments[1].m_PreTranslation[2], "Length");
  ASSERT_TRUE(conversion.characterToVSubject2(m_pRig, true));
  EXPECT_EQ(conversion.getSubjectParametrised().m_Segments[1].m_PreTranslation[2], "250");
}

TEST_F(SubjectConversionTest, RefusalsAreLoggedWithTheirReasons) {
  HostTest::LogCapture log;
  AnvilSubjectCoreTypesConversion solving(1);
  EXPECT_FALSE(solving.characterToVSubject2(m_pRig, false));
  EXPECT_FALSE(solving.characterToVSubject2(nullptr, false));
  VSubjectParametrised nothing;
  EXPECT_FALSE(solving.populateBindPose(nothing));
  TSimpleArray<Module*> found;
  m_pRig->getDescendantsWithName("TOP", found);
  static_cast<SubjectConstraint*>(found[0])->rotationNames().push_back("Gyro");
  AnvilSubjectCoreTypesConversion labeling(0);
  EXPECT_FALSE(labeling.characterToVSubject2(m_pRig, false));
  EXPECT_EQ(log.errors(), (std::vector<std::string>{
                              "Subject Rig has no solving setup.", "No character to convert.",
                              "Constraint TOP of Rig names unknown rotation observation Gyro."}));
  EXPECT_EQ(labeling.getErrors().size(), 1u);
}

TEST_F(SubjectConversionTest, SolvingSetupsTakeTheirOwnConstraintsInTheirOrder) {
  SolvingSetup* pSetup = m_pRig->getSolvingSetup(true);
  auto* pRoot = new SolvingBone("Root");
  pRoot->setJoint(VJointTypeBase::EBall);
  g_db->addChild(pSetup, pRoot);
  auto* pLate = new SolvingConstraint("LATE");
  pLate->setOrder(1);
  auto* pEarly = new SolvingConstraint("EARLY");
  pEarly->setOrder(0);
  g_db->addChild(pRoot, pLate);
  g_db->addChild(pRoot, new SolvingConstraint("FREE"));
  g_db->addChild(pRoot, pEarly);
  g_db->addChild(pRoot, new LabelingConstraint("OTHER")); // not a solving constraint
  pSetup->subjectRecord().m_Markers.resize(1);
  pSetup->subjectRecord().m_Markers[0].m_Name = "FREE";
  pSetup->subjectRecord().m_Markers[0].m_Radius = 3.0;
  AnvilSubjectCoreTypesConversion conversion(1);
  ASSERT_TRUE(conversion.characterToVSubject2(m_pRig, false));
  const VSubjectParametrised& s = conversion.getSubjectParametrised();
  std::vector<std::string> targets;
  for (const auto& t : conversion.getSubjectApplicationData().m_Targets)
    targets.push_back(t.m_Name);
  EXPECT_EQ(targets, (std::vector<std::string>{"EARLY", "LATE", "FREE"}));
  ASSERT_EQ(s.m_Markers.size(), 3u);
  EXPECT_EQ(s.m_Markers[0].m_Radius, 3.0); // the setup's own record comes first
  EXPECT_EQ(s.m_Targets[2].m_MarkerIndices, std::vector<uint32_t>{0});
  EXPECT_EQ(s.m_Targets[0].m_MarkerIndices, std::vector<uint32_t>{1});

  // The bind pose of the current pose.
  g_db->getTimeManager()->setCurrentTime(3);
  pRoot->m_rotationTrack.setKey(3, AnvilRotation(Vec3(0, 1, 0), 30.0));
  VSubjectParametrised posed = s;
  ASSERT_TRUE(conversion.populateBindPose(posed));
  ASSERT_EQ(posed.m_Segments[0].m_Joint.m_BindPose.size(), 3u);
  EXPECT_NEAR(posed.m_Segments[0].m_Joint.m_BindPose[1], M_PI / 6, 1e-12);
}

} // namespace
