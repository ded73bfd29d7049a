#pragma once
#include "HTime.h"
#include "Module.h"
#include <cstdint>
#include <string>
#include <vector>

/// One analog channel as a measuring device recorded it, kept at full precision: the value in
/// `units` of reading i is (readings[i] - offset) * scale.
struct AnalogChannel {
  std::vector<double> readings;
  double offset = 0.0;
  double scale = 1.0;
  std::string units; ///< as the file names them ("N", "V", "mm"); empty when unknown
  double valueAt(size_t i_index) const { return (readings[i_index] - offset) * scale; }
};

/// An audio track of the scene: one or more channels of signed 16-bit samples at a fixed rate,
/// whose first sample plays at `getStartTime`. Before the first sample and after the last the
/// source is silent.
///
/// A source made from measurements (`setMeasurements`, the analog channels of a C3D file) keeps
/// them whole beside its 16-bit samples, which are derived from them for the users of samples.
class ANVIL_HOST_API AudioSource : public Module {
  H_DECLARE_RUNTIME_CLASS(AudioSource)
public:
  explicit AudioSource(const HString& i_rName = HString());

  /// Samples per second of each channel, as given (not always a whole number: analog channels
  /// run at a multiple of the capture rate); 0 for a source without samples.
  double getSampleRate() const { return m_sampleRate; }
  int getNumChannels() const { return m_numChannels; }
  /// Samples in each channel.
  int64_t getNumSamples() const { return m_channels.empty() ? 0 : int64_t(m_channels[0].size()); }

  /// One channel sampled at `i_sampleRate` over a range of scene time: sample i is the sound at
  /// range start + i / rate seconds, and the samples run to the end of the range's last frame
  /// (range end plus one frame of the time manager), so `o_rCount` is that span times the rate,
  /// rounded. A source at another rate is resampled with a windowed-sinc filter (band-limited,
  /// so a downsampled source does not alias). The caller owns the array and frees it with
  /// `delete[]`. A bad channel, a rate not above 0 or an empty span give null and a count of 0.
  int16_t* resampleData(const HTimeRange& i_rRange, double i_sampleRate, int i_channel,
                        unsigned long& o_rCount) const;

  /// Host side: replaces the samples (and forgets any measurements). Every channel must hold the
  /// same count; returns false, changing nothing, when they do not, when there is no channel or
  /// when the rate is not a finite number above 0.
  bool setSamples(double i_sampleRate, std::vector<std::vector<int16_t>> i_channels);
  const std::vector<int16_t>& getChannel(int i_channel) const {
    return m_channels[size_t(i_channel)];
  }

  /// Host side: replaces the samples with measurements, kept as given. The 16-bit samples are
  /// derived per channel from the counts (readings minus offset): counts that are all whole
  /// numbers from -32768 to 98303 are taken as 16-bit words (modulo 2^16, so exact within
  /// -32768..32767; see docs/audio.md for the larger ones); any other channel is scaled so that its
  /// largest magnitude becomes 32767 (zero stays zero, the shape survives). Same conditions as
  /// `setSamples`; non-finite readings count as 0.
  bool setMeasurements(double i_sampleRate, std::vector<AnalogChannel> i_channels);
  /// Whether the source holds measurements, and what they are.
  bool hasMeasurements() const { return !m_measurements.empty(); }
  const AnalogChannel& getMeasurement(int i_channel) const {
    return m_measurements[size_t(i_channel)];
  }
  /// The value, in the channel's units, of one step of its 16-bit samples: sample times this is
  /// the measured value to within half a step (for counts taken modulo 2^16, those above 32767
  /// excepted). 1 for a source without measurements.
  double getSampleStep(int i_channel) const {
    return m_sampleSteps.empty() ? 1.0 : m_sampleSteps[size_t(i_channel)];
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
  double m_sampleRate = 0.0;
  int m_numChannels = 0;
  HTime m_startTime = 0;
  std::vector<std::vector<int16_t>> m_channels;
  std::vector<AnalogChannel> m_measurements;
  std::vector<double> m_sampleSteps; ///< per channel, with measurements only
  std::string m_filePath;
};
