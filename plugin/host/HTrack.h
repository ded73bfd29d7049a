#pragma once
#include "HTime.h"
#include <algorithm>
#include <vector>

/// Keys sorted by time. Between keys a track interpolates (the `Lerp` policy); outside them it
/// holds the first or last value. Times and values are kept apart so lookups scan only times.
template <typename T, typename Lerp> class HTrack {
public:
  int getNumKeys() const { return static_cast<int>(m_times.size()); }
  bool isEmpty() const { return m_times.empty(); }
  HTime getKeyTime(int i_index) const { return m_times[static_cast<size_t>(i_index)]; }
  const T& getKeyValue(int i_index) const { return m_values[static_cast<size_t>(i_index)]; }
  T& keyValue(int i_index) { return m_values[static_cast<size_t>(i_index)]; }
  const std::vector<HTime>& times() const { return m_times; }

  /// Sets the value at a time, replacing a key at exactly that time.
  void setKey(HTime i_t, const T& i_rValue) {
    if (m_times.empty() || i_t > m_times.back()) {
      m_times.push_back(i_t);
      m_values.push_back(i_rValue);
      return;
    }
    auto it = std::lower_bound(m_times.begin(), m_times.end(), i_t);
    const size_t index = static_cast<size_t>(it - m_times.begin());
    if (it != m_times.end() && *it == i_t) {
      m_values[index] = i_rValue;
      return;
    }
    m_times.insert(it, i_t);
    m_values.insert(m_values.begin() + static_cast<long>(index), i_rValue);
  }
  void clear() {
    m_times.clear();
    m_values.clear();
  }
  void reserve(size_t i_count) {
    m_times.reserve(i_count);
    m_values.reserve(i_count);
  }

  /// Index of the key at exactly `i_t`, or -1.
  int findKey(HTime i_t) const {
    auto it = std::lower_bound(m_times.begin(), m_times.end(), i_t);
    return (it != m_times.end() && *it == i_t) ? static_cast<int>(it - m_times.begin()) : -1;
  }
  /// Value at `i_t`; `i_rDefault` for a track without keys.
  T evaluate(HTime i_t, const T& i_rDefault) const {
    if (m_times.empty()) return i_rDefault;
    if (i_t <= m_times.front()) return m_values.front();
    if (i_t >= m_times.back()) return m_values.back();
    auto it = std::lower_bound(m_times.begin(), m_times.end(), i_t);
    const size_t hi = static_cast<size_t>(it - m_times.begin());
    if (*it == i_t) return m_values[hi];
    const size_t lo = hi - 1;
    const double u = double(i_t - m_times[lo]) / double(m_times[hi] - m_times[lo]);
    return Lerp()(m_values[lo], m_values[hi], u);
  }
  /// Count of keys whose time lies within [start, end]; `o_rFirst` is the first such index.
  int countInRange(HTime i_start, HTime i_end, int& o_rFirst) const {
    auto lo = std::lower_bound(m_times.begin(), m_times.end(), i_start);
    auto hi = std::upper_bound(m_times.begin(), m_times.end(), i_end);
    o_rFirst = static_cast<int>(lo - m_times.begin());
    return hi > lo ? static_cast<int>(hi - lo) : 0;
  }

private:
  std::vector<HTime> m_times;
  std::vector<T> m_values;
};
