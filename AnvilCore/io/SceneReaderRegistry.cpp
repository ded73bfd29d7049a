#include "ISceneReader.h"
#include <algorithm>
#include <cctype>
#include <cerrno>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <sstream>

namespace AnvilCore {

bool readWholeFile(const std::string& i_path, std::string& o_rText, std::string& o_rError) {
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
  o_rText = text.str();
  return true;
}

SceneReaderRegistry& SceneReaderRegistry::instance() {
  static SceneReaderRegistry s_registry;
  return s_registry;
}

void SceneReaderRegistry::add(std::unique_ptr<ISceneReader> i_pReader) {
  m_readers.push_back(std::move(i_pReader));
}

ISceneReader* SceneReaderRegistry::find(const std::string& i_path) const {
  std::string ext = std::filesystem::path(i_path).extension().string();
  if (ext.empty()) return nullptr;
  ext.erase(0, 1);
  std::transform(ext.begin(), ext.end(), ext.begin(),
                 [](unsigned char c) { return static_cast<char>(std::tolower(c)); });
  for (const auto& pReader : m_readers) {
    const auto exts = pReader->extensions();
    if (std::find(exts.begin(), exts.end(), ext) != exts.end()) return pReader.get();
  }
  return nullptr;
}

} // namespace AnvilCore
