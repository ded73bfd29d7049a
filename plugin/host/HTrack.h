#pragma once
#include "HTime.h"
#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <vector>

/// Keys sorted by time. Between keys a track interpolates (the `Lerp` policy); outside them it
/// holds the first or last value.
///
/// Key times are kept as runs of evenly spaced times (start, step, count): a track sampled at a
/// frame rate, with or without gaps, holds a few runs instead of one time per key, so a long
/// take costs little more than its values. Lookups search the runs, then compute the index.
template <typename T, typename Lerp> class HTrack {
  struct Run {
    HTime start;
    uint64_t step;  ///< ticks between keys; 0 while the run holds one key
    uint32_t first; ///< index of the run's first key
    uint32_t count;
    HTime time(size_t i_offset) const { return HTime(uint64_t(start) + step * i_offset); }
    HTime last() const { return time(count - 1); }
  };

public:
  int getNumKeys() const { return static_cast<int>(m_values.size()); }
  bool isEmpty() const { return m_values.empty(); }
  HTime getKeyTime(int i_index) const {
    const Run& run = m_runs[runOfIndex(size_t(i_index))];
    return run.time(size_t(i_index) - run.first);
  }
  const T& getKeyValue(int i_index) const { return m_values[static_cast<size_t>(i_index)]; }
  T& keyValue(int i_index) { return m_values[static_cast<size_t>(i_index)]; }
  /// Every key time in order. Built on the first call after a change and kept until the next
  /// change; walk a `KeyCursor` instead where memory matters. Not for concurrent first calls.
  const std::vector<HTime>& times() const {
    if (m_timesStale) {
      m_times.clear();
      m_times.reserve(m_values.size());
      for (const Run& run : m_runs)
        for (size_t i = 0; i < run.count; ++i)
          m_times.push_back(run.time(i));
      m_timesStale = false;
    }
    return m_times;
  }

  /// Sets the value at a time, replacing a key at exactly that time.
  void setKey(HTime i_t, const T& i_rValue) {
    if (m_values.empty() || i_t > m_runs.back().last()) {
      appendTime(i_t);
      m_values.push_back(i_rValue);
      return;
    }
    setKeyWithin(i_t, i_rValue);
  }
  /// Appends keys at increasing times, all after the last key, in one step; keys out of that
  /// order are set one by one as `setKey` does.
  void appendKeys(const HTime* i_pTimes, const T* i_pValues, size_t i_count) {
    if (i_count == 0) return;
    if (!m_values.empty() && i_pTimes[0] <= m_runs.back().last()) {
      for (size_t i = 0; i < i_count; ++i)
        setKey(i_pTimes[i], i_pValues[i]);
      return;
    }
    dropTimes();
    size_t i = 0;
    if (m_runs.empty()) {
      m_runs.push_back({i_pTimes[0], 0, 0, 1});
      i = 1;
    }
    // The last run is extended in a local copy and stored back when a new one begins.
    Run run = m_runs.back();
    HTime last = run.last();
    for (; i < i_count && i_pTimes[i] > last; ++i) {
      const uint64_t step = uint64_t(i_pTimes[i]) - uint64_t(last);
      if (run.count == 1) run.step = step;
      if (run.step == step) {
        ++run.count;
      } else {
        m_runs.back() = run;
        run = {i_pTimes[i], 0, run.first + run.count, 1};
        m_runs.push_back(run);
      }
      last = i_pTimes[i];
    }
    m_runs.back() = run;
    m_values.insert(m_values.end(), i_pValues, i_pValues + i);
    for (; i < i_count; ++i)
      setKey(i_pTimes[i], i_pValues[i]);
  }
  void clear() {
    m_runs.clear();
    m_values.clear();
    dropTimes();
  }
  void reserve(size_t i_count) { m_values.reserve(i_count); }

  /// Index of the first key at or after `i_t`; the key count when there is none.
  size_t lowerBound(HTime i_t) const {
    // The last run starting at or before i_t holds the answer, or the next run's first key does.
    auto it = std::upper_bound(m_runs.begin(), m_runs.end(), i_t,
                               [](HTime t, const Run& run) { return t < run.start; });
    if (it == m_runs.begin()) return 0;
    const Run& run = *(it - 1);
    if (i_t > run.last()) return size_t(run.first) + run.count;
    if (run.count == 1) return run.first;
    const uint64_t offset = uint64_t(i_t) - uint64_t(run.start);
    return size_t(run.first) + size_t((offset + run.step - 1) / run.step);
  }
  /// Index of the key at exactly `i_t`, or -1.
  int findKey(HTime i_t) const {
    const size_t index = lowerBound(i_t);
    return (index < m_values.size() && getKeyTime(int(index)) == i_t) ? int(index) : -1;
  }
  /// Value at `i_t`; `i_rDefault` for a track without keys.
  T evaluate(HTime i_t, const T& i_rDefault) const {
    if (m_values.empty()) return i_rDefault;
    if (i_t <= m_runs.front().start) return m_values.front();
    if (i_t >= m_runs.back().last()) return m_values.back();
    const size_t hi = lowerBound(i_t);
    const HTime hiTime = getKeyTime(int(hi));
    if (hiTime == i_t) return m_values[hi];
    const size_t lo = hi - 1;
    const HTime loTime = getKeyTime(int(lo));
    const double u = double(i_t - loTime) / double(hiTime - loTime);
    return Lerp()(m_values[lo], m_values[hi], u);
  }
  /// Count of keys whose time lies within [start, end]; `o_rFirst` is the first such index.
  int countInRange(HTime i_start, HTime i_end, int& o_rFirst) const {
    const size_t lo = lowerBound(i_start);
    const size_t hi = i_end == INT64_MAX ? m_values.size() : lowerBound(i_end + 1);
    o_rFirst = static_cast<int>(lo);
    return hi > lo ? static_cast<int>(hi - lo) : 0;
  }

  /// Walks the keys in time order, each step in constant time.
  class KeyCursor {
  public:
    explicit KeyCursor(const HTrack& i_rTrack) : m_pRuns(&i_rTrack.m_runs) {}
    bool atEnd() const { return m_run == m_pRuns->size(); }
    /// Index of the key at the cursor (the key count at the end).
    int index() const { return atEnd() ? endIndex() : int((*m_pRuns)[m_run].first + m_offset); }
    /// Time of the key at the cursor; not at the end.
    HTime time() const { return (*m_pRuns)[m_run].time(m_offset); }
    void next() {
      if (++m_offset == (*m_pRuns)[m_run].count) {
        ++m_run;
        m_offset = 0;
      }
    }
    /// Steps past the keys before `i_t`.
    void skipBefore(HTime i_t) {
      while (!atEnd() && time() < i_t)
        next();
    }

  private:
    int endIndex() const {
      return m_pRuns->empty() ? 0 : int(m_pRuns->back().first + m_pRuns->back().count);
    }
    const std::vector<Run>* m_pRuns;
    size_t m_run = 0;
    uint32_t m_offset = 0;
  };

private:
  // A key at or before the last one: replaces the key at that time, or goes between others.
  [[gnu::noinline]] void setKeyWithin(HTime i_t, const T& i_rValue) {
    const size_t index = lowerBound(i_t);
    if (index < m_values.size() && getKeyTime(int(index)) == i_t) {
      m_values[index] = i_rValue;
      return;
    }
    // A key between others: the runs are built again around it.
    std::vector<HTime> all = times();
    all.insert(all.begin() + static_cast<long>(index), i_t);
    m_values.insert(m_values.begin() + static_cast<long>(index), i_rValue);
    m_runs.clear();
    for (const HTime t : all)
      appendTime(t);
  }

  size_t runOfIndex(size_t i_index) const {
    auto it = std::upper_bound(m_runs.begin(), m_runs.end(), i_index,
                               [](size_t i, const Run& run) { return i < run.first; });
    return size_t(it - m_runs.begin()) - 1;
  }
  // Appends a time after the last key.
  void appendTime(HTime i_t) {
    dropTimes();
    if (!m_runs.empty()) {
      Run& run = m_runs.back();
      const uint64_t step = uint64_t(i_t) - uint64_t(run.last());
      if (run.count == 1) run.step = step;
      if (run.step == step) {
        ++run.count;
        return;
      }
    }
    const uint32_t first = m_runs.empty() ? 0 : m_runs.back().first + m_runs.back().count;
    m_runs.push_back({i_t, 0, first, 1});
  }
  void dropTimes() {
    if (!m_timesStale) {
      m_times.clear();
      m_times.shrink_to_fit();
      m_timesStale = true;
    }
  }

  std::vector<Run> m_runs;
  std::vector<T> m_values;
  mutable std::vector<HTime> m_times; ///< built by `times()`
  mutable bool m_timesStale = true;
};
