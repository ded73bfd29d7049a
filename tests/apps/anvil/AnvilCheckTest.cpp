// `anvil check` end to end: the test data and the demo, a broken and an unreadable file, JSON.
#include <nlohmann/json.hpp>

#include <gtest/gtest.h>

#include <array>
#include <cstdio>
#include <filesystem>
#include <fstream>
#include <regex>
#include <string>
#include <sys/wait.h>
#include <unistd.h>

namespace fs = std::filesystem;

namespace {

struct CheckRun {
  int code = -1;
  std::string out; // stdout only
};

CheckRun check(const std::string& i_args) {
  const std::string command =
      std::string(ANVIL_BIN_DIR) + "/anvil check " + i_args + " 2>/dev/null";
  CheckRun run;
  FILE* pPipe = ::popen(command.c_str(), "r");
  if (!pPipe) return run;
  std::array<char, 4096> buffer;
  for (size_t n; (n = std::fread(buffer.data(), 1, buffer.size(), pPipe)) > 0;)
    run.out.append(buffer.data(), n);
  const int status = ::pclose(pPipe);
  run.code = WIFEXITED(status) ? WEXITSTATUS(status) : -1;
  return run;
}

std::string data(const std::string& i_name) {
  return std::string(ANVIL_TEST_DATA) + "/" + i_name;
}

/// The error lines of a text report.
std::vector<std::string> errors(const std::string& i_out) {
  std::vector<std::string> lines;
  std::istringstream in(i_out);
  for (std::string line; std::getline(in, line);)
    if (line.find(": error: ") != std::string::npos) lines.push_back(line);
  return lines;
}

class AnvilCheck : public ::testing::Test {
protected:
  void SetUp() override {
    m_dir = fs::temp_directory_path() / ("anvil-check-test-" + std::to_string(::getpid()));
    fs::create_directories(m_dir);
  }
  void TearDown() override { fs::remove_all(m_dir); }
  /// A copy of a test file with `from` replaced by `to`.
  std::string edited(const std::string& i_name, const std::string& from, const std::string& to) {
    std::ifstream in(data(i_name));
    std::string text((std::istreambuf_iterator<char>(in)), {});
    const auto at = text.find(from);
    EXPECT_NE(at, std::string::npos) << from;
    if (at != std::string::npos) text.replace(at, from.size(), to);
    const fs::path path = m_dir / fs::path(i_name).filename();
    std::ofstream(path) << text;
    return path.string();
  }
  fs::path m_dir;
};

} // namespace

TEST_F(AnvilCheck, TestDataAndDemo) {
  for (const char* name : {"kmt/v1_0.kmt", "kmt/v2_6.kmt", "c3d/Eb015pi.c3d", "c3d/Optotrak.c3d"}) {
    const CheckRun run = check(data(name));
    EXPECT_EQ(run.code, 0) << name << "\n" << run.out;
    EXPECT_TRUE(errors(run.out).empty()) << name;
  }
  const CheckRun demo = check("demo");
  EXPECT_EQ(demo.code, 0) << demo.out;
  EXPECT_TRUE(demo.out.empty()) << demo.out;
  // Two of the reader's test files carry statistics that the checks refuse.
  const CheckRun v20 = check(data("kmt/v2_0.kmt"));
  EXPECT_EQ(v20.code, 1);
  EXPECT_EQ(errors(v20.out),
            (std::vector<std::string>{
                data("kmt/v2_0.kmt") +
                    ": v2_0: SubjectCheck: error: Inconsistent template stats information.",
                data("kmt/v2_0.kmt") +
                    ": v2_0: SubjectCheck: error: Segment Upper, invalid template values"}));
  const CheckRun v31 = check(data("kmt/v3_1.kmt"));
  EXPECT_EQ(v31.code, 1);
  EXPECT_EQ(errors(v31.out), (std::vector<std::string>{data("kmt/v3_1.kmt") +
                                                       ": v3_1: SubjectCheck: error: Inconsistent "
                                                       "range information."}));
}

TEST_F(AnvilCheck, BrokenAndUnreadableInputs) {
  const std::string broken = edited("kmt/v1_0.kmt", "COVARIANCE=\"0.01\"", "COVARIANCE=\"-0.01\"");
  const CheckRun run = check(broken);
  EXPECT_EQ(run.code, 1);
  EXPECT_EQ(errors(run.out),
            (std::vector<std::string>{
                broken + ": v1_0: SubjectCheck: error: Invalid joint covariance matrix"}));
  const std::string missing = (m_dir / "absent.kmf").string();
  EXPECT_EQ(check(missing).code, 2);
  const std::string garbage = (m_dir / "garbage.kms").string();
  std::ofstream(garbage) << "<KinematicModel";
  // An unreadable input wins over a failed check, and the other inputs are still reported.
  const CheckRun mixed = check(garbage + " " + broken + " " + data("kmt/v2_6.kmt"));
  EXPECT_EQ(mixed.code, 2);
  const auto lines = errors(mixed.out);
  ASSERT_EQ(lines.size(), 2u) << mixed.out;
  EXPECT_EQ(lines[0].rfind(garbage + ": Input: error: ", 0), 0u) << lines[0];
  EXPECT_NE(lines[1].find("Invalid joint covariance matrix"), std::string::npos);
  EXPECT_EQ(check((m_dir / "scene.json").string()).code, 2);
}

TEST_F(AnvilCheck, JsonReport) {
  const std::string broken = edited("kmt/v1_0.kmt", "COVARIANCE=\"0.01\"", "COVARIANCE=\"-0.01\"");
  const CheckRun run = check("--json " + broken + " " + (m_dir / "absent.kmt").string());
  EXPECT_EQ(run.code, 2);
  const auto report = nlohmann::json::parse(run.out);
  ASSERT_TRUE(report.is_array());
  std::vector<nlohmann::json> errorsOnly;
  for (const auto& entry : report)
    if (entry.at("level") == "error") errorsOnly.push_back(entry);
  ASSERT_EQ(errorsOnly.size(), 2u) << run.out;
  EXPECT_EQ(errorsOnly[0].at("file"), broken);
  EXPECT_EQ(errorsOnly[0].at("subject"), "v1_0");
  EXPECT_EQ(errorsOnly[0].at("rule"), "SubjectCheck");
  EXPECT_EQ(errorsOnly[0].at("message"), "Invalid joint covariance matrix");
  EXPECT_EQ(errorsOnly[1].at("rule"), "Input");
  EXPECT_EQ(errorsOnly[1].at("subject"), "");
  const CheckRun clean = check("--json demo");
  EXPECT_EQ(clean.code, 0);
  EXPECT_EQ(nlohmann::json::parse(clean.out), nlohmann::json::array());
}
