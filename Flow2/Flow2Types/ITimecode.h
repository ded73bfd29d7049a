#pragma once
// A timecode as the host reads it off its clock and as the Flow timecode item carries it.
#include <cstdint>

namespace ZMT {

/// Timecode standards: the frame count per second and whether the clock runs 1000/1001 slow.
enum ETimecodeStandard : uint32_t {
  ETimecodeFilm = 0,          ///< 24 fps
  ETimecodeFilmNtsc = 1,      ///< 24 fps at 23.976 Hz
  ETimecodePal = 2,           ///< 25 fps
  ETimecodeNtscFull = 3,      ///< 30 fps at 30 Hz
  ETimecodeNtsc = 4,          ///< 30 fps at 29.97 Hz, non-drop
  ETimecodeNtscDrop = 5,      ///< 30 fps at 29.97 Hz, drop frame
  ETimecodeStandardCount = 6, ///< first value that names no standard
};

/// Frames counted per second of timecode for a standard; 0 for an unknown one.
inline uint32_t timecodeFramesPerSecond(uint32_t i_standard) {
  static const uint32_t s_fps[ETimecodeStandardCount] = {24, 24, 25, 30, 30, 30};
  return i_standard < ETimecodeStandardCount ? s_fps[i_standard] : 0;
}

/// A timecode: hours, minutes, seconds and frames of a standard, plus the ticks past the frame's
/// start and the length in ticks of one subframe (so the frame holds ticksPerFrame / unit
/// subframes, and the time lies `m_subframes / m_subframeUnit` subframes into it).
/// `TicksPerSecond` is the clock it was taken from (the host's: 135,000,000).
template <int64_t TicksPerSecond> struct ITimecode {
  uint32_t m_standard = ETimecodeStandardCount;
  uint8_t m_hours = 0;
  uint8_t m_minutes = 0;
  uint8_t m_seconds = 0;
  uint8_t m_frames = 0;
  uint32_t m_subframes = 0;    ///< ticks past the frame's start
  uint32_t m_subframeUnit = 0; ///< length of one subframe in ticks; 0 when unknown

  /// Ticks in one frame of a standard (135,000,000 ticks: 5625000, 5630625, 5400000, 4500000,
  /// 4504500, 4504500); 0 for an unknown standard.
  static int64_t ticksPerFrame(uint32_t i_standard) {
    const uint32_t fps = timecodeFramesPerSecond(i_standard);
    if (fps == 0) return 0;
    const bool slow = i_standard == ETimecodeFilmNtsc || i_standard >= ETimecodeNtsc;
    return slow ? TicksPerSecond * 1001 / (int64_t(fps) * 1000) : TicksPerSecond / fps;
  }

  /// A known standard, a time of day below 24 hours, a frame below the standard's rate, a
  /// subframe count below the frame's ticks, and no frame that drop-frame counting skips
  /// (frames 0 and 1 of the first second of each minute not a multiple of 10).
  bool isValid() const {
    if (m_standard >= ETimecodeStandardCount) return false;
    if (m_hours >= 24 || m_minutes >= 60 || m_seconds >= 60) return false;
    if (m_frames >= timecodeFramesPerSecond(m_standard)) return false;
    if (int64_t(m_subframes) >= ticksPerFrame(m_standard)) return false;
    if (m_standard == ETimecodeNtscDrop && m_seconds == 0 && m_minutes % 10 != 0 && m_frames < 2)
      return false;
    return true;
  }

  bool operator==(const ITimecode&) const = default;

  static constexpr const char* FlowClassName = "Timecode";
  template <class S, class V> static void FlowFields(S& s, V&& v) {
    v("Standard", "Timecode standard", s.m_standard);
    v("Hours", "", s.m_hours);
    v("Minutes", "", s.m_minutes);
    v("Seconds", "", s.m_seconds);
    v("Frames", "", s.m_frames);
    v("Subframes", "Ticks past the frame's start", s.m_subframes);
    v("SubframeUnit", "Ticks in one subframe", s.m_subframeUnit);
  }
};

} // namespace ZMT
