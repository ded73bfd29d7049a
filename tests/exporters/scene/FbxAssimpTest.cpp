// The independent reader: assimp opens the demo FBX that `anvil` writes and finds the same nodes
// and takes as the test reader.
#include "../../fbx/FbxTestReader.h"
#include <array>
#include <cstdio>
#include <filesystem>
#include <gtest/gtest.h>
#include <regex>
#include <set>
#include <sys/wait.h>
#include <unistd.h>

namespace {

std::string run(const std::string& i_rCommand, int& o_rCode) {
  std::string output;
  FILE* pPipe = ::popen((i_rCommand + " 2>&1").c_str(), "r");
  if (!pPipe) return output;
  std::array<char, 4096> buffer;
  for (size_t n; (n = std::fread(buffer.data(), 1, buffer.size(), pPipe)) > 0;)
    output.append(buffer.data(), n);
  const int status = ::pclose(pPipe);
  o_rCode = WIFEXITED(status) ? WEXITSTATUS(status) : -1;
  return output;
}

int count(const std::string& i_rText, const char* i_pLabel) {
  std::smatch match;
  if (!std::regex_search(i_rText, match, std::regex(std::string(i_pLabel) + R"(:\s+(\d+))")))
    return -1;
  return std::stoi(match[1]);
}

class FbxAssimp : public testing::TestWithParam<const char*> {};

TEST_P(FbxAssimp, OpensTheDemoAndCountsItsNodesAndTakes) {
  int code = 0;
  run("command -v assimp", code);
  if (code != 0) GTEST_SKIP() << "assimp is not installed (scripts/setup installs assimp-utils)";
  const std::filesystem::path dir =
      std::filesystem::temp_directory_path() / ("anvil-assimp-" + std::to_string(::getpid()));
  std::filesystem::create_directories(dir);
  const std::string fbx = (dir / "demo.fbx").string();
  const std::string exported = run(std::string(ANVIL_BIN_DIR) + "/anvil export demo --user-setup " +
                                       (dir / "setup.ini").string() + " -o " + fbx +
                                       " -c 'fbxExportOptions -version " + GetParam() + "'",
                                   code);
  ASSERT_EQ(code, 0) << exported;

  const std::string info = run("assimp info " + fbx + " -raw", code);
  ASSERT_EQ(code, 0) << info;
  EXPECT_EQ(info.find("ERROR"), std::string::npos) << info;
  const FbxTest::File file = FbxTest::read(fbx);
  const FbxTest::Scene scene(file);
  EXPECT_EQ(count(info, "Animations"), int(scene.ofType("AnimationStack").size()));

  // Every node assimp lists is one of the file's models, the root, or a pivot helper of assimp's
  // own; and every model is there.
  std::set<std::string> models;
  for (const FbxTest::Object* pModel : scene.ofType("Model"))
    models.insert(pModel->name);
  const std::string tree = info.substr(info.find("Node hierarchy"));
  std::set<std::string> listed;
  int lines = 0;
  const std::regex node(R"((?:^|\n)[ │├└╴]*([^\n│├└╴][^\n]*))");
  for (auto it = std::sregex_iterator(tree.begin(), tree.end(), node); it != std::sregex_iterator();
       ++it) {
    const std::string name = (*it)[1];
    if (name == "Node hierarchy:" || name.empty()) continue;
    ++lines;
    if (name == "RootNode" || name.find("$AssimpFbx$") != std::string::npos) continue;
    listed.insert(name);
  }
  EXPECT_EQ(listed, models);
  EXPECT_EQ(count(info, "Nodes"), lines);
  std::filesystem::remove_all(dir);
}

INSTANTIATE_TEST_SUITE_P(Versions, FbxAssimp, testing::Values("2014", "2020"));

} // namespace
