// The TRC input reader: marker trajectories (with "Subject:Marker" names as subjects).
#include "ISceneReader.h"
#include "TrajectoryScene.h"
#include "TrcReader.h"
#include "plugin/host/Database.h"
#include "plugin/host/Marker.h"
#include <fstream>
#include <iterator>

namespace AnvilCore {

namespace {

class TrcSceneReader : public ISceneReader {
public:
  std::vector<std::string> extensions() const override { return {"trc"}; }
  std::string description() const override { return "TRC marker trajectories"; }

  bool read(const std::string& i_path, std::string& o_rError) override {
    std::ifstream in(i_path, std::ios::binary);
    if (!in) {
      o_rError = i_path + ": cannot open the file";
      return false;
    }
    const std::string text((std::istreambuf_iterator<char>(in)), std::istreambuf_iterator<char>());
    if (in.bad()) {
      o_rError = i_path + ": read error";
      return false;
    }
    TrcContent content;
    std::string error;
    if (!parseTrc(text.data(), text.size(), content, error)) {
      o_rError = i_path + ": " + error;
      return false;
    }
    for (const std::string& warning : content.warnings)
      g_db->logWarning("%s: %s", i_path.c_str(), warning.c_str());
    double toMillimetres = millimetresPer(content.units);
    if (toMillimetres == 0.0) {
      g_db->logWarning("%s: unknown Units \"%s\"; read as millimetres", i_path.c_str(),
                       content.units.c_str());
      toMillimetres = 1.0;
    }
    TrajectorySceneBuilder builder(content.dataRate, content.labels);
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
