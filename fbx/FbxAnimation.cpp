#include "FbxAnimation.h"
#include "FbxScene.h"
#include <algorithm>

namespace AnvilFbx {

namespace {
// A new key is cubic with automatic tangents until told otherwise.
constexpr uint32_t kNewKeyFlags =
    uint32_t(FbxAnimCurveDef::eInterpolationCubic) | uint32_t(FbxAnimCurveDef::eTangentAuto);

uint32_t withInterpolation(uint32_t i_flags, FbxAnimCurveDef::EInterpolationType i_type) {
  const uint32_t flags = (i_flags & ~FbxAnimCurveDef::kInterpolationMask) | uint32_t(i_type);
  // Tangent modes only mean something for cubic keys.
  return i_type == FbxAnimCurveDef::eInterpolationCubic ? flags : flags & ~uint32_t(0x7F00);
}
} // namespace

FbxAnimStack* FbxAnimStack::Create(FbxScene* i_pScene, const char* i_pName) {
  FbxAnimStack* pStack = i_pScene->add(std::unique_ptr<FbxAnimStack>(new FbxAnimStack(i_pName)));
  i_pScene->m_stacks.push_back(pStack);
  return pStack;
}

void FbxAnimStack::AddMember(FbxAnimLayer* i_pLayer) {
  if (!i_pLayer || i_pLayer->m_pStack) return;
  i_pLayer->m_pStack = this;
  m_layers.push_back(i_pLayer);
}

FbxAnimLayer* FbxAnimLayer::Create(FbxScene* i_pScene, const char* i_pName) {
  return i_pScene->add(std::unique_ptr<FbxAnimLayer>(new FbxAnimLayer(i_pName)));
}

void FbxAnimCurve::ResizeKeyBuffer(int i_count) {
  const size_t n = size_t(std::max(i_count, 0));
  ownTimes().reserve(n);
  m_values.reserve(n);
}

FbxKeyTimes& FbxAnimCurve::ownTimes() {
  if (m_pTimes.use_count() > 1) m_pTimes = std::make_shared<FbxKeyTimes>(*m_pTimes);
  return *m_pTimes;
}

std::pair<size_t, uint32_t> FbxAnimCurve::runOf(size_t i_index) const {
  size_t run = 0;
  while (run < m_flagRuns.size() && i_index >= m_flagRuns[run].count)
    i_index -= m_flagRuns[run++].count;
  return {run, uint32_t(i_index)};
}

uint32_t FbxAnimCurve::KeyGetFlags(int i_index) const {
  const auto [run, offset] = runOf(size_t(i_index));
  return m_flagRuns[run].flags;
}

// Joins equal neighbours among runs first..last (and the runs next to them) and drops empty ones.
void FbxAnimCurve::mergeRuns(size_t i_first, size_t i_last) {
  size_t from = i_first > 0 ? i_first - 1 : 0;
  const size_t to = std::min(i_last + 1, m_flagRuns.size() - 1);
  size_t out = from;
  for (size_t r = from + 1; r <= to; ++r) {
    if (m_flagRuns[r].count == 0) continue;
    if (m_flagRuns[out].count == 0 || m_flagRuns[out].flags == m_flagRuns[r].flags) {
      m_flagRuns[out].count += m_flagRuns[r].count;
      m_flagRuns[out].flags = m_flagRuns[r].flags;
    } else {
      m_flagRuns[++out] = m_flagRuns[r];
    }
  }
  m_flagRuns.erase(m_flagRuns.begin() + long(out + 1), m_flagRuns.begin() + long(to + 1));
}

void FbxAnimCurve::insertFlags(size_t i_index, uint32_t i_flags) {
  const auto [run, offset] = runOf(i_index);
  if (run == m_flagRuns.size()) { // after the last key
    if (!m_flagRuns.empty() && m_flagRuns.back().flags == i_flags)
      ++m_flagRuns.back().count;
    else
      m_flagRuns.push_back({i_flags, 1});
    return;
  }
  FlagRun& rHost = m_flagRuns[run];
  if (rHost.flags == i_flags) {
    ++rHost.count;
    return;
  }
  // Split the run around the new key.
  const FlagRun after{rHost.flags, rHost.count - offset};
  rHost.count = offset;
  m_flagRuns.insert(m_flagRuns.begin() + long(run) + 1, {FlagRun{i_flags, 1}, after});
  mergeRuns(run, run + 2);
}

int FbxAnimCurve::KeyAdd(FbxTime i_time) {
  const int64_t t = i_time.Get();
  FbxKeyTimes& times = ownTimes();
  if (times.empty() || t > times.back()) {
    times.push_back(t);
    m_values.push_back(0.0f);
    insertFlags(times.size() - 1, kNewKeyFlags);
    return int(times.size()) - 1;
  }
  const auto it = std::lower_bound(times.begin(), times.end(), t);
  const size_t index = size_t(it - times.begin());
  if (*it != t) {
    times.insert(it, t);
    m_values.insert(m_values.begin() + long(index), 0.0f);
    insertFlags(index, kNewKeyFlags);
  }
  return int(index);
}

void FbxAnimCurve::KeySetInterpolation(int i_index, FbxAnimCurveDef::EInterpolationType i_type) {
  const auto [run, offset] = runOf(size_t(i_index));
  FlagRun& rHost = m_flagRuns[run];
  const uint32_t flags = withInterpolation(rHost.flags, i_type);
  if (flags == rHost.flags) return;
  // The key becomes a run of its own between the two parts of its old run.
  const FlagRun after{rHost.flags, rHost.count - offset - 1};
  rHost.count = offset;
  m_flagRuns.insert(m_flagRuns.begin() + long(run) + 1, {FlagRun{flags, 1}, after});
  mergeRuns(run, run + 2);
}

void FbxAnimCurve::addKeys(std::span<const int64_t> i_times, std::span<const float> i_values,
                           FbxAnimCurveDef::EInterpolationType i_type) {
  const size_t n = std::min(i_times.size(), i_values.size());
  const FbxKeyTimes& times = *m_pTimes;
  bool increasing = times.empty() || n == 0 || i_times[0] > times.back();
  for (size_t k = 1; increasing && k < n; ++k)
    increasing = i_times[k] > i_times[k - 1];
  if (!increasing) {
    for (size_t k = 0; k < n; ++k) {
      const int index = KeyAdd(FbxTime(i_times[k]));
      KeySetValue(index, i_values[k]);
      KeySetInterpolation(index, i_type);
    }
    return;
  }
  if (n == 0) return;
  FbxKeyTimes& own = ownTimes();
  own.insert(own.end(), i_times.begin(), i_times.begin() + long(n));
  m_values.insert(m_values.end(), i_values.begin(), i_values.begin() + long(n));
  const uint32_t flags = withInterpolation(kNewKeyFlags, i_type);
  if (!m_flagRuns.empty() && m_flagRuns.back().flags == flags)
    m_flagRuns.back().count += uint32_t(n);
  else
    m_flagRuns.push_back({flags, uint32_t(n)});
}

void FbxAnimCurve::addKeys(std::shared_ptr<FbxKeyTimes> i_pTimes, FbxKeyValues i_values,
                           FbxAnimCurveDef::EInterpolationType i_type) {
  const FbxKeyTimes& times = *i_pTimes;
  bool increasing = times.size() == i_values.size() && m_pTimes->empty();
  for (size_t k = 1; increasing && k < times.size(); ++k)
    increasing = times[k] > times[k - 1];
  if (!increasing || times.empty()) {
    addKeys(std::span<const int64_t>(times), std::span<const float>(i_values), i_type);
    return;
  }
  m_pTimes = std::move(i_pTimes);
  m_values = std::move(i_values);
  m_flagRuns.assign(1, {withInterpolation(kNewKeyFlags, i_type), uint32_t(times.size())});
}

} // namespace AnvilFbx
