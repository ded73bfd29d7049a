#include "SceneReaderTestSupport.h"
#include "plugin/host/HTimeManager.h"
#include <filesystem>
#include <fstream>
#include <unistd.h>

void SceneReaderTest::SetUp() {
  g_db->clearScene();
  g_db->getTimeManager()->setFrameRate(120.0);
  const ::testing::TestInfo* pInfo = ::testing::UnitTest::GetInstance()->current_test_info();
  m_folder = (std::filesystem::temp_directory_path() /
              ("anvil-io-" + std::to_string(::getpid()) + "-" + pInfo->name()))
                 .string();
  std::filesystem::create_directories(m_folder);
  g_db->setLogSink([](HLogLevel, const std::string&) {});
}

void SceneReaderTest::TearDown() {
  std::filesystem::remove_all(m_folder);
  g_db->clearScene();
  g_db->setLogSink(nullptr);
}

std::string SceneReaderTest::writeFile(const std::string& i_name,
                                       const std::string& i_bytes) const {
  const std::string path = m_folder + "/" + i_name;
  std::ofstream(path, std::ios::binary) << i_bytes;
  return path;
}

std::string SceneReaderTest::writeFile(const std::string& i_name,
                                       const std::vector<uint8_t>& i_bytes) const {
  return writeFile(i_name, std::string(i_bytes.begin(), i_bytes.end()));
}

bool SceneReaderTest::read(const std::string& i_path, std::string& o_rError) const {
  AnvilCore::ISceneReader* pReader = AnvilCore::SceneReaderRegistry::instance().find(i_path);
  if (!pReader) {
    o_rError = "no reader";
    return false;
  }
  return pReader->read(i_path, o_rError);
}

Module* SceneReaderTest::find(const std::string& i_path) const {
  Module* pModule = g_db->getRoot();
  size_t start = 0;
  while (pModule && start <= i_path.size()) {
    const size_t end = std::min(i_path.find('\\', start), i_path.size());
    const std::string name = i_path.substr(start, end - start);
    Module* pNext = nullptr;
    for (int i = 0; i < pModule->getNumChildren() && !pNext; ++i)
      if (pModule->getChild(i)->getName() == name.c_str()) pNext = pModule->getChild(i);
    pModule = pNext;
    start = end + 1;
  }
  return pModule;
}

std::vector<std::string> SceneReaderTest::sceneListing() const {
  std::vector<std::string> result;
  for (Module* pModule : g_db->getModules())
    if (pModule != g_db->getRoot()) result.push_back(pModule->getFullPathString().GetStr());
  return result;
}
