#pragma once
// Subjects with a retargeting skeleton of many bones, every bone's rotation keyed on every
// frame of the long take: the shape of the scene exporters' heavy case.
#include "LongTake.h"
#include "plugin/host/RetargetingBone.h"
#include "plugin/host/RetargetingSetup.h"
#include <string>
#include <vector>

namespace Bench {

/// Adds `i_subjects` subjects of `i_bones` bones (a spine with branches every fifth bone) with
/// `i_frames` keyed frames at the scene's rate; returns every bone.
inline std::vector<RetargetingBone*> addSkeletonTake(int i_subjects, int i_bones, int i_frames) {
  std::vector<RetargetingBone*> all;
  const int64_t tpf = g_db->getTimeManager()->getTicksPerFrame();
  for (int s = 0; s < i_subjects; ++s) {
    auto* pSubject = new Character(HString("Actor" + std::to_string(s)));
    g_db->addToScene(pSubject, false, nullptr, false, false);
    RetargetingSetup* pSetup = pSubject->getRetargetingSetup(true);
    std::vector<RetargetingBone*> bones;
    for (int b = 0; b < i_bones; ++b) {
      auto* pBone = new RetargetingBone(HString("Bone" + std::to_string(b)));
      pBone->setPreTranslation(Vec3(0, 0, 100.0 + b));
      Module* pParent =
          b == 0 ? static_cast<Module*>(pSetup) : bones[std::size_t(b % 5 == 0 ? b / 5 : b - 1)];
      g_db->addChild(pParent, pBone);
      pBone->m_rotationTrack.reserve(i_frames);
      for (int f = 0; f < i_frames; ++f)
        pBone->m_rotationTrack.setKey(f * tpf, AnvilRotation(Vec3(std::sin(b), 1.0, std::cos(s)),
                                                             30.0 * std::sin(f * 0.01 + b)));
      if (b == 0) {
        pBone->m_positionTrack.reserve(i_frames);
        for (int f = 0; f < i_frames; ++f)
          pBone->m_positionTrack.setKey(f * tpf, Vec3(f * 0.5, 100.0 * s, 950.0));
      }
      bones.push_back(pBone);
    }
    all.insert(all.end(), bones.begin(), bones.end());
  }
  return all;
}

} // namespace Bench
