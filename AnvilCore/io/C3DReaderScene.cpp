// The C3D input reader: markers (with their subjects) and analog channels into the scene.
#include "C3DReader.h"
#include "ISceneReader.h"
#include "MappedFile.h"
#include "TrajectoryScene.h"
#include "plugin/host/AudioSource.h"
#include "plugin/host/Database.h"
#include "plugin/host/Marker.h"
#include <algorithm>
#include <cmath>
#include <vector>

namespace AnvilCore {

namespace {

// Frames decoded at a time: about this many bytes of floats.
constexpr size_t kBlockBytes = size_t(1) << 18;

// Consecutive channels with one label form one source; each source starts at the first frame,
// runs at the analog rate as the file gives it, and keeps the readings at full precision with
// their offset, scale and units.
void addAnalogSources(const C3DContent& i_rContent, TrajectorySceneBuilder& io_rBuilder) {
  const int channels = i_rContent.analogChannels;
  const double rate = i_rContent.analogRate;
  if (channels == 0 || !(rate > 0.0)) return;
  const size_t samples = size_t(i_rContent.frameCount) * size_t(i_rContent.analogSamplesPerFrame);
  if (samples == 0) return;
  for (int first = 0; first < channels;) {
    int last = first;
    while (last + 1 < channels &&
           i_rContent.analogLabels[size_t(last + 1)] == i_rContent.analogLabels[size_t(first)])
      ++last;
    std::vector<AnalogChannel> data(size_t(last - first + 1));
    for (int c = first; c <= last; ++c) {
      AnalogChannel& channel = data[size_t(c - first)];
      channel.offset = i_rContent.analogOffsets[size_t(c)];
      channel.scale = i_rContent.analogScales[size_t(c)];
      channel.units = i_rContent.analogUnits[size_t(c)];
      channel.readings.resize(samples);
      for (size_t s = 0; s < samples; ++s)
        channel.readings[s] = i_rContent.analog[s * size_t(channels) + size_t(c)] + channel.offset;
    }
    auto pSource = std::make_unique<AudioSource>(HString(i_rContent.analogLabels[size_t(first)]));
    if (pSource->setMeasurements(rate, std::move(data))) {
      pSource->setStartTime(io_rBuilder.frameTime(i_rContent.firstFrame));
      io_rBuilder.addTopLevel(pSource.release());
    }
    first = last + 1;
  }
}

// The frames are decoded a block at a time straight into the tracks, each reserved once for
// every frame; the file's pages of a block are let go once it is read.
void addPoints(const C3DContent& i_rContent, MappedFile& io_rFile, double i_toMillimetres,
               TrajectorySceneBuilder& io_rBuilder) {
  const size_t points = size_t(i_rContent.pointCount);
  const size_t frames = size_t(i_rContent.frameCount);
  if (points == 0 || frames == 0) return;
  std::vector<HPositionTrack*> tracks(points);
  for (size_t m = 0; m < points; ++m) {
    tracks[m] = &io_rBuilder.marker(int(m)).m_track;
    tracks[m]->reserve(frames);
  }
  const size_t blockFrames = std::max<size_t>(1, std::min(frames, kBlockBytes / (16 * points + 1)));
  std::vector<float> column(blockFrames * 4);
  std::vector<HTime> times(blockFrames), keyTimes(blockFrames);
  std::vector<Vec3> keyValues(blockFrames);
  for (size_t first = 0; first < frames; first += blockFrames) {
    const size_t count = std::min(blockFrames, frames - first);
    for (size_t f = 0; f < count; ++f)
      times[f] = io_rBuilder.frameTime(int64_t(i_rContent.firstFrame) + int64_t(first + f));
    // Marker by marker: its values over the block's frames, then its present keys in one step.
    for (size_t m = 0; m < points; ++m) {
      decodeC3DPoints(i_rContent, io_rFile.data(), first, count, m, 1, column.data());
      size_t present = 0;
      for (size_t f = 0; f < count; ++f) {
        const float* p = &column[4 * f];
        if (p[3] < 0.0f) continue;
        keyTimes[present] = times[f];
        keyValues[present++] =
            Vec3(p[0] * i_toMillimetres, p[1] * i_toMillimetres, p[2] * i_toMillimetres);
      }
      tracks[m]->appendKeys(keyTimes.data(), keyValues.data(), present);
    }
    io_rFile.releaseBefore(i_rContent.dataStart + (first + count) * i_rContent.frameBytes);
  }
}

class C3DSceneReader : public ISceneReader {
public:
  std::vector<std::string> extensions() const override { return {"c3d"}; }
  std::string description() const override { return "C3D motion capture file"; }

  bool read(const std::string& i_path, std::string& o_rError) override {
    MappedFile file;
    if (!file.open(i_path, o_rError)) return false;
    C3DContent content;
    std::string error;
    if (!parseC3D(file.data(), file.size(), content, error, false)) {
      o_rError = i_path + ": " + error;
      return false;
    }
    logReaderWarnings(i_path, content.warnings);
    // A file without POINT:UNITS is taken as millimetres without a word.
    const double toMillimetres =
        content.units.empty() ? 1.0 : fileUnitsToMillimetres(i_path, content.units);
    TrajectorySceneBuilder builder(content.frameRate, content.labels, content.subjectPrefixes);
    addPoints(content, file, toMillimetres, builder);
    addAnalogSources(content, builder);
    builder.commit(content.firstFrame, int64_t(content.firstFrame) + content.frameCount - 1);
    g_db->logInfo("%s: %d markers, %d frames from %d at %g Hz, %d analog channels", i_path.c_str(),
                  content.pointCount, content.frameCount, content.firstFrame, content.frameRate,
                  content.analogChannels);
    return true;
  }
};

} // namespace

} // namespace AnvilCore

using AnvilCore::C3DSceneReader;
ANVIL_REGISTER_SCENE_READER(C3DSceneReader)
