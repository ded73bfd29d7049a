// The program with option commands (-c, --script, anvil commands) and trajectory inputs.
#include "AnvilCore/io/C3DReader.h"
#include <cstdio>
#include <filesystem>
#include <fstream>
#include <gtest/gtest.h>
#include <iterator>
#include <sys/wait.h>
#include <unistd.h>

namespace fs = std::filesystem;

namespace {

class AnvilCommands : public ::testing::Test {
protected:
  void SetUp() override {
    m_dir = fs::temp_directory_path() /
            ("anvil-commands-" + std::to_string(::getpid()) + "-" +
             ::testing::UnitTest::GetInstance()->current_test_info()->name());
    fs::create_directories(m_dir);
  }
  void TearDown() override { fs::remove_all(m_dir); }

  // Runs the program with a private user setup; returns the exit code, output in `m_output`.
  int run(const std::string& i_args) {
    const std::string command = std::string(ANVIL_BIN_DIR) + "/anvil --user-setup '" +
                                path("setup.ini") + "' " + i_args + " > '" + path("out.txt") +
                                "' 2>&1";
    const int status = std::system(command.c_str());
    std::ifstream in(path("out.txt"));
    m_output.assign(std::istreambuf_iterator<char>(in), std::istreambuf_iterator<char>());
    return WIFEXITED(status) ? WEXITSTATUS(status) : -1;
  }
  std::string path(const std::string& i_name) const { return (m_dir / i_name).string(); }
  static std::string sample(const char* i_pName) {
    return std::string(ANVIL_TEST_DATA) + "/c3d/" + i_pName;
  }

  fs::path m_dir;
  std::string m_output;
};

TEST_F(AnvilCommands, ListsEveryCommandWithItsOptions) {
  ASSERT_EQ(run("commands"), 0) << m_output;
  EXPECT_NE(m_output.find("c3dExportOptions\tSet C3D Export Options\n"), std::string::npos);
  EXPECT_NE(m_output.find("  -minKeys\tint\n"), std::string::npos);
  EXPECT_NE(m_output.find("  -upAxis\tstring\n"), std::string::npos);
  EXPECT_NE(m_output.find("trcExportOptions\tSet TRC Export Options\n  -writeSubjectNames\tbool"),
            std::string::npos);
  EXPECT_LT(m_output.find("c3dExportOptions"), m_output.find("trcExportOptions"));
}

TEST_F(AnvilCommands, CommandsSetTheExportersOptions) {
  // Integer frames in the Intel form, then read back.
  ASSERT_EQ(run("export " + sample("Eb015vr.c3d") + " -o " + path("walk.c3d") +
                " -c 'c3dExportOptions -real false -decFormat off' -c 'c3dExportOptions "
                "-decFormat toggle -decFormat toggle'"),
            0)
      << m_output;
  std::ifstream in(path("walk.c3d"), std::ios::binary);
  const std::vector<uint8_t> bytes{std::istreambuf_iterator<char>(in), {}};
  AnvilCore::C3DContent content;
  std::string error;
  ASSERT_TRUE(AnvilCore::parseC3D(bytes.data(), bytes.size(), content, error)) << error;
  EXPECT_GT(content.scale, 0.0f);
  EXPECT_EQ(content.processor, C3D::EProcessorIntel);
  EXPECT_EQ(content.pointCount, 26);
  EXPECT_EQ(content.frameCount, 450);
  EXPECT_EQ(content.analogChannels, 16);

  std::ofstream(path("options.txt")) << "# TRC with subject names\n"
                                        "trcExportOptions -writeSubjectNames true\n";
  ASSERT_EQ(run("export " + path("walk.c3d") + " -o " + path("walk.trc") + " --script " +
                path("options.txt")),
            0)
      << m_output;
  ASSERT_EQ(run("info " + path("walk.trc")), 0) << m_output;
  EXPECT_NE(m_output.find("frame rate: 50 Hz"), std::string::npos) << m_output;
  EXPECT_NE(m_output.find("animation range: 1..450"), std::string::npos) << m_output;
}

TEST_F(AnvilCommands, CommandLineOptionsLastOneRunUnlessSaved) {
  const std::string input = sample("Eb015vr.c3d");
  auto isFloat = [&](const std::string& i_name) {
    std::ifstream in(path(i_name), std::ios::binary);
    const std::vector<uint8_t> bytes{std::istreambuf_iterator<char>(in), {}};
    AnvilCore::C3DContent content;
    std::string error;
    EXPECT_TRUE(AnvilCore::parseC3D(bytes.data(), bytes.size(), content, error)) << error;
    return content.scale < 0.0f;
  };
  ASSERT_EQ(run("export " + input + " -o " + path("a.c3d") + " -c 'c3dExportOptions -real false'"),
            0)
      << m_output;
  EXPECT_FALSE(isFloat("a.c3d"));
  ASSERT_EQ(run("export " + input + " -o " + path("b.c3d")), 0) << m_output;
  EXPECT_TRUE(isFloat("b.c3d")) << "a -c option of an earlier run leaked into this one";

  ASSERT_EQ(run("export " + input + " -o " + path("c.c3d") +
                " --save-setup -c 'c3dExportOptions -real false'"),
            0)
      << m_output;
  ASSERT_EQ(run("export " + input + " -o " + path("d.c3d")), 0) << m_output;
  EXPECT_FALSE(isFloat("d.c3d")) << "--save-setup should keep the option";
}

TEST_F(AnvilCommands, ABadCommandLineExportsNothing) {
  const std::string input = sample("Eb015pi.c3d");
  EXPECT_EQ(run("export " + input + " -o " + path("a.trc") +
                " -c 'trcExportOptions -writeUnlabeled on' -c 'trcExportOptions -bogus 1'"),
            2);
  EXPECT_NE(m_output.find("-c 2, column 18: unknown option \"-bogus\" of trcExportOptions"),
            std::string::npos)
      << m_output;

  std::ofstream(path("bad.txt"))
      << "c3dExportOptions -real false\n\nc3dExportOptions -real maybe\n";
  EXPECT_EQ(run("export " + input + " -o " + path("a.trc") + " --script " + path("bad.txt")), 2);
  EXPECT_NE(m_output.find(path("bad.txt") + ":3:24: -real expects a bool"), std::string::npos)
      << m_output;

  EXPECT_EQ(run("export " + input + " -o " + path("a.c3d") + " -c 'c3dExportOptions -minKeys -1'"),
            2);
  EXPECT_NE(m_output.find("error: minKeys value must be positive"), std::string::npos);
  EXPECT_NE(m_output.find("-c 1: c3dExportOptions failed; nothing exported"), std::string::npos)
      << m_output;
  EXPECT_FALSE(fs::exists(path("a.trc")));
  EXPECT_FALSE(fs::exists(path("a.c3d")));
}

TEST_F(AnvilCommands, ABrokenInputIsNamedWithItsPlace) {
  std::ifstream in(sample("Eb015pi.c3d"), std::ios::binary);
  std::string bytes{std::istreambuf_iterator<char>(in), {}};
  bytes.resize(700);
  std::ofstream(path("cut.c3d"), std::ios::binary) << bytes;
  EXPECT_EQ(run("export " + path("cut.c3d") + " -o " + path("cut.trc")), 2);
  EXPECT_NE(m_output.find(path("cut.c3d") + ": "), std::string::npos) << m_output;
  EXPECT_NE(m_output.find("(byte "), std::string::npos) << m_output;
  EXPECT_FALSE(fs::exists(path("cut.trc")));
}

} // namespace
