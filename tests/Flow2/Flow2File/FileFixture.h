#pragma once
// Writing small recordings into memory and reading them back, with a raw walk over the chunks for
// checks on the layout.

#include "EvolvingTypes.h"
#include "FlowTestTypes.h"

#include "Flow2/Flow2File/VReader.h"
#include "Flow2/Flow2File/VWriter.h"
#include "Flow2/Flow2Store/VFlowStoreFactory.h"
#include "Flow2/Flow2Types/CreateFlowItem.h"
#include "Utils/UtilsFileSystem/MemoryStreams.h"

#include <gtest/gtest.h>

#include <cstring>
#include <vector>

namespace FlowTest {

constexpr std::int64_t Period = 135000000 / 100;

struct VChunk {
  std::uint64_t m_Position = 0;
  std::uint16_t m_Type = 0;
  std::uint16_t m_Flags = 0;
  std::uint32_t m_Payload = 0;
  std::uint64_t End() const { return m_Position + 8 + m_Payload; }
};

/// Every chunk of a well-formed file, in order.
inline std::vector<VChunk> Walk(const std::vector<std::uint8_t>& bytes) {
  std::vector<VChunk> chunks;
  std::uint64_t position = 0;
  while (position + 8 <= bytes.size()) {
    VChunk chunk;
    chunk.m_Position = position;
    std::memcpy(&chunk.m_Type, &bytes[position], 2);
    std::memcpy(&chunk.m_Flags, &bytes[position + 2], 2);
    std::memcpy(&chunk.m_Payload, &bytes[position + 4], 4);
    chunks.push_back(chunk);
    position = chunk.End();
  }
  return chunks;
}

template <class T> T ValueAt(const std::vector<std::uint8_t>& bytes, std::uint64_t position) {
  T value{};
  std::memcpy(&value, &bytes[position], sizeof(T));
  return value;
}

/// A store of the test types; the writing side and the reading side each have one.
struct VSide {
  explicit VSide(std::uint64_t storeId, ZMT::IFlowItemFactories factories = TestFactories()) {
    auto& factory = Flow2Store::GetFlowStoreFactory();
    EXPECT_TRUE(factory.CreateStore(m_Store, factories, storeId).IsSuccess());
    EXPECT_TRUE(factory.CreateBufferFactory(m_Buffers, nullptr).IsSuccess());
    EXPECT_TRUE(factory.CreateStateFactory(m_States).IsSuccess());
  }
  template <class T> ZMT::IFlowItemHandle Create() {
    ZMT::IFlowItemHandle item;
    EXPECT_NE(ZMT::CreateFlowItem<T>(m_Store, item), nullptr);
    return item;
  }
  ZMT::IFlowStateHandle State(std::int64_t frame, std::uint32_t session = 1) {
    ZMT::IFlowStateHandle state;
    EXPECT_TRUE(
        m_States->CreateState(state, {frame * Period, std::uint64_t(Period), session}, {}, {})
            .IsSuccess());
    return state;
  }
  Flow2File::VReader Reader() { return Flow2File::VReader(m_Store, m_Buffers, m_States); }

  ZMT::IFlowStoreHandle m_Store;
  ZMT::IFlowBufferFactoryHandle m_Buffers;
  ZMT::IFlowStateFactoryHandle m_States;
};

/// The items of one written state, kept to compare with what is read.
using VFrame = std::vector<ZMT::IFlowItemHandle>;

/// A recording: per frame three new points and an event with its own time, and one mixed item
/// that every frame shares; the shared item is also written as a static item at the end.
struct VRecording {
  std::vector<VFrame> m_Frames;
  ZMT::IFlowItemHandle m_Shared;
  std::vector<std::uint8_t> m_Bytes;
};

/// `withStore`: bodies from the store's cached bytes rather than serialised by the writer.
inline VRecording Record(VSide& side, int frames, bool withStore = true) {
  VRecording recording;
  recording.m_Shared = side.Create<VFlowTestMixed>();
  auto* pMixed = recording.m_Shared.As<MixedItem>();
  pMixed->m_Ids = {4, 5, 6};
  pMixed->m_Values = {{"gain", 1.5}, {"offset", -2}};
  pMixed->m_Kind = EKind::Segment;
  pMixed->m_Points = {VPoint{1, 2, 3, 4}};

  UtilsFileSystem::VMemoryOutputStream out;
  Flow2File::VWriter writer(side.m_Buffers, side.m_Store);
  writer.SetUseStoreBuffers(withStore);
  EXPECT_TRUE(writer.Open(&out).IsSuccess());
  for (int f = 0; f < frames; ++f) {
    ZMT::IFlowStateHandle state = side.State(f);
    VFrame frame;
    for (int i = 0; i < 3; ++i) {
      auto point = side.Create<VFlowTestPoint>();
      auto* p = point.As<PointItem>();
      p->m_X = f;
      p->m_Y = i;
      p->m_Z = f * 0.001 + i;
      p->m_Quality = static_cast<std::uint32_t>(f * 10 + i);
      state->AddItem(point);
      frame.push_back(point);
    }
    auto event = side.Create<VFlowTestEvent>();
    event.As<EventItem>()->m_Name = "frame " + std::to_string(f);
    event.As<EventItem>()->m_Tick = f;
    // A time inside the frame but not the frame's own.
    EXPECT_TRUE(state->AddItem(event, {f * Period + Period / 2, 0, 1}));
    frame.push_back(event);
    state->AddItem(recording.m_Shared);
    frame.push_back(recording.m_Shared);
    EXPECT_TRUE(writer.WriteState(*state).IsSuccess());
    recording.m_Frames.push_back(std::move(frame));
  }
  EXPECT_TRUE(writer.WriteItems({recording.m_Shared}, false).IsSuccess());
  EXPECT_TRUE(writer.Close().IsSuccess());
  recording.m_Bytes = out.Bytes();
  return recording;
}

/// Whether a read state holds exactly the frame's items, byte for byte, with their tokens.
inline ::testing::AssertionResult SameItems(const ZMT::IFlowState& state, const VFrame& frame) {
  if (state.GetItemCount() != frame.size())
    return ::testing::AssertionFailure()
           << state.GetItemCount() << " items read, " << frame.size() << " written";
  for (const ZMT::IFlowItemHandle& written : frame) {
    ZMT::VItemHandles found;
    state.GetItems(found, ZMT::VTokens{written.GetToken()});
    if (found.size() != 1)
      return ::testing::AssertionFailure() << "token " << written.GetToken().m_ItemId << " missing";
    if (Serialise(*found[0]) != Serialise(*written))
      return ::testing::AssertionFailure() << "item " << written.GetToken().m_ItemId << " differs";
  }
  return ::testing::AssertionSuccess();
}

} // namespace FlowTest
