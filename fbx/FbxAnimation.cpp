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
  m_times.reserve(n);
  m_values.reserve(n);
  m_flags.reserve(n);
}

int FbxAnimCurve::KeyAdd(FbxTime i_time) {
  const int64_t t = i_time.Get();
  if (m_times.empty() || t > m_times.back()) {
    m_times.push_back(t);
    m_values.push_back(0.0f);
    m_flags.push_back(kNewKeyFlags);
    return int(m_times.size()) - 1;
  }
  const auto it = std::lower_bound(m_times.begin(), m_times.end(), t);
  const size_t index = size_t(it - m_times.begin());
  if (*it != t) {
    m_times.insert(it, t);
    m_values.insert(m_values.begin() + long(index), 0.0f);
    m_flags.insert(m_flags.begin() + long(index), kNewKeyFlags);
  }
  return int(index);
}

void FbxAnimCurve::KeySetInterpolation(int i_index, FbxAnimCurveDef::EInterpolationType i_type) {
  uint32_t& flags = m_flags[size_t(i_index)];
  flags = withInterpolation(flags, i_type);
}

void FbxAnimCurve::addKeys(std::span<const int64_t> i_times, std::span<const float> i_values,
                           FbxAnimCurveDef::EInterpolationType i_type) {
  const size_t n = std::min(i_times.size(), i_values.size());
  bool increasing = m_times.empty() || n == 0 || i_times[0] > m_times.back();
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
  m_times.insert(m_times.end(), i_times.begin(), i_times.begin() + long(n));
  m_values.insert(m_values.end(), i_values.begin(), i_values.begin() + long(n));
  m_flags.resize(m_flags.size() + n, withInterpolation(kNewKeyFlags, i_type));
}

size_t FbxAnimCurve::keyBytes() const {
  return m_times.capacity() * sizeof(int64_t) + m_values.capacity() * sizeof(float) +
         m_flags.capacity() * sizeof(uint32_t);
}

} // namespace AnvilFbx
