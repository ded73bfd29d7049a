#include "DemoScene.h"
#include "DemoWalk.h"
#include "plugin/host/Character.h"
#include "plugin/host/Database.h"
#include "plugin/host/HTimeManager.h"
#include "plugin/host/Marker.h"
#include <algorithm>
#include <map>

namespace AnvilCore {

namespace {
std::multimap<int, DemoPart>& parts() {
  static std::multimap<int, DemoPart> s_parts;
  return s_parts;
}

constexpr double kRate = 120.0;
constexpr int kFrames = 1200; // ten seconds

// Frames where a marker was not seen: [first, last] inclusive.
struct Gap {
  const char* marker;
  int first, last;
};
const Gap kGaps[] = {{"LWRB", 300, 340}, {"RTOE", 700, 712}, {"LFIN", 1000, 1050},
                     {"RBAK", 0, 5},     {"LHEE", 1190, 1199}};

bool inGap(const std::string& i_rName, int i_frame) {
  return std::any_of(std::begin(kGaps), std::end(kGaps), [&](const Gap& g) {
    return i_rName == g.marker && i_frame >= g.first && i_frame <= g.last;
  });
}
} // namespace

void registerDemoPart(int i_order, DemoPart i_part) {
  parts().emplace(i_order, std::move(i_part));
}

void buildDemoScene() {
  g_db->clearScene();
  g_db->setSceneName("demo");
  g_db->setZUp(true);
  HTimeManager* pTime = g_db->getTimeManager();
  pTime->setFrameRate(kRate);
  const int64_t tpf = pTime->getTicksPerFrame();
  pTime->setAnimRange(HTimeRange(0, (kFrames - 1) * tpf));
  pTime->setPlayRange(HTimeRange(120 * tpf, (kFrames - 121) * tpf));
  pTime->setCurrentTime(0);

  auto* pWalker = new Character("Walker");
  g_db->addToScene(pWalker, false, nullptr, false, false);
  const std::vector<std::string>& names = demoWalkMarkerNames();
  std::vector<Marker*> markers;
  for (const std::string& name : names) {
    auto* pMarker = new Marker(HString(name));
    pMarker->m_track.reserve(kFrames);
    g_db->addToScene(pMarker, false, pWalker, false, false);
    markers.push_back(pMarker);
  }
  std::vector<Vec3> positions;
  for (int frame = 0; frame < kFrames; ++frame) {
    demoWalkPose(frame / kRate, positions);
    for (size_t m = 0; m < markers.size(); ++m)
      if (!inGap(names[m], frame)) markers[m]->m_track.setKey(frame * tpf, positions[m]);
  }

  // Unlabelled trajectories: a stray reflection seen for a while, a ghost of the left hand that
  // flickers, and a marker left on the floor.
  auto addUnlabeled = [&](const char* i_pName, int i_first, int i_last, auto i_position) {
    auto* pMarker = new Marker(i_pName);
    pMarker->setUnlabeled(true);
    for (int frame = i_first; frame <= i_last; ++frame)
      if (Vec3 p; i_position(frame, p)) pMarker->m_track.setKey(frame * tpf, p);
    g_db->addToScene(pMarker, false, nullptr, false, false);
  };
  addUnlabeled("Unlabeled1", 100, 400, [](int, Vec3& p) {
    p = Vec3(2150.0, 1480.0, 2310.0);
    return true;
  });
  addUnlabeled("Unlabeled2", 500, 800, [&](int frame, Vec3& p) {
    demoWalkPose(frame / kRate, positions);
    p = positions[demoWalkMarkerIndex("LFIN")] + Vec3(35.0, 20.0, -15.0);
    return (frame / 7) % 3 != 0;
  });
  addUnlabeled("Unlabeled3", 0, kFrames - 1, [](int, Vec3& p) {
    p = Vec3(-3000.0, 2000.0, 7.5);
    return true;
  });

  for (auto& [order, part] : parts()) part();
}

} // namespace AnvilCore
