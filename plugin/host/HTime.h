#pragma once
#include "HString.h"
#include "HostExport.h"
#include <cstdint>

/// Host time: signed 64-bit ticks, 135,000,000 to the second.
using HTime = int64_t;
constexpr HTime kTicksPerSecond = 135000000;

/// A closed range of ticks.
class ANVIL_HOST_API HTimeRange {
public:
  HTimeRange() = default;
  HTimeRange(HTime i_start, HTime i_end) : m_start(i_start), m_end(i_end) {}
  void setEnds(HTime i_start, HTime i_end) {
    m_start = i_start;
    m_end = i_end;
  }
  HTime getStart() const { return m_start; }
  HTime getEnd() const { return m_end; }
  /// Frames from start to end inclusive at the time manager's rate: (end - start) / T + 1.
  /// A range whose end lies before its start gives that same signed formula, as the host does.
  int getNumFrames() const;
  bool contains(HTime i_t) const { return i_t >= m_start && i_t <= m_end; }
  bool operator==(const HTimeRange& o) const { return m_start == o.m_start && m_end == o.m_end; }

private:
  HTime m_start = 0;
  HTime m_end = 0;
};

/// A frame rate in frames per second.
class ANVIL_HOST_API HFrameRate {
public:
  explicit HFrameRate(double i_rate = 0.0) : m_rate(i_rate) {}
  double getBaseFrameRate() const { return m_rate; }

private:
  double m_rate;
};
