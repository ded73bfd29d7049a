#pragma once
#include "HTime.h"
#include "Module.h"
#include <cstdint>
#include <string>
#include <vector>

/// An audio track of the scene: one or more channels of signed 16-bit samples at a fixed rate,
/// whose first sample plays at `getStartTime`. Before the first sample and after the last the
/// source is silent.
class ANVIL_HOST_API AudioSource : public Module {
  H_DECLARE_RUNTIME_CLASS(AudioSource)
public:
  explicit AudioSource(const HString& i_rName = HString());

  /// Samples per second of each channel; 0 for a source without samples.
  int getSampleRate() const { return m_sampleRate; }
  int getNumChannels() const { return m_numChannels; }
  /// Samples in each channel.
  int64_t getNumSamples() const { return m_channels.empty() ? 0 : int64_t(m_channels[0].size()); }

  /// One channel sampled at `i_sampleRate` over a range of scene time: sample i is the sound at
  /// range start + i / rate seconds, and the samples run to the end of the range's last frame
  /// (range end plus one frame of the time manager), so `o_rCount` is that span times the rate,
  /// rounded. A source at another rate is resampled with a windowed-sinc filter (band-limited,
  /// so a downsampled source does not alias). The caller owns the array and frees it with
  /// `delete[]`. A bad channel, a rate not above 0 or an empty span give null and a count of 0.
  int16_t* resampleData(const HTimeRange& i_rRange, int i_sampleRate, int i_channel,
                        unsigned long& o_rCount) const;

  /// Host side: replaces the samples. Every channel must hold the same count; returns false,
  /// changing nothing, when they do not, when there is no channel or when the rate is not above 0.
  bool setSamples(int i_sampleRate, std::vector<std::vector<int16_t>> i_channels);
  const std::vector<int16_t>& getChannel(int i_channel) const {
    return m_channels[size_t(i_channel)];
  }
  /// Scene time of the first sample, in ticks.
  HTime getStartTime() const { return m_startTime; }
  void setStartTime(HTime i_t) { m_startTime = i_t; }
  /// Host side: loads a sound file (WAV and the other formats of libsndfile) as 16-bit samples.
  /// On failure returns false with a message naming the file and the reason, source unchanged.
  bool loadFile(const std::string& i_path, std::string& o_rError);
  /// The file the samples came from; empty for samples given in memory.
  const std::string& getFilePath() const { return m_filePath; }

private:
  int m_sampleRate = 0;
  int m_numChannels = 0;
  HTime m_startTime = 0;
  std::vector<std::vector<int16_t>> m_channels;
  std::string m_filePath;
};
