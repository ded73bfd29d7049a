#include "ISceneReader.h"
#include "SceneJson.h"
#include <cerrno>
#include <cstring>
#include <fstream>
#include <sstream>

namespace AnvilCore {
namespace {

/// Anvil scene files: JSON describing time settings, subjects, markers, nodes and more.
class SceneJsonReader : public ISceneReader {
public:
  std::vector<std::string> extensions() const override { return {"json", "anvil"}; }
  std::string description() const override { return "Anvil scene file (JSON)"; }
  bool read(const std::string& i_path, std::string& o_rError) override {
    std::ifstream in(i_path, std::ios::binary);
    if (!in) {
      o_rError = i_path + ": cannot open: " + std::strerror(errno);
      return false;
    }
    std::ostringstream text;
    text << in.rdbuf();
    if (in.bad()) {
      o_rError = i_path + ": read error";
      return false;
    }
    return readSceneJson(text.str(), i_path, o_rError);
  }
};

} // namespace
ANVIL_REGISTER_SCENE_READER(SceneJsonReader)
} // namespace AnvilCore
