// The MCP exporter on the demo take: what each frame and the item table hold, what each option
// leaves out, timecode, and the user setup.
#include "AnvilCore/demo/DemoScene.h"
#include "McpFile.h"
#include "exporters/mcp/AnvilMCPExporter.h"
#include "plugin/host/Character.h"
#include "plugin/host/Database.h"
#include "plugin/host/HInterface.h"
#include "plugin/host/HTimeManager.h"
#include "plugin/host/LabelingSetup.h"
#include "plugin/host/Marker.h"
#include "plugin/host/OpticalCamera.h"
#include "plugin/host/ParameterizedSetup.h"
#include "plugin/host/RetargetingSetup.h"
#include "plugin/host/SolvingSetup.h"
#include "plugin/host/SubjectBone.h"
#include "plugin/host/SubjectManager.h"
#include <cmath>

namespace {

namespace Cat = ZMT::Catalogue;
using McpTest::McpFile;

constexpr std::uint32_t kCameraTypes[] = {4096, 4098, 4106, 4143};
constexpr std::uint32_t kSubjectTypes[] = {4122, 4114, 4115, 36878, 4140, 4123,
                                           4124, 4162, 4155, 4152,  4153, 4166};

class McpExporterTest : public ::testing::Test {
protected:
  void SetUp() override {
    AnvilCore::buildDemoScene();
    m_pExporter.reset(AnvilMCPExporter::createInstance());
    for (int i = 0; i < g_db->getNumOpticalCameras(); ++i)
      if (!g_db->getOpticalCamera(i)->isDV()) {
        ++m_cameras;
        m_calibrated += g_db->getOpticalCamera(i)->isCalibrated() ? 1 : 0;
      }
    m_subjects = g_db->getSubjectManager()->getNumSubjects();
  }
  std::string record(const std::string& i_rName) {
    const std::string path = ExportTest::tempPath(i_rName);
    ExportTest::exportText(*m_pExporter, path);
    return path;
  }
  const Marker* marker(const char* i_pName) const {
    for (Module* p : g_db->getModules())
      if (p->isKindOf(&Marker::s_classMarker) && p->getName() == i_pName)
        return static_cast<const Marker*>(p);
    return nullptr;
  }

  ExportTest::Owned<AnvilMCPExporter> m_pExporter;
  int m_cameras = 0;
  int m_calibrated = 0;
  int m_subjects = 0; ///< the walker and the prop, each with all three setups
};

TEST_F(McpExporterTest, TheDemoTakeHoldsEveryFrameOfThePlayRangeWithItsTrajectories) {
  McpFile file(record("demo.mcp"));
  ASSERT_EQ(file.openResult(), ZMT::IResult(ZMT::IResult::Ok)) << file.problems();
  EXPECT_TRUE(file.reader().IsComplete());
  const HTimeManager& time = *g_db->getTimeManager();
  const std::int64_t tpf = time.getTicksPerFrame();
  ASSERT_EQ(file.stateCount(), 960u);
  // A frame at T is recorded at T minus one frame.
  EXPECT_EQ(file.reader().GetIndex().front().m_Tick, 119 * tpf);
  EXPECT_EQ(file.reader().GetIndex().back().m_Tick, 1078 * tpf);

  ASSERT_GT(m_cameras, 0);
  std::map<std::uint32_t, int> statics = file.staticCounts();
  for (std::uint32_t type : kCameraTypes)
    EXPECT_EQ(statics[type], m_cameras) << type;
  ASSERT_EQ(m_subjects, 2);
  for (std::uint32_t type : kSubjectTypes)
    EXPECT_EQ(statics[type], m_subjects) << type;

  // Frame 300: the left wrist's second marker is hidden; every other is where the scene keyed it.
  const std::size_t index = 300 - 120;
  ZMT::IFlowStateHandle state = file.state(index);
  ZMT::IFlowItemHandle setItem, trackItem, labelItem, tableItem;
  auto* pSet = file.first<Cat::VFlowReconstructionSet>(state, setItem);
  auto* pTracks = file.first<Cat::VFlowReconstructionTrackSet>(state, trackItem);
  auto* pLabels = file.first<Cat::VFlowReconstructionLabelSet>(state, labelItem);
  auto* pTable = file.first<Cat::VFlowParametersItem>(state, tableItem);
  ASSERT_TRUE(pSet && pTracks && pLabels && pTable);
  ASSERT_EQ(pTracks->m_ReconstructionTracks.size(), pSet->m_Reconstructions.size());
  ASSERT_EQ(pLabels->m_ReconstructionLabels.size(), pSet->m_Reconstructions.size());
  EXPECT_EQ(pTable->m_Tags.size(), 44u);
  EXPECT_EQ(pTable->m_Tags.at(0), "Walker:LFHD");
  EXPECT_EQ(pTable->m_Tags.at(43), "Unlabeled3");
  // Unlabeled2 flickers off on frames whose seventh is a multiple of three; 300/7 = 42.
  int unlabelledSeen = 0;
  bool wristSeen = false;
  for (std::size_t i = 0; i < pSet->m_Reconstructions.size(); ++i) {
    const std::string& label =
        pTable->m_Tags.at(std::int32_t(pTracks->m_ReconstructionTracks[i].m_TrackId));
    wristSeen |= label == "Walker:LWRB";
    const bool unlabelled = label.rfind("Unlabeled", 0) == 0;
    unlabelledSeen += unlabelled;
    EXPECT_EQ(pLabels->m_ReconstructionLabels[i].m_Score, unlabelled ? 0.0f : 1.0f) << label;
    const std::string name = label.substr(label.find(':') + 1);
    const Marker* pMarker = marker(name.c_str());
    ASSERT_NE(pMarker, nullptr) << label;
    const Vec3 p = pMarker->m_track.evaluate(300 * tpf, Vec3());
    EXPECT_EQ(pSet->m_Reconstructions[i].m_Position, (std::array<double, 3>{p.x, p.y, p.z}))
        << label;
  }
  EXPECT_FALSE(wristSeen);
  EXPECT_EQ(unlabelledSeen, 2); // Unlabeled1 (100-400) and Unlabeled3; Unlabeled2 starts at 500
  EXPECT_EQ(pSet->m_Reconstructions.size(), 41u - 1u + 2u);

  // The table is one item shared by every frame.
  ZMT::IFlowStateHandle last = file.state(file.stateCount() - 1);
  ZMT::IFlowItemHandle lastTable;
  ASSERT_TRUE(file.first<Cat::VFlowParametersItem>(last, lastTable));
  EXPECT_EQ(lastTable.GetToken(), tableItem.GetToken());

  // The subject's pose, one centroid set per calibrated camera, the scene's turn (Z up).
  std::map<std::uint32_t, int> counts = file.stateCounts(index);
  EXPECT_EQ(counts[Cat::VFlowSubjectWorldPose::FlowTypeId], 1);
  EXPECT_EQ(counts[Cat::VFlowSubjectLocalPose::FlowTypeId], 1);
  EXPECT_EQ(counts[Cat::VFlowCentroidSet::FlowTypeId], m_calibrated);
  ZMT::IFlowItemHandle orientationItem;
  auto* pOrientation = file.first<Cat::VFlowSceneOrientation>(state, orientationItem);
  ASSERT_TRUE(pOrientation);
  EXPECT_EQ(pOrientation->m_Orientation, (std::array<double, 4>{0.0, 0.0, 0.0, 1.0}));
  ZMT::IFlowItemHandle poseItem;
  auto* pPose = file.first<Cat::VFlowSubjectWorldPose>(state, poseItem);
  ASSERT_TRUE(pPose);
  EXPECT_EQ(pPose->m_SubjectId, 1u);
  EXPECT_FALSE(pPose->m_Segments.empty());
}

TEST_F(McpExporterTest, CentroidsAreTheMarkersAsEachCameraImagesThem) {
  // Two markers for the first calibrated camera: three metres along its view (it looks down its
  // -Z axis), and as far behind it.
  const OpticalCamera* pCamera = nullptr;
  for (int i = 0; i < g_db->getNumOpticalCameras() && !pCamera; ++i)
    if (g_db->getOpticalCamera(i)->isCalibrated() && !g_db->getOpticalCamera(i)->isDV())
      pCamera = g_db->getOpticalCamera(i);
  ASSERT_NE(pCamera, nullptr);
  const Vec3& v = pCamera->getCalibrationOrientation();
  const double angle = std::sqrt(v.x * v.x + v.y * v.y + v.z * v.z);
  const AnvilRotation turn(Vec3(v.x / angle, v.y / angle, v.z / angle), angle * 180.0 / M_PI);
  const Vec3 ahead = turn.rotate(Vec3(0.0, 0.0, -3000.0));
  const Vec3 at = pCamera->getCalibrationPosition();
  const HTime first = g_db->getTimeManager()->getPlayRange().getStart();
  for (const double side : {1.0, -1.0}) {
    auto* pMarker = new Marker(side > 0 ? "Ahead" : "Behind");
    pMarker->setUnlabeled(true);
    pMarker->m_track.setKey(
        first, Vec3(at.x + side * ahead.x, at.y + side * ahead.y, at.z + side * ahead.z));
    g_db->addToScene(pMarker, false, nullptr, false, false);
  }

  McpFile file(record("centroids.mcp"));
  ZMT::IFlowStateHandle state = file.state(0);
  ZMT::VItemHandles sets;
  state->GetItems(sets, Cat::VFlowCentroidSet::FlowTypeId, ZMT::EMatch::Equal, state->GetTime());
  ASSERT_EQ(int(sets.size()), m_calibrated);
  ZMT::IFlowItemHandle setItem;
  const Cat::VFlowCentroidSet* pSet = nullptr;
  for (const auto& item : sets) {
    const auto* pCandidate = item.As<ZMT::Detail::VFlowItem<Cat::VFlowCentroidSet>>();
    for (const auto& centroid : pCandidate->m_Centroids) {
      EXPECT_GE(centroid.m_Position[0], 0.0);
      EXPECT_GE(centroid.m_Position[1], 0.0);
      EXPECT_GT(centroid.m_Radius, 0.0);
    }
    if (pCandidate->m_DeviceURN == pCamera->getDeviceURN().GetString()) pSet = pCandidate;
  }
  ASSERT_NE(pSet, nullptr);
  // Exactly one centroid sits on the principal point, the size of a 14 mm marker at 3 m; the
  // marker behind the camera is not imaged.
  int onAxis = 0;
  for (const auto& centroid : pSet->m_Centroids)
    if (std::abs(centroid.m_Position[0] - pCamera->getPrincipalPoint().x) < 1e-6 &&
        std::abs(centroid.m_Position[1] - pCamera->getPrincipalPoint().y) < 1e-6) {
      ++onAxis;
      EXPECT_NEAR(centroid.m_Radius, pCamera->getFocalLengthInPixels() * 7.0 / 3000.0, 1e-9);
    }
  EXPECT_EQ(onAxis, 1);
  for (const auto& centroid : pSet->m_Centroids) {
    EXPECT_LT(centroid.m_Position[0], pCamera->getSensorWidth());
    EXPECT_LT(centroid.m_Position[1], pCamera->getSensorHeight());
  }
}

TEST_F(McpExporterTest, EachOptionLeavesOutWhatItNames) {
  struct Case {
    const char* name;
    McpExportOptions options;
    bool cameras, subjects, centroids, poses, states;
  };
  const Case cases[] = {
      {"no cameras", {false, true, true, true}, false, true, true, true, true},
      {"no subjects", {true, false, true, true}, true, false, true, true, true},
      {"no camera data", {true, true, false, true}, true, true, false, true, true},
      {"no subject motion", {true, true, true, false}, true, true, true, false, true},
      {"no dynamic data", {true, true, false, false}, true, true, false, false, false},
  };
  for (const Case& c : cases) {
    SCOPED_TRACE(c.name);
    McpExportOptions options = c.options;
    ASSERT_TRUE(m_pExporter->setOptions(&options));
    McpFile file(record("options.mcp"));
    ASSERT_EQ(file.openResult(), ZMT::IResult(ZMT::IResult::Ok)) << file.problems();
    std::map<std::uint32_t, int> statics = file.staticCounts();
    EXPECT_EQ(statics[4096], c.cameras ? m_cameras : 0);
    EXPECT_EQ(statics[4122], c.subjects ? m_subjects : 0);
    ASSERT_EQ(file.stateCount(), c.states ? 960u : 0u);
    if (!c.states) continue;
    std::map<std::uint32_t, int> counts = file.stateCounts(10);
    EXPECT_EQ(counts[4096], c.cameras ? m_cameras : 0);
    EXPECT_EQ(counts[4122], c.subjects ? m_subjects : 0);
    EXPECT_EQ(counts[Cat::VFlowCentroidSet::FlowTypeId], c.centroids ? m_calibrated : 0);
    EXPECT_EQ(counts[Cat::VFlowSubjectWorldPose::FlowTypeId], c.poses ? 1 : 0);
    // Trajectories go with every take.
    EXPECT_EQ(counts[Cat::VFlowReconstructionSet::FlowTypeId], 1);
  }
}

TEST_F(McpExporterTest, AllOptionsOffGivesAFileWithNothingInIt) {
  McpExportOptions options{false, false, false, false};
  m_pExporter->setOptions(&options);
  McpFile file(record("empty.mcp"));
  ASSERT_EQ(file.openResult(), ZMT::IResult(ZMT::IResult::Ok)) << file.problems();
  EXPECT_TRUE(file.reader().IsComplete());
  EXPECT_EQ(file.stateCount(), 0u);
  EXPECT_TRUE(file.staticCounts().empty());
}

TEST_F(McpExporterTest, ASubjectStandingStillGivesStaticItemsOnly) {
  Character* pWalker = g_db->getSubjectManager()->getSubject(0);
  ASSERT_NE(pWalker, nullptr);
  for (ParameterizedSetup* pSetup :
       {static_cast<ParameterizedSetup*>(pWalker->getLabelingSetup(false)),
        static_cast<ParameterizedSetup*>(pWalker->getSolvingSetup(false)),
        static_cast<ParameterizedSetup*>(pWalker->getRetargetingSetup(false))}) {
    std::vector<SubjectBone*> bones;
    pSetup->collectBones(bones);
    for (SubjectBone* pBone : bones) {
      pBone->m_positionTrack.clear();
      pBone->m_rotationTrack.clear();
    }
  }
  ASSERT_FALSE(g_db->getSubjectManager()->subjectsHaveAnimation());
  McpFile file(record("still.mcp"));
  EXPECT_EQ(file.stateCount(), 0u);
  EXPECT_EQ(file.staticCounts()[4122], m_subjects);
}

TEST_F(McpExporterTest, TimecodeComesFromTheActiveClipWhenItIsValid) {
  {
    McpFile file(record("timecode.mcp"));
    ZMT::IFlowStateHandle state = file.state(0);
    ZMT::IFlowItemHandle item;
    auto* pTimecode = file.first<Cat::VFlowTimecode>(state, item);
    ASSERT_TRUE(pTimecode);
    // The demo's clip starts at 01:00:00:00 (30 Hz); the first state is at 119/120 s.
    EXPECT_EQ(pTimecode->m_hours, 1);
    EXPECT_EQ(pTimecode->m_minutes, 0);
    EXPECT_EQ(pTimecode->m_seconds, 0);
    EXPECT_EQ(pTimecode->m_frames, 29);
  }
  // A mode with no standard gives no timecode, and the take is still written.
  g_db->getTimeManager()->setTimecodeMode(99);
  {
    McpFile file(record("no-standard.mcp"));
    ASSERT_EQ(file.stateCount(), 960u);
    EXPECT_EQ(file.stateCounts(0)[Cat::VFlowTimecode::FlowTypeId], 0);
  }
  g_db->getTimeManager()->setTimecodeMode(0);
  g_db->setActiveClip(nullptr, false, false, false);
  McpFile file(record("no-clip.mcp"));
  ASSERT_EQ(file.stateCount(), 960u);
  EXPECT_EQ(file.stateCounts(0)[Cat::VFlowTimecode::FlowTypeId], 0);
}

TEST_F(McpExporterTest, UserSetupKeepsTheFourFlagsUnderTheirKeys) {
  McpExportOptions options{false, true, false, true};
  m_pExporter->setOptions(&options);
  m_pExporter->saveUserSetup();
  const HString& scope = HString::EMPTY_STRING;
  EXPECT_FALSE(g_interface.getUserSetupBool("MCPExporter", "ExportCameras", true, scope));
  EXPECT_TRUE(g_interface.getUserSetupBool("MCPExporter", "ExportSubjects", false, scope));
  EXPECT_FALSE(g_interface.getUserSetupBool("MCPExporter", "ExportCameraDynamicData", true, scope));
  EXPECT_TRUE(
      g_interface.getUserSetupBool("MCPExporter", "ExportSubjectDynamicData", false, scope));

  ExportTest::Owned<AnvilMCPExporter> other(AnvilMCPExporter::createInstance());
  other->loadUserSetup();
  EXPECT_FALSE(other->getExportCameras());
  EXPECT_TRUE(other->getExportSubjects());
  EXPECT_FALSE(other->getExportCamerasDynamicData());
  EXPECT_TRUE(other->getExportSubjectsDynamicData());
}

} // namespace
