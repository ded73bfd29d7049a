// Parses arbitrary text as a TRC file, then builds (without committing) the markers a read would
// add to the scene. Every input must end in a result or a message naming a line.
#include "AnvilCore/io/TrajectoryScene.h"
#include "AnvilCore/io/TrcReader.h"
#include "exporters/trajectory/c3d/PrintableText.h"
#include "plugin/host/Marker.h"
#include <cstddef>
#include <cstdint>
#include <cstdlib>
#include <string>

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* i_pData, size_t i_size) {
  AnvilCore::TrcContent content;
  std::string error;
  if (!AnvilCore::parseTrc(reinterpret_cast<const char*>(i_pData), i_size, content, error)) {
    if (error.empty() || C3D::printableText(error) != error) std::abort();
    return 0;
  }
  for (const std::string& label : content.labels)
    if (C3D::printableText(label) != label) std::abort();
  AnvilCore::TrajectorySceneBuilder builder(content.dataRate, content.labels);
  for (const AnvilCore::TrcContent::Sample& sample : content.samples) {
    if (sample.marker < 0 || sample.marker >= builder.getMarkerCount() || sample.frame < 0 ||
        size_t(sample.frame) >= content.frameNumbers.size())
      std::abort();
    builder.marker(sample.marker)
        .m_track.setKey(builder.frameTime(content.frameNumbers[size_t(sample.frame)]),
                        Vec3(sample.x, sample.y, sample.z));
  }
  return 0;
}
