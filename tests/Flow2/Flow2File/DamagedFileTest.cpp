// Damaged files: cut short anywhere, a chunk with a wrong size, a broken index link, a type
// without definition or unknown here. Each gives a clear result and what stands before the
// damage still reads.

#include "FileFixture.h"

#include <gtest/gtest.h>

#include <algorithm>

namespace {

using namespace FlowTest;
using Flow2File::EChunkType;
using ZMT::IResult;

constexpr int Frames = 6;

struct VDamage : ::testing::Test {
  void SetUp() override { m_Recording = Record(m_Writing, Frames); }

  /// Where each state's chunks end: at the next chunk that is neither a group nor an item.
  std::vector<std::uint64_t> StateEnds() const {
    const auto chunks = Walk(m_Recording.m_Bytes);
    std::vector<std::uint64_t> ends;
    for (std::size_t i = 0; i < chunks.size(); ++i) {
      if (chunks[i].m_Type != std::uint16_t(EChunkType::StateHeader)) continue;
      std::size_t j = i + 1;
      while (j < chunks.size() && (chunks[j].m_Type == std::uint16_t(EChunkType::ItemGroup) ||
                                   chunks[j].m_Type == std::uint16_t(EChunkType::ItemData)))
        ++j;
      ends.push_back(chunks[j - 1].End());
    }
    return ends;
  }

  std::vector<VChunk> Chunks(EChunkType type) const {
    std::vector<VChunk> found;
    for (const VChunk& chunk : Walk(m_Recording.m_Bytes))
      if (chunk.m_Type == std::uint16_t(type)) found.push_back(chunk);
    return found;
  }

  /// Opens the bytes with a fresh store and reads every state it finds; returns the results.
  struct VOutcome {
    IResult m_Open;
    std::vector<IResult> m_States;
    std::vector<std::string> m_Problems;
    std::vector<bool> m_Equal;
  };
  VOutcome ReadAll(const std::vector<std::uint8_t>& bytes) {
    VOutcome outcome;
    VSide reading(88);
    Flow2File::VReader reader = reading.Reader();
    UtilsFileSystem::VMemoryInputStream in(bytes);
    outcome.m_Open = reader.Open(&in);
    for (std::size_t i = 0; i < reader.GetStateCount(); ++i) {
      ZMT::IFlowStateHandle state;
      outcome.m_States.push_back(reader.ReadState(i, state));
      outcome.m_Equal.push_back(state && i < m_Recording.m_Frames.size() &&
                                SameItems(*state, m_Recording.m_Frames[i]));
    }
    std::vector<ZMT::IFlowItemHandle> statics;
    reader.ReadStaticItems(statics);
    outcome.m_Problems = reader.GetProblems();
    return outcome;
  }

  VSide m_Writing{77};
  VRecording m_Recording;
};

TEST_F(VDamage, ACutAtAnyChunkBoundaryOrInsideAChunkKeepsTheStatesBefore) {
  const std::vector<std::uint64_t> ends = StateEnds();
  ASSERT_EQ(ends.size(), std::size_t(Frames));
  std::vector<std::uint64_t> cuts;
  for (const VChunk& chunk : Walk(m_Recording.m_Bytes))
    for (std::uint64_t cut : {chunk.m_Position, chunk.m_Position + 3, chunk.m_Position + 8,
                              chunk.m_Position + 8 + chunk.m_Payload / 2})
      if (cut < m_Recording.m_Bytes.size()) cuts.push_back(cut);
  for (std::uint64_t cut : cuts) {
    const std::vector<std::uint8_t> bytes(m_Recording.m_Bytes.begin(),
                                          m_Recording.m_Bytes.begin() + std::int64_t(cut));
    const VOutcome outcome = ReadAll(bytes);
    if (cut < 40) {
      EXPECT_EQ(outcome.m_Open, IResult(IResult::InvalidFormat)) << "cut at " << cut;
      continue;
    }
    EXPECT_EQ(outcome.m_Open, IResult(IResult::OkButPartial)) << "cut at " << cut;
    EXPECT_FALSE(outcome.m_Problems.empty());
    const auto whole = std::size_t(
        std::count_if(ends.begin(), ends.end(), [&](std::uint64_t end) { return end <= cut; }));
    ASSERT_GE(outcome.m_States.size(), whole) << "cut at " << cut;
    for (std::size_t i = 0; i < whole; ++i) {
      EXPECT_EQ(outcome.m_States[i], IResult(IResult::Ok)) << "cut at " << cut << ", state " << i;
      EXPECT_TRUE(outcome.m_Equal[i]) << "cut at " << cut << ", state " << i;
    }
    // The state the cut went through, if found, says it is damaged.
    for (std::size_t i = whole; i < outcome.m_States.size(); ++i)
      EXPECT_EQ(outcome.m_States[i], IResult(IResult::InvalidFormat)) << "cut at " << cut;
  }
}

TEST_F(VDamage, AChunkWithAWrongSizeSpoilsOnlyItsState) {
  // An item of the fourth state claims three bytes more than it has.
  const std::vector<VChunk> headers = Chunks(EChunkType::StateHeader);
  std::vector<std::uint8_t> bytes = m_Recording.m_Bytes;
  const std::uint64_t item = headers[3].End() + 8 + 16 + 4; // past its group of points
  ASSERT_EQ(ValueAt<std::uint16_t>(bytes, item), std::uint16_t(EChunkType::ItemData));
  bytes[item + 4] += 3;
  VOutcome outcome = ReadAll(bytes);
  EXPECT_EQ(outcome.m_Open, IResult(IResult::Ok)); // the index doesn't see inside states
  ASSERT_EQ(outcome.m_States.size(), std::size_t(Frames));
  for (int i = 0; i < Frames; ++i)
    EXPECT_EQ(outcome.m_States[std::size_t(i)],
              i == 3 ? IResult(IResult::InvalidFormat) : IResult(IResult::Ok))
        << i;

  // A state header claiming a huge payload.
  bytes = m_Recording.m_Bytes;
  std::memset(&bytes[headers[1].m_Position + 4], 0xF0, 4);
  outcome = ReadAll(bytes);
  ASSERT_EQ(outcome.m_States.size(), std::size_t(Frames));
  EXPECT_EQ(outcome.m_States[0], IResult(IResult::Ok));
  EXPECT_EQ(outcome.m_States[1], IResult(IResult::InvalidFormat));
  EXPECT_EQ(outcome.m_States[2], IResult(IResult::Ok));
}

TEST_F(VDamage, ABrokenIndexLinkFallsBackToWalkingTheRest) {
  const std::vector<VChunk> indexes = Chunks(EChunkType::SessionIndex);
  ASSERT_EQ(indexes.size(), 2u); // opening and closing
  for (std::uint64_t link : {std::uint64_t(41), std::uint64_t(1) << 40, indexes[0].m_Position}) {
    std::vector<std::uint8_t> bytes = m_Recording.m_Bytes;
    std::memcpy(&bytes[indexes[0].m_Position + 8], &link, 8);
    const VOutcome outcome = ReadAll(bytes);
    EXPECT_EQ(outcome.m_Open, IResult(IResult::OkButPartial));
    ASSERT_FALSE(outcome.m_Problems.empty());
    EXPECT_NE(outcome.m_Problems[0].find("index link"), std::string::npos) << outcome.m_Problems[0];
    ASSERT_EQ(outcome.m_States.size(), std::size_t(Frames));
    for (int i = 0; i < Frames; ++i) {
      EXPECT_EQ(outcome.m_States[std::size_t(i)], IResult(IResult::Ok));
      EXPECT_TRUE(outcome.m_Equal[std::size_t(i)]);
    }
  }
}

TEST_F(VDamage, ItemsOfAnUndefinedTypeAreLeftOutAndSaidSo) {
  std::vector<std::uint8_t> bytes = m_Recording.m_Bytes;
  const std::vector<VChunk> headers = Chunks(EChunkType::StateHeader);
  const std::uint64_t group = headers[2].End();
  ASSERT_EQ(ValueAt<std::uint16_t>(bytes, group), std::uint16_t(EChunkType::ItemGroup));
  const std::uint32_t undefined = 999;
  std::memcpy(&bytes[group + 8 + 8], &undefined, 4);

  VSide reading(88);
  Flow2File::VReader reader = reading.Reader();
  UtilsFileSystem::VMemoryInputStream in(bytes);
  ASSERT_EQ(reader.Open(&in), IResult(IResult::Ok));
  ZMT::IFlowStateHandle state;
  EXPECT_EQ(reader.ReadState(2, state), IResult(IResult::OkButPartial));
  EXPECT_EQ(state->GetItemCount(), 2u); // the event and the shared item; the points left out
  EXPECT_NE(reader.GetProblems().back().find("type 999 has no definition"), std::string::npos);
  EXPECT_EQ(reader.ReadState(3, state), IResult(IResult::Ok));
  EXPECT_TRUE(SameItems(*state, m_Recording.m_Frames[3]));
}

TEST_F(VDamage, ATypeUnknownHereKeepsItsBytes) {
  // The reading side knows points and mixed items, not events.
  VSide reading(88, ZMT::MakeFlowItemFactories<VFlowTestPoint, VFlowTestMixed>());
  Flow2File::VReader reader = reading.Reader();
  UtilsFileSystem::VMemoryInputStream in(m_Recording.m_Bytes);
  ASSERT_EQ(reader.Open(&in), IResult(IResult::Ok));
  ZMT::IFlowStateHandle state;
  ASSERT_EQ(reader.ReadState(4, state), IResult(IResult::Ok));
  ASSERT_EQ(state->GetItemCount(), 5u);
  const ZMT::IFlowItemHandle& event = m_Recording.m_Frames[4][3];
  bool found = false;
  for (std::size_t i = 0; i < state->GetItemCount(); ++i) {
    const ZMT::VFlowStateRecord& record = state->GetRecord(i);
    if (!record.m_Token.IsUnknownType()) continue;
    found = true;
    EXPECT_EQ(record.m_Item->GetInfo().m_Name, "FlowTestEvent");
    EXPECT_EQ(Serialise(*record.m_Item), Serialise(*event));
  }
  EXPECT_TRUE(found);
}

TEST_F(VDamage, SomethingElseIsNotAFlowFile) {
  std::vector<std::uint8_t> bytes(200, 'x');
  EXPECT_EQ(ReadAll(bytes).m_Open, IResult(IResult::InvalidFormat));
  bytes = m_Recording.m_Bytes;
  bytes[24] = 2; // format major
  EXPECT_EQ(ReadAll(bytes).m_Open, IResult(IResult::InvalidVersion));
  EXPECT_EQ(ReadAll({}).m_Open, IResult(IResult::InvalidFormat));
}

} // namespace
