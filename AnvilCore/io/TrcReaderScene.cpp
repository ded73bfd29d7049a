// The TRC input reader: marker trajectories (with "Subject:Marker" names as subjects).
#include "ISceneReader.h"
#include "MappedFile.h"
#include "TrajectoryScene.h"
#include "TrcReader.h"
#include "plugin/host/Database.h"
#include "plugin/host/Marker.h"
#include <vector>

namespace AnvilCore {

namespace {

class TrcSceneReader : public ISceneReader {
public:
  std::vector<std::string> extensions() const override { return {"trc"}; }
  std::string description() const override { return "TRC marker trajectories"; }

  bool read(const std::string& i_path, std::string& o_rError) override {
    MappedFile file;
    if (!file.open(i_path, o_rError)) return false;
    TrcContent content;
    std::string error;
    if (!parseTrc(reinterpret_cast<const char*>(file.data()), file.size(), content, error)) {
      o_rError = i_path + ": " + error;
      return false;
    }
    logReaderWarnings(i_path, content.warnings);
    const double toMillimetres = fileUnitsToMillimetres(i_path, content.units);
    TrajectorySceneBuilder builder(content.dataRate, content.labels);
    // Each track is reserved once for its samples.
    std::vector<size_t> counts(content.labels.size(), 0);
    for (const TrcContent::Sample& sample : content.samples)
      ++counts[size_t(sample.marker)];
    for (size_t m = 0; m < counts.size(); ++m)
      builder.marker(int(m)).m_track.reserve(counts[m]);
    for (const TrcContent::Sample& sample : content.samples)
      builder.marker(sample.marker)
          .m_track.setKey(
              builder.frameTime(content.frameNumbers[size_t(sample.frame)]),
              Vec3(sample.x * toMillimetres, sample.y * toMillimetres, sample.z * toMillimetres));
    const bool empty = content.frameNumbers.empty();
    builder.commit(empty ? 1 : content.frameNumbers.front(),
                   empty ? 1 : content.frameNumbers.back());
    g_db->logInfo("%s: %zu markers, %zu frames at %g Hz", i_path.c_str(), content.labels.size(),
                  content.frameNumbers.size(), content.dataRate);
    return true;
  }
};

} // namespace

} // namespace AnvilCore

using AnvilCore::TrcSceneReader;
ANVIL_REGISTER_SCENE_READER(TrcSceneReader)
