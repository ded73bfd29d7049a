#pragma once
#include "HTime.h"
#include "HostExport.h"

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
