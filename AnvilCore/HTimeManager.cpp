#include "plugin/host/HTimeManager.h"
#include "plugin/host/Database.h"
#include <cmath>

namespace {
int64_t floorDiv(int64_t a, int64_t b) {
  int64_t q = a / b;
  if ((a % b != 0) && ((a < 0) != (b < 0))) --q;
  return q;
}
} // namespace

int HTimeRange::getNumFrames() const {
  const int64_t tpf = HTimeManager::getInstance()->getTicksPerFrame();
  return static_cast<int>((m_end - m_start) / tpf + 1);
}

HTimeManager* HTimeManager::getInstance() {
  return g_db->getTimeManager();
}

HTimeManager::HTimeManager() {
  setFrameRate(120.0);
}

void HTimeManager::setFrameRate(double i_framesPerSecond) {
  if (!(i_framesPerSecond > 0.0) || !std::isfinite(i_framesPerSecond)) return;
  m_frameRate = i_framesPerSecond;
  m_ticksPerFrame = std::llround(double(kTicksPerSecond) / i_framesPerSecond);
  if (m_ticksPerFrame < 1) m_ticksPerFrame = 1;
}

int HTimeManager::getFrame(HTime i_t) const {
  return static_cast<int>(floorDiv(i_t, m_ticksPerFrame));
}

double HTimeManager::getFrames(HTime i_t, bool i_floor) const {
  if (i_floor) return double(floorDiv(i_t, m_ticksPerFrame));
  return double(i_t) / double(m_ticksPerFrame);
}

int HTimeManager::getSeconds(HTime i_t) const {
  const int64_t s = floorDiv(i_t, kTicksPerSecond);
  return static_cast<int>(s - floorDiv(s, 60) * 60);
}

int HTimeManager::getMinutes(HTime i_t) const {
  const int64_t m = floorDiv(i_t, kTicksPerSecond * 60);
  return static_cast<int>(m - floorDiv(m, 60) * 60);
}

int HTimeManager::getHours(HTime i_t) const {
  return static_cast<int>(floorDiv(i_t, kTicksPerSecond * 3600));
}

bool HTimeManager::isOnframe(HTime i_a, HTime i_b) const {
  return i_a % m_ticksPerFrame == 0 && i_b % m_ticksPerFrame == 0;
}
