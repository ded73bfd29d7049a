// The host's subject classes, the joint conventions of bones, and the demo's subjects.
#include "../../support/HostFixture.h"
#include "../../support/SubjectTestRecords.h"
#include "AnvilCore/SubjectJointPose.h"
#include "AnvilCore/demo/DemoScene.h"
#include "River/CoreOstraTypesUtils/AngleAxis.h"
#include "River/CoreOstraTypesUtils/JointAxes.h"
#include "plugin/host/LabelingBone.h"
#include "plugin/host/LabelingCluster.h"
#include "plugin/host/LabelingConstraint.h"
#include "plugin/host/LabelingSetup.h"
#include "plugin/host/RetargetingBone.h"
#include "plugin/host/RetargetingSetup.h"
#include "plugin/host/SolvingBone.h"
#include "plugin/host/SolvingSetup.h"
#include "plugin/host/SubjectManager.h"
#include "plugin/host/SubjectScaler.h"
#include <Eigen/Geometry>
#include <cmath>
#include <gtest/gtest.h>
#include <set>

namespace {

using CoreOstraTypes::VJointTypeBase;

TEST(SubjectHost, ClassTagsAndSetupsOfACharacter) {
  HostTest::resetScene();
  auto* pBob = new Character("Bob");
  g_db->addToScene(pBob, false, nullptr, false, false);
  EXPECT_EQ(pBob->getLabelingSetup(false), nullptr);
  LabelingSetup* pSetup = pBob->getLabelingSetup(true);
  ASSERT_NE(pSetup, nullptr);
  EXPECT_EQ(pSetup->getName(), "Bob");
  EXPECT_EQ(pBob->getLabelingSetup(true), pSetup); // made once
  EXPECT_EQ(pBob->getSolvingSetup(false), nullptr);
  EXPECT_TRUE(pSetup->isKindOf(&ParameterizedSetup::s_classParameterizedSetup));
  EXPECT_TRUE(pSetup->isKindOf(&Node::s_classNode));
  EXPECT_FALSE(pSetup->isKindOf(&SolvingSetup::s_classSolvingSetup));
  LabelingBone bone("b");
  EXPECT_TRUE(bone.isKindOf(&SubjectBone::s_classSubjectBone));
  EXPECT_FALSE(bone.isKindOf(&SolvingBone::s_classSolvingBone));
  LabelingCluster cluster("c");
  EXPECT_FALSE(cluster.isKindOf(&LabelingConstraint::s_classLabelingConstraint));
  EXPECT_EQ(cluster.targetRecord().m_Type, CoreOstraTypes::VTargetTypeBase::ERigidBody);
  LabelingConstraint constraint("LFHD");
  EXPECT_EQ(constraint.markerNames(), std::vector<std::string>{"LFHD"});

  // Root bones and depth-first bone lists.
  auto* pRoot = new LabelingBone("Root");
  g_db->addChild(pSetup, pRoot);
  auto* pA = new LabelingBone("A");
  g_db->addChild(pRoot, pA);
  g_db->addChild(pA, new LabelingConstraint("m"));
  g_db->addChild(pA, new LabelingBone("A1"));
  g_db->addChild(pRoot, new LabelingBone("B"));
  EXPECT_EQ(pSetup->getRootBone(), pRoot);
  EXPECT_EQ(pSetup->getRootBone(true), pRoot);
  TSimpleArray<LabelingBone*> bones;
  pSetup->getBones(bones);
  std::vector<std::string> names;
  for (LabelingBone* p : bones)
    names.push_back(p->getName().GetStr());
  EXPECT_EQ(names, (std::vector<std::string>{"Root", "A", "A1", "B"}));
  g_db->addChild(pSetup, new LabelingBone("Second"));
  EXPECT_EQ(pSetup->getRootBone(true), nullptr);
  EXPECT_EQ(pSetup->getRootBone(false), pRoot);
  EXPECT_EQ(g_db->getNumLabelingBones(), 5);
  EXPECT_EQ(g_db->getLabelingBone(4)->getName(), "Second");
  EXPECT_EQ(g_db->getLabelingBone(-1), nullptr);
  EXPECT_EQ(g_db->getNumLabelingConstraints(), 1);
  g_db->clearScene();
}

TEST(SubjectHost, RetargetingBonesAndTheScaler) {
  HostTest::resetScene();
  std::vector<std::string> errors;
  Character* pBob = AnvilCore::addSubjectToScene(SubjectTest::bobRecords(), errors);
  ASSERT_NE(pBob, nullptr);
  RetargetingSetup* pSetup = pBob->getRetargetingSetup(false);
  TSimpleArray<RetargetingBone*> all, below;
  pSetup->getBones(all, true);
  pSetup->getBones(below, false);
  EXPECT_EQ(all.getCount(), 3);
  ASSERT_EQ(below.getCount(), 2);
  EXPECT_EQ(below[0]->getName(), "Thorax");
  // Retargeting setups hold no constraints; the others one per target.
  EXPECT_EQ(pSetup->getRootBone()->getNumChildren(), 1);
  EXPECT_EQ(pBob->getSolvingSetup(false)->getRootBone()->getNumChildren(), 2);

  pSetup->setStaticTransform(Vec3(), AnvilRotation(), Vec3(1.2, 1.2, 1.2));
  pSetup->m_scaleTrack.setKey(0, Vec3(1.1, 1.1, 1.1));
  Vec3 before = below[1]->getWSPos(0);
  SubjectScaler scaler;
  EXPECT_EQ(scaler.unscaleRetargetingSubjects(), 1);
  EXPECT_TRUE(pSetup->m_scaleTrack.isEmpty());
  EXPECT_EQ(pSetup->getStaticScale(), Vec3(1, 1, 1));
  EXPECT_NEAR(below[1]->getWSPos(0).z * 1.1, before.z, 1e-9);
  g_db->clearScene();
}

// The pose of a segment in its parent is P A J A^-1 (no post transform here): a bone's node
// must give the same point for every joint type, and give its parameters back.
TEST(SubjectHost, BoneMotionFollowsTheJointConvention) {
  using namespace CoreOstraTypesUtils;
  struct Case {
    VJointTypeBase::EJointType type;
    std::vector<double> params;
  } cases[] = {{VJointTypeBase::EFree, {0.2, -0.4, 0.3, 10, -20, 30}},
               {VJointTypeBase::EBall, {-0.5, 0.1, 0.7}},
               {VJointTypeBase::EHardySpicer, {0.6, -0.3}},
               {VJointTypeBase::EHinge, {1.1}},
               {VJointTypeBase::ESlider, {42.0}},
               {VJointTypeBase::EDummy, {}}};
  Vector3 orientation;
  ASSERT_TRUE(JointOrientationFromAxisPair({0.3, 0.4, 0.5, -0.4, 0.3, 0.0}, orientation));
  const Vector3 preRotation{0.1, 0.2, -0.3}, preTranslation{5, 6, 7};
  const Eigen::Vector3d point(11, -13, 17);
  for (const Case& c : cases) {
    CoreOstraTypes::VSubjectParametrised::VJoint joint;
    joint.m_JointType = c.type;
    joint.m_JointOrientation = orientation;
    Module holder("holder"); // world transforms stop below the parentless scene root
    auto* pBone = new LabelingBone("b");
    holder.addChild(pBone);
    LabelingBone& bone = *pBone;
    bone.setPreTranslation(Vec3(preTranslation[0], preTranslation[1], preTranslation[2]));
    bone.setPreRotation(AnvilCore::rotationFromAngleAxis(preRotation));
    Vec3 t;
    AnvilRotation r;
    AnvilCore::jointToBoneMotion(joint, bone.getPreRotation(), c.params, t, r);
    bone.setStaticTransform(t, r, Vec3(1, 1, 1));
    // Reference: P * A * J * A^-1 applied to the point.
    const Eigen::Matrix3d a = AngleAxisToRotation(orientation);
    Eigen::Matrix3d jr = Eigen::Matrix3d::Identity();
    Eigen::Vector3d jt = Eigen::Vector3d::Zero();
    const auto& p = c.params;
    if (c.type == VJointTypeBase::EFree || c.type == VJointTypeBase::EBall)
      jr = AngleAxisToRotation({p[0], p[1], p[2]});
    if (c.type == VJointTypeBase::EFree) jt = {p[3], p[4], p[5]};
    if (c.type == VJointTypeBase::EHardySpicer)
      jr = Eigen::AngleAxisd(p[0], Eigen::Vector3d::UnitZ()) *
           Eigen::AngleAxisd(p[1], Eigen::Vector3d::UnitY());
    if (c.type == VJointTypeBase::EHinge)
      jr = Eigen::AngleAxisd(p[0], Eigen::Vector3d::UnitZ()).toRotationMatrix();
    if (c.type == VJointTypeBase::ESlider) jt = {0, 0, p[0]};
    const Eigen::Vector3d expected =
        AngleAxisToRotation(preRotation) * (a * (jr * (a.transpose() * point) + jt)) +
        Eigen::Vector3d(preTranslation[0], preTranslation[1], preTranslation[2]);
    auto* pChild = new Node("tip");
    bone.addChild(pChild);
    pChild->setStaticTransform(Vec3(point.x(), point.y(), point.z()), AnvilRotation(),
                               Vec3(1, 1, 1));
    const Vec3 got = pChild->getWSPos(0);
    EXPECT_NEAR(got.x, expected.x(), 1e-9) << c.type;
    EXPECT_NEAR(got.y, expected.y(), 1e-9) << c.type;
    EXPECT_NEAR(got.z, expected.z(), 1e-9) << c.type;
    const std::vector<double> back =
        AnvilCore::boneMotionToJoint(joint, bone.getPreRotation(), t, r);
    ASSERT_EQ(back.size(), c.params.size()) << c.type;
    for (size_t i = 0; i < back.size(); ++i)
      EXPECT_NEAR(back[i], c.params[i], 1e-9) << c.type;
  }
}

TEST(SubjectHost, DemoMarkersFollowTheWalkingSkeleton) {
  AnvilCore::buildDemoScene();
  SubjectManager* pSubjects = g_db->getSubjectManager();
  ASSERT_EQ(pSubjects->getNumSubjects(), 2);
  Character* pWalker = pSubjects->getSubject(0);
  Character* pBox = pSubjects->getSubject(1);
  EXPECT_FALSE(pWalker->isProp());
  EXPECT_TRUE(pBox->isProp());
  EXPECT_TRUE(pSubjects->subjectsHaveAnimation());

  TSimpleArray<LabelingBone*> bones;
  pWalker->getLabelingSetup(false)->getBones(bones);
  EXPECT_EQ(bones.getCount(), 20);
  std::set<int> types;
  for (LabelingBone* p : bones)
    types.insert(p->getJointType());
  EXPECT_EQ(types, (std::set<int>{VJointTypeBase::EFree, VJointTypeBase::EBall,
                                  VJointTypeBase::EHardySpicer, VJointTypeBase::EHinge}));
  EXPECT_EQ(g_db->getNumLabelingConstraints(), 41 + 4);
  EXPECT_EQ(g_db->getNumLabelingClusters(), 1);

  const int64_t tpf = g_db->getTimeManager()->getTicksPerFrame();
  int markers = 0;
  for (int i = 0; i < pWalker->getNumChildren(); ++i) {
    if (!pWalker->getChild(i)->isKindOf(&Marker::s_classMarker)) continue;
    const auto* pMarker = static_cast<const Marker*>(pWalker->getChild(i));
    ++markers;
    TSimpleArray<Module*> places;
    pWalker->getLabelingSetup(false)->getDescendantsWithName(pMarker->getName(), places);
    ASSERT_EQ(places.getCount(), 1) << pMarker->getName().GetStr();
    for (int frame : {0, 333, 1199}) {
      if (!pMarker->m_track.hasKeyAt(frame * tpf)) continue;
      EXPECT_EQ(pMarker->getWSPos(frame * tpf),
                static_cast<Node*>(places[0])->getWSPos(frame * tpf))
          << pMarker->getName().GetStr() << " " << frame;
    }
  }
  EXPECT_EQ(markers, 41);
  // The gaps stay where they were.
  TSimpleArray<Module*> lwrb;
  pWalker->getDescendantsWithName("LWRB", lwrb);
  const auto* pGap = static_cast<const Marker*>(lwrb[0]);
  EXPECT_FALSE(pGap->m_track.hasKeyAt(320 * tpf));
  EXPECT_TRUE(pGap->m_track.hasKeyAt(341 * tpf));
  // The walker walks: the pelvis moves 13 m in 10 s along +X.
  EXPECT_NEAR(bones[0]->getWSPos(1199 * tpf).x - bones[0]->getWSPos(0).x, 1300.0 * 1199 / 120,
              1e-6);
  g_db->clearScene();
}

} // namespace
