// The FBX exporter against a small scene, read back with the test reader: tree, connections,
// transforms, camera and light, time mode, axes, curves, and the options that shape them.
#include "FbxExportFixture.h"
#include "plugin/host/NLEClip.h"
#include <fstream>
#include <gtest/gtest.h>
#include <sys/wait.h>

using namespace FbxExportTest;
using ExportTest::Owned;

namespace {

class FbxExporterTest : public testing::Test {
protected:
  void SetUp() override { m_parts = buildScene(); }
  Owned<AnvilFbxExporter> m_exporter{AnvilFbxExporter::createInstance()};
  SceneParts m_parts{};
};

TEST_F(FbxExporterTest, TreeConnectionsTransformsAndCurvesFollowTheScene) {
  HostTest::LogCapture log;
  const FbxTest::File file = exportFbx(*m_exporter, "tree.fbx");
  EXPECT_EQ(file.version, 7700u); // 2020 by default
  const FbxTest::Scene scene(file);

  // Subject as a null at the root, its marker and its bone below it (the setup gives no node).
  const FbxTest::Object* pBob = scene.model("Bob");
  const FbxTest::Object* pMarker = scene.model("Bob:LFHD");
  const FbxTest::Object* pBone = scene.model("Bob:Hips");
  const FbxTest::Object* pCamera = scene.model("Cam");
  const FbxTest::Object* pLight = scene.model("Lamp");
  ASSERT_TRUE(pBob && pMarker && pBone && pCamera && pLight);
  EXPECT_EQ(scene.ofType("Model").size(), 5u);
  EXPECT_EQ(scene.parentOf(pBob->id), 0);
  EXPECT_EQ(scene.parentOf(pMarker->id), pBob->id);
  EXPECT_EQ(scene.parentOf(pBone->id), pBob->id);
  EXPECT_EQ(scene.parentOf(pCamera->id), 0);
  EXPECT_EQ(pBob->subtype, "Null");
  EXPECT_EQ(pMarker->subtype, "Marker");
  EXPECT_EQ(pBone->subtype, "LimbNode");
  EXPECT_EQ(pCamera->subtype, "Camera");
  EXPECT_EQ(pLight->subtype, "Camera"); // a light travels as a camera
  // Each model has one attribute of its kind.
  for (const FbxTest::Object* pModel : {pBob, pMarker, pBone, pCamera, pLight}) {
    int attributes = 0;
    for (const auto& [source, property] : scene.sourcesOf(pModel->id))
      if (scene.byId(source)->node->name == "NodeAttribute") {
        ++attributes;
        EXPECT_EQ(scene.byId(source)->subtype, pModel->subtype);
      }
    EXPECT_EQ(attributes, 1) << pModel->name;
  }

  // Marker: millimetres to centimetres, one key per frame at the FBX tick of the frame.
  const FbxTest::Node* pX = scene.curve("Bob:LFHD", "Lcl Translation", "d|X");
  const FbxTest::Node* pZ = scene.curve("Bob:LFHD", "Lcl Translation", "d|Z");
  ASSERT_TRUE(pX && pZ);
  const std::vector<int64_t> times = FbxTest::Scene::keyTimes(*pX);
  ASSERT_EQ(times.size(), size_t(kFrames));
  for (int f = 0; f < kFrames; ++f) {
    EXPECT_EQ(times[size_t(f)], ticksOfFrame(f));
    EXPECT_NEAR(FbxTest::Scene::keyValues(*pX)[size_t(f)], 1.0 * f, 1e-5);
    EXPECT_NEAR(FbxTest::Scene::keyValues(*pZ)[size_t(f)], 100.0, 1e-4);
  }
  EXPECT_EQ(pX->child("KeyAttrFlags")->props[0].integers, std::vector<int64_t>({4})); // linear

  // Bone: translation is its pre-translation, rotation keys in degrees about Z.
  EXPECT_NEAR(pValue(*pBone->node, "Lcl Translation", 2), 90.0, 1e-9);
  const FbxTest::Node* pRz = scene.curve("Bob:Hips", "Lcl Rotation", "d|Z");
  ASSERT_NE(pRz, nullptr);
  const std::vector<double> angles = FbxTest::Scene::keyValues(*pRz);
  EXPECT_NEAR(angles[3], 60.0, 1e-4);
  EXPECT_NEAR(std::remainder(angles[12] - 240.0, 360.0), 0.0, 1e-3);

  // Camera: moving along X, turned so that FBX's +X view axis is the host's -Z.
  const FbxTest::Node* pCx = scene.curve("Cam", "Lcl Translation", "d|X");
  ASSERT_NE(pCx, nullptr);
  EXPECT_NEAR(FbxTest::Scene::keyValues(*pCx)[4], 2.0, 1e-5);
  EXPECT_NEAR(pValue(*pCamera->node, "PostRotation", 1), -90.0, 1e-9);
  EXPECT_NEAR(pValue(*pLight->node, "PostRotation", 1), -90.0, 1e-9);
  EXPECT_EQ(pValue(*pCamera->node, "RotationActive"), 1.0);
  for (const auto& [source, property] : scene.sourcesOf(pCamera->id)) {
    const FbxTest::Object* pAttribute = scene.byId(source);
    if (pAttribute->node->name != "NodeAttribute") continue;
    EXPECT_EQ(pValue(*pAttribute->node, "FilmFormatIndex"), 5.0);
    EXPECT_NEAR(pValue(*pAttribute->node, "FilmWidth"), 0.980, 1e-12);
    EXPECT_NEAR(pValue(*pAttribute->node, "FilmHeight"), 0.735, 1e-12);
  }
  EXPECT_NEAR(pValue(*pLight->node, "Lcl Translation", 2), 300.0, 1e-9);

  // Clock and axes: 100 Hz without timecode is eFrames100; the scene is Z up.
  const FbxTest::Node* pSettings = file.section("GlobalSettings");
  EXPECT_EQ(pValue(*pSettings, "TimeMode"), 2.0);
  EXPECT_EQ(pValue(*pSettings, "CustomFrameRate"), 100.0);
  EXPECT_EQ(pValue(*pSettings, "UpAxis"), 2.0);
  EXPECT_EQ(pValue(*pSettings, "FrontAxisSign"), -1.0);
  // One take covering the animation range.
  const auto stacks = scene.ofType("AnimationStack");
  ASSERT_EQ(stacks.size(), 1u);
  EXPECT_EQ(stacks[0]->name, "Take 001");
  EXPECT_EQ(int64_t(pValue(*stacks[0]->node, "LocalStop")), ticksOfFrame(kFrames - 1));
  EXPECT_TRUE(log.errors().empty());
  // The host scene is back as it was.
  EXPECT_FALSE(g_db->isSceneRotated());
}

TEST_F(FbxExporterTest, UpAxisYTurnsTheDataAndVersion2014Writes7400) {
  m_exporter->setDesiredUpAxis(FbxExportOptions::EUpAxisY);
  m_exporter->setFBXVersion(FbxExportOptions::E2014);
  const FbxTest::File file = exportFbx(*m_exporter, "ySide.fbx");
  EXPECT_EQ(file.version, 7400u);
  EXPECT_EQ(pValue(*file.section("GlobalSettings"), "UpAxis"), 1.0);
  const FbxTest::Scene scene(file);
  // The subject at the root carries the turn as its pre-rotation; its marker's local keys map
  // through it: Z up (1000 mm) becomes Y up, and facing positive turns X and Z about Y.
  const FbxTest::Object* pBob = scene.model("Bob");
  ASSERT_NE(pBob, nullptr);
  AnvilRotation pre;
  pre.setAsEuler(AnvilRotation::XYZ,
                 Vec3(pValue(*pBob->node, "PreRotation", 0), pValue(*pBob->node, "PreRotation", 1),
                      pValue(*pBob->node, "PreRotation", 2)));
  Vec3 local;
  for (int a = 0; a < 3; ++a) {
    const char* channels[] = {"d|X", "d|Y", "d|Z"};
    local[a] =
        FbxTest::Scene::keyValues(*scene.curve("Bob:LFHD", "Lcl Translation", channels[a]))[3];
  }
  const Vec3 world = pre.rotate(local);
  EXPECT_NEAR(world.x, -3.0, 1e-4);
  EXPECT_NEAR(world.y, 100.0, 1e-4);
  EXPECT_NEAR(world.z, 2.0, 1e-4);
  // A root marker takes the turn in its own keys.
  const FbxTest::Node* pCy = scene.curve("Cam", "Lcl Translation", "d|Y");
  ASSERT_NE(pCy, nullptr);
  EXPECT_NEAR(FbxTest::Scene::keyValues(*pCy)[0], 150.0, 1e-4);
  EXPECT_FALSE(g_db->isSceneRotated());

  // Up axis Z on a Z-up scene: no turn at all.
  m_exporter->setDesiredUpAxis(FbxExportOptions::EUpAxisZ);
  const FbxTest::Scene zScene(exportFbx(*m_exporter, "zSide.fbx"));
  EXPECT_NEAR(FbxTest::Scene::keyValues(*zScene.curve("Bob:LFHD", "Lcl Translation", "d|Z"))[3],
              100.0, 1e-4);
}

TEST_F(FbxExporterTest, CollapseSubjectsPutsTheSubjectsPartsAtTheRoot) {
  m_exporter->setCollapseSubjects(true);
  const FbxTest::Scene scene(exportFbx(*m_exporter, "collapse.fbx"));
  EXPECT_EQ(scene.model("Bob"), nullptr);
  ASSERT_NE(scene.model("Bob:LFHD"), nullptr);
  EXPECT_EQ(scene.parentOf(scene.model("Bob:LFHD")->id), 0);
  EXPECT_EQ(scene.parentOf(scene.model("Bob:Hips")->id), 0);
}

TEST_F(FbxExporterTest, NamespaceModesNameNodes) {
  struct Case {
    FbxExportOptions::ENamespaceMode mode;
    const char* marker;
  };
  for (const Case& c : {Case{FbxExportOptions::ENamespaceFull, "Bob:LFHD"},
                        Case{FbxExportOptions::ENamespaceShort, "Bob:LFHD"},
                        Case{FbxExportOptions::ENamespaceNone, "LFHD"},
                        Case{FbxExportOptions::ENamespaceUseName, "LFHD"}}) {
    m_exporter->setNamespaceMode(c.mode);
    m_exporter->reset();
    const FbxTest::Scene scene(exportFbx(*m_exporter, "ns.fbx"));
    EXPECT_NE(scene.model(c.marker), nullptr) << int(c.mode);
  }
  // Full names go through the setup: subject, setup, bone.
  m_exporter->setNamespaceMode(FbxExportOptions::ENamespaceFull);
  m_exporter->reset();
  EXPECT_NE(FbxTest::Scene(exportFbx(*m_exporter, "full.fbx")).model("Bob:Bob:Hips"), nullptr);
}

TEST(FbxExporterNames, SpacesColonsAndNonAsciiSurvive) {
  buildScene("Left Knee:é✓");
  Owned<AnvilFbxExporter> exporter(AnvilFbxExporter::createInstance());
  const std::string name = "Left Knee:é✓";
  struct Case {
    FbxExportOptions::ENamespaceMode mode;
    std::string expected;
  };
  for (const Case& c : {Case{FbxExportOptions::ENamespaceFull, "Bob:" + name},
                        Case{FbxExportOptions::ENamespaceShort, "Bob:" + name},
                        Case{FbxExportOptions::ENamespaceUseName, name},
                        // Mode none keeps the text after the last colon.
                        Case{FbxExportOptions::ENamespaceNone, "é✓"}}) {
    exporter->setNamespaceMode(c.mode);
    exporter->reset();
    const FbxTest::Scene scene(exportFbx(*exporter, "names.fbx"));
    EXPECT_NE(scene.model(c.expected), nullptr) << c.expected;
  }
}

TEST_F(FbxExporterTest, UnrollRemovesTheWrapOfTheBoneCurve) {
  auto largestStep = [](const FbxTest::Node& i_rCurve) {
    const std::vector<double> v = FbxTest::Scene::keyValues(i_rCurve);
    double largest = 0.0;
    for (size_t k = 1; k < v.size(); ++k)
      largest = std::max(largest, std::fabs(v[k] - v[k - 1]));
    return largest;
  };
  const FbxTest::Scene plain(exportFbx(*m_exporter, "plain.fbx"));
  EXPECT_GT(largestStep(*plain.curve("Bob:Hips", "Lcl Rotation", "d|Z")), 300.0);
  m_exporter->setUnrollAnimationCurves(true);
  m_exporter->reset();
  const FbxTest::Scene unrolled(exportFbx(*m_exporter, "unrolled.fbx"));
  const FbxTest::Node* pZ = unrolled.curve("Bob:Hips", "Lcl Rotation", "d|Z");
  EXPECT_NEAR(largestStep(*pZ), 20.0, 1e-3);
  EXPECT_NEAR(FbxTest::Scene::keyValues(*pZ).back(), 380.0, 1e-3);
}

TEST_F(FbxExporterTest, PlayRangeOnlyKeepsTheKeysOfThePlayRange) {
  m_exporter->setExportPlayRangeOnly(true);
  const FbxTest::Scene scene(exportFbx(*m_exporter, "play.fbx"));
  const std::vector<int64_t> times =
      FbxTest::Scene::keyTimes(*scene.curve("Bob:LFHD", "Lcl Translation", "d|X"));
  ASSERT_EQ(times.size(), 10u);
  EXPECT_EQ(times.front(), ticksOfFrame(5));
  EXPECT_EQ(times.back(), ticksOfFrame(14));
  EXPECT_EQ(int64_t(pValue(*scene.ofType("AnimationStack")[0]->node, "LocalStart")),
            ticksOfFrame(5));
}

TEST_F(FbxExporterTest, EveryClipGetsATakeUnlessOnlyTheActiveOne) {
  const int64_t tpf = g_db->getTimeManager()->getTicksPerFrame();
  auto* pFirst = new NLEClip("Walk", HTimeRange(0, 9 * tpf));
  auto* pSecond = new NLEClip("Run", HTimeRange(10 * tpf, 19 * tpf), 100 * tpf);
  g_db->addClip(pFirst);
  g_db->addClip(pSecond);
  g_db->setActiveClip(pSecond, false, false, false);

  const FbxTest::Scene active(exportFbx(*m_exporter, "active.fbx"));
  ASSERT_EQ(active.ofType("AnimationStack").size(), 1u);
  EXPECT_EQ(active.ofType("AnimationStack")[0]->name, "Run");
  // Key times run on the clip's timeline: the start offset is added.
  EXPECT_EQ(FbxTest::Scene::keyTimes(*active.curve("Bob:LFHD", "Lcl Translation", "d|X"))[0],
            ticksOfFrame(100));

  m_exporter->setExportActiveClipOnly(false);
  m_exporter->reset();
  const FbxTest::Scene all(exportFbx(*m_exporter, "all.fbx"));
  ASSERT_EQ(all.ofType("AnimationStack").size(), 2u);
  EXPECT_EQ(all.ofType("AnimationStack")[0]->name, "Walk");
  EXPECT_EQ(all.ofType("AnimationStack")[1]->name, "Run");
  EXPECT_EQ(all.ofType("Model").size(), 5u); // nodes are made once, animated per take
  EXPECT_EQ(g_db->getActiveClip(), pSecond);
}

TEST(FbxExporterScenes, EmptyPartsStillWriteAndAnEmptySceneFails) {
  HostTest::resetScene(kRate, kFrames);
  g_db->getTimeManager()->setTimecodeMode(6);
  Owned<AnvilFbxExporter> exporter(AnvilFbxExporter::createInstance());
  {
    HostTest::LogCapture log;
    AnvilCore::ExportRequest request;
    request.path = ExportTest::tempPath("empty.fbx");
    std::filesystem::remove(request.path);
    std::string error;
    EXPECT_EQ(AnvilCore::runExport(*exporter, request, error),
              AnvilCore::EExportStatus::EWriteFailed);
    EXPECT_EQ(log.errors(), std::vector<std::string>({"No nodes to export"}));
    EXPECT_FALSE(std::filesystem::exists(request.path));
  }
  // Only an unlabelled marker: no subject, no camera.
  HostTest::addMarker("Loose", {Vec3(1, 2, 3)});
  exporter->reset();
  EXPECT_NE(FbxTest::Scene(exportFbx(*exporter, "loose.fbx")).model("Loose"), nullptr);
  // Only a camera: no marker.
  HostTest::resetScene(kRate, kFrames);
  g_db->getTimeManager()->setTimecodeMode(6);
  g_db->addToScene(new HCamera("OnlyCam"), false, nullptr, false, false);
  exporter->reset();
  EXPECT_NE(FbxTest::Scene(exportFbx(*exporter, "cam.fbx")).model("OnlyCam"), nullptr);
}

TEST(FbxExporterScenes, TimeModesFollowTheClock) {
  struct Case {
    int timecode;
    double rate;
    int fileMode; // -1: the export fails
  };
  Owned<AnvilFbxExporter> exporter(AnvilFbxExporter::createInstance());
  for (const Case& c : {Case{0, 120.0, 1}, Case{3, 25.0, 10}, Case{4, 72.0, -1}, Case{6, 118.0, 14},
                        Case{1, 60.0, 14}, Case{0, 50.0, -1}}) {
    HostTest::resetScene(c.rate, 5);
    g_db->getTimeManager()->setTimecodeMode(c.timecode);
    HostTest::addMarker("M", {Vec3(1, 2, 3)});
    HostTest::LogCapture log;
    exporter->reset();
    AnvilCore::ExportRequest request;
    request.path = ExportTest::tempPath("mode.fbx");
    std::filesystem::remove(request.path);
    std::string error;
    const auto status = AnvilCore::runExport(*exporter, request, error);
    if (c.fileMode < 0) {
      EXPECT_EQ(status, AnvilCore::EExportStatus::EWriteFailed) << c.rate;
      EXPECT_FALSE(std::filesystem::exists(request.path));
      ASSERT_EQ(log.errors().size(), 2u);
      EXPECT_EQ(log.errors()[1], "An error occurred while creating the FBX scene");
      continue;
    }
    ASSERT_EQ(status, AnvilCore::EExportStatus::EOk) << c.rate;
    const FbxTest::File file = FbxTest::read(request.path);
    EXPECT_EQ(pValue(*file.section("GlobalSettings"), "TimeMode"), c.fileMode) << c.rate;
    if (c.rate == 118.0) {
      EXPECT_EQ(pValue(*file.section("GlobalSettings"), "CustomFrameRate"), 118.0);
      EXPECT_EQ(log.warnings().size(), 1u);
    }
  }
}

} // namespace

namespace {

TEST(FbxExporterFailures, AFailedExportKeepsTheOldFileAndLeavesNothingBeside) {
  buildScene();
  g_db->getTimeManager()->setTimecodeMode(4); // film at 100 fps: refused
  const std::filesystem::path dir = ExportTest::tempPath("keep");
  std::filesystem::create_directories(dir);
  const std::string path = (dir / "old.fbx").string();
  { std::ofstream(path) << "old bytes"; }
  Owned<AnvilFbxExporter> exporter(AnvilFbxExporter::createInstance());
  HostTest::LogCapture log;
  AnvilCore::ExportRequest request;
  request.path = path;
  std::string error;
  EXPECT_EQ(AnvilCore::runExport(*exporter, request, error),
            AnvilCore::EExportStatus::EWriteFailed);
  EXPECT_EQ(log.errors().front(), "Film may only be exported at 24, 48, 96, or 120.");
  EXPECT_EQ(ExportTest::readText(path), "old bytes");
  EXPECT_EQ(std::distance(std::filesystem::directory_iterator(dir),
                          std::filesystem::directory_iterator()),
            1);
  EXPECT_FALSE(g_db->isSceneRotated());
}

TEST(FbxExporterFailures, AnUnwritablePathExitsOneWithAMessage) {
  const std::string dir = ExportTest::tempPath("cli");
  std::filesystem::create_directories(dir);
  // A folder where the file should be: the finished file cannot replace it.
  const std::string blocked = dir + "/blocked.fbx";
  std::filesystem::create_directories(blocked);
  for (const std::string& target : {dir + "/missing/demo.fbx", blocked}) {
    const std::string command = std::string(ANVIL_BIN_DIR) + "/anvil export demo --user-setup " +
                                dir + "/setup.ini -o " + target + " 2>&1";
    FILE* pPipe = ::popen(command.c_str(), "r");
    ASSERT_NE(pPipe, nullptr);
    std::string output;
    char buffer[4096];
    for (size_t n; (n = std::fread(buffer, 1, sizeof buffer, pPipe)) > 0;)
      output.append(buffer, n);
    const int status = ::pclose(pPipe);
    EXPECT_EQ(WEXITSTATUS(status), 1) << output;
    EXPECT_NE(output.find(target), std::string::npos) << output;
  }
  EXPECT_TRUE(std::filesystem::is_directory(blocked));
  EXPECT_FALSE(std::filesystem::exists(dir + "/missing"));
  // Nothing but the blocked folder and the user setup is left in the folder.
  for (const auto& entry : std::filesystem::directory_iterator(dir))
    EXPECT_TRUE(entry.path() == blocked || entry.path().filename() == "setup.ini") << entry.path();
}

} // namespace
