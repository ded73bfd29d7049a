// Subjects from input files: subject files, subject files beside trajectories, the scene file.
#include "../../support/HostFixture.h"
#include "../../support/SubjectTestRecords.h"
#include "AnvilCore/io/ISceneReader.h"
#include "AnvilCore/io/SceneJson.h"
#include "River/CoreOstraKMTIO/Writer.h"
#include "plugin/host/AnvilSubjectCoreTypesConversion.h"
#include "plugin/host/LabelingCluster.h"
#include "plugin/host/LabelingSetup.h"
#include "plugin/host/RetargetingSetup.h"
#include "plugin/host/SolvingBone.h"
#include "plugin/host/SolvingSetup.h"
#include "plugin/host/SubjectManager.h"
#include <filesystem>
#include <fstream>
#include <gtest/gtest.h>
#include <unistd.h>

namespace {

class SubjectSceneInputTest : public ::testing::Test {
protected:
  void SetUp() override {
    HostTest::resetScene();
    m_dir =
        std::filesystem::temp_directory_path() / ("anvil-subjects-" + std::to_string(::getpid()));
    std::filesystem::create_directories(m_dir);
    const AnvilCore::SubjectRecords records = SubjectTest::bobRecords();
    ASSERT_EQ(CoreOstraKMTIO::Write((m_dir / "Bob.kmf").string(), records.subject,
                                    records.application, records.subspace, nullptr, 16),
              0u);
  }
  void TearDown() override {
    g_db->clearScene();
    std::filesystem::remove_all(m_dir);
  }
  bool readInput(const std::string& i_rName, std::string& o_rError) {
    const std::string path = (m_dir / i_rName).string();
    AnvilCore::ISceneReader* pReader = AnvilCore::SceneReaderRegistry::instance().find(path);
    return pReader && pReader->read(path, o_rError);
  }
  bool readScene(const std::string& i_rText, std::string& o_rError) {
    return AnvilCore::readSceneJson(i_rText, (m_dir / "scene.json").string(), o_rError);
  }
  std::filesystem::path m_dir;
};

TEST_F(SubjectSceneInputTest, ASubjectFileJoinsTheCharacterAndItsPrefixedMarkers) {
  // What a trajectory file left: a subject "Bob" with a marker, and a top-level "Bob:ELB".
  auto* pBob = new Character("Bob");
  g_db->addToScene(pBob, false, nullptr, false, false);
  g_db->addChild(pBob, new Marker("PEL"));
  auto* pLoose = new Marker("Bob:ELB");
  pLoose->setUnlabeled(true);
  g_db->addToScene(pLoose, false, nullptr, false, false);
  g_db->addToScene(new Marker("Bobby"), false, nullptr, false, false);
  std::string error;
  ASSERT_TRUE(readInput("Bob.kmf", error)) << error;
  ASSERT_EQ(g_db->getSubjectManager()->getNumSubjects(), 1);
  EXPECT_EQ(g_db->getSubjectManager()->getSubject(0), pBob);
  EXPECT_NE(pBob->getLabelingSetup(false), nullptr);
  EXPECT_NE(pBob->getSolvingSetup(false), nullptr);
  EXPECT_NE(pBob->getRetargetingSetup(false), nullptr);
  EXPECT_EQ(pLoose->getParent(), pBob);
  EXPECT_EQ(pLoose->getName(), "ELB");
  EXPECT_FALSE(pLoose->isUnlabeled());
  EXPECT_EQ(g_db->getRoot()->getNumChildren(), 2); // Bob and "Bobby"
  // Reading it again replaces the setups rather than adding more.
  ASSERT_TRUE(readInput("Bob.kmf", error)) << error;
  EXPECT_EQ(pBob->getNumChildrenOfType(&ParameterizedSetup::s_classParameterizedSetup), 3);
}

TEST_F(SubjectSceneInputTest, ABrokenSubjectFileChangesNothing) {
  std::ofstream(m_dir / "Bad.kmf")
      << "<KinematicModel VERSION=\"9.0\"><Skeleton/></KinematicModel>";
  std::ofstream(m_dir / "Cut.kms") << "<KinematicModel VERSION=\"3.5\"><Skeleton>";
  std::string error;
  EXPECT_FALSE(readInput("Bad.kmf", error));
  EXPECT_EQ(error.rfind((m_dir / "Bad.kmf").string() + ": Cannot load KMT file with version", 0),
            0u)
      << error;
  EXPECT_FALSE(readInput("Cut.kms", error));
  EXPECT_EQ(g_db->getRoot()->getNumChildren(), 0);
}

TEST_F(SubjectSceneInputTest, TheSceneFileNamesASubjectFileAndWritesSetups) {
  const std::string scene = R"({
    "subjects": [
      {"name": "Bob", "file": "Bob.kmf"},
      {"name": "Ann", "setups": {
        "labeling": {"root": {
          "name": "Hips", "joint": "free", "translation": [0, 0, 900],
          "markers": [{"name": "LASI", "position": [100, 120, 0]}],
          "clusters": [{"name": "Belt", "translation": [0, 0, 50], "markers": [
            {"name": "B1", "position": [10, 0, 0]}, {"name": "B2", "position": [0, 10, 0]},
            {"name": "B3", "position": [-10, 0, 0]}]}],
          "children": [{"name": "Knee", "joint": "hinge", "axis": [0, 1, 0],
                        "preTranslation": [0, 90, -430]}]}},
        "solving": "labeling",
        "retargeting": "labeling"}}
    ]})";
  std::string error;
  ASSERT_TRUE(readScene(scene, error)) << error;
  SubjectManager* pSubjects = g_db->getSubjectManager();
  ASSERT_EQ(pSubjects->getNumSubjects(), 2);
  Character* pBob = pSubjects->getSubject(0);
  AnvilSubjectCoreTypesConversion fromFile(0);
  ASSERT_TRUE(fromFile.characterToVSubject2(pBob, false));
  EXPECT_EQ(fromFile.getSubjectParametrised().m_Segments.size(), 3u);
  EXPECT_EQ(fromFile.getSubjectParametrised().m_StaticParameters[0].m_Name, "Height");

  Character* pAnn = pSubjects->getSubject(1);
  AnvilSubjectCoreTypesConversion labeling(0), solving(1), retargeting(2);
  ASSERT_TRUE(labeling.characterToVSubject2(pAnn, false));
  ASSERT_TRUE(solving.characterToVSubject2(pAnn, false));
  ASSERT_TRUE(retargeting.characterToVSubject2(pAnn, false));
  const auto& s = labeling.getSubjectParametrised();
  ASSERT_EQ(s.m_Segments.size(), 2u);
  EXPECT_EQ(s.m_Segments[1].m_Joint.m_JointType, CoreOstraTypes::VJointTypeBase::EHinge);
  EXPECT_EQ(s.m_Markers.size(), 4u);
  EXPECT_EQ(s.m_Targets.size(), 2u);
  // The solving copy drops the cluster, the retargeting copy every marker.
  EXPECT_EQ(solving.getSubjectParametrised().m_Targets.size(), 1u);
  EXPECT_EQ(solving.getSubjectParametrised().m_Segments, s.m_Segments);
  EXPECT_TRUE(retargeting.getSubjectParametrised().m_Markers.empty());
  EXPECT_EQ(g_db->getNumLabelingClusters(), 1);
}

TEST_F(SubjectSceneInputTest, SceneFileFaultsNameTheirPathAndChangeNothing) {
  const std::pair<const char*, const char*> cases[] = {
      {R"({"subjects": [{"name": "Bob", "file": "Missing.kmf"}]})", "/subjects/0/file"},
      {R"({"subjects": [{"name": "A", "setups": {"labeling": {"root": {"name": "R", "joint": "elbow"}}}}]})",
       "/subjects/0/setups/labeling/root/joint"},
      {R"({"subjects": [{"name": "A", "setups": {"solving": "retargeting"}}]})",
       "/subjects/0/setups/solving"},
      {R"({"subjects": [{"name": "A", "setups": {"retargeting": {"root": {"name": "R",
          "markers": [{"name": "M", "position": [0, 0, 0]}]}}}}]})",
       "/subjects/0/setups/retargeting/root/markers"},
      {R"({"subjects": [{"name": "A", "setups": {"labeling": {"root": {"name": "R",
          "clusters": [{"name": "C", "markers": []}]}}}}]})",
       "/subjects/0/setups/labeling/root/clusters/0/markers"}};
  for (const auto& [text, path] : cases) {
    std::string error;
    EXPECT_FALSE(readScene(text, error)) << text;
    EXPECT_NE(error.find(path), std::string::npos) << error;
  }
  EXPECT_EQ(g_db->getRoot()->getNumChildren(), 0);
}

} // namespace
