// The header block and the frames of a C3D export.
#include "C3DExporter.h"
#include "MarkerCursor.h"
#include "c3d/C3DFormat.h"
#include "plugin/host/AudioSource.h"
#include "plugin/host/HTimeManager.h"
#include "plugin/host/Marker.h"
#include "plugin/host/OperationStack.h"
#include <algorithm>
#include <cmath>
#include <cstdio>
#include <memory>
#include <vector>

namespace {
// Frames are written in blocks of about this many bytes.
constexpr size_t kBlockBytes = size_t(1) << 20;

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
  const size_t pointValues = 4 * size_t(m_pointCount);
  const size_t frameValues = size_t(spf) * size_t(m_analogChannels) + pointValues;
  const size_t frameSize = valueSize * frameValues;
  const double inverseScale = 1.0 / double(m_scale);

  std::vector<ChannelSamples> channels;
  for (const AudioSource* pSource : m_audioSources)
    for (int c = 0; c < pSource->getNumChannels(); ++c) {
      ChannelSamples channel;
      channel.samples.reset(pSource->resampleData(m_timeRange, m_analogRate, c, channel.count));
      channels.push_back(std::move(channel));
    }

  // Times only grow, so each marker's cursor keeps its first key not before t - T/2: the gap
  // test and the key's value need no search per frame.
  std::vector<TrajectoryExport::MarkerCursor> cursors;
  cursors.reserve(size_t(m_markers.getCount()));
  for (const Marker* pMarker : m_markers)
    cursors.emplace_back(pMarker);

  // Each frame's values are gathered in their number form, then converted to the file's bytes
  // in one pass; whole frames fill a block that goes out in one fwrite.
  std::vector<float> reals(real ? frameValues : 0);
  std::vector<int16_t> words(real ? 0 : frameValues);
  const size_t blockFrames = std::max<size_t>(1, kBlockBytes / std::max<size_t>(frameSize, 1));
  std::vector<uint8_t> block(blockFrames * frameSize);
  size_t framesInBlock = 0;
  std::fseek(m_pFile, long(m_dataStartBlock - 1) * C3D::kBlockSize, SEEK_SET);
  int frameIndex = 0;
  for (HTime t = m_timeRange.getStart(); t <= m_timeRange.getEnd(); t += ticksPerFrame) {
    const HTime low = t - half, high = t - half + 2 * half;
    for (size_t m = 0; m < cursors.size(); ++m) {
      TrajectoryExport::MarkerCursor& cursor = cursors[m];
      cursor.advanceTo(low);
      const bool present = !m_options.m_preserveGaps || cursor.hasKeyUpTo(high);
      const Vec3 pos = present ? cursor.position(t) : Vec3();
      if (real) {
        float* pValue = &reals[4 * m];
        pValue[0] = float(pos.x);
        pValue[1] = float(pos.y);
        pValue[2] = float(pos.z);
        pValue[3] = present ? 0.0f : -1.0f;
      } else {
        int16_t* pValue = &words[4 * m];
        pValue[0] = int16_t(uint16_t(truncateToInt32(inverseScale * pos.x)));
        pValue[1] = int16_t(uint16_t(truncateToInt32(inverseScale * pos.y)));
        pValue[2] = int16_t(uint16_t(truncateToInt32(inverseScale * pos.z)));
        pValue[3] = present ? int16_t(0) : int16_t(uint16_t(0x8000));
      }
    }
    size_t v = pointValues;
    for (int s = 0; s < spf; ++s)
      for (const ChannelSamples& channel : channels) {
        const int sample = channel.at(long(spf) * frameIndex + s);
        if (real)
          reals[v++] = float(sample + 32768);
        else
          words[v++] = int16_t(uint16_t(sample - 32768));
      }
    uint8_t* p = block.data() + framesInBlock * frameSize;
    if (real)
      C3D::putFloats(p, reals.data(), frameValues, dec);
    else
      C3D::putWordsLE(p, words.data(), frameValues);
    if (++framesInBlock == blockFrames) {
      std::fwrite(block.data(), 1, framesInBlock * frameSize, m_pFile);
      framesInBlock = 0;
    }
    ++frameIndex;
    if (s_doProgress && frameIndex % 10 == 0) g_theOperationStack.stepTask();
    if (t > INT64_MAX - ticksPerFrame) break;
  }
  if (framesInBlock > 0) std::fwrite(block.data(), 1, framesInBlock * frameSize, m_pFile);
}
