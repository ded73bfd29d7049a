#pragma once
// Test helpers for code that runs against the host: a clean scene, captured log lines, and
// markers made from plain position lists.
#include "plugin/host/Character.h"
#include "plugin/host/Database.h"
#include "plugin/host/FileExporter.h"
#include "plugin/host/HTimeManager.h"
#include "plugin/host/Marker.h"
#include <optional>
#include <string>
#include <utility>
#include <vector>

namespace HostTest {

/// Log lines captured while the object lives; the default sink comes back afterwards.
class LogCapture {
public:
  LogCapture() {
    g_db->setLogSink([this](HLogLevel i_level, const std::string& i_rText) {
      m_lines.emplace_back(i_level, i_rText);
    });
  }
  ~LogCapture() { g_db->setLogSink(nullptr); }
  std::vector<std::string> texts(HLogLevel i_level) const {
    std::vector<std::string> result;
    for (const auto& [level, text] : m_lines)
      if (level == i_level) result.push_back(text);
    return result;
  }
  std::vector<std::string> errors() const { return texts(HLogLevel::EError); }
  std::vector<std::string> warnings() const { return texts(HLogLevel::EWarning); }

private:
  std::vector<std::pair<HLogLevel, std::string>> m_lines;
};

/// Empties the scene and sets the clock: `i_rate` Hz, animation range frames [0, i_frames - 1].
inline void resetScene(double i_rate = 100.0, int i_frames = 10) {
  g_db->clearScene();
  HTimeManager* pTime = g_db->getTimeManager();
  pTime->setFrameRate(i_rate);
  const int64_t tpf = pTime->getTicksPerFrame();
  pTime->setAnimRange(HTimeRange(0, (i_frames - 1) * tpf));
  pTime->setPlayRange(HTimeRange(0, (i_frames - 1) * tpf));
  pTime->setTimecodeMode(0);
  pTime->setCurrentTime(0);
  g_db->getFileExporterMgr()->setExportSelectedOnly(false);
}

using Positions = std::vector<std::optional<Vec3>>;

/// A marker with one key per frame from frame 0; an empty entry is a gap.
inline Marker* addMarker(const char* i_pName, const Positions& i_positions,
                         Character* i_pSubject = nullptr) {
  auto* pMarker = new Marker(i_pName);
  pMarker->setUnlabeled(i_pSubject == nullptr);
  const int64_t tpf = g_db->getTimeManager()->getTicksPerFrame();
  for (size_t i = 0; i < i_positions.size(); ++i)
    if (i_positions[i]) pMarker->m_track.setKey(int64_t(i) * tpf, *i_positions[i]);
  g_db->addToScene(pMarker, false, i_pSubject, false, false);
  return pMarker;
}

inline Character* addSubject(const char* i_pName) {
  auto* pSubject = new Character(i_pName);
  g_db->addToScene(pSubject, false, nullptr, false, false);
  return pSubject;
}

} // namespace HostTest
