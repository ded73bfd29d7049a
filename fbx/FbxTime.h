#pragma once
// FBX time: signed 64-bit ticks, 46,186,158,000 to the second in every 7.x file.
#include <cmath>
#include <cstdint>

namespace AnvilFbx {

inline constexpr int64_t kFbxTicksPerSecond = 46186158000LL;

class FbxTime {
public:
  /// Frame rates of the global time mode (the values the file stores).
  enum EMode {
    eDefaultMode = 0,
    eFrames120 = 1,
    eFrames100 = 2,
    eFrames60 = 3,
    eFrames50 = 4,
    eFrames48 = 5,
    eFrames30 = 6,
    eFrames30Drop = 7,
    eNTSCDropFrame = 8,
    eNTSCFullFrame = 9,
    ePAL = 10,
    eFrames24 = 11,
    eFrames1000 = 12,
    eFilmFullFrame = 13,
    eCustom = 14,
    eFrames96 = 15,
    eFrames72 = 16,
    eFrames59dot94 = 17,
    eFrames119dot88 = 18,
  };

  FbxTime() = default;
  explicit FbxTime(int64_t i_ticks) : m_ticks(i_ticks) {}
  void SetSecondDouble(double i_seconds) {
    m_ticks = static_cast<int64_t>(std::llround(i_seconds * double(kFbxTicksPerSecond)));
  }
  double GetSecondDouble() const { return double(m_ticks) / double(kFbxTicksPerSecond); }
  int64_t Get() const { return m_ticks; }
  void Set(int64_t i_ticks) { m_ticks = i_ticks; }
  bool operator<(const FbxTime& o) const { return m_ticks < o.m_ticks; }
  bool operator==(const FbxTime& o) const { return m_ticks == o.m_ticks; }

  /// Frames per second of a mode; 0 for the default and custom modes.
  static double GetFrameRate(EMode i_mode);
  /// The process-wide mode (and custom rate) that new documents start from.
  static void SetGlobalTimeMode(EMode i_mode, double i_customRate = 0.0);
  static EMode GetGlobalTimeMode();

private:
  int64_t m_ticks = 0;
};

/// A span of time, start and stop inclusive.
struct FbxTimeSpan {
  FbxTimeSpan() = default;
  FbxTimeSpan(FbxTime i_start, FbxTime i_stop) : m_start(i_start), m_stop(i_stop) {}
  FbxTime GetStart() const { return m_start; }
  FbxTime GetStop() const { return m_stop; }
  FbxTime m_start;
  FbxTime m_stop;
};

} // namespace AnvilFbx
