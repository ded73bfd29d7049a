// The Anvil scene file: what a good file builds, and that every bad one names its fault and
// leaves the scene alone.
#include "AnvilCore/io/SceneJson.h"
#include "../support/HostFixture.h"
#include "plugin/host/SubjectManager.h"
#include <gtest/gtest.h>

using namespace HostTest;

namespace {
const char* const kGood = R"({
  "format": "anvil-scene", "version": 1, "name": "take1", "zUp": false,
  "time": {"frameRate": 50, "animRange": [2, 5], "playRange": [3, 4]},
  "subjects": [{
    "name": "Bob",
    "nodes": [{"name": "Hips", "translation": [0, 900, 0],
               "children": [{"name": "Spine", "preTranslation": [0, 100, 0]}],
               "animation": {"firstFrame": 2, "rotation": [[0, 0, 0], [0, 90, 0]]}}],
    "markers": [{"name": "LFHD", "firstFrame": 2, "positions": [[1, 2, 3], null, [7, 8, 9]]}]
  }],
  "markers": [{"name": "stray", "positions": [[0, 0, 0]]}]
})";
} // namespace

TEST(SceneFile, BuildsSubjectsMarkersNodesAndClock) {
  resetScene();
  std::string error;
  ASSERT_TRUE(AnvilCore::readSceneJson(kGood, "good.json", error)) << error;
  EXPECT_EQ(g_db->getSceneName(), "take1");
  EXPECT_FALSE(g_db->isZUp());
  HTimeManager* pTime = g_db->getTimeManager();
  EXPECT_EQ(pTime->getFrameRate(), 50.0);
  EXPECT_EQ(pTime->getAnimRange(), HTimeRange(2 * 2700000, 5 * 2700000));
  EXPECT_EQ(pTime->getPlayRange(), HTimeRange(3 * 2700000, 4 * 2700000));
  ASSERT_EQ(g_db->getSubjectManager()->getNumSubjects(), 1);

  TSimpleArray<Module*> found = g_db->getModulesWithName("LFHD", &Marker::s_classMarker);
  ASSERT_EQ(found.getCount(), 1);
  const Marker* pMarker = static_cast<Marker*>(found[0]);
  EXPECT_FALSE(pMarker->isUnlabeled());
  EXPECT_EQ(pMarker->getCharacterParent()->getName(), "Bob");
  EXPECT_EQ(pMarker->m_track.getNumKeys(), 2);
  EXPECT_FALSE(pMarker->m_track.hasKeyAt(3 * 2700000));
  EXPECT_EQ(pMarker->getWSPos(4 * 2700000), Vec3(7, 8, 9));
  const Marker* pStray = static_cast<Marker*>(g_db->getModulesWithName("stray", nullptr)[0]);
  EXPECT_TRUE(pStray->isUnlabeled());

  // Spine sits 100 above the hips; the hips turn 90 degrees about Y over one frame.
  const Node* pSpine = static_cast<Node*>(g_db->getModulesWithName("Spine", nullptr)[0]);
  const Vec3 spine = pSpine->getWSPos(3 * 2700000);
  EXPECT_NEAR(spine.y, 1000.0, 1e-9);
  EXPECT_NEAR(pSpine->getWSRot(3 * 2700000).rotate(Vec3(1, 0, 0)).z, -1.0, 1e-9);
}

TEST(SceneFile, RangeDefaultsToTheKeysRead) {
  resetScene();
  std::string error;
  ASSERT_TRUE(AnvilCore::readSceneJson(
      R"({"time": {"frameRate": 100}, "markers": [{"name": "m", "firstFrame": 7, "positions": [[0,0,0],[1,1,1]]}]})",
      "r.json", error))
      << error;
  EXPECT_EQ(g_db->getTimeManager()->getAnimRange(), HTimeRange(7 * 1350000, 8 * 1350000));
}

TEST(SceneFile, ErrorsNameTheJsonPathAndChangeNothing) {
  const std::pair<const char*, const char*> cases[] = {
      {"[1, 2]", "at /: expected an object"},
      {R"({"markers": 3})", "at /markers: expected an array"},
      {R"({"markrs": []})", "at /markrs: unknown key \"markrs\""},
      {R"({"format": "other"})", "at /format: expected \"anvil-scene\""},
      {R"({"version": 9})", "at /version: unsupported scene file version 9"},
      {R"({"time": {"frameRate": 0}})", "at /time/frameRate: frame rate must lie in (0, 100000]"},
      {R"({"time": {"frameRate": 60, "animRange": [5, 1]}})",
       "at /time/animRange: last frame comes before first frame"},
      {R"({"markers": [{"name": "a"}, {"name": "a"}]})",
       "at /markers/1/name: duplicate name \"a\""},
      {R"({"markers": [{"positions": []}]})", "at /markers/0: missing required key \"name\""},
      {R"({"markers": [{"name": "a", "positions": [[1, "2", 3]]}]})",
       "at /markers/0/positions/0/1: expected a number"},
      {R"({"nodes": [{"name": "n", "rotationOrder": "XXY"}]})",
       "at /nodes/0/rotationOrder: unknown rotation order \"XXY\""},
      {R"({"subjects": [{"name": "S", "nodes": [{"name": "n", "children": [{"name": ""}]}]}]})",
       "at /subjects/0/nodes/0/children/0/name: a name must not be empty"},
      {R"({"nodes": [{"name": "n", "animation": {"firstFrame": 1.5}}]})",
       "at /nodes/0/animation/firstFrame: expected an integer"},
  };
  for (const auto& [text, expected] : cases) {
    resetScene(100.0, 10);
    addMarker("existing", {Vec3(1, 1, 1)});
    std::string error;
    EXPECT_FALSE(AnvilCore::readSceneJson(text, "bad.json", error)) << text;
    EXPECT_EQ(error.rfind("bad.json: ", 0), 0u) << error;
    EXPECT_NE(error.find(expected), std::string::npos) << "got: " << error;
    EXPECT_EQ(g_db->getNumNodes(), 1) << text;
    EXPECT_EQ(g_db->getTimeManager()->getFrameRate(), 100.0) << text;
  }
  std::string error;
  EXPECT_FALSE(AnvilCore::readSceneJson("{\"markers\": [", "cut.json", error));
  EXPECT_NE(error.find("cut.json: not valid JSON"), std::string::npos) << error;
}
