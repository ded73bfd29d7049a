// Timecode of the scene clock: the mode names a standard, times become h:m:s:f plus subframes.
#include "TimecodeModes.h"
#include "plugin/host/HTimeManager.h"
#include <numeric>

namespace {
using Timecode = ZMT::ITimecode<135000000>;

// Standard of each timecode mode; modes past the table have none.
constexpr uint32_t kStandardOfMode[] = {
    ZMT::ETimecodeNtscFull, ZMT::ETimecodeNtsc, ZMT::ETimecodeNtscDrop,
    ZMT::ETimecodePal,      ZMT::ETimecodeFilm, ZMT::ETimecodeFilmNtsc,
};
constexpr int kModesWithStandard = int(sizeof kStandardOfMode / sizeof kStandardOfMode[0]);

// Drop-frame counting at 29.97: ten minutes hold 17982 frames, a minute not a multiple of ten
// 1798, and the numbers 0 and 1 are skipped at the start of those minutes.
constexpr int64_t kDropFramesPerTenMinutes = 17982;
constexpr int64_t kDropFramesPerMinute = 1798;

int64_t floorMod(int64_t a, int64_t b) {
  const int64_t r = a % b;
  return r < 0 ? r + b : r;
}

int64_t floorDiv(int64_t a, int64_t b) {
  return (a - floorMod(a, b)) / b;
}

int64_t framesPerDay(uint32_t i_standard) {
  if (i_standard == ZMT::ETimecodeNtscDrop) return kDropFramesPerTenMinutes * 6 * 24;
  return int64_t(ZMT::timecodeFramesPerSecond(i_standard)) * 86400;
}
} // namespace

int AnvilCore::timecodeModeOfStandard(uint32_t i_standard) {
  for (int mode = 0; mode < kModesWithStandard; ++mode)
    if (kStandardOfMode[mode] == i_standard) return mode;
  return -1;
}

bool HTimeManager::isTimecodeSupported() const {
  return m_timecodeMode >= 0 && m_timecodeMode < kModesWithStandard;
}

Timecode HTimeManager::getTimecode(HTime i_t) const {
  Timecode tc;
  if (!isTimecodeSupported()) return tc;
  const uint32_t standard = kStandardOfMode[m_timecodeMode];
  const int64_t tpf = Timecode::ticksPerFrame(standard);
  const int64_t fps = ZMT::timecodeFramesPerSecond(standard);
  const int64_t frame = floorDiv(i_t, tpf);
  int64_t label = floorMod(frame, framesPerDay(standard));
  if (standard == ZMT::ETimecodeNtscDrop) {
    const int64_t tens = label / kDropFramesPerTenMinutes;
    const int64_t rest = label % kDropFramesPerTenMinutes;
    label += 18 * tens + (rest >= 2 ? 2 * ((rest - 2) / kDropFramesPerMinute) : 0);
  }
  tc.m_standard = standard;
  tc.m_frames = uint8_t(label % fps);
  tc.m_seconds = uint8_t(label / fps % 60);
  tc.m_minutes = uint8_t(label / (fps * 60) % 60);
  tc.m_hours = uint8_t(label / (fps * 3600) % 24);
  tc.m_subframes = uint32_t(i_t - frame * tpf);
  tc.m_subframeUnit = uint32_t(std::gcd(m_ticksPerFrame > 0 ? m_ticksPerFrame : tpf, tpf));
  return tc;
}

HTime HTimeManager::timecodeToTime(int i_hours, int i_minutes, int i_seconds, int i_frames) const {
  if (!isTimecodeSupported()) return -1;
  const uint32_t standard = kStandardOfMode[m_timecodeMode];
  Timecode tc;
  tc.m_standard = standard;
  if (i_hours < 0 || i_minutes < 0 || i_seconds < 0 || i_frames < 0 || i_hours > 255 ||
      i_minutes > 255 || i_seconds > 255 || i_frames > 255)
    return -1;
  tc.m_hours = uint8_t(i_hours);
  tc.m_minutes = uint8_t(i_minutes);
  tc.m_seconds = uint8_t(i_seconds);
  tc.m_frames = uint8_t(i_frames);
  if (!tc.isValid()) return -1;
  const int64_t fps = ZMT::timecodeFramesPerSecond(standard);
  const int64_t minutes = int64_t(i_hours) * 60 + i_minutes;
  int64_t frame = (minutes * 60 + i_seconds) * fps + i_frames;
  if (standard == ZMT::ETimecodeNtscDrop) frame -= 2 * (minutes - minutes / 10);
  return frame * Timecode::ticksPerFrame(standard);
}
