#pragma once
#include "HTime.h"
#include "HostExport.h"
#include "Flow2/Flow2Types/ITimecode.h"

/// How the scene counts timecode (`HTimeManager::getTimecodeMode`).
enum ETimecodeMode {
  ETimecodeMode30Hz = 0,     ///< 30 fps, non-drop
  ETimecodeModeNtsc = 1,     ///< 29.97 fps, non-drop
  ETimecodeModeNtscDrop = 2, ///< 29.97 fps, drop frame
  ETimecodeModePal = 3,      ///< 25 fps
  ETimecodeModeFilm = 4,     ///< 24 fps
  ETimecodeModeNtscFilm = 5, ///< 23.976 fps
  ETimecodeModeNone = 6,     ///< no timecode
};

/// The scene clock: frame rate, ticks per frame, the animation and play ranges, current time.
class ANVIL_HOST_API HTimeManager {
public:
  /// The scene's time manager (the one `g_db` holds).
  static HTimeManager* getInstance();

  HTimeManager();

  /// Sets the rate; ticks per frame become the nearest whole number of ticks.
  void setFrameRate(double i_framesPerSecond);
  double getFrameRate() const { return m_frameRate; }
  int64_t getTicksPerFrame() const { return m_ticksPerFrame; }
  int getTimecodeMode() const { return m_timecodeMode; }
  void setTimecodeMode(int i_mode) { m_timecodeMode = i_mode; }
  /// True when the timecode mode names a standard (modes 0 to 5).
  bool isTimecodeSupported() const;
  /// Timecode of a time under the current mode, wrapped into one day. The subframe unit is the
  /// largest tick count dividing both the scene's and the timecode's frame. Mode None (or an
  /// unknown mode) gives a timecode whose standard is `ZMT::ETimecodeStandardCount` (invalid).
  ZMT::ITimecode<135000000> getTimecode(HTime i_t) const;
  /// The time whose timecode under the current mode is h:m:s:f (no subframes), counting from
  /// midnight; -1 when the mode has no timecode or the fields are out of range.
  HTime timecodeToTime(int i_hours, int i_minutes, int i_seconds, int i_frames) const;

  /// Frame number of a time: ticks divided by ticks per frame, rounded towards minus infinity.
  int getFrame(HTime i_t) const;
  /// Frames as a real number; with `i_floor` set the whole frames only.
  double getFrames(HTime i_t, bool i_floor) const;
  /// The seconds part (0..59) of a time, the minutes part and the hours.
  int getSeconds(HTime i_t) const;
  int getMinutes(HTime i_t) const;
  int getHours(HTime i_t) const;
  double getTimeInSeconds(HTime i_t) const { return double(i_t) / double(kTicksPerSecond); }
  /// Current frame.
  int getFrame() const { return getFrame(m_currentTime); }
  HTime getCurrentTime() const { return m_currentTime; }
  void setCurrentTime(HTime i_t) { m_currentTime = i_t; }
  /// True when both times fall on the same frame boundary.
  bool isOnframe(HTime i_a, HTime i_b) const;
  /// Time of the start of a frame.
  HTime frameToTime(int64_t i_frame) const { return i_frame * m_ticksPerFrame; }

  const HTimeRange& getAnimRange() const { return m_animRange; }
  const HTimeRange& getPlayRange() const { return m_playRange; }
  void setAnimRange(const HTimeRange& i_r) { m_animRange = i_r; }
  void setPlayRange(const HTimeRange& i_r) { m_playRange = i_r; }

private:
  double m_frameRate;
  int64_t m_ticksPerFrame;
  int m_timecodeMode = 0;
  HTime m_currentTime = 0;
  HTimeRange m_animRange;
  HTimeRange m_playRange;
};
