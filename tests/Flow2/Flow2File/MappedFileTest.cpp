// A recording on disk, written through the replacing file and read through the memory-mapped
// input with pages small enough to swap many times; and the page window itself.

#include "FileFixture.h"
#include "TempDir.h"

#include "DebugServices/LogCapture.h"
#include "Utils/UtilsFileSystem/MemoryMappedInputStream.h"
#include "Utils/UtilsFileSystem/ReplacingFileStream.h"

#include <gtest/gtest.h>

#include <fstream>

namespace {

using namespace FlowTest;
using UtilsFileSystem::VMemoryMappedInputStream;
using ZMT::IResult;

void WriteBytes(const boost::filesystem::path& path, const std::vector<std::uint8_t>& bytes) {
  std::ofstream out(path.string(), std::ios::binary);
  out.write(reinterpret_cast<const char*>(bytes.data()), std::streamsize(bytes.size()));
}

TEST(FlowMappedFile, ARecordingOnDiskReadsBackThroughSwappedPages) {
  VTempDir dir;
  const auto path = dir / "take.mcp";
  VSide writing(77);
  VRecording recording = Record(writing, 200);
  {
    // The same recording again, this time to disk by the replacing road.
    UtilsFileSystem::VReplacingFile file;
    ASSERT_TRUE(file.Open(path).IsSuccess());
    UtilsFileSystem::VReplacingFileStream stream(file);
    VSide again(77);
    VRecording onDisk;
    Flow2File::VWriter writer(again.m_Buffers, again.m_Store);
    ASSERT_TRUE(writer.Open(&stream).IsSuccess());
    auto shared = again.Create<VFlowTestMixed>();
    static_cast<VMixed&>(*shared.As<MixedItem>()) = *recording.m_Shared.As<MixedItem>();
    for (std::size_t f = 0; f < recording.m_Frames.size(); ++f) {
      ZMT::IFlowStateHandle state = again.State(std::int64_t(f));
      for (int i = 0; i < 3; ++i) {
        auto point = again.Create<VFlowTestPoint>();
        static_cast<VPoint&>(*point.As<PointItem>()) =
            *recording.m_Frames[f][std::size_t(i)].As<PointItem>();
        state->AddItem(point);
      }
      auto event = again.Create<VFlowTestEvent>();
      static_cast<VEvent&>(*event.As<EventItem>()) = *recording.m_Frames[f][3].As<EventItem>();
      state->AddItem(event, {std::int64_t(f) * Period + Period / 2, 0, 1});
      state->AddItem(shared);
      ASSERT_TRUE(writer.WriteState(*state).IsSuccess());
    }
    ASSERT_TRUE(writer.WriteItems({shared}, false).IsSuccess());
    ASSERT_TRUE(writer.Close().IsSuccess());
    ASSERT_TRUE(file.Commit().IsSuccess());
  }

  auto [pStream, result] = UtilsFileSystem::OpenInputStream(path, 4096, 2);
  ASSERT_TRUE(result.IsSuccess());
  auto* pMapped = dynamic_cast<UtilsFileSystem::VMemoryMappedInputStreamVirtual*>(pStream.get());
  ASSERT_NE(pMapped, nullptr);
  std::uint64_t size = 0;
  ASSERT_TRUE(pMapped->GetSize(size));
  EXPECT_EQ(size, recording.m_Bytes.size()); // the file on disk is the one made in memory

  VSide reading(88);
  Flow2File::VReader reader = reading.Reader();
  ASSERT_EQ(reader.Open(pMapped), IResult(IResult::Ok));
  ASSERT_EQ(reader.GetStateCount(), recording.m_Frames.size());
  for (std::size_t i = 0; i < reader.GetStateCount(); ++i) {
    ZMT::IFlowStateHandle state;
    ASSERT_EQ(reader.ReadState(i, state), IResult(IResult::Ok));
    EXPECT_TRUE(SameItems(*state, recording.m_Frames[i])) << i;
  }
  EXPECT_GT(pMapped->Stream().GetSwapCount(), 2 * size / 4096);
  EXPECT_LE(pMapped->Stream().GetMappedPageCount(), 2u);
}

TEST(FlowMappedFile, ThePageWindowKeepsTheMostRecentlyUsedPages) {
  VTempDir dir;
  const std::uint64_t page = UtilsFileSystem::VMemoryMappedInputFile::SystemPageSize();
  std::vector<std::uint8_t> bytes(page * 3 + 100);
  for (std::size_t i = 0; i < bytes.size(); ++i)
    bytes[i] = std::uint8_t(i * 7 + i / 251);
  WriteBytes(dir / "three", bytes);

  VMemoryMappedInputStream stream(page, 2);
  ASSERT_TRUE(stream.Open(dir / "three").IsSuccess());
  auto at = [&](std::uint64_t position, std::uint64_t size = 16) {
    std::vector<std::uint8_t> got(size);
    EXPECT_TRUE(stream.Seek(std::int64_t(position)));
    EXPECT_TRUE(stream.Read(got.data(), size));
    return std::equal(got.begin(), got.end(), bytes.begin() + std::int64_t(position));
  };
  EXPECT_TRUE(at(10));
  EXPECT_TRUE(at(page * 2 + 5));
  EXPECT_EQ(stream.GetSwapCount(), 2u);
  for (int i = 0; i < 5; ++i) { // alternating between the two: no more swaps
    EXPECT_TRUE(at(20));
    EXPECT_TRUE(at(page * 2 + 40));
  }
  EXPECT_EQ(stream.GetSwapCount(), 2u);
  EXPECT_TRUE(at(page * 3 + 10)); // a third page evicts the least recently used (the first)
  EXPECT_EQ(stream.GetSwapCount(), 3u);
  EXPECT_TRUE(at(page * 2 + 1)); // still there
  EXPECT_EQ(stream.GetSwapCount(), 3u);
  EXPECT_TRUE(at(30)); // gone, mapped again
  EXPECT_EQ(stream.GetSwapCount(), 4u);
  EXPECT_TRUE(at(page - 8, 16)); // a read across a page boundary
  std::uint8_t past[200];
  EXPECT_TRUE(stream.Seek(std::int64_t(bytes.size() - 50)));
  EXPECT_FALSE(stream.Read(past, 100));
  EXPECT_TRUE(stream.IsFailed());
}

TEST(FlowMappedFile, SmallFilesMapOnceAndTheStatsCountPagesInTheFile) {
  VTempDir dir;
  const std::uint64_t page = UtilsFileSystem::VMemoryMappedInputFile::SystemPageSize();
  WriteBytes(dir / "small", std::vector<std::uint8_t>(100, 1));
  WriteBytes(dir / "one", std::vector<std::uint8_t>(page, 2));
  {
    VMemoryMappedInputStream stream(dir / "small", page * 4, 2);
    std::uint8_t all[100];
    ASSERT_TRUE(stream.Read(all, 100));
    ASSERT_TRUE(stream.Seek(0));
    ASSERT_TRUE(stream.Read(all, 10));
    EXPECT_EQ(stream.GetSwapCount(), 1u);
    const std::uint8_t* pData = nullptr;
    EXPECT_EQ(stream.GetContiguous(pData), 90u); // the page is the file's size
  }
  ZMT::VLogCapture capture;
  {
    VMemoryMappedInputStream stream(dir / "one", page, 2);
    std::uint8_t b = 0;
    ASSERT_TRUE(stream.Read(&b, 1));
  }
  const auto messages = capture.Messages("System");
  ASSERT_EQ(messages.size(), 1u);
  EXPECT_EQ(messages[0], "VMemoryMappedInputStream stats: 1 swaps, 2 pages in file.");

  EXPECT_THROW(VMemoryMappedInputStream(dir / "missing"), std::runtime_error);
  auto [pStream, result] = UtilsFileSystem::OpenInputStream(dir / "missing");
  EXPECT_EQ(pStream, nullptr);
  EXPECT_EQ(result, IResult(IResult::FileNotFound));
}

} // namespace
