// Sound files through libsndfile: any format it reads comes in as 16-bit samples.
#include "plugin/host/AudioSource.h"
#include <memory>
#include <sndfile.h>

namespace {
struct SndFileCloser {
  void operator()(SNDFILE* i_pFile) const { sf_close(i_pFile); }
};
} // namespace

bool AudioSource::loadFile(const std::string& i_path, std::string& o_rError) {
  SF_INFO info{};
  std::unique_ptr<SNDFILE, SndFileCloser> pFile(sf_open(i_path.c_str(), SFM_READ, &info));
  if (!pFile) {
    o_rError = "cannot read audio file '" + i_path + "': " + sf_strerror(nullptr);
    return false;
  }
  if (info.channels <= 0 || info.samplerate <= 0 || info.frames < 0) {
    o_rError = "audio file '" + i_path + "' has no channels or no sample rate";
    return false;
  }
  // Past 2^31 samples (4 GiB of 16-bit data) refuse rather than exhaust memory.
  constexpr sf_count_t kMaxSamples = sf_count_t(1) << 31;
  if (info.frames * info.channels > kMaxSamples) {
    o_rError = "audio file '" + i_path + "' is too long";
    return false;
  }
  std::vector<int16_t> interleaved(size_t(info.frames * info.channels));
  const sf_count_t read = sf_readf_short(pFile.get(), interleaved.data(), info.frames);
  if (read != info.frames) {
    o_rError = "audio file '" + i_path + "' ends early: " + sf_strerror(pFile.get());
    return false;
  }
  std::vector<std::vector<int16_t>> channels(size_t(info.channels),
                                             std::vector<int16_t>(size_t(info.frames)));
  for (sf_count_t i = 0; i < info.frames; ++i)
    for (int c = 0; c < info.channels; ++c)
      channels[size_t(c)][size_t(i)] = interleaved[size_t(i * info.channels + c)];
  setSamples(info.samplerate, std::move(channels));
  m_filePath = i_path;
  return true;
}
