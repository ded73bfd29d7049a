// An item's life: create, hold, release, cached, found again, reused, recycled; and items from
// bytes.

#include "StoreFixture.h"

#include "Flow2/Flow2Store/VFlowStore.h"

#include <gtest/gtest.h>

namespace {

using namespace FlowTest;
using ZMT::IFlowItemHandle;
using ZMT::IFlowItemToken;
using ZMT::IResult;

class FlowItemLife : public StoreFixture {
protected:
  std::uint64_t FreeCount(std::uint32_t typeId) {
    return static_cast<Flow2Store::VFlowStore*>(m_Store.Get())->GetFreeCount(typeId);
  }
};

TEST_F(FlowItemLife, CreateHoldReleaseFindAndReuse) {
  IFlowItemHandle item = Create<VFlowTestEvent>();
  ASSERT_TRUE(item);
  EXPECT_EQ(item.GetToken(), IFlowItemToken(1, 102, 77));
  EXPECT_EQ(item.GetEntry()->m_RefCount.load(), 0u); // one owner
  item.As<EventItem>()->m_Name = "first";
  ZMT::IFlowItem* const pItem = item.Get();

  std::uint64_t live = 0, created = 0;
  {
    IFlowItemHandle second = item; // hold
    EXPECT_EQ(item.GetEntry()->m_RefCount.load(), 1u);
    item.Reset();
    Counts(TypeOf<VFlowTestEvent>(), live, created);
    EXPECT_EQ(live, 1u);
  }
  Counts(TypeOf<VFlowTestEvent>(), live, created);
  EXPECT_EQ(live, 0u);
  EXPECT_EQ(FreeCount(102), 1u);

  // Cached: still found by its token, and live again.
  IFlowItemHandle found;
  ASSERT_TRUE(m_Store->FindItem(IFlowItemToken(1, 102, 77), found).IsSuccess());
  EXPECT_EQ(found.Get(), pItem);
  EXPECT_EQ(found.As<EventItem>()->m_Name, "first");
  Counts(TypeOf<VFlowTestEvent>(), live, created);
  EXPECT_EQ(live, 1u);
  EXPECT_EQ(FreeCount(102), 0u);
  // Finding a live item adds an owner.
  IFlowItemHandle again;
  ASSERT_TRUE(m_Store->FindItem(IFlowItemToken(1, 102, 77), again).IsSuccess());
  EXPECT_EQ(again, found);
  EXPECT_EQ(found.GetEntry()->m_RefCount.load(), 1u);
  found.Reset();
  again.Reset();

  // Reuse: the slot comes back cleared, with a new token; the old token is gone.
  IFlowItemHandle reused = Create<VFlowTestEvent>();
  EXPECT_EQ(reused.Get(), pItem);
  EXPECT_EQ(reused.GetToken(), IFlowItemToken(2, 102, 77));
  EXPECT_EQ(reused.As<EventItem>()->m_Name, "");
  EXPECT_EQ(reused.As<EventItem>()->m_Text, "none");
  EXPECT_EQ(m_Store->FindItem(IFlowItemToken(1, 102, 77), found), IResult(IResult::InvalidToken));
  Counts(TypeOf<VFlowTestEvent>(), live, created);
  EXPECT_EQ(created, 1u);
}

TEST_F(FlowItemLife, TheFreeListDropsItsTwoOldestPastOneHundred) {
  std::vector<IFlowItemHandle> items;
  ASSERT_TRUE(m_Store->CreateItems(TypeOf<VFlowTestPoint>(), 102, items).IsSuccess());
  ASSERT_EQ(items.size(), 102u);
  EXPECT_EQ(items[101].GetToken().m_ItemId, 102u);
  for (int i = 0; i < 100; ++i)
    items[i].Reset();
  EXPECT_EQ(FreeCount(101), 100u);
  items[100].Reset(); // 101 free, 1 live: the two oldest go
  EXPECT_EQ(FreeCount(101), 99u);
  IFlowItemHandle found;
  EXPECT_EQ(m_Store->FindItem(IFlowItemToken(1, 101, 77), found), IResult(IResult::InvalidToken));
  EXPECT_EQ(m_Store->FindItem(IFlowItemToken(2, 101, 77), found), IResult(IResult::InvalidToken));
  ASSERT_TRUE(m_Store->FindItem(IFlowItemToken(3, 101, 77), found).IsSuccess());
  found.Reset();
  items[101].Reset(); // 100 free: not over the limit
  EXPECT_EQ(FreeCount(101), 100u);
}

// More items than buckets, so that every bucket chains several: live, cached and reused items
// are each found, or not, by their own token.
TEST_F(FlowItemLife, MoreItemsThanBucketsAreFoundByTokenThroughReuse) {
  constexpr std::uint32_t Count = 20000;
  std::vector<IFlowItemHandle> items;
  ASSERT_TRUE(m_Store->CreateItems(TypeOf<VFlowTestPoint>(), Count, items).IsSuccess());
  for (std::uint32_t i = 0; i < Count; i += 2)
    items[i].Reset(); // ids 1, 3, 5, ... are cached
  std::vector<IFlowItemHandle> reused;
  ASSERT_TRUE(m_Store->CreateItems(TypeOf<VFlowTestPoint>(), 3000, reused).IsSuccess());
  EXPECT_EQ(reused.back().GetToken().m_ItemId, Count + 3000);

  IFlowItemHandle found;
  for (std::uint32_t id = 1; id <= Count + 3000; ++id) {
    const IResult result = m_Store->FindItem(IFlowItemToken(id, 101, 77), found);
    // The 3000 oldest cached slots (ids 1, 3, ..., 5999) took the new ids.
    const bool gone = id <= 6000 && id % 2 == 1;
    ASSERT_EQ(result.IsSuccess(), !gone) << "id " << id;
    if (!gone) {
      ASSERT_EQ(found.GetToken().m_ItemId, id);
    }
    found.Reset();
  }
  // A token of another store with the same item id is another item.
  EXPECT_EQ(m_Store->FindItem(IFlowItemToken(2, 101, 78), found), IResult(IResult::InvalidToken));
}

TEST_F(FlowItemLife, ARecycledItemIsRebuiltOnlyWhenItLastHeldMuch) {
  std::uint64_t live = 0, created = 0;
  for (int i = 0; i < 402; ++i) {
    IFlowItemHandle item = Create<VFlowTestMixed>(); // 1 creation, 401 reuses
    item.As<MixedItem>()->m_Ids.assign(100, 7u);
  }
  Counts(TypeOf<VFlowTestMixed>(), live, created);
  EXPECT_EQ(created, 1u); // a small item keeps its slot past the countdown

  // One that last held more than 64 KiB is rebuilt when its next countdown runs out.
  for (int i = 0; i < 440; ++i) {
    IFlowItemHandle item = Create<VFlowTestMixed>();
    item.As<MixedItem>()->m_Ids.assign(20000, 7u);
  }
  Counts(TypeOf<VFlowTestMixed>(), live, created);
  EXPECT_EQ(created, 2u);
  IFlowItemHandle item = Create<VFlowTestMixed>();
  EXPECT_TRUE(item.As<MixedItem>()->m_Ids.empty());
}

TEST_F(FlowItemLife, CountedCreateReleasesWhatTheVectorHeld) {
  std::vector<IFlowItemHandle> items;
  ASSERT_TRUE(m_Store->CreateItems(TypeOf<VFlowTestPoint>(), 5, items).IsSuccess());
  const IFlowItemToken first = items[0].GetToken();
  ASSERT_TRUE(m_Store->CreateItems(TypeOf<VFlowTestPoint>(), 3, items).IsSuccess());
  ASSERT_EQ(items.size(), 3u);
  std::uint64_t live = 0, created = 0;
  Counts(TypeOf<VFlowTestPoint>(), live, created);
  EXPECT_EQ(live, 3u);
  EXPECT_EQ(created, 5u); // the new three reused released slots
  EXPECT_NE(items[0].GetToken(), first);
}

TEST_F(FlowItemLife, ItemsComeFromBytesOnceAndAreSharedAfterwards) {
  MixedItem source;
  source.m_Ids = {1, 2, 3};
  source.m_Values["a"] = 1.0;
  const IFlowItemToken token(9, 103, 1234);

  IFlowItemHandle item;
  ASSERT_TRUE(m_Store->GetOrCreateItem(token, BytesOf(source), item).IsSuccess());
  EXPECT_EQ(item.GetToken(), token);
  EXPECT_EQ(item.As<MixedItem>()->m_Ids, source.m_Ids);

  // The second call frees the second buffer and returns the first item.
  const std::uint32_t references = m_Buffers->GetReferenceCount();
  ZMT::IFlowBuffer* pSecond = BytesOf(source);
  EXPECT_EQ(m_Buffers->GetReferenceCount(), references + 1);
  IFlowItemHandle second;
  ASSERT_TRUE(m_Store->GetOrCreateItem(token, pSecond, second).IsSuccess());
  EXPECT_EQ(second, item);
  EXPECT_EQ(m_Buffers->GetReferenceCount(), references);

  // The bytes it was read from are its cached serialised form.
  const ZMT::IFlowBufferConst* pBytes = nullptr;
  ASSERT_TRUE(m_Store->GetItemBuffer(item, m_Buffers->GetItemWriter(), pBytes).IsSuccess());
  EXPECT_EQ(pBytes->GetChainSize(), source.GetSize());
}

TEST_F(FlowItemLife, BytesThatDontReadAreRefusedAndNothingIsKept) {
  MixedItem source;
  source.m_Ids.assign(2000, 7); // two pages
  ZMT::IFlowBuffer* pBytes = BytesOf(source);
  ASSERT_NE(pBytes->GetNext(), nullptr);
  pBytes->GetMutableNext()->SetSize(10); // cut the second page short
  const IFlowItemToken token(4, 103, 99);
  IFlowItemHandle item;
  EXPECT_EQ(m_Store->GetOrCreateItem(token, pBytes, item), IResult(IResult::SerialisationFailure));
  EXPECT_FALSE(item);
  EXPECT_EQ(m_Store->FindItem(token, item), IResult(IResult::InvalidToken));
  std::uint64_t live = 0, created = 0;
  Counts(TypeOf<VFlowTestMixed>(), live, created);
  EXPECT_EQ(live, 0u);

  // The failed slot is reused cleanly.
  ASSERT_TRUE(m_Store->GetOrCreateItem(token, BytesOf(source), item).IsSuccess());
  EXPECT_EQ(item.As<MixedItem>()->m_Ids.size(), 2000u);

  EXPECT_EQ(m_Store->GetOrCreateItem(IFlowItemToken(1, 555, 1), BytesOf(source), item),
            IResult(IResult::InvalidToken));
  EXPECT_EQ(m_Store->GetOrCreateItem(token, nullptr, item), IResult(IResult::InvalidPointer));
}

TEST_F(FlowItemLife, ItemBytesAreMadeOnceAndCompared) {
  IFlowItemHandle a = Create<VFlowTestEvent>();
  IFlowItemHandle b = Create<VFlowTestEvent>();
  IFlowItemHandle c = Create<VFlowTestEvent>();
  a.As<EventItem>()->m_Name = "same";
  b.As<EventItem>()->m_Name = "same";
  c.As<EventItem>()->m_Name = "same!";
  auto& writer = m_Buffers->GetItemWriter();
  const ZMT::IFlowBufferConst* pFirst = nullptr;
  const ZMT::IFlowBufferConst* pAgain = nullptr;
  ASSERT_TRUE(m_Store->GetItemBuffer(a, writer, pFirst).IsSuccess());
  ASSERT_TRUE(m_Store->GetItemBuffer(a, writer, pAgain).IsSuccess());
  EXPECT_EQ(pFirst, pAgain);
  EXPECT_EQ(pFirst->GetChainSize(), a->GetSize());

  bool equal = false;
  ASSERT_TRUE(m_Store->CompareItems(a, b, writer, equal).IsSuccess());
  EXPECT_TRUE(equal);
  ASSERT_TRUE(m_Store->CompareItems(a, c, writer, equal).IsSuccess());
  EXPECT_FALSE(equal); // c is one byte longer
  c.As<EventItem>()->m_Name = "same";
}

TEST_F(FlowItemLife, LargeItemsCompareAcrossPageBoundaries) {
  IFlowItemHandle a = Create<VFlowTestMixed>();
  IFlowItemHandle b = Create<VFlowTestMixed>();
  a.As<MixedItem>()->m_Ids.assign(3000, 1);
  b.As<MixedItem>()->m_Ids.assign(3000, 1);
  b.As<MixedItem>()->m_Ids[2500] = 2; // on the third page
  bool equal = true;
  ASSERT_TRUE(m_Store->CompareItems(a, b, m_Buffers->GetItemWriter(), equal).IsSuccess());
  EXPECT_FALSE(equal);
  ASSERT_TRUE(m_Store->CompareItems(a, a, m_Buffers->GetItemWriter(), equal).IsSuccess());
  EXPECT_TRUE(equal);
}

} // namespace
