// Reads arbitrary bytes as an MCP recording, then builds (without committing) the markers and
// cameras a read would add to the scene. Every input must end in content that keeps the reader's
// promises or in a printable message, never a crash or a hang.
#include "AnvilCore/OpticalCameraFromRecords.h"
#include "AnvilCore/io/McpReader.h"
#include "AnvilCore/io/TrajectoryScene.h"
#include "Utils/UtilsFileSystem/MemoryStreams.h"
#include "exporters/trajectory/c3d/PrintableText.h"
#include "plugin/host/Marker.h"
#include "plugin/host/OpticalCamera.h"
#include <cmath>
#include <cstddef>
#include <cstdint>
#include <cstdlib>
#include <string>

namespace {
void require(bool i_ok) {
  if (!i_ok) std::abort();
}
} // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* i_pData, size_t i_size) {
  UtilsFileSystem::VMemoryInputStream stream(i_pData, i_size);
  AnvilCore::McpContent content;
  std::string error;
  if (!AnvilCore::readMcp(stream, content, error)) {
    require(!error.empty() && C3D::printableText(error) == error);
    return 0;
  }
  for (const std::string& warning : content.warnings)
    require(C3D::printableText(warning) == warning);
  require(content.frameCount == 0 || content.ticksPerFrame > 0);
  require(content.firstTime <= content.lastTime);
  for (size_t t = 0; t < content.tracks.size(); ++t) {
    const AnvilCore::McpTrack& track = content.tracks[t];
    require(t == 0 || content.tracks[t - 1].trackId < track.trackId);
    require(track.times.size() == track.positions.size());
    require(!track.label.empty() && C3D::printableText(track.label) == track.label);
    require(track.times.size() <= content.frameCount);
    for (size_t k = 0; k < track.times.size(); ++k) {
      require(k == 0 || track.times[k - 1] < track.times[k]);
      require(track.times[k] >= content.firstTime && track.times[k] <= content.lastTime);
      const Vec3& p = track.positions[k];
      require(std::isfinite(p.x) && std::isfinite(p.y) && std::isfinite(p.z));
    }
  }
  if (content.frameCount > 0) {
    std::vector<std::string> labels;
    for (const AnvilCore::McpTrack& track : content.tracks)
      labels.push_back(track.label);
    AnvilCore::TrajectorySceneBuilder builder(
        double(kTicksPerSecond) / double(content.ticksPerFrame), labels);
    require(builder.getMarkerCount() == int(labels.size()));
    for (size_t m = 0; m < content.tracks.size(); ++m) {
      const AnvilCore::McpTrack& track = content.tracks[m];
      builder.marker(int(m)).m_track.appendKeys(track.times.data(), track.positions.data(),
                                                track.times.size());
    }
  }
  for (size_t c = 0; c < content.cameras.size(); ++c)
    require(AnvilCore::opticalCameraFromRecords("Camera", int(c) + 1, content.cameras[c].records())
                ->getCameraNumber() == int(c) + 1);
  return 0;
}
