// The USD exporter against the scene: prims, joints, rest and bind transforms, samples, axes,
// unscaling, awkward names and the roads that fail.
#include "exporters/scene/USDExporter.h"
#include "../../support/HostFixture.h"
#include "../RunExport.h"
#include "AnvilCore/demo/DemoScene.h"
#include "plugin/host/Character.h"
#include "plugin/host/Database.h"
#include "plugin/host/HInterface.h"
#include "plugin/host/HTimeManager.h"
#include "plugin/host/LabelingBone.h"
#include "plugin/host/LabelingSetup.h"
#include "plugin/host/RetargetingBone.h"
#include "plugin/host/RetargetingSetup.h"
#include "plugin/host/SubjectManager.h"
#include "tests/support/UsdaReader.h"

#include <gtest/gtest.h>

#include <cmath>
#include <set>

namespace {

using ExportTest::Owned;
using UsdaTest::Value;

class UsdExporterTest : public ::testing::Test {
protected:
  void SetUp() override {
    HostTest::resetScene();
    m_pExporter.reset(USDExporter::createInstance());
  }
  UsdaTest::Layer exportLayer(const std::string& i_rName) {
    m_text = ExportTest::exportText(*m_pExporter, ExportTest::tempPath(i_rName));
    return UsdaTest::parse(m_text);
  }
  std::vector<RetargetingBone*> walkerBones() {
    Character* pWalker = g_db->getSubjectManager()->getSubject(0);
    TSimpleArray<RetargetingBone*> bones;
    pWalker->getRetargetingSetup(false)->getBones(bones, true);
    return {bones.begin(), bones.end()};
  }
  Owned<USDExporter> m_pExporter;
  std::string m_text;
};

/// The 3 by 3 block a row-vector transform has for a host rotation.
void expectRotationBlock(const Value& i_rMatrix, const AnvilRotation& i_rRotation) {
  double m[9];
  i_rRotation.getMatrix(m);
  for (int r = 0; r < 3; ++r)
    for (int c = 0; c < 3; ++c)
      EXPECT_NEAR(i_rMatrix.items[r].items[c].number(), m[c * 3 + r], 1e-6) << r << "," << c;
}

void expectTranslationRow(const Value& i_rMatrix, const Vec3& i_rMillimetres) {
  const Value& row = i_rMatrix.items[3];
  EXPECT_EQ(row.items[0].number(), double(float(i_rMillimetres.x * 0.1)));
  EXPECT_EQ(row.items[1].number(), double(float(i_rMillimetres.y * 0.1)));
  EXPECT_EQ(row.items[2].number(), double(float(i_rMillimetres.z * 0.1)));
  EXPECT_EQ(row.items[3].number(), 1.0);
}

TEST_F(UsdExporterTest, TheDemoWalkerBecomesASkeletonWithItsAnimation) {
  AnvilCore::buildDemoScene();
  const UsdaTest::Layer layer = exportLayer("demo.usd");
  HTimeManager* pTime = g_db->getTimeManager();
  EXPECT_EQ(layer.metadata.at("framesPerSecond").number(), pTime->getFrameRate());
  EXPECT_EQ(layer.metadata.at("startTimeCode").number(),
            pTime->getFrame(pTime->getPlayRange().getStart()));
  EXPECT_EQ(layer.metadata.at("endTimeCode").number(),
            pTime->getFrame(pTime->getPlayRange().getEnd()));
  EXPECT_EQ(layer.metadata.at("upAxis").text, g_db->isZUp() ? "Z" : "Y");

  ASSERT_EQ(layer.roots.size(), std::size_t(g_db->getSubjectManager()->getNumSubjects()));
  ASSERT_NE(layer.prim("/Walker"), nullptr);
  const UsdaTest::Prim& skeleton = *layer.prim("/Walker");
  EXPECT_EQ(skeleton.type, "Skeleton");
  EXPECT_EQ(skeleton.name, "Walker");
  EXPECT_EQ(skeleton.apiSchemas, std::vector<std::string>{"SkelBindingAPI"});
  EXPECT_EQ(skeleton.relationships.at("skel:animationSource"),
            std::vector<std::string>{"/Walker/Anim"});
  const UsdaTest::Prim* pAnim = skeleton.child("Anim");
  ASSERT_NE(pAnim, nullptr);
  EXPECT_EQ(pAnim->type, "SkelAnimation");
  EXPECT_EQ(skeleton.attributes.at("joints").type, "token[]");
  EXPECT_TRUE(skeleton.attributes.at("joints").uniform);
  EXPECT_EQ(pAnim->attributes.at("rotations").type, "quatf[]");
  EXPECT_EQ(pAnim->attributes.at("scales").type, "half3[]");
  EXPECT_EQ(pAnim->attributes.at("translations").type, "float3[]");

  // Joints: the retargeting bones in their order, each path unique, every parent first.
  const std::vector<RetargetingBone*> bones = walkerBones();
  const auto& joints = skeleton.attributes.at("joints").value.items;
  ASSERT_EQ(joints.size(), bones.size());
  std::set<std::string> seen;
  for (std::size_t j = 0; j < joints.size(); ++j) {
    const std::string& path = joints[j].text;
    EXPECT_TRUE(seen.insert(path).second) << path;
    const std::size_t slash = path.rfind('/');
    EXPECT_EQ(path.substr(slash == std::string::npos ? 0 : slash + 1),
              bones[j]->getName().GetString());
    if (slash != std::string::npos) {
      EXPECT_TRUE(seen.count(path.substr(0, slash))) << path << " comes before its parent";
    }
  }
  EXPECT_EQ(pAnim->attributes.at("joints").value.items.size(), joints.size());

  // Rest: the pre-transform (rotation inverted); bind: the static world pose.
  const auto& rest = skeleton.attributes.at("restTransforms").value.items;
  const auto& bind = skeleton.attributes.at("bindTransforms").value.items;
  ASSERT_EQ(rest.size(), bones.size());
  ASSERT_EQ(bind.size(), bones.size());
  for (std::size_t j = 0; j < bones.size(); ++j) {
    SCOPED_TRACE(joints[j].text);
    expectRotationBlock(rest[j], bones[j]->getPreRotation().inverse());
    expectTranslationRow(rest[j], bones[j]->getPreTranslation());
    expectRotationBlock(bind[j], bones[j]->getConstWSRot());
    expectTranslationRow(bind[j], bones[j]->getConstWSPos());
  }

  // Samples: one per frame of the play range, each joint's local transform.
  const auto& translations = pAnim->attributes.at("translations").samples;
  const auto& rotations = pAnim->attributes.at("rotations").samples;
  const auto& scales = pAnim->attributes.at("scales").samples;
  const HTimeRange& play = pTime->getPlayRange();
  const std::size_t frames =
      std::size_t((play.getEnd() - play.getStart()) / pTime->getTicksPerFrame() + 1);
  EXPECT_EQ(translations.size(), frames);
  EXPECT_EQ(rotations.size(), frames);
  EXPECT_EQ(scales.size(), frames);
  for (const HTime t :
       {play.getStart(), play.getStart() + 37 * pTime->getTicksPerFrame(), play.getEnd()}) {
    const double code = pTime->getFrame(t);
    SCOPED_TRACE(code);
    for (std::size_t j = 0; j < bones.size(); ++j) {
      const Vec3 p = bones[j]->getLocalPos(t);
      const Value& v = translations.at(code).items[j];
      EXPECT_EQ(v.items[0].single(), float(p.x * 0.1));
      EXPECT_EQ(v.items[1].single(), float(p.y * 0.1));
      EXPECT_EQ(v.items[2].single(), float(p.z * 0.1));
      double x, y, z, w;
      bones[j]->getLocalRot(t).getAsQuaternion(x, y, z, w);
      const Value& q = rotations.at(code).items[j];
      EXPECT_EQ(q.items[0].single(), float(w));
      EXPECT_EQ(q.items[1].single(), float(x));
      EXPECT_EQ(q.items[2].single(), float(y));
      EXPECT_EQ(q.items[3].single(), float(z));
      for (const Value& s : scales.at(code).items[j].items)
        EXPECT_EQ(s.text, "1");
    }
  }
}

TEST_F(UsdExporterTest, UpAxisTurnsTheBindPoseAndTheSceneComesBack) {
  AnvilCore::buildDemoScene();
  ASSERT_TRUE(g_db->isZUp()) << "the demo is Z-up";
  const std::vector<RetargetingBone*> bones = walkerBones();
  const UsdaTest::Layer asIs = exportLayer("z.usd");
  const auto& bindZ = asIs.roots[0]->attributes.at("bindTransforms").value.items;

  for (const bool face : {true, false}) {
    SCOPED_TRACE(face);
    m_pExporter->setDesiredUpAxis(USDExporter::EUpAxis(UsdExportOptions::EUpAxisY));
    m_pExporter->setRotateToFacePostive(face);
    const UsdaTest::Layer layer = exportLayer("y.usd");
    EXPECT_EQ(layer.metadata.at("upAxis").text, "Y");
    const auto& bindY = layer.roots[0]->attributes.at("bindTransforms").value.items;
    // A quarter turn about X takes (x, y, z) to (x, z, -y); the half turn about Y that faces
    // forward then negates x and z.
    for (std::size_t j = 0; j < bones.size(); ++j) {
      const double x = bindZ[j].items[3].items[0].number();
      const double y = bindZ[j].items[3].items[1].number();
      const double z = bindZ[j].items[3].items[2].number();
      const auto& row = bindY[j].items[3].items;
      EXPECT_NEAR(row[0].number(), face ? -x : x, 1e-4);
      EXPECT_NEAR(row[1].number(), z, 1e-4);
      EXPECT_NEAR(row[2].number(), face ? y : -y, 1e-4);
    }
    EXPECT_TRUE(g_db->isZUp());
    EXPECT_FALSE(g_db->isSceneRotated());
  }
  // Asking for the axis the scene has turns nothing.
  m_pExporter->setDesiredUpAxis(USDExporter::EUpAxis(UsdExportOptions::EUpAxisZ));
  const UsdaTest::Layer same = exportLayer("z2.usd");
  EXPECT_EQ(same.roots[0]->attributes.at("bindTransforms").value.items[3].items[3].items[2].text,
            bindZ[3].items[3].items[2].text);
}

TEST_F(UsdExporterTest, UnscalingRemovesTheRetargetingScale) {
  AnvilCore::buildDemoScene();
  Character* pWalker = g_db->getSubjectManager()->getSubject(0);
  RetargetingSetup* pSetup = pWalker->getRetargetingSetup(false);
  const UsdaTest::Layer plain = exportLayer("plain.usd");
  pSetup->setStaticTransform(pSetup->getStaticPos(), pSetup->getStaticRot(), Vec3(2, 2, 2));

  m_pExporter->setUnscaleRetargetingSubjects(false);
  const UsdaTest::Layer scaled = exportLayer("scaled.usd");
  m_pExporter->setUnscaleRetargetingSubjects(true);
  const UsdaTest::Layer unscaled = exportLayer("unscaled.usd");
  const auto row = [](const UsdaTest::Layer& i_rLayer, std::size_t i_joint) {
    return i_rLayer.roots[0]->attributes.at("bindTransforms").value.items[i_joint].items[3];
  };
  const auto texts = [](const Value& i_rRow) {
    std::vector<std::string> result;
    for (const Value& v : i_rRow.items)
      result.push_back(v.text);
    return result;
  };
  const std::size_t foot = 3;
  EXPECT_NE(texts(row(scaled, foot)), texts(row(plain, foot)))
      << "the scale should show in the world pose";
  EXPECT_EQ(texts(row(unscaled, foot)), texts(row(plain, foot)));
  EXPECT_EQ(pSetup->getStaticScale().x, 1.0);
}

TEST_F(UsdExporterTest, AwkwardNamesBecomeUniqueIdentifiers) {
  Character* pSubject = HostTest::addSubject("ns:Actor 1");
  LabelingSetup* pSetup = pSubject->getLabelingSetup(true);
  auto* pRoot = new LabelingBone("1Hips");
  g_db->addChild(pSetup, pRoot);
  for (const char* pName : {"Left Arm", "Left_Arm", "ns:Leg", "H\xc3\xbc" "fte"})
    g_db->addChild(pRoot, new LabelingBone(pName));
  HostTest::addSubject("ns_Actor_1"); // collides once made valid
  HostTest::addSubject("Empty");

  const UsdaTest::Layer layer = exportLayer("names.usd");
  ASSERT_EQ(layer.roots.size(), 3u);
  EXPECT_EQ(layer.roots[0]->name, "ns_Actor_1");
  EXPECT_EQ(layer.roots[1]->name, "ns_Actor_1_1");
  const auto& joints = layer.roots[0]->attributes.at("joints").value.items;
  std::vector<std::string> tokens;
  for (const Value& v : joints)
    tokens.push_back(v.text);
  EXPECT_EQ(tokens, (std::vector<std::string>{"_Hips", "_Hips/Left_Arm", "_Hips/Left_Arm_1",
                                              "_Hips/ns_Leg", "_Hips/H__fte"}));
  // A subject without a setup: no joints, and empty arrays at every frame.
  const UsdaTest::Prim& empty = *layer.roots[2];
  EXPECT_TRUE(empty.attributes.at("joints").value.items.empty());
  const auto& samples = empty.child("Anim")->attributes.at("translations").samples;
  ASSERT_FALSE(samples.empty());
  for (const auto& [time, value] : samples)
    EXPECT_TRUE(value.items.empty());
}

TEST_F(UsdExporterTest, AStageWithoutSubjectsAndAStageThatCannotBeCreated) {
  const UsdaTest::Layer layer = exportLayer("none.usd");
  EXPECT_TRUE(layer.roots.empty());
  EXPECT_EQ(layer.metadata.at("upAxis").text, g_db->isZUp() ? "Z" : "Y");

  AnvilCore::buildDemoScene();
  m_pExporter->setDesiredUpAxis(USDExporter::EUpAxis(UsdExportOptions::EUpAxisY));
  HostTest::LogCapture log;
  m_pExporter->setFilePath("/nonexistent-folder/take.usd");
  EXPECT_FALSE(m_pExporter->write());
  EXPECT_EQ(log.errors(), std::vector<std::string>{"USD Exporter: Failed to create stage file "
                                                   "'/nonexistent-folder/take.usd'"});
  EXPECT_FALSE(g_db->isSceneRotated()) << "a failed export must not leave the scene turned";
  EXPECT_TRUE(g_db->isZUp());
}

TEST_F(UsdExporterTest, OptionsAndTheirUserSetupKeys) {
  EXPECT_TRUE(m_pExporter->setDesiredUpAxis(HString("Y")));
  EXPECT_FALSE(m_pExporter->setDesiredUpAxis(HString("x")));
  EXPECT_EQ(m_pExporter->getDesiredUpAxisAsString(), "Y");
  m_pExporter->setRotateToFacePostive(false);
  g_interface.clear();
  m_pExporter->saveUserSetup();
  EXPECT_EQ(*g_interface.find("USDExporter", "DesiredUpAxis"), "Y");
  EXPECT_EQ(*g_interface.find("USDExporter", "RotateToFacePositive"), "0");
  EXPECT_EQ(*g_interface.find("USDExporter", "UnscaleRetargetingSubjects"), "1");
  Owned<USDExporter> pOther(USDExporter::createInstance());
  pOther->loadUserSetup();
  UsdExportOptions options;
  ASSERT_TRUE(pOther->getOptions(&options));
  EXPECT_EQ(options.m_desiredUpAxis, UsdExportOptions::EUpAxisY);
  EXPECT_FALSE(options.m_rotateToFacePositive);
  EXPECT_TRUE(options.m_unscaleRetargetingSubjects);
  g_interface.clear();
}

} // namespace
