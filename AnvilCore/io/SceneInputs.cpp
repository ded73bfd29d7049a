#include "SceneInputs.h"
#include "AnvilCore/demo/DemoScene.h"
#include "ISceneReader.h"
#include "plugin/host/Database.h"
#include <algorithm>
#include <filesystem>

namespace AnvilCore {

std::vector<std::string> readableExtensions() {
  std::vector<std::string> result;
  for (const auto& pReader : SceneReaderRegistry::instance().readers())
    for (const std::string& ext : pReader->extensions())
      result.push_back(ext);
  std::sort(result.begin(), result.end());
  return result;
}

bool loadSceneInputs(const std::vector<std::string>& i_inputs, std::string& o_rError) {
  for (const std::string& input : i_inputs) {
    if (input == "demo") {
      if (g_db->getNumNodes() > 0) {
        o_rError = "demo: the demo scene must come first among the inputs";
        return false;
      }
      buildDemoScene();
      continue;
    }
    std::error_code ec;
    if (!std::filesystem::is_regular_file(input, ec)) {
      o_rError = input + ": no such file";
      return false;
    }
    ISceneReader* pReader = SceneReaderRegistry::instance().find(input);
    if (!pReader) {
      std::string known;
      for (const std::string& ext : readableExtensions())
        known += (known.empty() ? "." : ", .") + ext;
      o_rError = input + ": unknown input format (readable: demo, " + known + ")";
      return false;
    }
    if (!pReader->read(input, o_rError)) return false;
  }
  return true;
}

} // namespace AnvilCore
