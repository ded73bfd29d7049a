// MCP recordings through the built program: described by `info`, converted by `export`, and a
// file that is not a recording refused with exit 2.
#include "AnvilCore/demo/DemoWalk.h"
#include "McpTestFile.h"
#include <array>
#include <cstdio>
#include <filesystem>
#include <fstream>
#include <gtest/gtest.h>
#include <sys/wait.h>
#include <unistd.h>

namespace fs = std::filesystem;

namespace {

struct CliResult {
  int code = -1;
  std::string output;
};

class McpCli : public ::testing::Test {
protected:
  void SetUp() override {
    m_dir = fs::temp_directory_path() /
            ("anvil-mcp-cli-" + std::to_string(::getpid()) + "-" +
             ::testing::UnitTest::GetInstance()->current_test_info()->name());
    fs::create_directories(m_dir);
  }
  void TearDown() override { fs::remove_all(m_dir); }
  std::string path(const std::string& i_name) const { return (m_dir / i_name).string(); }
  CliResult anvil(const std::string& i_args) const {
    const std::string command = std::string(ANVIL_BIN_DIR) + "/anvil --user-setup '" +
                                path("setup.ini") + "' " + i_args + " 2>&1";
    CliResult run;
    FILE* pPipe = ::popen(command.c_str(), "r");
    if (!pPipe) return run;
    std::array<char, 4096> buffer;
    for (size_t n; (n = std::fread(buffer.data(), 1, buffer.size(), pPipe)) > 0;)
      run.output.append(buffer.data(), n);
    const int status = ::pclose(pPipe);
    run.code = WIFEXITED(status) ? WEXITSTATUS(status) : -1;
    return run;
  }
  void write(const std::string& i_name, const std::vector<uint8_t>& i_bytes) const {
    std::ofstream(path(i_name), std::ios::binary)
        .write(reinterpret_cast<const char*>(i_bytes.data()), std::streamsize(i_bytes.size()));
  }
  fs::path m_dir;
};

TEST_F(McpCli, InfoDescribesARecordingAndExportConvertsIt) {
  const std::vector<std::string>& names = AnvilCore::demoWalkMarkerNames();
  McpTestFile file;
  file.ticksPerFrame = 135000000 / 60;
  file.firstFrame = 5;
  file.table = {{0, "Ann:" + names[0]}, {1, "Ann:" + names[1]}, {2, "*9"}};
  for (int f = 0; f < 4; ++f)
    file.frames.push_back({{0, {1.0 * f, 0, 0}}, {1, {0, 2.0 * f, 0}}, {2, {0, 0, 3.0}, 0.0f}});
  AnvilCore::SubjectRecords ann = AnvilCore::demoWalkRecords();
  ann.subject.m_Name = "Ann";
  file.subjects.push_back(ann);
  file.cameras = {mcpTestCamera(1), mcpTestCamera(2)};
  file.orientation = std::array<double, 4>{0.70710678118654752, 0, 0, 0.70710678118654752};
  write("take.mcp", file.build());

  CliResult run = anvil("info " + path("take.mcp"));
  ASSERT_EQ(run.code, 0) << run.output;
  for (const char* line : {"frame rate: 60 Hz", "animation range: 5..8 (4 frames)", "up axis: Y",
                           "labelled markers: 2", "unlabelled markers: 1", "subjects: 1"})
    EXPECT_NE(run.output.find(line), std::string::npos) << line << "\n" << run.output;
  EXPECT_NE(run.output.find("Camera 2"), std::string::npos) << run.output;

  run = anvil("export " + path("take.mcp") + " -o " + path("take.trc"));
  ASSERT_EQ(run.code, 0) << run.output;
  std::ifstream trc(path("take.trc"));
  std::string line;
  for (int i = 0; i < 3; ++i)
    std::getline(trc, line);
  EXPECT_EQ(line.rfind("60.000000\t60.000000\t4\t3\tmm\t60.000000\t1\t4", 0), 0u) << line;
}

TEST_F(McpCli, ANonRecordingExitsTwoNamingTheFile) {
  std::ofstream(path("junk.mcp")) << "not a recording";
  const CliResult run = anvil("export " + path("junk.mcp") + " -o " + path("out.trc"));
  EXPECT_EQ(run.code, 2) << run.output;
  EXPECT_NE(run.output.find(path("junk.mcp") + ": not an MCP file"), std::string::npos)
      << run.output;
  EXPECT_FALSE(fs::exists(path("out.trc")));
}

} // namespace
