// States: records in order with their times, the time rules, counts, merging, the pool.

#include "StoreFixture.h"

#include "Flow2/Flow2Types/IFlowState.h"

#include <gtest/gtest.h>

namespace {

using namespace FlowTest;
using ZMT::EMatch;
using ZMT::IFlowItemHandle;
using ZMT::VFlowTimestamp;

VFlowTimestamp At(std::int64_t tick, std::uint64_t period = 0, std::uint32_t session = 1) {
  return VFlowTimestamp{tick, period, session};
}

TEST(FlowTimeMatch, SessionsCompareFirstAndZeroPeriodsCountAsOne) {
  EXPECT_TRUE(ZMT::Matches(At(5), EMatch::Equal, At(5)));
  EXPECT_FALSE(ZMT::Matches(At(5, 0, 1), EMatch::Equal, At(5, 0, 2)));
  EXPECT_TRUE(ZMT::Matches(At(900, 0, 1), EMatch::Before, At(5, 0, 2)));
  EXPECT_FALSE(ZMT::Matches(At(5), EMatch::Before, At(5)));
  EXPECT_TRUE(ZMT::Matches(At(5), EMatch::AtOrBefore, At(5)));
  EXPECT_TRUE(ZMT::Matches(At(1, 0, 3), EMatch::After, At(900, 0, 2)));
  EXPECT_TRUE(ZMT::Matches(At(5), EMatch::AtOrAfter, At(5)));
  EXPECT_FALSE(ZMT::Matches(At(4), EMatch::AtOrAfter, At(5)));
  // Overlap: [5, 6) and [6, 7) with zero periods don't meet; [5, 6) meets itself.
  EXPECT_TRUE(ZMT::Matches(At(5), EMatch::Overlap, At(5)));
  EXPECT_FALSE(ZMT::Matches(At(5), EMatch::Overlap, At(6)));
  EXPECT_TRUE(ZMT::Matches(At(5, 2), EMatch::Overlap, At(6)));
  EXPECT_FALSE(ZMT::Matches(At(5, 2, 1), EMatch::Overlap, At(6, 0, 2)));
}

class FlowState : public StoreFixture {
protected:
  void SetUp() override {
    StoreFixture::SetUp();
    ASSERT_TRUE(Flow2Store::GetFlowStoreFactory().CreateStateFactory(m_States).IsSuccess());
  }
  ZMT::IFlowStateHandle NewState(VFlowTimestamp time) {
    ZMT::IFlowStateHandle state;
    EXPECT_TRUE(m_States->CreateState(state, time, {}, {}).IsSuccess());
    return state;
  }
  ZMT::IFlowStateFactoryHandle m_States;
};

TEST_F(FlowState, RecordsAreOrderedByTypeSessionTickAndItem) {
  auto state = NewState(At(100, 10));
  IFlowItemHandle mixed = Create<VFlowTestMixed>();
  IFlowItemHandle p1 = Create<VFlowTestPoint>();
  IFlowItemHandle p2 = Create<VFlowTestPoint>();
  IFlowItemHandle event = Create<VFlowTestEvent>();
  state->AddItem(mixed);
  EXPECT_TRUE(state->AddItem(p2, At(105)));
  EXPECT_TRUE(state->AddItem(p1, At(105)));
  EXPECT_TRUE(state->AddItem(p2, At(100)));
  state->AddItem(event);
  state->AddItem(IFlowItemHandle()); // ignored
  ASSERT_EQ(state->GetItemCount(), 5u);
  std::vector<std::pair<std::uint32_t, std::int64_t>> order;
  for (auto i = state->Begin(); i != state->End(); ++i)
    order.emplace_back(state->GetRecord(i).m_Token.m_TypeId * 1000 +
                           state->GetRecord(i).m_Token.m_ItemId,
                       state->GetRecord(i).m_Time.m_Tick);
  EXPECT_EQ(order, (std::vector<std::pair<std::uint32_t, std::int64_t>>{
                       {101002, 100}, {101001, 105}, {101002, 105}, {102001, 100}, {103001, 100}}));

  EXPECT_EQ(state->LowerBound(101), 0u);
  EXPECT_EQ(state->UpperBound(101), 3u);
  EXPECT_EQ(state->LowerBound(101, EMatch::After, At(100)), 1u);
  ZMT::VItemHandles items;
  EXPECT_EQ(state->GetItems(items, 101, EMatch::Equal, At(105)), 2u);
  EXPECT_EQ(items[0], p1);
  EXPECT_EQ(state->CountItems(101, EMatch::Equal), 1u);
  IFlowItemHandle first;
  ASSERT_TRUE(state->GetItem(first, 102, EMatch::Overlap));
  EXPECT_EQ(first, event);
  EXPECT_FALSE(state->GetItem(first, 104, EMatch::Overlap));
  EXPECT_EQ(state->CountItems(ZMT::VTypeIds{101, 103}, EMatch::AtOrAfter), 4u);

  ZMT::VTokens tokens;
  state->GetTokens(tokens, 101, EMatch::AtOrAfter);
  EXPECT_EQ(tokens.size(), 2u); // p2 twice, once in the list
  EXPECT_EQ(tokens[0], p1.GetToken());
  VFlowTimestamp time;
  ASSERT_TRUE(state->FindToken(p1.GetToken(), time));
  EXPECT_EQ(time, At(105));
  EXPECT_FALSE(state->FindToken(ZMT::IFlowItemToken(), time));
}

TEST_F(FlowState, HandlesInAStateKeepItemsAliveUntilTheStateGoes) {
  auto state = NewState(At(1));
  IFlowItemHandle item = Create<VFlowTestEvent>();
  item.As<EventItem>()->m_Name = "kept";
  state->AddItem(item);
  item.Reset();
  std::uint64_t live = 0, created = 0;
  Counts(TypeOf<VFlowTestEvent>(), live, created);
  EXPECT_EQ(live, 1u);
  IFlowItemHandle fromState;
  ASSERT_TRUE(state->GetItem(fromState, 102, EMatch::Equal));
  EXPECT_EQ(fromState.As<EventItem>()->m_Name, "kept");
  fromState.Reset();
  state.Reset();
  Counts(TypeOf<VFlowTestEvent>(), live, created);
  EXPECT_EQ(live, 0u);
}

TEST_F(FlowState, BeforeAndAfterCountOnlyTheStatesSession) {
  auto state = NewState(At(100, 10));
  EXPECT_TRUE(state->AddItem(Create<VFlowTestPoint>(), At(100, 10))); // own time: neither
  EXPECT_EQ(state->GetBeforeCount(), 0u);
  EXPECT_EQ(state->GetAfterCount(), 0u);
  EXPECT_TRUE(state->AddItem(Create<VFlowTestPoint>(), At(95, 10)));  // starts before
  EXPECT_TRUE(state->AddItem(Create<VFlowTestPoint>(), At(105, 10))); // ends after
  EXPECT_TRUE(state->AddItem(Create<VFlowTestPoint>(), At(90, 40)));  // both
  EXPECT_EQ(state->GetBeforeCount(), 2u);
  EXPECT_EQ(state->GetAfterCount(), 2u);
  state->Erase(state->Begin()); // the one at 90
  EXPECT_EQ(state->GetBeforeCount(), 1u);
  EXPECT_EQ(state->GetAfterCount(), 1u);
  EXPECT_EQ(state->RemoveMatching(EMatch::Before), 1u);
  EXPECT_EQ(state->GetBeforeCount(), 0u);
}

TEST_F(FlowState, TimesOutsideTheStateAreRefusedWithoutChange) {
  auto state = NewState(At(100, 0, 1));
  const std::uint64_t revision = state->GetRevision();
  IFlowItemHandle item = Create<VFlowTestPoint>();
  EXPECT_FALSE(state->AddItem(item, At(100, 0, 2))); // another session
  EXPECT_FALSE(state->AddItem(item, At(101)));       // zero periods: [100,101) and [101,102)
  EXPECT_FALSE(state->AddItems({item}, At(99)));
  EXPECT_EQ(state->GetItemCount(), 0u);
  EXPECT_EQ(state->GetRevision(), revision);
  EXPECT_TRUE(state->AddItem(item, At(99, 2))); // [99,101) meets [100,101)
  EXPECT_GT(state->GetRevision(), revision);
}

TEST_F(FlowState, SetTimeKeepsOverlappingRecordsOfTheSameSessionOnly) {
  auto state = NewState(At(100, 20));
  state->AddItem(Create<VFlowTestPoint>(), At(100, 5));
  state->AddItem(Create<VFlowTestPoint>(), At(115, 5));
  state->SetTime(At(110, 20));
  ASSERT_EQ(state->GetItemCount(), 1u);
  EXPECT_EQ(state->GetRecord(0).m_Time.m_Tick, 115);
  state->SetTime(At(115, 0, 2));
  EXPECT_EQ(state->GetItemCount(), 0u);
}

TEST_F(FlowState, ShiftTimeMovesRecordsAndWrapsThePeriodicReference) {
  ZMT::IFlowStateHandle state;
  ASSERT_TRUE(m_States->CreateState(state, At(100), At(7, 10), At(1000)).IsSuccess());
  EXPECT_EQ(state->GetPeriodicReference().m_Tick, 7);
  state->AddItem(Create<VFlowTestPoint>());
  state->ShiftTime(-25, true, true);
  EXPECT_EQ(state->GetTime().m_Tick, 75);
  EXPECT_EQ(state->GetRecord(0).m_Time.m_Tick, 75);
  EXPECT_EQ(state->GetPeriodicReference().m_Tick, 2); // 7 - 25 = -18 -> 2
  EXPECT_EQ(state->GetAbsoluteReference().m_Tick, 975);
  state->ShiftTime(-3, true, false);
  EXPECT_EQ(state->GetPeriodicReference().m_Tick, 9);
  EXPECT_EQ(state->GetAbsoluteReference().m_Tick, 975);
  state->SetPeriodicReference(At(-1, 4));
  EXPECT_EQ(state->GetPeriodicReference().m_Tick, 3);

  state->ShiftSession(2);
  EXPECT_EQ(state->GetTime().m_Session, 3u);
  EXPECT_EQ(state->GetRecord(0).m_Time.m_Session, 3u);
}

TEST_F(FlowState, MergeKeepsPresentRecordsAndCopiesNeedEqualTimes) {
  auto a = NewState(At(100));
  auto b = NewState(At(100));
  IFlowItemHandle shared = Create<VFlowTestPoint>();
  IFlowItemHandle onlyB = Create<VFlowTestEvent>();
  a->AddItem(shared);
  b->AddItem(shared);
  b->AddItem(onlyB);
  ASSERT_TRUE(a->Merge(*b));
  EXPECT_EQ(a->GetItemCount(), 2u);
  auto other = NewState(At(100, 0, 9));
  EXPECT_FALSE(a->Merge(*other));

  auto c = NewState(At(100));
  EXPECT_TRUE(c->CopyTypes(*b, {102}));
  EXPECT_EQ(c->GetItemCount(), 1u);
  EXPECT_FALSE(other->CopyFrom(*b));
  EXPECT_EQ(other->GetItemCount(), 0u);

  ZMT::IFlowStateHandle copy;
  ASSERT_TRUE(m_States->CreateStateCopy(copy, *b).IsSuccess());
  EXPECT_EQ(copy->GetItemCount(), 2u);
  EXPECT_EQ(copy->GetTime(), b->GetTime());
  EXPECT_EQ(copy->RetainTypes({101}), 1u);
  EXPECT_EQ(copy->GetItemCount(), 1u);
  EXPECT_EQ(b->GetItemCount(), 2u);
}

TEST_F(FlowState, ReleasedStatesComeBackClearedFromThePool) {
  auto state = NewState(At(5));
  state->Reserve(64);
  state->AddItem(Create<VFlowTestPoint>());
  ZMT::IFlowState* const pState = state.Get();
  state.Reset();
  auto again = NewState(At(6));
  EXPECT_EQ(again.Get(), pState);
  EXPECT_EQ(again->GetItemCount(), 0u);
  EXPECT_GE(again->GetCapacity(), 64u);
  EXPECT_EQ(again->GetTime(), At(6));
  EXPECT_EQ(again->GetFactory(), m_States.Get());
}

} // namespace
