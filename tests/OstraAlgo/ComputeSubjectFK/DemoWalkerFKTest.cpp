// The demo walker, built as a compute subject from the records its scene character converts to,
// reproduces the scene's marker trajectories by forward kinematics, frame by frame.

#include "NumericRecord.h"

#include "OstraAlgo/ComputeSubjectFK/VComputeSubject.h"
#include "OstraAlgo/KinematicAlgo/SubjectCalibratedFromRecord.h"

#include "AnvilCore/demo/DemoScene.h"
#include "AnvilCore/demo/DemoWalk.h"
#include "plugin/host/AnvilSubjectCoreTypesConversion.h"
#include "plugin/host/Character.h"
#include "plugin/host/Database.h"
#include "plugin/host/HTimeManager.h"
#include "plugin/host/Marker.h"
#include "plugin/host/SubjectManager.h"

#include <gtest/gtest.h>

#include <map>

namespace {

using KinematicTest::Solved;

TEST(DemoWalkerFK, ReproducesTheScenesMarkerPositionsFrameByFrame) {
  AnvilCore::buildDemoScene();
  Character* pWalker = g_db->getSubjectManager()->getSubject(0);
  ASSERT_NE(pWalker, nullptr);
  AnvilSubjectCoreTypesConversion conversion(AnvilSubjectCoreTypesConversion::ELabeling);
  ASSERT_TRUE(conversion.characterToVSubject2(pWalker, true));

  std::vector<std::string> errors, notes;
  const auto model = KinematicAlgo::SubjectCalibratedFromRecord(
      Solved(conversion.getSubjectParametrised()), errors, notes);
  ASSERT_TRUE(model) << errors.front();
  ComputeSubject::VComputeSubject walker(model);
  ASSERT_EQ(walker.NumSegments(), 20u);
  ASSERT_EQ(walker.NumTargets(), 41u);

  // The scene's marker of each target, by name.
  std::map<std::string, const Marker*> sceneMarkers;
  for (int i = 0; i < pWalker->getNumChildren(); ++i)
    if (auto* pMarker = dynamic_cast<const Marker*>(pWalker->getChild(i)))
      sceneMarkers[pMarker->getName().GetStr()] = pMarker;

  const HTimeManager* pTime = g_db->getTimeManager();
  const double rate = pTime->getFrameRate();
  std::vector<std::vector<double>> params;
  std::vector<double> state(walker.NumParams());
  int compared = 0;
  double worst = 0.0;
  for (int frame = 0; frame < 1200; frame += 7) {
    AnvilCore::demoWalkJoints(frame / rate, params);
    size_t cursor = 0;
    for (const auto& joint : params)
      for (double value : joint)
        state[cursor++] = value;
    ASSERT_EQ(cursor, state.size());
    walker.Update({state.data(), state.size()});
    const HTime time = frame * pTime->getTicksPerFrame();
    for (std::uint32_t t = 0; t < walker.NumTargets(); ++t) {
      const auto* target = walker.PositionTarget(t);
      const Marker* pMarker = sceneMarkers.at(target->Target().Name());
      const int key = pMarker->m_track.findKey(time);
      if (key < 0) continue; // a gap in the scene's data
      const Vec3 expected = pMarker->m_track.getKeyValue(key);
      const Eigen::Vector3d p = target->WorldPosition();
      const double error =
          (p - Eigen::Vector3d(expected.x, expected.y, expected.z)).cwiseAbs().maxCoeff();
      worst = std::max(worst, error);
      ++compared;
    }
  }
  EXPECT_GT(compared, 41 * 150);
  EXPECT_LT(worst, 1e-9);
}

} // namespace
