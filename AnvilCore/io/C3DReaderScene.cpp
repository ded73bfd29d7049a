// The C3D input reader: markers (with their subjects) and analog channels into the scene.
#include "C3DReader.h"
#include "ISceneReader.h"
#include "TrajectoryScene.h"
#include "plugin/host/AudioSource.h"
#include "plugin/host/Database.h"
#include "plugin/host/Marker.h"
#include <cmath>

namespace AnvilCore {

namespace {

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

class C3DSceneReader : public ISceneReader {
public:
  std::vector<std::string> extensions() const override { return {"c3d"}; }
  std::string description() const override { return "C3D motion capture file"; }

  bool read(const std::string& i_path, std::string& o_rError) override {
    std::string bytes;
    if (!readWholeFile(i_path, bytes, o_rError)) return false;
    C3DContent content;
    std::string error;
    if (!parseC3D(reinterpret_cast<const uint8_t*>(bytes.data()), bytes.size(), content, error)) {
      o_rError = i_path + ": " + error;
      return false;
    }
    logReaderWarnings(i_path, content.warnings);
    // A file without POINT:UNITS is taken as millimetres without a word.
    const double toMillimetres =
        content.units.empty() ? 1.0 : fileUnitsToMillimetres(i_path, content.units);
    TrajectorySceneBuilder builder(content.frameRate, content.labels, content.subjectPrefixes);
    for (int m = 0; m < content.pointCount; ++m) {
      HPositionTrack& track = builder.marker(m).m_track;
      track.reserve(size_t(content.frameCount));
      for (int f = 0; f < content.frameCount; ++f) {
        const float* p = content.point(f, m);
        if (p[3] < 0.0f) continue;
        track.setKey(builder.frameTime(int64_t(content.firstFrame) + f),
                     Vec3(p[0] * toMillimetres, p[1] * toMillimetres, p[2] * toMillimetres));
      }
    }
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
