// Threads sharing one store: handles copied and moved across threads, and four workers creating,
// filling, finding and releasing items and states of several types.

#include "StoreFixture.h"

#include "Flow2/Flow2Types/IFlowState.h"

#include <gtest/gtest.h>

#include <atomic>
#include <random>
#include <thread>
#include <vector>

namespace {

using namespace FlowTest;
using ZMT::IFlowItemHandle;

class FlowThreads : public StoreFixture {};

TEST_F(FlowThreads, HandlesCopiedAndMovedAcrossThreadsCountEveryOwner) {
  IFlowItemHandle item = Create<VFlowTestEvent>();
  item.As<EventItem>()->m_Name = "shared";
  std::vector<std::thread> threads;
  std::atomic<int> seen{0};
  for (int t = 0; t < 4; ++t)
    threads.emplace_back([copy = item, &seen]() mutable {
      std::vector<IFlowItemHandle> copies(1000, copy);
      IFlowItemHandle moved = std::move(copy);
      if (moved.As<EventItem>()->m_Name == "shared") ++seen;
      copies.clear();
    });
  for (auto& thread : threads)
    thread.join();
  EXPECT_EQ(seen.load(), 4);
  EXPECT_EQ(item.GetEntry()->m_RefCount.load(), 0u);

  // The last owner may be another thread: the item goes back to its store from there.
  std::thread last([moved = std::move(item)]() mutable { moved.Reset(); });
  last.join();
  std::uint64_t live = 0, created = 0;
  Counts(TypeOf<VFlowTestEvent>(), live, created);
  EXPECT_EQ(live, 0u);
}

TEST_F(FlowThreads, FourWorkersStreamItemsAndStatesConcurrently) {
  ZMT::IFlowStateFactoryHandle states;
  ASSERT_TRUE(Flow2Store::GetFlowStoreFactory().CreateStateFactory(states).IsSuccess());
  constexpr int Frames = 1000;
  std::atomic<int> failures{0};
  std::atomic<std::uint64_t> found{0};

  auto worker = [&](unsigned seed) {
    std::mt19937 random(seed);
    std::vector<IFlowItemHandle> points;
    std::vector<ZMT::IFlowItemToken> recent;
    for (int frame = 0; frame < Frames; ++frame) {
      ZMT::IFlowStateHandle state;
      const ZMT::VFlowTimestamp time{frame, 1, 1};
      if (states->CreateState(state, time, {}, {}).IsFailure()) ++failures;
      if (m_Store->CreateItems(TypeOf<VFlowTestPoint>(), 1 + random() % 20, points).IsFailure())
        ++failures;
      for (auto& point : points) {
        point.As<PointItem>()->m_X = frame;
        state->AddItem(point);
      }
      IFlowItemHandle event = Create<VFlowTestEvent>();
      event.As<EventItem>()->m_Name = std::to_string(seed);
      state->AddItem(event);
      IFlowItemHandle mixed = Create<VFlowTestMixed>();
      mixed.As<MixedItem>()->m_Ids.assign(random() % 1500, frame); // up to two pages
      state->AddItem(mixed);
      const ZMT::IFlowBufferConst* pBytes = nullptr;
      if (m_Store->GetItemBuffer(mixed, m_Buffers->GetItemWriter(), pBytes).IsFailure() ||
          pBytes->GetChainSize() != mixed->GetSize())
        ++failures;
      recent.push_back(event.GetToken());

      // Look up tokens this or other threads released: cached items come back, others are gone.
      for (int i = 0; i < 3 && !recent.empty(); ++i) {
        IFlowItemHandle hit;
        if (m_Store->FindItem(recent[random() % recent.size()], hit).IsSuccess()) {
          ++found;
          if (hit.As<EventItem>()->m_Name.empty()) ++failures;
        }
      }
      if (recent.size() > 64) recent.erase(recent.begin(), recent.begin() + 32);

      // Hand the state to a copy now and then, so states are copied while items are shared.
      if (frame % 50 == 0) {
        ZMT::IFlowStateHandle copy;
        if (states->CreateStateCopy(copy, *state).IsFailure() ||
            copy->GetItemCount() != state->GetItemCount())
          ++failures;
      }
      if (state->CountItems(101, ZMT::EMatch::Equal) != points.size()) ++failures;
      points.clear();
    }
  };

  std::vector<std::thread> threads;
  for (unsigned t = 0; t < 4; ++t)
    threads.emplace_back(worker, 1000 + t);
  for (auto& thread : threads)
    thread.join();

  EXPECT_EQ(failures.load(), 0);
  EXPECT_GT(found.load(), 0u);
  std::vector<ZMT::IFlowItemCounts> counts;
  m_Store->GetAllCounts(counts);
  for (const auto& count : counts) {
    EXPECT_EQ(count.m_Live, 0u) << count.m_Name;
    EXPECT_LE(count.m_Peak, 4u * 21u) << count.m_Name;
  }
}

} // namespace
