#include "DemoScene.h"
#include "AnvilCore/SubjectJointPose.h"
#include "DemoWalk.h"
#include "plugin/host/Character.h"
#include "plugin/host/Database.h"
#include "plugin/host/HTimeManager.h"
#include "plugin/host/LabelingConstraint.h"
#include "plugin/host/LabelingSetup.h"
#include "plugin/host/Marker.h"
#include "plugin/host/RetargetingSetup.h"
#include "plugin/host/SolvingSetup.h"
#include "plugin/host/SubjectBone.h"
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
const Gap kGaps[] = {{"LWRB", 300, 340},
                     {"RTOE", 700, 712},
                     {"LFIN", 1000, 1050},
                     {"RBAK", 0, 5},
                     {"LHEE", 1190, 1199}};

bool inGap(const std::string& i_rName, int i_frame) {
  return std::any_of(std::begin(kGaps), std::end(kGaps), [&](const Gap& g) {
    return i_rName == g.marker && i_frame >= g.first && i_frame <= g.last;
  });
}

// Keys the joints of every setup's bones at each frame.
void animateDemoWalker(Character& io_rWalker, int i_frames, int64_t i_ticksPerFrame) {
  ParameterizedSetup* setups[] = {io_rWalker.getLabelingSetup(false),
                                  io_rWalker.getSolvingSetup(false),
                                  io_rWalker.getRetargetingSetup(false)};
  std::vector<std::vector<double>> params;
  for (ParameterizedSetup* pSetup : setups) {
    std::vector<SubjectBone*> bones;
    pSetup->collectBones(bones);
    for (int frame = 0; frame < i_frames; ++frame) {
      demoWalkJoints(frame / kRate, params);
      for (size_t b = 0; b < bones.size(); ++b) {
        SubjectBone& bone = *bones[b];
        Vec3 translation;
        AnvilRotation rotation;
        jointToBoneMotion(bone.segmentRecord().m_Joint, bone.getPreRotation(), params[b],
                          translation, rotation);
        if (bone.getJointType() == CoreOstraTypes::VJointTypeBase::EFree)
          bone.m_positionTrack.setKey(frame * i_ticksPerFrame, translation);
        bone.m_rotationTrack.setKey(frame * i_ticksPerFrame, rotation);
      }
    }
  }
}

// The labeling constraint of each marker name.
std::vector<const Node*> constraintsByName(const LabelingSetup& i_rSetup,
                                           const std::vector<std::string>& i_rNames) {
  std::vector<SubjectBone*> bones;
  i_rSetup.collectBones(bones);
  std::vector<const Node*> result(i_rNames.size(), nullptr);
  for (SubjectBone* pBone : bones)
    for (int i = 0; i < pBone->getNumChildren(); ++i) {
      const Module* pChild = pBone->getChild(i);
      auto it = std::find(i_rNames.begin(), i_rNames.end(), pChild->getName().GetStr());
      if (it != i_rNames.end() && pChild->isKindOf(&LabelingConstraint::s_classLabelingConstraint))
        result[size_t(it - i_rNames.begin())] = static_cast<const Node*>(pChild);
    }
  return result;
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
  // The walker's setups, their bones walking; the markers follow the labeling setup's
  // constraints.
  std::vector<std::string> errors;
  addSubjectToScene(demoWalkRecords(), errors);
  animateDemoWalker(*pWalker, kFrames, tpf);
  std::vector<const Node*> places = constraintsByName(*pWalker->getLabelingSetup(false), names);
  for (int frame = 0; frame < kFrames; ++frame)
    for (size_t m = 0; m < markers.size(); ++m)
      if (!inGap(names[m], frame))
        markers[m]->m_track.setKey(frame * tpf, places[m]->getWSPos(frame * tpf));

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
  const Marker* pHand = markers[size_t(demoWalkMarkerIndex("LFIN"))];
  addUnlabeled("Unlabeled2", 500, 800, [&](int frame, Vec3& p) {
    p = pHand->m_track.evaluate(frame * tpf, Vec3()) + Vec3(35.0, 20.0, -15.0);
    return (frame / 7) % 3 != 0;
  });
  addUnlabeled("Unlabeled3", 0, kFrames - 1, [](int, Vec3& p) {
    p = Vec3(-3000.0, 2000.0, 7.5);
    return true;
  });

  for (auto& [order, part] : parts())
    part();
}

} // namespace AnvilCore
