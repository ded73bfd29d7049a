// Recordings written by VWriter and read back by VReader: equal items, the layout's particular
// cases, seeking through the index, and files written by an older build.

#include "FileFixture.h"

#include <gtest/gtest.h>

namespace {

using namespace FlowTest;
using Flow2File::EChunkType;
using ZMT::IResult;

std::vector<std::uint16_t> Types(const std::vector<VChunk>& chunks) {
  std::vector<std::uint16_t> types;
  for (const VChunk& chunk : chunks)
    types.push_back(chunk.m_Type);
  return types;
}

TEST(FlowFile, ItemsOfSeveralTypesReadBackEqual) {
  VSide writing(77);
  const VRecording recording = Record(writing, 40);

  VSide reading(88);
  Flow2File::VReader reader = reading.Reader();
  UtilsFileSystem::VMemoryInputStream in(recording.m_Bytes);
  ASSERT_EQ(reader.Open(&in), IResult(IResult::Ok)) << reader.GetProblems().front();
  EXPECT_TRUE(reader.IsComplete());
  ASSERT_EQ(reader.GetStateCount(), 40u);
  for (std::size_t i = 0; i < 40; ++i) {
    ZMT::IFlowStateHandle state;
    ASSERT_EQ(reader.ReadState(i, state), IResult(IResult::Ok));
    EXPECT_EQ(state->GetTime(), (ZMT::VFlowTimestamp{std::int64_t(i) * Period, Period, 1}));
    EXPECT_TRUE(SameItems(*state, recording.m_Frames[i])) << "state " << i;
    // The event keeps its own time.
    ZMT::IFlowItemHandle event = recording.m_Frames[i][3];
    ZMT::VFlowTimestamp time;
    ASSERT_TRUE(state->FindToken(event.GetToken(), time));
    EXPECT_EQ(time, (ZMT::VFlowTimestamp{std::int64_t(i) * Period + Period / 2, 0, 1}));
  }
  std::vector<ZMT::IFlowItemHandle> statics;
  ASSERT_EQ(reader.ReadStaticItems(statics), IResult(IResult::Ok));
  ASSERT_EQ(statics.size(), 1u);
  EXPECT_EQ(statics[0].GetToken(), recording.m_Shared.GetToken());
  EXPECT_EQ(Serialise(*statics[0]), Serialise(*recording.m_Shared));

  // Items serialised by the writer make the same file as the store's cached bytes.
  VSide plain(77);
  EXPECT_EQ(Record(plain, 40, false).m_Bytes, recording.m_Bytes);
}

TEST(FlowFile, ARepeatedItemIsWrittenOnceAndReferredToAfterwards) {
  VSide writing(77);
  const VRecording recording = Record(writing, 3);
  const auto chunks = Walk(recording.m_Bytes);
  // Header, the two tables, the opening index, the three type definitions (in type order) and
  // then per state its header and groups; closing index and tables last.
  const std::vector<std::uint16_t> start = {0, 2, 6, 1, 3, 3, 3, 4, 8, 9, 9, 9, 8, 9, 8, 9};
  const auto types = Types(chunks);
  ASSERT_GE(types.size(), start.size());
  EXPECT_EQ(std::vector<std::uint16_t>(types.begin(), types.begin() + std::int64_t(start.size())),
            start);
  EXPECT_EQ(chunks[1].m_Position, 40u);
  EXPECT_EQ(chunks[2].m_Position, 60u);

  // The mixed item's body is in the first state; later states hold its position.
  const VChunk& firstMixed = chunks[15];
  std::vector<VChunk> groups;
  for (const VChunk& chunk : chunks)
    if (chunk.m_Type == std::uint16_t(EChunkType::ItemGroup)) groups.push_back(chunk);
  ASSERT_EQ(groups.size(), 9u);
  EXPECT_EQ(groups[1].m_Flags, 4); // the event: own time
  EXPECT_EQ(groups[2].m_Flags, 0);
  EXPECT_EQ(groups[5].m_Flags, 2); // the mixed item by reference
  EXPECT_EQ(groups[5].m_Payload, 16u + 8u);
  EXPECT_EQ(ValueAt<std::uint64_t>(recording.m_Bytes, groups[5].m_Position + 8 + 16),
            firstMixed.m_Position);
  // The event group carries its time: tick and a zero period as given.
  EXPECT_EQ(ValueAt<std::int64_t>(recording.m_Bytes, groups[1].m_Position + 8 + 16), Period / 2);
  EXPECT_EQ(ValueAt<std::uint64_t>(recording.m_Bytes, groups[1].m_Position + 8 + 24), 0u);

  EXPECT_EQ(std::vector<std::uint16_t>(types.end() - 4, types.end()),
            (std::vector<std::uint16_t>{7, 1, 2, 6}));
  // The opening tables are linked to the closing ones.
  EXPECT_EQ(ValueAt<std::uint64_t>(recording.m_Bytes, 48), chunks[chunks.size() - 2].m_Position);
  EXPECT_EQ(ValueAt<std::uint64_t>(recording.m_Bytes, 68), chunks.back().m_Position);
}

TEST(FlowFile, AFileWithoutStatesHoldsStaticItemsOnly) {
  VSide writing(77);
  UtilsFileSystem::VMemoryOutputStream out;
  Flow2File::VWriter writer(writing.m_Buffers, writing.m_Store);
  ASSERT_TRUE(writer.Open(&out).IsSuccess());
  auto point = writing.Create<VFlowTestPoint>();
  auto event = writing.Create<VFlowTestEvent>();
  ASSERT_TRUE(writer.WriteItems({point, event, point}, false).IsSuccess());
  ASSERT_TRUE(writer.Close().IsSuccess());
  EXPECT_EQ(Types(Walk(out.Bytes())), (std::vector<std::uint16_t>{0, 2, 6, 3, 7, 3, 7, 2, 6}));

  VSide reading(88);
  Flow2File::VReader reader = reading.Reader();
  UtilsFileSystem::VMemoryInputStream in(out.Bytes());
  ASSERT_EQ(reader.Open(&in), IResult(IResult::Ok));
  EXPECT_EQ(reader.GetStateCount(), 0u);
  std::vector<ZMT::IFlowItemHandle> statics;
  ASSERT_EQ(reader.ReadStaticItems(statics), IResult(IResult::Ok));
  ASSERT_EQ(statics.size(), 2u);
  EXPECT_EQ(statics[1].GetToken(), event.GetToken());
}

TEST(FlowFile, TimesMustStayOnTheGridOfTheirSession) {
  VSide side(77);
  UtilsFileSystem::VMemoryOutputStream out;
  Flow2File::VWriter writer(side.m_Buffers, side.m_Store);
  ASSERT_TRUE(writer.Open(&out).IsSuccess());
  EXPECT_EQ(writer.Open(&out), IResult(IResult::AlreadyInProgress));
  auto at = [&](std::int64_t tick, std::uint32_t session) {
    return writer.UpdateTime({tick, std::uint64_t(Period), session}, {}, {});
  };
  EXPECT_EQ(at(0, 0), IResult(IResult::InvalidSession));
  EXPECT_TRUE(at(10 * Period, 2).IsSuccess());
  EXPECT_TRUE(at(12 * Period, 2).IsSuccess()); // a skipped frame is fine
  EXPECT_EQ(at(12 * Period + Period * 3 / 2, 2), IResult(IResult::InvalidIndex));
  EXPECT_EQ(at(11 * Period, 2), IResult(IResult::InvalidIndex)); // back in time
  EXPECT_EQ(at(20 * Period, 1), IResult(IResult::InvalidSession));
  EXPECT_TRUE(at(5 * Period, 3).IsSuccess()); // a new session starts anywhere
  EXPECT_TRUE(writer.Close().IsSuccess());
  EXPECT_EQ(writer.Close(), IResult(IResult::FileNotOpen));
  EXPECT_EQ(writer.WriteState(*side.State(1)), IResult(IResult::FileNotOpen));
}

TEST(FlowFile, SeekingByTimeReadsAHandfulOfChunks) {
  VSide writing(77);
  UtilsFileSystem::VMemoryOutputStream out;
  constexpr int Frames = 10050;
  {
    Flow2File::VWriter writer(writing.m_Buffers, writing.m_Store);
    ASSERT_TRUE(writer.Open(&out).IsSuccess());
    for (int f = 0; f < Frames; ++f) {
      ZMT::IFlowStateHandle state = writing.State(f);
      auto point = writing.Create<VFlowTestPoint>();
      point.As<PointItem>()->m_Quality = static_cast<std::uint32_t>(f);
      state->AddItem(point);
      ASSERT_TRUE(writer.WriteState(*state).IsSuccess());
    }
    ASSERT_TRUE(writer.Close().IsSuccess());
  }
  // Three index chunks (opening, after 10,000 states, closing), each linked from the one before.
  std::vector<VChunk> indexes;
  for (const VChunk& chunk : Walk(out.Bytes()))
    if (chunk.m_Type == std::uint16_t(EChunkType::SessionIndex)) indexes.push_back(chunk);
  ASSERT_EQ(indexes.size(), 3u);
  EXPECT_EQ(ValueAt<std::uint64_t>(out.Bytes(), indexes[0].m_Position + 8), indexes[1].m_Position);
  EXPECT_EQ(ValueAt<std::uint64_t>(out.Bytes(), indexes[1].m_Position + 8), indexes[2].m_Position);
  EXPECT_EQ(ValueAt<std::uint32_t>(out.Bytes(), indexes[1].m_Position + 8 + 84), 10000u);
  EXPECT_EQ(ValueAt<std::uint64_t>(out.Bytes(), indexes[2].m_Position + 8 + 68),
            std::uint64_t(Frames));

  VSide reading(88);
  Flow2File::VReader reader = reading.Reader();
  UtilsFileSystem::VMemoryInputStream in(out.Bytes());
  ASSERT_EQ(reader.Open(&in), IResult(IResult::Ok));
  ASSERT_EQ(reader.GetStateCount(), std::size_t(Frames));
  std::size_t index = 0;
  ASSERT_TRUE(reader.FindState({7777 * Period + Period / 3, 0, 1}, index).IsSuccess());
  EXPECT_EQ(index, 7777u);
  ZMT::IFlowStateHandle state;
  ASSERT_EQ(reader.ReadState(index, state), IResult(IResult::Ok));
  ZMT::IFlowItemHandle point;
  ASSERT_TRUE(state->GetItem(point, VFlowTestPoint::FlowTypeId, ZMT::EMatch::Equal));
  EXPECT_EQ(point.As<PointItem>()->m_Quality, 7777u);
  // Header, two tables, a type definition, three index chunks, the chunks scanned on the way to
  // the first index, and the state's three: nowhere near the 20,000 chunks of the file.
  EXPECT_LT(reader.GetChunksRead(), 20u);

  EXPECT_EQ(reader.FindState({-5, 0, 1}, index), IResult(IResult::NotFound));
  EXPECT_EQ(reader.FindState({0, 0, 2}, index), IResult(IResult::NotFound));
  ASSERT_TRUE(reader.FindState({Frames * Period * 10, 0, 1}, index).IsSuccess());
  EXPECT_EQ(index, std::size_t(Frames - 1));
}

TEST(FlowFile, AnOlderBuildsFileReadsIntoTheNewerType) {
  VSide older(77, ZMT::MakeFlowItemFactories<VFlowSampleV1>());
  UtilsFileSystem::VMemoryOutputStream out;
  std::vector<ZMT::IFlowItemHandle> written;
  {
    Flow2File::VWriter writer(older.m_Buffers, older.m_Store);
    ASSERT_TRUE(writer.Open(&out).IsSuccess());
    for (int f = 0; f < 5; ++f) {
      ZMT::IFlowStateHandle state = older.State(f);
      auto item = older.Create<VFlowSampleV1>();
      static_cast<VSampleV1&>(*item.As<ZMT::Detail::VFlowItem<VFlowSampleV1>>()) =
          FilledSampleV1(f);
      state->AddItem(item);
      written.push_back(item);
      ASSERT_TRUE(writer.WriteState(*state).IsSuccess());
    }
    ASSERT_TRUE(writer.Close().IsSuccess());
  }
  VSide newer(88, ZMT::MakeFlowItemFactories<VFlowSampleV2>());
  Flow2File::VReader reader = newer.Reader();
  UtilsFileSystem::VMemoryInputStream in(out.Bytes());
  ASSERT_EQ(reader.Open(&in), IResult(IResult::Ok));
  for (int f = 0; f < 5; ++f) {
    ZMT::IFlowStateHandle state;
    ASSERT_EQ(reader.ReadState(std::size_t(f), state), IResult(IResult::Ok));
    ZMT::IFlowItemHandle item;
    ASSERT_TRUE(state->GetItem(item, 150, ZMT::EMatch::Equal));
    auto* pSample = item.As<ZMT::Detail::VFlowItem<VFlowSampleV2>>();
    ASSERT_NE(pSample, nullptr);
    EXPECT_EQ(item.GetToken(), written[std::size_t(f)].GetToken());
    EXPECT_EQ(pSample->m_Label, "sample " + std::to_string(f));
    EXPECT_EQ(pSample->m_Count, -5 - f);
    EXPECT_EQ(pSample->m_Weight, 0.25);
    EXPECT_EQ(pSample->m_Colour, EColourV2::Blue);
    EXPECT_EQ(pSample->m_X, 1.5 + f);
    EXPECT_EQ(pSample->m_Added, 42u);
  }
}

} // namespace
