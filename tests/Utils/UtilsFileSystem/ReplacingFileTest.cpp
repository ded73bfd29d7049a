// The replacing file: a target changes only when every byte reached the disk.
#include "Utils/UtilsFileSystem/ReplacingFile.h"
#include "Utils/UtilsFileSystem/FileStreams.h"

#include "TempDir.h"

#include <gtest/gtest.h>

#include <boost/filesystem/operations.hpp>

#include <cerrno>
#include <fstream>
#include <sstream>
#include <sys/stat.h>

using namespace UtilsFileSystem;

namespace {

std::string Text(const boost::filesystem::path& path) {
  std::ifstream in(path.string(), std::ios::binary);
  std::ostringstream text;
  text << in.rdbuf();
  return text.str();
}

std::size_t Leftovers(const VTempDir& dir) {
  std::size_t count = 0;
  for (const auto& entry : boost::filesystem::directory_iterator(dir.Path()))
    if (entry.path().filename().string().find(".anvil-") != std::string::npos) ++count;
  return count;
}

struct VFaultScope {
  VFaultScope(std::uint64_t bytes, int error) { InjectWriteFault(bytes, error); }
  ~VFaultScope() { ClearWriteFault(); }
};

} // namespace

TEST(ReplacingFile, ReplacesTheTargetKeepingItsModeAndFollowingLinks) {
  VTempDir dir;
  const auto target = dir / "take.trc";
  std::ofstream(target.string()) << "old";
  ASSERT_EQ(chmod(target.c_str(), 0640), 0);

  VReplacingFile file;
  ASSERT_TRUE(file.Open(target).IsSuccess()) << file.Reason();
  EXPECT_EQ(Leftovers(dir), 1u);
  ASSERT_TRUE(file.Write("new ", 4));
  // Seeking back and patching, as the C3D writer does with its header.
  std::fputs("text", file.File());
  std::fseek(file.File(), 0, SEEK_SET);
  std::fputs("NEW", file.File());
  EXPECT_EQ(Text(target), "old") << "the target changed before the commit";
  ASSERT_TRUE(file.Commit().IsSuccess()) << file.Reason();
  EXPECT_EQ(Text(target), "NEW text");
  struct stat status {};
  ASSERT_EQ(stat(target.c_str(), &status), 0);
  EXPECT_EQ(status.st_mode & 07777, 0640u);
  EXPECT_EQ(Leftovers(dir), 0u);

  const auto link = dir / "link.trc";
  boost::filesystem::create_symlink(target, link);
  ASSERT_TRUE(file.Open(link).IsSuccess());
  file.Write("via link", 8);
  ASSERT_TRUE(file.Commit().IsSuccess());
  EXPECT_TRUE(boost::filesystem::is_symlink(link));
  EXPECT_EQ(Text(target), "via link");
}

TEST(ReplacingFile, AFullDiskAtAnyPointKeepsTheOldFile) {
  VTempDir dir;
  const auto target = dir / "subject.kmt";
  const std::string payload(100000, 'x');
  for (const std::uint64_t budget : {0ull, 1ull, 4095ull, 65536ull, 99999ull}) {
    SCOPED_TRACE(budget);
    std::ofstream(target.string(), std::ios::trunc) << "precious";
    ClearLastReplaceFailure();
    VReplacingFile file;
    ASSERT_TRUE(file.Open(target).IsSuccess());
    {
      VFaultScope fault(budget, ENOSPC);
      file.Write(payload.data(), payload.size());
      EXPECT_EQ(file.Commit(), ZMT::IResult(ZMT::IResult::DiskFull));
    }
    EXPECT_EQ(file.Reason(), "disk full");
    EXPECT_EQ(LastReplaceFailure().m_Target, target.string());
    EXPECT_EQ(LastReplaceFailure().m_Reason, "disk full");
    EXPECT_EQ(Text(target), "precious");
    EXPECT_EQ(Leftovers(dir), 0u);
  }
  // Other errors keep the system's words.
  VReplacingFile file;
  ASSERT_TRUE(file.Open(target).IsSuccess());
  {
    VFaultScope fault(10, EIO);
    file.Write(payload.data(), payload.size());
    EXPECT_TRUE(file.Commit().IsFailure());
  }
  EXPECT_EQ(file.Reason(), std::strerror(EIO));
  EXPECT_EQ(Text(target), "precious");
}

TEST(ReplacingFile, AnAbandonedOrDestroyedFileLeavesNothing) {
  VTempDir dir;
  const auto target = dir / "cameras.xcp";
  {
    VReplacingFile file;
    ASSERT_TRUE(file.Open(target).IsSuccess());
    file.Write("half", 4);
  }
  EXPECT_FALSE(boost::filesystem::exists(target));
  EXPECT_EQ(Leftovers(dir), 0u);

  VReplacingFile file;
  EXPECT_EQ(file.Commit(), ZMT::IResult(ZMT::IResult::FileNotOpen));
  EXPECT_FALSE(file.Write("x", 1));
}

TEST(ReplacingFile, RefusedTargetsSayWhy) {
  VTempDir dir;
  VReplacingFile file;
  EXPECT_EQ(file.Open(dir / "no" / "such.c3d"), ZMT::IResult(ZMT::IResult::FileNotFound));
  EXPECT_EQ(file.Reason(), "the folder '" + (dir / "no").string() + "' does not exist");
  EXPECT_EQ(LastReplaceFailure().m_Target, (dir / "no" / "such.c3d").string());

  boost::filesystem::create_directory(dir / "take.c3d");
  EXPECT_EQ(file.Open(dir / "take.c3d"), ZMT::IResult(ZMT::IResult::InvalidType));
  EXPECT_EQ(file.Reason(), "it is a folder");
}

TEST(FileStreams, AFailedCloseNeverClosesTwice) {
  // /dev/full accepts the open and refuses the data when the buffer is flushed at close.
  auto [pFile, result] = OpenOutputFile("/dev/full", true);
  if (!pFile) GTEST_SKIP() << "/dev/full is not available";
  VFileOutputStream stream(pFile);
  ASSERT_TRUE(stream.Write("data", 4));
  EXPECT_TRUE(stream.Close().IsFailure());
  EXPECT_EQ(stream.File(), nullptr);
  EXPECT_EQ(stream.Close(), ZMT::IResult(ZMT::IResult::InvalidArgument));
}
