// The program on a real file system that is full to the last block: every format fails with a
// message that names the file and the reason, keeps the old file and leaves no temporary file.
// The file system is a small tmpfs mounted in a mount namespace of this test process alone, so
// nothing is left mounted whatever happens; where that is not allowed the test is skipped.
#include <gtest/gtest.h>

#include <cerrno>
#include <cstdio>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <sstream>
#include <string>
#include <vector>

#include <sched.h>
#include <sys/mount.h>
#include <sys/wait.h>
#include <unistd.h>

namespace fs = std::filesystem;

namespace {

std::string runAnvil(const std::string& i_args, int& o_rCode) {
  const std::string command = std::string(ANVIL_BIN_DIR) + "/anvil " + i_args + " 2>&1";
  std::string output;
  FILE* pPipe = ::popen(command.c_str(), "r");
  if (!pPipe) return output;
  char buffer[4096];
  for (size_t n; (n = std::fread(buffer, 1, sizeof buffer, pPipe)) > 0;)
    output.append(buffer, n);
  const int status = ::pclose(pPipe);
  o_rCode = WIFEXITED(status) ? WEXITSTATUS(status) : -1;
  return output;
}

std::string readText(const fs::path& i_path) {
  std::ifstream in(i_path, std::ios::binary);
  std::ostringstream text;
  text << in.rdbuf();
  return text.str();
}

/// Writes until the file system refuses: afterwards not one more block fits.
void fill(const fs::path& i_path) {
  FILE* pFile = std::fopen(i_path.c_str(), "wb");
  ASSERT_NE(pFile, nullptr);
  std::setvbuf(pFile, nullptr, _IONBF, 0);
  const std::vector<char> block(4096, 'f');
  while (std::fwrite(block.data(), 1, block.size(), pFile) == block.size()) {
  }
  // The last partial block, byte by byte.
  while (std::fwrite(block.data(), 1, 1, pFile) == 1) {
  }
  std::fclose(pFile);
}

} // namespace

TEST(FullDisk, EveryFormatKeepsTheOldFileAndSaysDiskFull) {
  const fs::path dir =
      fs::temp_directory_path() / ("anvil-full-disk-" + std::to_string(::getpid()));
  fs::create_directories(dir);
  if (::unshare(CLONE_NEWNS) != 0 ||
      ::mount(nullptr, "/", nullptr, MS_REC | MS_PRIVATE, nullptr) != 0 ||
      ::mount("anvil-full", dir.c_str(), "tmpfs", 0, "size=1m") != 0) {
    const int error = errno;
    fs::remove_all(dir);
    GTEST_SKIP() << "cannot mount a small file system here: " << std::strerror(error);
  }

  int code = -1;
  std::string extensions = runAnvil("formats --extensions", code);
  ASSERT_EQ(code, 0) << extensions;
  std::vector<std::string> formats;
  std::istringstream words(extensions);
  for (std::string ext; words >> ext;)
    formats.push_back(ext);
  ASSERT_GE(formats.size(), 8u);

  for (const std::string& ext : formats)
    std::ofstream(dir / ("demo." + ext)) << "precious " << ext;
  fill(dir / "filler");

  for (const std::string& ext : formats) {
    SCOPED_TRACE(ext);
    const fs::path path = dir / ("demo." + ext);
    const std::string output = runAnvil("--user-setup '" + (dir / "setup.ini").string() +
                                            "' export demo -o '" + path.string() + "'",
                                        code);
    EXPECT_EQ(code, 1) << output;
    EXPECT_NE(output.find("'" + path.string() + "'"), std::string::npos) << output;
    EXPECT_NE(output.find("disk full"), std::string::npos) << output;
    EXPECT_EQ(readText(path), "precious " + ext);
  }
  for (const auto& entry : fs::directory_iterator(dir))
    EXPECT_EQ(entry.path().filename().string().find(".anvil-"), std::string::npos)
        << "temporary file left behind: " << entry.path();

  ::umount2(dir.c_str(), MNT_DETACH);
  fs::remove_all(dir);
}
