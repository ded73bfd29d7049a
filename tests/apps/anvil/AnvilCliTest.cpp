// The built program end to end: exit codes, messages, and files written or not.
#include "AnvilCore/demo/DemoWalk.h"
#include "McpTestFile.h"
#include <array>
#include <cstdio>
#include <filesystem>
#include <fstream>
#include <gtest/gtest.h>
#include <sstream>
#include <string>
#include <sys/wait.h>
#include <unistd.h>

namespace fs = std::filesystem;

namespace {
struct CliRun {
  int code;
  std::string output; // stdout and stderr together
};

class AnvilCli : public ::testing::Test {
protected:
  void SetUp() override {
    m_dir = fs::temp_directory_path() /
            ("anvil-cli-test-" + std::to_string(::getpid()) + "-" +
             ::testing::UnitTest::GetInstance()->current_test_info()->name());
    fs::remove_all(m_dir);
    fs::create_directories(m_dir);
  }
  void TearDown() override { fs::remove_all(m_dir); }

  CliRun anvil(const std::string& i_args) {
    const std::string command = std::string(ANVIL_BIN_DIR) + "/anvil --user-setup '" +
                                (m_dir / "setup.ini").string() + "' " + i_args + " 2>&1";
    CliRun run{-1, {}};
    FILE* pPipe = ::popen(command.c_str(), "r");
    if (!pPipe) return run;
    std::array<char, 4096> buffer;
    for (size_t n; (n = std::fread(buffer.data(), 1, buffer.size(), pPipe)) > 0;)
      run.output.append(buffer.data(), n);
    const int status = ::pclose(pPipe);
    run.code = WIFEXITED(status) ? WEXITSTATUS(status) : -1;
    return run;
  }
  std::string path(const std::string& i_name) const { return (m_dir / i_name).string(); }
  fs::path m_dir;
};

std::string line(const std::string& i_path, int i_index) {
  std::ifstream in(i_path);
  std::string text;
  for (int i = 0; i <= i_index && std::getline(in, text); ++i) {
  }
  return text;
}
} // namespace

TEST_F(AnvilCli, ExportsTheDemoToTrc) {
  const CliRun run = anvil("export demo -o " + path("demo.trc"));
  ASSERT_EQ(run.code, 0) << run.output;
  EXPECT_EQ(line(path("demo.trc"), 0), "PathFileType\t4\t(X/Y/Z)\t" + path("demo.trc"));
  EXPECT_EQ(line(path("demo.trc"), 2), "120.000000\t120.000000\t1200\t44\tmm\t120.000000\t1\t1200");
  EXPECT_EQ(line(path("demo.trc"), 5).rfind("0\t0.000000\t", 0), 0u);
  // A plain run leaves the user setup file alone.
  EXPECT_FALSE(fs::exists(path("setup.ini")));

  const CliRun ranged = anvil("export demo --range 10:19 -o " + path("part.trc"));
  ASSERT_EQ(ranged.code, 0) << ranged.output;
  EXPECT_EQ(line(path("part.trc"), 2), "120.000000\t120.000000\t10\t44\tmm\t120.000000\t1\t10");
  EXPECT_EQ(line(path("part.trc"), 5).rfind("10\t0.083333\t", 0), 0u);
}

TEST_F(AnvilCli, UsageErrorsExitTwoAndWriteNothing) {
  CliRun run = anvil("export demo -o " + path("demo.xyz"));
  EXPECT_EQ(run.code, 2);
  EXPECT_NE(run.output.find("no exporter for this extension (known: "), std::string::npos)
      << run.output;
  EXPECT_NE(run.output.find(".trc"), std::string::npos);

  std::ofstream(path("bad.json")) << R"({"time": {"frameRate": "fast"}})";
  run = anvil("export " + path("bad.json") + " -o " + path("out.trc"));
  EXPECT_EQ(run.code, 2);
  EXPECT_NE(run.output.find("at /time/frameRate: expected a number"), std::string::npos)
      << run.output;
  EXPECT_FALSE(fs::exists(path("out.trc")));

  run = anvil("export demo --range 9:3 -o " + path("out.trc"));
  EXPECT_EQ(run.code, 2);
  EXPECT_FALSE(fs::exists(path("out.trc")));

  run = anvil("export demo");
  EXPECT_EQ(run.code, 2) << run.output;
  run = anvil("export " + path("missing.json") + " -o " + path("out.trc"));
  EXPECT_EQ(run.code, 2);
  EXPECT_NE(run.output.find("missing.json: no such file"), std::string::npos) << run.output;

  run = anvil(std::string("--module ") + ANVIL_WRONG_API_MODULE + " formats");
  EXPECT_EQ(run.code, 2);
  EXPECT_NE(run.output.find("API version 0x70000 is not supported"), std::string::npos)
      << run.output;
}

TEST_F(AnvilCli, UnwritableOutputFailsWithOneMessage) {
  const CliRun run = anvil("export demo -o " + path("no/such/folder/x.trc"));
  EXPECT_EQ(run.code, 1);
  EXPECT_NE(run.output.find("cannot create"), std::string::npos) << run.output;
  EXPECT_NE(run.output.find("nothing written"), std::string::npos);
}

TEST_F(AnvilCli, InfoFormatsAndHelp) {
  CliRun run = anvil("info demo");
  ASSERT_EQ(run.code, 0) << run.output;
  EXPECT_NE(run.output.find("frame rate: 120 Hz"), std::string::npos) << run.output;
  EXPECT_NE(run.output.find("labelled markers: 41"), std::string::npos);
  EXPECT_NE(run.output.find("unlabelled markers: 3"), std::string::npos);
  EXPECT_NE(run.output.find("subjects: 2"), std::string::npos); // the walker and the box prop
  EXPECT_NE(run.output.find("audio sources: 1"), std::string::npos);
  EXPECT_NE(run.output.find("clips: 1"), std::string::npos);

  run = anvil("formats");
  ASSERT_EQ(run.code, 0) << run.output;
  EXPECT_NE(run.output.find("Motion Analysis Trajectory"), std::string::npos);
  for (const char* sub : {"export --help", "formats --help", "info --help", "--help"}) {
    run = anvil(sub);
    EXPECT_EQ(run.code, 0) << sub;
    EXPECT_NE(run.output.find("Usage"), std::string::npos) << sub;
  }
}

TEST_F(AnvilCli, SubjectFilesAndTheirSchema) {
  CliRun run = anvil("schema kmt -o " + path("kmt.xsd"));
  ASSERT_EQ(run.code, 0) << run.output;
  std::ifstream xsd(path("kmt.xsd"));
  std::stringstream text;
  text << xsd.rdbuf();
  EXPECT_NE(text.str().find("schema"), std::string::npos);

  run = anvil(std::string("info ") + ANVIL_TEST_DATA + "/kmt/v1_0.kmt");
  ASSERT_EQ(run.code, 0) << run.output;
  EXPECT_NE(run.output.find("Version: 1.0"), std::string::npos) << run.output;
  EXPECT_NE(run.output.find("Joints: ball 1, hinge 1"), std::string::npos) << run.output;
  EXPECT_NE(run.output.find("Hinge joint 'Elbow' is missing AXIS"), std::string::npos);

  // A file that is not a subject file fails to read: exit 1 with the reader's message.
  std::ofstream(path("broken.kmt")) << "<NotASubject/>";
  run = anvil("info " + path("broken.kmt"));
  EXPECT_EQ(run.code, 1) << run.output;
  EXPECT_FALSE(run.output.empty());
}

TEST_F(AnvilCli, McpRecordingsAreDescribedConvertedOrRefused) {
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
  const std::vector<uint8_t> bytes = file.build();
  std::ofstream(path("take.mcp"), std::ios::binary)
      .write(reinterpret_cast<const char*>(bytes.data()), std::streamsize(bytes.size()));

  CliRun run = anvil("info " + path("take.mcp"));
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

  // A file that is not a recording: exit 2 naming it, nothing written.
  std::ofstream(path("junk.mcp")) << "not a recording";
  run = anvil("export " + path("junk.mcp") + " -o " + path("out.trc"));
  EXPECT_EQ(run.code, 2) << run.output;
  EXPECT_NE(run.output.find(path("junk.mcp") + ": not an MCP file"), std::string::npos)
      << run.output;
  EXPECT_FALSE(fs::exists(path("out.trc")));
}
