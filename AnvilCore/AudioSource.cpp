#include "plugin/host/AudioSource.h"
#include "AudioResampler.h"
#include "plugin/host/HTimeManager.h"
#include <algorithm>
#include <cmath>

H_IMPLEMENT_RUNTIME_CLASS(AudioSource, Module)

AudioSource::AudioSource(const HString& i_rName) : Module(i_rName) {}

namespace {
bool validRate(double i_rate) {
  return std::isfinite(i_rate) && i_rate > 0.0;
}

// 16-bit samples of one measured channel, and the value of one step of them.
std::vector<int16_t> toSamples(const AnalogChannel& i_rChannel, double& o_rStep) {
  const size_t n = i_rChannel.readings.size();
  std::vector<double> counts(n);
  bool whole = true;
  double largest = 0.0, lowest = 0.0, highest = 0.0;
  for (size_t i = 0; i < n; ++i) {
    const double c = i_rChannel.readings[i] - i_rChannel.offset;
    counts[i] = std::isfinite(c) ? c : 0.0;
    whole = whole && counts[i] == std::nearbyint(counts[i]);
    largest = std::max(largest, std::fabs(counts[i]));
    lowest = std::min(lowest, counts[i]);
    highest = std::max(highest, counts[i]);
  }
  const double scale = std::isfinite(i_rChannel.scale) ? i_rChannel.scale : 1.0;
  std::vector<int16_t> samples(n);
  o_rStep = scale;
  if (whole && lowest >= -32768.0 && highest <= 98303.0) {
    // Counts of a 16-bit converter stay exact, taken modulo 2^16 when they pass 32767: the words
    // of unsigned data, and those of the C3D files this toolkit writes, whose OFFSET of -32768
    // gives sample + 32768 in integer form and sample + 65536 in float form.
    for (size_t i = 0; i < n; ++i)
      samples[i] = int16_t(uint16_t(int32_t(counts[i]) & 0xFFFF));
    return samples;
  }
  // Anything else (volts, newtons, a wider converter) spreads over the 16-bit range.
  const double factor = largest == 0.0 ? 1.0 : 32767.0 / largest;
  o_rStep = scale / factor;
  for (size_t i = 0; i < n; ++i)
    samples[i] = int16_t(std::clamp(std::nearbyint(counts[i] * factor), -32768.0, 32767.0));
  return samples;
}
} // namespace

bool AudioSource::setSamples(double i_sampleRate, std::vector<std::vector<int16_t>> i_channels) {
  if (!validRate(i_sampleRate) || i_channels.empty()) return false;
  for (const auto& channel : i_channels)
    if (channel.size() != i_channels[0].size()) return false;
  m_sampleRate = i_sampleRate;
  m_numChannels = int(i_channels.size());
  m_channels = std::move(i_channels);
  m_measurements.clear();
  m_sampleSteps.clear();
  return true;
}

bool AudioSource::setMeasurements(double i_sampleRate, std::vector<AnalogChannel> i_channels) {
  if (!validRate(i_sampleRate) || i_channels.empty()) return false;
  for (const auto& channel : i_channels)
    if (channel.readings.size() != i_channels[0].readings.size()) return false;
  std::vector<std::vector<int16_t>> samples;
  std::vector<double> steps(i_channels.size());
  for (size_t c = 0; c < i_channels.size(); ++c)
    samples.push_back(toSamples(i_channels[c], steps[c]));
  setSamples(i_sampleRate, std::move(samples));
  m_measurements = std::move(i_channels);
  m_sampleSteps = std::move(steps);
  return true;
}

int16_t* AudioSource::resampleData(const HTimeRange& i_rRange, double i_sampleRate, int i_channel,
                                   unsigned long& o_rCount) const {
  o_rCount = 0;
  if (!validRate(i_sampleRate) || i_channel < 0 || i_channel >= m_numChannels) return nullptr;
  const HTime span =
      i_rRange.getEnd() - i_rRange.getStart() + HTimeManager::getInstance()->getTicksPerFrame();
  if (span <= 0) return nullptr;
  const double wanted = double(span) * i_sampleRate / double(kTicksPerSecond);
  if (!(wanted < 4294967295.0)) return nullptr; // more than a count can say
  const long long count = std::llround(wanted);
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
