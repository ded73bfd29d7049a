#include "plugin/host/AudioSource.h"
#include "AudioResampler.h"
#include "plugin/host/HTimeManager.h"
#include <cmath>

H_IMPLEMENT_RUNTIME_CLASS(AudioSource, Module)

AudioSource::AudioSource(const HString& i_rName) : Module(i_rName) {}

bool AudioSource::setSamples(int i_sampleRate, std::vector<std::vector<int16_t>> i_channels) {
  if (i_sampleRate <= 0 || i_channels.empty()) return false;
  for (const auto& channel : i_channels)
    if (channel.size() != i_channels[0].size()) return false;
  m_sampleRate = i_sampleRate;
  m_numChannels = int(i_channels.size());
  m_channels = std::move(i_channels);
  return true;
}

int16_t* AudioSource::resampleData(const HTimeRange& i_rRange, int i_sampleRate, int i_channel,
                                   unsigned long& o_rCount) const {
  o_rCount = 0;
  if (i_sampleRate <= 0 || i_channel < 0 || i_channel >= m_numChannels) return nullptr;
  const HTime span =
      i_rRange.getEnd() - i_rRange.getStart() + HTimeManager::getInstance()->getTicksPerFrame();
  if (span <= 0) return nullptr;
  const long long count = std::llround(double(span) * i_sampleRate / double(kTicksPerSecond));
  if (count <= 0) return nullptr;

  int16_t* pOut = new int16_t[size_t(count)];
  const std::vector<int16_t>& source = m_channels[size_t(i_channel)];
  // Position of the range's start in source samples, and source samples per output sample.
  const double first =
      double(i_rRange.getStart() - m_startTime) * m_sampleRate / double(kTicksPerSecond);
  const double step = double(m_sampleRate) / double(i_sampleRate);
  const double whole = std::nearbyint(first);
  if (step == 1.0 && std::fabs(first - whole) < 1e-9) {
    // Same rate, on the source's sample grid: a plain copy with silence outside the source.
    const long long offset = (long long)whole;
    for (long long i = 0; i < count; ++i) {
      const long long k = i + offset;
      pOut[i] = (k >= 0 && k < (long long)source.size()) ? source[size_t(k)] : int16_t(0);
    }
  } else {
    AnvilCoreImpl::resampleSinc(source.data(), source.size(), first, step, pOut, size_t(count));
  }
  o_rCount = (unsigned long)count;
  return pOut;
}
