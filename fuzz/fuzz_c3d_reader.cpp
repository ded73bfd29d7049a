// Parses arbitrary bytes as a C3D file, then builds (without committing) the markers a read would
// add to the scene. Every input must end in a result or a message, with every value read from
// inside the buffer and allocations bounded by its size.
#include "AnvilCore/io/C3DReader.h"
#include "AnvilCore/io/TrajectoryScene.h"
#include "exporters/trajectory/c3d/PrintableText.h"
#include "plugin/host/Marker.h"
#include <cstddef>
#include <cstdint>
#include <cstdlib>
#include <string>

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* i_pData, size_t i_size) {
  AnvilCore::C3DContent content;
  std::string error;
  if (!AnvilCore::parseC3D(i_pData, i_size, content, error)) {
    // A failure always says why, in printable text.
    if (error.empty() || C3D::printableText(error) != error) std::abort();
    return 0;
  }
  for (const std::string& label : content.labels)
    if (C3D::printableText(label) != label) std::abort();
  if (content.analogOffsets.size() != size_t(content.analogChannels) ||
      content.analogScales.size() != size_t(content.analogChannels) ||
      content.analogUnits.size() != size_t(content.analogChannels))
    std::abort();
  if (content.labels.size() != size_t(content.pointCount) ||
      content.points.size() != size_t(content.pointCount) * size_t(content.frameCount) * 4 ||
      content.analog.size() != size_t(content.frameCount) * size_t(content.analogChannels) *
                                   size_t(content.analogSamplesPerFrame))
    std::abort();
  AnvilCore::TrajectorySceneBuilder builder(content.frameRate, content.labels,
                                            content.subjectPrefixes);
  for (int m = 0; m < content.pointCount; ++m)
    for (int f = 0; f < content.frameCount; ++f) {
      const float* p = content.point(f, m);
      if (p[3] >= 0.0f)
        builder.marker(m).m_track.setKey(builder.frameTime(int64_t(content.firstFrame) + f),
                                         Vec3(p[0], p[1], p[2]));
    }
  return 0;
}
