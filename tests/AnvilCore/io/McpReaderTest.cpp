// MCP recordings written in the test and read back into the scene: trajectories with their gaps,
// subjects, cameras, the clock and the up axis; files that lack parts or are damaged.
#include "AnvilCore/demo/DemoWalk.h"
#include "McpTestFile.h"
#include "SceneReaderTestSupport.h"
#include "plugin/host/Character.h"
#include "plugin/host/HCameraConverter.h"
#include "plugin/host/HTimeManager.h"
#include "plugin/host/Marker.h"
#include "plugin/host/OpticalCamera.h"
#include "plugin/host/ParameterizedSetup.h"
#include <cmath>

namespace {

constexpr double kHalf = 0.70710678118654752;

class McpReaderTest : public SceneReaderTest {
protected:
  void SetUp() override {
    SceneReaderTest::SetUp();
    g_db->setLogSink([this](HLogLevel i_level, const std::string& i_text) {
      if (i_level == HLogLevel::EWarning) m_warnings.push_back(i_text);
    });
  }
  bool warned(const std::string& i_part) const {
    for (const std::string& warning : m_warnings)
      if (warning.find(i_part) != std::string::npos) return true;
    return false;
  }
  std::string allWarnings() const {
    std::string text;
    for (const std::string& warning : m_warnings)
      text += warning + "\n";
    return text;
  }
  Marker* marker(const std::string& i_path) const { return dynamic_cast<Marker*>(find(i_path)); }

  std::vector<std::string> m_warnings;
};

// Four tracks over three frames from frame 10: two markers of Bob (the second missing in the
// middle frame), an unlabelled marker and a top-level one.
McpTestFile takeWithBob() {
  const std::vector<std::string>& names = AnvilCore::demoWalkMarkerNames();
  McpTestFile file;
  file.firstFrame = 10;
  file.table = {{0, "Bob:" + names[0]}, {1, "Bob:" + names[1]}, {2, "*3"}, {3, "Loose"}};
  for (int f = 0; f < 3; ++f) {
    std::vector<McpTestFile::Point> points = {{0, {100.0 + f, 2.0, 3.0}},
                                              {1, {200.0 + f, 5.0, 6.0}},
                                              {2, {-1.0, -2.0, -3.0 - f}, 0.0f},
                                              {3, {7.0, 8.0, 9.0 * f}}};
    if (f == 1) points.erase(points.begin() + 1);
    file.frames.push_back(points);
  }
  AnvilCore::SubjectRecords bob = AnvilCore::demoWalkRecords();
  bob.subject.m_Name = "Bob";
  file.subjects.push_back(bob);
  return file;
}

TEST_F(McpReaderTest, BuildsMarkersWithGapsSubjectsAndTheClock) {
  std::string error;
  ASSERT_TRUE(read(writeFile("take.mcp", takeWithBob().build()), error)) << error;
  EXPECT_TRUE(m_warnings.empty()) << allWarnings();

  HTimeManager* pTime = g_db->getTimeManager();
  EXPECT_DOUBLE_EQ(pTime->getFrameRate(), 120.0);
  EXPECT_EQ(pTime->getTicksPerFrame(), 1125000);
  EXPECT_EQ(pTime->getAnimRange(), HTimeRange(pTime->frameToTime(10), pTime->frameToTime(12)));
  EXPECT_EQ(pTime->getPlayRange(), pTime->getAnimRange());

  const std::string lfhd = "Bob\\" + AnvilCore::demoWalkMarkerNames()[0];
  const std::string rfhd = "Bob\\" + AnvilCore::demoWalkMarkerNames()[1];
  ASSERT_NE(marker(lfhd), nullptr);
  ASSERT_NE(marker(rfhd), nullptr);
  ASSERT_NE(marker("*3"), nullptr);
  ASSERT_NE(marker("Loose"), nullptr);
  EXPECT_TRUE(marker("*3")->isUnlabeled());
  EXPECT_FALSE(marker("Loose")->isUnlabeled());
  EXPECT_FALSE(marker(lfhd)->isUnlabeled());

  // The gap stays a gap; keys land on the frames' scene times.
  EXPECT_EQ(marker(lfhd)->m_track.getNumKeys(), 3);
  ASSERT_EQ(marker(rfhd)->m_track.getNumKeys(), 2);
  EXPECT_FALSE(marker(rfhd)->m_track.hasKeyAt(pTime->frameToTime(11)));
  const Vec3 p = marker(rfhd)->getWSPos(pTime->frameToTime(12));
  EXPECT_DOUBLE_EQ(p.x, 202.0);
  EXPECT_DOUBLE_EQ(p.z, 6.0);
  EXPECT_DOUBLE_EQ(marker("Loose")->getWSPos(pTime->frameToTime(12)).z, 18.0);

  // Markers are made in track order; the subject's setups join its character after its markers.
  auto* pBob = dynamic_cast<Character*>(find("Bob"));
  ASSERT_NE(pBob, nullptr);
  ASSERT_EQ(pBob->getNumChildren(), 5);
  EXPECT_EQ(pBob->getChild(0), marker(lfhd));
  EXPECT_EQ(pBob->getChild(1), marker(rfhd));
  for (int i = 2; i < 5; ++i)
    EXPECT_TRUE(pBob->getChild(i)->isKindOf(&ParameterizedSetup::s_classParameterizedSetup));
  EXPECT_NE(pBob->getLabelingSetup(false), nullptr);
  const std::vector<std::string> top = {"Bob", "*3", "Loose"};
  std::vector<std::string> found;
  for (int i = 0; i < g_db->getRoot()->getNumChildren(); ++i)
    found.push_back(g_db->getRoot()->getChild(i)->getName().GetStr());
  EXPECT_EQ(found, top);
}

TEST_F(McpReaderTest, CamerasComeBackAsTheirRecordsSaid) {
  McpTestFile file;
  file.cameras = {mcpTestCamera(1), mcpTestCamera(2, false), mcpTestCamera(3)};
  const HTimeRange range = g_db->getTimeManager()->getAnimRange();
  std::string error;
  ASSERT_TRUE(read(writeFile("cameras.mcp", file.build()), error)) << error;
  EXPECT_FALSE(warned("cameras.mcp: 1 calibration")) << allWarnings();

  for (int c = 0; c < 3; ++c) {
    const std::string name = "Camera " + std::to_string(c + 1);
    auto* pCamera = dynamic_cast<OpticalCamera*>(find(name));
    ASSERT_NE(pCamera, nullptr) << name;
    EXPECT_EQ(pCamera->getCameraNumber(), c + 1);
    // Converting the camera back gives the records it was read from.
    CoreOstraTypes::VCameraHardware hardware;
    HCameraConverter::convertOpticalCameraToVCameraHardware(*pCamera, hardware);
    EXPECT_EQ(hardware, file.cameras[size_t(c)].hardware) << name;
    CoreOstraTypes::VCameraMaskGrid mask;
    HCameraConverter::convertOpticalCameraToVCameraMask(*pCamera, mask);
    EXPECT_EQ(mask, file.cameras[size_t(c)].mask) << name;
    CoreOstraTypes::VCameraCalibrationDetails details;
    HCameraConverter::convertOpticalCameraToVCameraCalibrationDetails(*pCamera, details);
    EXPECT_EQ(details, file.cameras[size_t(c)].details) << name;
    EXPECT_EQ(pCamera->isCalibrated(), c != 1) << name;
    if (!pCamera->isCalibrated()) continue;
    CoreOstraTypes::VCameraCalibration calibration;
    HCameraConverter::convertOpticalCameraToVCameraCalibration(*pCamera, calibration);
    EXPECT_EQ(calibration, file.cameras[size_t(c)].calibration) << name;
  }
  // A file of cameras alone leaves the clock as it was.
  EXPECT_DOUBLE_EQ(g_db->getTimeManager()->getFrameRate(), 120.0);
  EXPECT_EQ(g_db->getTimeManager()->getAnimRange(), range);
}

TEST_F(McpReaderTest, UpAxisFromTheSceneOrientation) {
  struct Case {
    std::optional<std::array<double, 4>> orientation;
    bool startZUp;
    bool zUp;
    bool warns;
  };
  const Case cases[] = {
      {std::array<double, 4>{0, 0, 0, 1}, false, true, false},
      {std::array<double, 4>{kHalf, 0, 0, kHalf}, true, false, false},
      {std::array<double, 4>{-kHalf, 0, 0, -kHalf}, true, false, false}, // the same turn
      {std::array<double, 4>{0.6, 0.1, 0, 0.79}, true, false, true},     // nearer Y up
      {std::array<double, 4>{0.1, 0.2, 0, 0.97}, false, true, true},     // nearer Z up
      {std::array<double, 4>{0, 0, 0, 0}, false, false, true},           // not a turn: unchanged
      {std::nullopt, false, false, false},
  };
  for (const Case& c : cases) {
    g_db->clearScene();
    g_db->setZUp(c.startZUp);
    m_warnings.clear();
    McpTestFile file;
    file.frames = {{{0, {1, 2, 3}}}};
    file.table = {{0, "A"}};
    file.orientation = c.orientation;
    std::string error;
    ASSERT_TRUE(read(writeFile("up.mcp", file.build()), error)) << error;
    const double x = c.orientation ? (*c.orientation)[0] : -1.0;
    EXPECT_EQ(g_db->isZUp(), c.zUp) << x;
    EXPECT_EQ(warned("up.mcp: the scene orientation"), c.warns) << x << allWarnings();
  }
}

TEST_F(McpReaderTest, MissingTablesAndSetsAreRepairedWithWarnings) {
  McpTestFile file;
  file.frames = {{{7, {1, 1, 1}}, {9, {2, 2, 2}}}, {{9, {3, 3, 3}}}};
  file.table = {{7, "A"}};
  file.withTable = false;
  std::string error;
  ASSERT_TRUE(read(writeFile("notable.mcp", file.build()), error)) << error;
  EXPECT_TRUE(warned("notable.mcp: no trajectory table")) << allWarnings();
  ASSERT_NE(marker("Track7"), nullptr);
  ASSERT_NE(marker("Track9"), nullptr);
  EXPECT_EQ(marker("Track9")->m_track.getNumKeys(), 2);

  // A table that misses a track names that one only.
  g_db->clearScene();
  file.withTable = true;
  ASSERT_TRUE(read(writeFile("partial.mcp", file.build()), error)) << error;
  EXPECT_NE(marker("A"), nullptr);
  EXPECT_NE(marker("Track9"), nullptr);
  EXPECT_TRUE(warned("partial.mcp: 1 tracks have no name")) << allWarnings();

  // Without track sets the points are tracks by position; without labels nothing is unlabelled.
  g_db->clearScene();
  file.withTrackSet = false;
  file.withLabelSet = false;
  file.table = {{0, "First"}, {1, "*Second"}};
  ASSERT_TRUE(read(writeFile("notracks.mcp", file.build()), error)) << error;
  EXPECT_TRUE(warned("notracks.mcp: points without a track set taken as tracks by position"))
      << allWarnings();
  ASSERT_NE(marker("First"), nullptr);
  EXPECT_EQ(marker("First")->m_track.getNumKeys(), 2);
  EXPECT_DOUBLE_EQ(marker("First")->getWSPos(g_db->getTimeManager()->frameToTime(1)).x, 3.0);
  EXPECT_FALSE(marker("First")->isUnlabeled());
  ASSERT_NE(marker("*Second"), nullptr);
  EXPECT_TRUE(marker("*Second")->isUnlabeled());
}

TEST_F(McpReaderTest, PointsThatCannotBeKeyedAreLeftOutOnceCounted) {
  McpTestFile file;
  file.table = {{0, "A"}, {1, "B\tC"}};
  for (int f = 0; f < 3; ++f)
    file.frames.push_back({{0, {1.0 + f, 0, 0}},
                           {0, {99, 99, 99}},
                           {0xFFFFFFFFu, {5, 5, 5}},
                           {1, {std::nan(""), 0, 0}}});
  std::string error;
  ASSERT_TRUE(read(writeFile("points.mcp", file.build()), error)) << error;
  ASSERT_NE(marker("A"), nullptr);
  ASSERT_EQ(marker("A")->m_track.getNumKeys(), 3);
  EXPECT_DOUBLE_EQ(marker("A")->getWSPos(g_db->getTimeManager()->frameToTime(2)).x, 3.0);
  // The name's tab can't be printed; the track is a marker without keys.
  ASSERT_NE(marker("B?C"), nullptr);
  EXPECT_EQ(marker("B?C")->m_track.getNumKeys(), 0);
  EXPECT_TRUE(warned("points.mcp: a track with two points in one frame kept the first (track 0, "
                     "tick 0) (3 times)"))
      << allWarnings();
  EXPECT_TRUE(warned("points.mcp: a point without a track was left out (3 times)"));
  EXPECT_TRUE(warned("points.mcp: a point whose position is not a number was left out (3 times)"));
  EXPECT_TRUE(warned("points.mcp: 1 track names had characters that can't be printed"));
}

TEST_F(McpReaderTest, SceneItemsAreFoundInTheFramesWithoutAnItemTable) {
  McpTestFile file = takeWithBob();
  file.cameras = {mcpTestCamera(1)};
  file.withStaticItems = false;
  std::string error;
  ASSERT_TRUE(read(writeFile("nostatic.mcp", file.build()), error)) << error;
  EXPECT_NE(find("Camera 1"), nullptr);
  auto* pBob = dynamic_cast<Character*>(find("Bob"));
  ASSERT_NE(pBob, nullptr);
  EXPECT_NE(pBob->getLabelingSetup(false), nullptr);
}

TEST_F(McpReaderTest, RecordsThatCannotBeUsedAreLeftOutWithTheReason) {
  McpTestFile file = takeWithBob();
  AnvilCore::SubjectRecords broken = AnvilCore::demoWalkRecords();
  broken.subject.m_Name = "Broken";
  broken.subject.m_Segments[1].m_PreTranslation[0] = "1 +* NoSuchParameter";
  file.subjects.push_back(broken);
  AnvilCore::SubjectRecords nameless = AnvilCore::demoWalkRecords();
  nameless.subject.m_Name.clear();
  file.subjects.push_back(nameless);
  file.cameras = {mcpTestCamera(1), mcpTestCamera(2)};
  file.cameras[1].calibration.m_Position[0] = std::nan("");
  std::string error;
  ASSERT_TRUE(read(writeFile("bad.mcp", file.build()), error)) << error;
  EXPECT_TRUE(warned("bad.mcp: subject \"Broken\" left out: ")) << allWarnings();
  EXPECT_TRUE(warned("bad.mcp: subject id 3 has no name")) << allWarnings();
  EXPECT_EQ(find("Broken"), nullptr);
  EXPECT_NE(dynamic_cast<Character*>(find("Bob"))->getLabelingSetup(false), nullptr);
  EXPECT_TRUE(warned("bad.mcp: camera 2: calibration has values that are not numbers"));
  EXPECT_TRUE(dynamic_cast<OpticalCamera*>(find("Camera 1"))->isCalibrated());
  EXPECT_FALSE(dynamic_cast<OpticalCamera*>(find("Camera 2"))->isCalibrated());
}

TEST_F(McpReaderTest, ATruncatedFileGivesItsFirstFramesAndSaysSo) {
  McpTestFile file;
  file.table = {{0, "A"}};
  for (int f = 0; f < 40; ++f)
    file.frames.push_back({{0, {double(f), 0, 0}}});
  std::vector<uint8_t> bytes = file.build();
  bytes.resize(bytes.size() / 2);
  std::string error;
  ASSERT_TRUE(read(writeFile("cut.mcp", bytes), error)) << error;
  EXPECT_TRUE(warned("cut.mcp: damaged: ")) << allWarnings();
  ASSERT_NE(marker("A"), nullptr);
  const int keys = marker("A")->m_track.getNumKeys();
  EXPECT_GT(keys, 5);
  EXPECT_LT(keys, 40);
  // The keys read are the file's first frames, in order, and the ranges cover them.
  HTimeManager* pTime = g_db->getTimeManager();
  for (int k = 0; k < keys; ++k)
    EXPECT_DOUBLE_EQ(marker("A")->getWSPos(pTime->frameToTime(k)).x, double(k));
  EXPECT_EQ(pTime->getAnimRange(), HTimeRange(0, pTime->frameToTime(keys - 1)));
}

TEST_F(McpReaderTest, FilesThatAreNotRecordingsFailAndLeaveTheSceneAlone) {
  std::string error;
  ASSERT_TRUE(read(writeFile("first.mcp", takeWithBob().build()), error)) << error;
  const std::vector<std::string> before = sceneListing();
  const HTimeRange range = g_db->getTimeManager()->getAnimRange();

  McpTestFile other;
  other.ticksPerFrame = 135000000 / 50;
  other.frames = {{{0, {1, 2, 3}}}};
  std::vector<uint8_t> wrongVersion = other.build();
  wrongVersion[24] = 2; // format major version

  const struct {
    std::string name;
    std::vector<uint8_t> bytes;
    std::string message;
  } cases[] = {
      {"text.mcp", {'h', 'e', 'l', 'l', 'o', '\n'}, "text.mcp: not an MCP file"},
      {"empty.mcp", {}, "empty.mcp: not an MCP file"},
      {"noise.mcp", std::vector<uint8_t>(4096, 0x5a), "noise.mcp: not an MCP file"},
      {"version.mcp", wrongVersion, "version.mcp: an MCP file of another format version"},
  };
  for (const auto& c : cases) {
    error.clear();
    EXPECT_FALSE(read(writeFile(c.name, c.bytes), error)) << c.name;
    EXPECT_EQ(error.rfind(m_folder + "/" + c.message, 0), 0u) << error;
  }
  EXPECT_FALSE(read(m_folder + "/missing.mcp", error));
  EXPECT_NE(error.find("missing.mcp: cannot open: No such file"), std::string::npos) << error;
  EXPECT_EQ(sceneListing(), before);
  EXPECT_EQ(g_db->getTimeManager()->getAnimRange(), range);
  EXPECT_DOUBLE_EQ(g_db->getTimeManager()->getFrameRate(), 120.0);
}

} // namespace
