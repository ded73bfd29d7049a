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
    std::string text;
    return readWholeFile(i_path, text, o_rError) && readSceneJson(text, i_path, o_rError);
  }
};

} // namespace
ANVIL_REGISTER_SCENE_READER(SceneJsonReader)
} // namespace AnvilCore
