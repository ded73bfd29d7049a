#include "Utils/UtilsFileSystem/FileIO.h"
#include "Utils/UtilsFileSystem/FileStreams.h"
#include "Utils/UtilsFileSystem/ReplacingFileStream.h"

#include "DebugServices/LogCapture.h"
#include "TempDir.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <cerrno>
#include <fstream>
#include <iterator>
#include <vector>

using namespace UtilsFileSystem;
using ZMT::IResult;

TEST(FileIO, MapsErrnoValuesToResults) {
  ZMT::VLogCapture capture;
  EXPECT_EQ(MapErrno(EEXIST), IResult::AlreadyPresent);
  EXPECT_EQ(MapErrno(EINVAL), IResult::InvalidArgument);
  EXPECT_EQ(MapErrno(ENOENT), IResult::FileNotFound);
  EXPECT_EQ(MapErrno(EISDIR), IResult::InvalidType);
  EXPECT_EQ(MapErrno(ENOTDIR), IResult::InvalidType);
  EXPECT_EQ(MapErrno(ENOTSUP), IResult::NotSupported);
  EXPECT_EQ(MapErrno(EPERM), IResult::NotPermitted);
  EXPECT_EQ(MapErrno(EACCES), IResult::NotPermitted);
  EXPECT_TRUE(capture.Messages("System").empty());
  EXPECT_EQ(MapErrno(ENOSPC), IResult::FileIOFailure);
  const auto messages = capture.Messages("System");
  ASSERT_EQ(messages.size(), 1u);
  EXPECT_EQ(messages[0], "Std error code: No space left on device");
}

TEST(FileIO, ResultTextsNameTheCode) {
  EXPECT_STREQ(IResult(IResult::NotPermitted).Text(),
               "NotPermitted: The function is not permitted at this time");
  EXPECT_STREQ(IResult(IResult::FileNotFound).Text(),
               "FileNotFound: The file does not exist or is unreadable");
  EXPECT_TRUE(IResult(IResult::DiskFull).IsFailure());
  EXPECT_TRUE(IResult(IResult::OkButNoEffect).IsSuccess());
}

TEST(FileIO, StreamsWriteSeekAndReadBack) {
  VTempDir dir;
  const auto path = dir / "data.bin";
  {
    auto [pFile, result] = OpenOutputFile(path, true);
    ASSERT_EQ(result, IResult::Ok);
    VFileOutputStreamVirtual stream{VFileOutputStream(pFile)};
    ASSERT_TRUE(stream.Write("abcdef", 6));
    std::uint64_t position = 0, size = 0;
    ASSERT_TRUE(stream.GetPosition(position));
    EXPECT_EQ(position, 6u);
    ASSERT_TRUE(stream.Seek(2));
    ASSERT_TRUE(stream.Write(ZMT::VGatherList{{"XY", 2}, {"Z", 1}}));
    ASSERT_TRUE(stream.GetSize(size));
    EXPECT_EQ(size, 6u);
    ASSERT_TRUE(stream.GetPosition(position));
    EXPECT_EQ(position, 5u) << "GetSize puts the position back";
  }
  auto [pFile, result] = OpenInputFile(path, true);
  ASSERT_EQ(result, IResult::Ok);
  VFileInputStreamVirtual input{VFileInputStream(pFile)};
  char text[7] = {};
  ASSERT_TRUE(input.Read(text, 6));
  EXPECT_STREQ(text, "abXYZf");
  EXPECT_FALSE(input.Read(text, 1));
  EXPECT_TRUE(input.IsFailed());
}

// After a patch the stream flushes once at the next buffer-sized boundary: the bytes on both
// sides of that split, by single and gathered writes, land where they were written. Gives the
// bytes it meant to write.
std::vector<std::uint8_t> WritePatchedAcrossBoundaries(ZMT::IOutputStreamSeekable& stream) {
  std::vector<std::uint8_t> expected;
  auto bytes = [](std::size_t count, std::uint8_t seed) {
    std::vector<std::uint8_t> out(count);
    for (std::size_t i = 0; i < count; ++i)
      out[i] = static_cast<std::uint8_t>(seed + i * 7);
    return out;
  };
  expected = bytes(1000, 1);
  EXPECT_TRUE(stream.Write(expected.data(), expected.size()));
  // Patch 8 bytes in the middle and go back to the (unaligned) end.
  EXPECT_TRUE(stream.Seek(100));
  EXPECT_TRUE(stream.Write("PATCHED!", 8));
  std::copy_n("PATCHED!", 8, expected.begin() + 100);
  EXPECT_TRUE(stream.Seek(1000));
  // Gathered pieces, one of them straddling the first boundary.
  const auto first = bytes(FullBufferSize - 3000, 2);
  const auto straddling = bytes(5000, 3);
  EXPECT_TRUE(stream.Write(
      ZMT::VGatherList{{first.data(), first.size()}, {straddling.data(), straddling.size()}}));
  expected.insert(expected.end(), first.begin(), first.end());
  expected.insert(expected.end(), straddling.begin(), straddling.end());
  // A second patch, then a single write across the next boundary.
  EXPECT_TRUE(stream.Seek(FullBufferSize + 10));
  EXPECT_TRUE(stream.Write("#", 1));
  expected[FullBufferSize + 10] = '#';
  EXPECT_TRUE(stream.Seek(static_cast<std::int64_t>(expected.size())));
  const auto last = bytes(FullBufferSize, 4);
  EXPECT_TRUE(stream.Write(last.data(), last.size()));
  expected.insert(expected.end(), last.begin(), last.end());
  return expected;
}

std::vector<std::uint8_t> ReadAll(const boost::filesystem::path& path) {
  std::ifstream in(path.string(), std::ios::binary);
  return {std::istreambuf_iterator<char>(in), std::istreambuf_iterator<char>()};
}

TEST(FileIO, WritesAfterAPatchSplitAtTheBufferBoundaryKeepEveryByte) {
  VTempDir dir;
  const auto plainPath = dir / "patched.bin";
  const auto replacedPath = dir / "replaced.bin";
  std::vector<std::uint8_t> plain, replaced;
  {
    auto [pFile, result] = OpenOutputFile(plainPath, true);
    ASSERT_EQ(result, IResult::Ok);
    VFileOutputStreamVirtual stream{VFileOutputStream(pFile)};
    plain = WritePatchedAcrossBoundaries(stream);
    ASSERT_EQ(stream.Stream().Close(), IResult::Ok);
  }
  {
    VReplacingFile file;
    ASSERT_TRUE(file.Open(replacedPath).IsSuccess());
    VReplacingFileStream stream(file);
    replaced = WritePatchedAcrossBoundaries(stream);
    ASSERT_TRUE(file.Commit().IsSuccess());
  }
  EXPECT_TRUE(ReadAll(plainPath) == plain);
  EXPECT_TRUE(ReadAll(replacedPath) == replaced);
}

TEST(FileIO, FailedOpensGiveANullFileAndTheMappedCode) {
  VTempDir dir;
  auto [pMissing, missing] = OpenInputFile(dir / "missing.txt", false);
  EXPECT_EQ(pMissing, nullptr);
  EXPECT_EQ(missing, IResult::FileNotFound);
  auto [pNoDir, noDir] = OpenOutputFile(dir / "no" / "such" / "dir.txt", false);
  EXPECT_EQ(pNoDir, nullptr);
  EXPECT_EQ(noDir, IResult::FileNotFound);
  auto [pDir, isDir] = OpenOutputFile(dir.Path(), false);
  EXPECT_EQ(pDir, nullptr);
  EXPECT_EQ(isDir, IResult::InvalidType);
  auto [pStream, streamResult] = OpenInputFileStream(dir / "missing.txt", true);
  EXPECT_EQ(pStream, nullptr);
  EXPECT_EQ(streamResult, IResult::FileNotFound);

  VFileOutputStream closed;
  EXPECT_FALSE(closed.Write("x", 1));
  EXPECT_EQ(CloseFile(nullptr), IResult::InvalidArgument);
  EXPECT_EQ(TellFile(nullptr).first, -1);
  EXPECT_EQ(GetFileSize(nullptr).second, IResult::InvalidArgument);
}

TEST(FileIO, FileStreamsOpenAndTruncate) {
  VTempDir dir;
  const auto path = dir / "text.txt";
  {
    auto [pOut, result] = OpenOutputFileStream(path, false);
    ASSERT_EQ(result, IResult::Ok);
    *pOut << "first line\n";
  }
  {
    auto [pOut, result] = OpenOutputFileStream(path, false);
    ASSERT_EQ(result, IResult::Ok);
    *pOut << "second";
  }
  auto [pIn, result] = OpenInputFileStream(path, false);
  ASSERT_EQ(result, IResult::Ok);
  std::string content((std::istreambuf_iterator<char>(*pIn)), std::istreambuf_iterator<char>());
  EXPECT_EQ(content, "second");
}

TEST(FileIO, RemoveFileReportsWhatHappened) {
  ZMT::VLogCapture capture;
  VTempDir dir;
  const auto path = dir / "gone.txt";
  std::ofstream(path.string()) << "x";
  EXPECT_EQ(RemoveFile(path), IResult::Ok);
  EXPECT_FALSE(boost::filesystem::exists(path));
  EXPECT_EQ(RemoveFile(path), IResult::OkButNoEffect);

  const auto full = dir / "full";
  boost::filesystem::create_directories(full / "child");
  const IResult refused = RemoveFile(full);
  EXPECT_TRUE(refused.IsFailure());
  EXPECT_TRUE(boost::filesystem::exists(full));

  const auto messages = capture.Messages("System");
  ASSERT_EQ(messages.size(), 4u);
  EXPECT_EQ(messages[0], "Removed file '" + path.string() + "'.");
  EXPECT_EQ(messages[1], "Nothing to remove: '" + path.string() + "' did not exist.");
  EXPECT_EQ(messages[2], "Std error code: Directory not empty");
  EXPECT_EQ(messages[3], "Failed to remove file '" + full.string() +
                             "': FileIOFailure: An operation to read or write a file failed");
}

TEST(FileIO, PathsAreUnchangedOffWindows) {
  const boost::filesystem::path path("/tmp/a/b.kmt");
  EXPECT_EQ(PlatformPath(path), path);
}
