// Audio sources: resampling (same rate, up, down), the span of a request, WAV files.
#include "plugin/host/AudioSource.h"
#include "WavTestFile.h"
#include "plugin/host/Database.h"
#include "plugin/host/HTimeManager.h"
#include <cmath>
#include <cstdio>
#include <filesystem>
#include <fstream>
#include <gtest/gtest.h>
#include <memory>
#include <unistd.h>

namespace {
constexpr double kPi = 3.14159265358979323846;

std::vector<int16_t> tone(double i_frequency, int i_rate, int i_count, double i_amplitude) {
  std::vector<int16_t> samples(static_cast<size_t>(i_count));
  for (int i = 0; i < i_count; ++i)
    samples[size_t(i)] =
        int16_t(std::lround(i_amplitude * std::sin(2.0 * kPi * i_frequency * i / i_rate)));
  return samples;
}

struct Resampled {
  std::unique_ptr<int16_t[]> data;
  unsigned long count = 0;
};

Resampled resample(const AudioSource& i_rSource, const HTimeRange& i_rRange, int i_rate,
                   int i_channel = 0) {
  Resampled r;
  r.data.reset(i_rSource.resampleData(i_rRange, i_rate, i_channel, r.count));
  return r;
}

// One second at the time manager's rate: frames 0 to rate - 1.
HTimeRange oneSecond() {
  const HTimeManager* pTime = g_db->getTimeManager();
  return HTimeRange(0, pTime->getTicksPerFrame() * (int64_t(pTime->getFrameRate()) - 1));
}

// Largest difference from a sine of the output's rate, away from the edges of the signal.
double worstError(const Resampled& i_r, double i_frequency, int i_rate, double i_amplitude,
                  unsigned long i_margin) {
  double worst = 0.0;
  for (unsigned long i = i_margin; i + i_margin < i_r.count; ++i)
    worst = std::max(worst, std::fabs(i_r.data[i] - i_amplitude * std::sin(2.0 * kPi * i_frequency *
                                                                           double(i) / i_rate)));
  return worst;
}

std::string tempFile(const std::string& i_name) {
  const auto dir =
      std::filesystem::temp_directory_path() / ("anvil-audio-test-" + std::to_string(::getpid()));
  std::filesystem::create_directories(dir);
  return (dir / i_name).string();
}

class AudioSourceTest : public ::testing::Test {
protected:
  void SetUp() override { g_db->getTimeManager()->setFrameRate(120.0); }
};
} // namespace

TEST_F(AudioSourceTest, SameRateIsAnExactCopyShiftedByTheStartTime) {
  AudioSource source("Mic");
  std::vector<int16_t> ramp(1000);
  for (int i = 0; i < 1000; ++i)
    ramp[size_t(i)] = int16_t(i + 1);
  ASSERT_TRUE(source.setSamples(1000, {ramp}));
  source.setStartTime(kTicksPerSecond / 10); // first sample at 0.1 s

  const Resampled r = resample(source, oneSecond(), 1000);
  ASSERT_EQ(r.count, 1000u); // to the end of the last frame
  for (int i = 0; i < 100; ++i)
    ASSERT_EQ(r.data[size_t(i)], 0) << i;
  for (int i = 100; i < 1000; ++i)
    ASSERT_EQ(r.data[size_t(i)], i - 99) << i;
}

TEST_F(AudioSourceTest, UpsampledSineKeepsFrequencyAndAmplitude) {
  AudioSource source("Mic");
  ASSERT_TRUE(source.setSamples(44100, {tone(1000.0, 44100, 44100 + 2000, 10000.0)}));
  const Resampled r = resample(source, oneSecond(), 48000);
  ASSERT_EQ(r.count, 48000u);
  // Away from the start (where the kernel meets the silence before the source) the output is
  // the same sine sampled at 48 kHz, to within a few steps of 16-bit rounding.
  EXPECT_LT(worstError(r, 1000.0, 48000, 10000.0, 100), 4.0);
}

TEST_F(AudioSourceTest, DownsamplingKeepsTheBandAndRemovesWhatWouldAlias) {
  AudioSource source("Mic");
  const int count = 48000 + 4000;
  ASSERT_TRUE(source.setSamples(
      48000, {tone(1000.0, 48000, count, 10000.0), tone(6000.0, 48000, count, 10000.0)}));
  const Resampled low = resample(source, oneSecond(), 8000, 0);
  ASSERT_EQ(low.count, 8000u);
  EXPECT_LT(worstError(low, 1000.0, 8000, 10000.0, 100), 4.0);

  // 6 kHz is above the new Nyquist frequency: linear interpolation would fold it to 2 kHz at
  // full strength; the band-limited filter leaves next to nothing.
  const Resampled folded = resample(source, oneSecond(), 8000, 1);
  double energy = 0.0;
  for (unsigned long i = 100; i + 100 < folded.count; ++i)
    energy += double(folded.data[i]) * folded.data[i];
  const double rms = std::sqrt(energy / double(folded.count - 200));
  EXPECT_LT(rms, 5.0);
}

TEST_F(AudioSourceTest, BadRequestsGiveNothing) {
  AudioSource source("Mic");
  ASSERT_TRUE(source.setSamples(1000, {std::vector<int16_t>(10, 1), std::vector<int16_t>(10, 2)}));
  EXPECT_FALSE(source.setSamples(1000, {std::vector<int16_t>(10), std::vector<int16_t>(9)}));
  EXPECT_FALSE(source.setSamples(0, {std::vector<int16_t>(10)}));
  EXPECT_FALSE(source.setSamples(1000, {}));
  EXPECT_EQ(source.getNumChannels(), 2);
  EXPECT_EQ(source.getSampleRate(), 1000);

  for (auto [rate, channel] : {std::pair{1000, 2}, std::pair{1000, -1}, std::pair{0, 0}}) {
    const Resampled r = resample(source, oneSecond(), rate, channel);
    EXPECT_EQ(r.data, nullptr);
    EXPECT_EQ(r.count, 0u);
  }
  const Resampled backwards = resample(source, HTimeRange(kTicksPerSecond, 0), 1000);
  EXPECT_EQ(backwards.count, 0u);
  EXPECT_EQ(resample(source, oneSecond(), 1000, 1).data[5], 2);
}

TEST_F(AudioSourceTest, LoadsWavFilesAndRefusesOthers) {
  const std::string path = tempFile("two.wav");
  const std::vector<std::vector<int16_t>> channels = {{0, 100, -100, 32767, -32768},
                                                      {5, 6, 7, 8, 9}};
  AudioTest::writeWav(path, 22050, channels);
  AudioSource source("Wav");
  std::string error;
  ASSERT_TRUE(source.loadFile(path, error)) << error;
  EXPECT_EQ(source.getSampleRate(), 22050);
  EXPECT_EQ(source.getNumChannels(), 2);
  EXPECT_EQ(source.getChannel(0), channels[0]);
  EXPECT_EQ(source.getChannel(1), channels[1]);
  EXPECT_EQ(source.getFilePath(), path);

  const std::string missing = tempFile("missing.wav");
  EXPECT_FALSE(source.loadFile(missing, error));
  EXPECT_EQ(error.rfind("cannot read audio file '" + missing + "'", 0), 0u) << error;
  const std::string garbage = tempFile("garbage.wav");
  std::ofstream(garbage) << "not a sound file at all";
  EXPECT_FALSE(source.loadFile(garbage, error));
  EXPECT_NE(error.find(garbage), std::string::npos);
  EXPECT_EQ(source.getChannel(0), channels[0]); // unchanged by the failures
  std::filesystem::remove_all(std::filesystem::path(path).parent_path());
}
