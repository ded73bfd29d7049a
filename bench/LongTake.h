#pragma once
// The long take the export benchmarks share: 200 markers x 36,000 frames (five minutes at
// 120 Hz) of smooth motion, built once per process.
#include "plugin/host/Character.h"
#include "plugin/host/Database.h"
#include "plugin/host/HTimeManager.h"
#include "plugin/host/Marker.h"
#include "plugin/host/OperationStack.h"
#include <cmath>
#include <filesystem>
#include <string>
#include <unistd.h>
#include <vector>

namespace Bench {

constexpr int kMarkers = 200;
constexpr int kFrames = 36000;

struct LongTakeShape {
  const char* markerPrefix = "M"; ///< marker names are prefix + index
  const char* subject = nullptr;  ///< when set, the markers sit under a subject of that name
  bool gaps = false;              ///< drop a few frames of each marker now and then
  bool keepScene = false;         ///< add the markers to the scene as it is instead of a new one
};

/// Builds the take into `g_db` on first call (later calls return the same markers).
inline std::vector<Marker*>& longTake(const LongTakeShape& i_rShape = LongTakeShape()) {
  static std::vector<Marker*> s_markers;
  if (!s_markers.empty()) return s_markers;
  if (!i_rShape.keepScene) g_db->clearScene();
  HTimeManager* pTime = g_db->getTimeManager();
  pTime->setFrameRate(120.0);
  const int64_t tpf = pTime->getTicksPerFrame();
  pTime->setAnimRange(HTimeRange(0, (kFrames - 1) * tpf));
  pTime->setPlayRange(HTimeRange(0, (kFrames - 1) * tpf));
  Character* pSubject = nullptr;
  if (i_rShape.subject) {
    pSubject = new Character(i_rShape.subject);
    g_db->addToScene(pSubject, false, nullptr, false, false);
  }
  for (int m = 0; m < kMarkers; ++m) {
    // Built by appending: GCC 12 warns falsely (-Wrestrict) on a prefix + std::to_string here.
    std::string name = i_rShape.markerPrefix;
    name += std::to_string(m);
    auto* pMarker = new Marker(HString(name));
    pMarker->m_track.reserve(kFrames);
    for (int f = 0; f < kFrames; ++f) {
      if (i_rShape.gaps && (f + 37 * m) % 500 <= 3) continue;
      pMarker->m_track.setKey(f * tpf, Vec3(1000.0 * std::sin(f * 0.01 + m), 500.0 + m,
                                            1200.0 * std::cos(f * 0.013 - m)));
    }
    g_db->addToScene(pMarker, false, pSubject, false, false);
    s_markers.push_back(pMarker);
  }
  g_theOperationStack.setStream(nullptr, false);
  return s_markers;
}

/// A per-process file name in the temporary folder.
inline std::string tempOutput(const std::string& i_suffix) {
  return (std::filesystem::temp_directory_path() /
          ("anvil-bench-" + std::to_string(::getpid()) + i_suffix))
      .string();
}

} // namespace Bench
