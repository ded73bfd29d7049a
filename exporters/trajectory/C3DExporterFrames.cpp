// The header block and the frames of a C3D export.
#include "C3DExporter.h"
#include "c3d/C3DFormat.h"
#include "plugin/host/AudioSource.h"
#include "plugin/host/HTimeManager.h"
#include "plugin/host/Marker.h"
#include "plugin/host/OperationStack.h"
#include <cmath>
#include <cstdio>
#include <memory>
#include <vector>

namespace {
// Truncation toward zero to a 32-bit integer, saturating where a cast would be undefined.
int32_t truncateToInt32(double i_value) {
  if (!(i_value > -2147483648.0)) return i_value != i_value ? 0 : INT32_MIN;
  if (!(i_value < 2147483647.0)) return INT32_MAX;
  return int32_t(i_value);
}

// Resampled audio of one channel, released with `delete[]` as `resampleData` hands it out.
struct ChannelSamples {
  std::unique_ptr<int16_t[]> samples;
  unsigned long count = 0;
  int16_t at(long i_index) const {
    return (i_index >= 0 && (unsigned long)i_index < count) ? samples[size_t(i_index)] : 0;
  }
};
} // namespace

void C3DExporter::writeHeader() {
  using namespace C3D::HeaderOffset;
  const bool dec = m_options.m_decFormat;
  uint8_t header[C3D::kBlockSize] = {};
  header[EParameterBlock] = 0x02;
  header[EKey] = C3D::kFormatKey;
  C3D::putU16LE(header + EPointCount, uint16_t(m_pointCount));
  // Channels times the rate over the frame rate, not channels times samples per frame.
  C3D::putU16LE(header + EAnalogPerFrame,
                uint16_t(wholeRatio(double(m_analogChannels) * m_analogRate, m_frameRate)));
  const int first = m_firstFrame >= 0xFFFF ? 0xFFFF : m_firstFrame;
  C3D::putU16LE(header + EFirstFrame, uint16_t(first));
  // A last frame past 16 bits repeats the first frame's word; DRU_LAST_FRAME holds the truth.
  C3D::putU16LE(header + ELastFrame, uint16_t(m_lastFrame <= 0xFFFE ? m_lastFrame : first));
  C3D::putU16LE(header + EMaxGap, 0);
  C3D::putFloat(header + EScale, m_scale, dec);
  C3D::putU16LE(header + EDataStart, uint16_t(m_dataStartBlock));
  C3D::putU16LE(header + ESamplesPerFrame, uint16_t(m_samplesPerFrame));
  C3D::putFloat(header + EFrameRate, m_frameRate, dec);
  C3D::putU16LE(header + EEventKey, C3D::kEventLabelKey);
  std::fseek(m_pFile, 0, SEEK_SET);
  std::fwrite(header, 1, sizeof header, m_pFile);
}

void C3DExporter::writeFrames() {
  const HTimeManager* pTime = HTimeManager::getInstance();
  const int64_t ticksPerFrame = pTime->getTicksPerFrame();
  const int64_t half = ticksPerFrame / 2;
  const bool dec = m_options.m_decFormat;
  const bool real = m_scale < 0.0f;
  const size_t valueSize = real ? 4 : 2;
  const int spf = m_samplesPerFrame;
  const size_t frameSize =
      valueSize * (size_t(spf) * size_t(m_analogChannels) + 4 * size_t(m_pointCount));
  const double inverseScale = 1.0 / double(m_scale);

  std::vector<ChannelSamples> channels;
  for (const AudioSource* pSource : m_audioSources)
    for (int c = 0; c < pSource->getNumChannels(); ++c) {
      ChannelSamples channel;
      channel.samples.reset(pSource->resampleData(m_timeRange, m_analogRate, c, channel.count));
      channels.push_back(std::move(channel));
    }

  // Times only grow, so each marker keeps the index of its first key not before t - T/2: the
  // gap test is then the track's range count without a search per frame.
  std::vector<size_t> firstKey(size_t(m_markers.getCount()), 0);

  std::vector<uint8_t> buffer(frameSize);
  std::fseek(m_pFile, long(m_dataStartBlock - 1) * C3D::kBlockSize, SEEK_SET);
  int frameIndex = 0;
  for (HTime t = m_timeRange.getStart(); t <= m_timeRange.getEnd(); t += ticksPerFrame) {
    uint8_t* p = buffer.data();
    const HTime low = t - half, high = t - half + 2 * half;
    for (int m = 0; m < m_markers.getCount(); ++m) {
      const Marker* pMarker = m_markers[m];
      bool present = true;
      if (m_options.m_preserveGaps) {
        const std::vector<HTime>& times = pMarker->m_track.times();
        size_t& k = firstKey[size_t(m)];
        while (k < times.size() && times[k] < low)
          ++k;
        present = k < times.size() && times[k] <= high;
      }
      const Vec3 pos = present ? pMarker->getWSPos(t) : Vec3();
      if (real) {
        for (int axis = 0; axis < 3; ++axis, p += 4)
          C3D::putFloat(p, float(pos[axis]), dec);
        C3D::putFloat(p, present ? 0.0f : -1.0f, dec);
        p += 4;
      } else {
        for (int axis = 0; axis < 3; ++axis, p += 2)
          C3D::putU16LE(p, uint16_t(truncateToInt32(inverseScale * pos[axis])));
        C3D::putU16LE(p, present ? 0 : 0x8000);
        p += 2;
      }
    }
    for (int s = 0; s < spf; ++s)
      for (const ChannelSamples& channel : channels) {
        const int sample = channel.at(long(spf) * frameIndex + s);
        if (real) {
          C3D::putFloat(p, float(sample + 32768), dec);
          p += 4;
        } else {
          C3D::putU16LE(p, uint16_t(sample - 32768));
          p += 2;
        }
      }
    std::fwrite(buffer.data(), 1, frameSize, m_pFile);
    ++frameIndex;
    if (s_doProgress && frameIndex % 10 == 0) g_theOperationStack.stepTask();
    if (t > INT64_MAX - ticksPerFrame) break;
  }
}
