// Store creation, ids, type queries and the failures of bad requests.

#include "StoreFixture.h"

#include "Flow2/Flow2Store/FlowStoreId.h"

#include <gtest/gtest.h>

namespace {

using namespace FlowTest;
using ZMT::IResult;

TEST(FlowStoreId, BytesBecomeAVersion4UuidFoldedToSixtyFourBits) {
  std::array<std::uint8_t, 16> bytes{};
  for (int i = 0; i < 16; ++i)
    bytes[i] = static_cast<std::uint8_t>(0x10 * (i % 16) + i);
  // Byte 6 (0x66) -> 0x46, byte 8 (0x88) -> 0x88; then the halves read big-endian and xored.
  const std::uint64_t high = 0x0011223344554677ull;
  const std::uint64_t low = 0x8899AABBCCDDEEFFull;
  EXPECT_EQ(Flow2Store::FlowStoreIdFromBytes(bytes), high ^ low);
  bytes.fill(0);
  EXPECT_EQ(Flow2Store::FlowStoreIdFromBytes(bytes), 0x0000000000004000ull ^ 0x8000000000000000ull);
}

TEST(FlowStoreId, ZeroAsksForARandomIdAndOtherIdsStay) {
  auto& factory = Flow2Store::GetFlowStoreFactory();
  ZMT::IFlowStoreHandle a, b, one;
  ASSERT_TRUE(factory.CreateStore(a, TestFactories(), 0).IsSuccess());
  ASSERT_TRUE(factory.CreateStore(b, TestFactories(), 0).IsSuccess());
  ASSERT_TRUE(factory.CreateStore(one, TestFactories(), 1).IsSuccess());
  std::uint64_t idA = 0, idB = 0, idOne = 0;
  a->GetFlowStoreId(idA);
  b->GetFlowStoreId(idB);
  one->GetFlowStoreId(idOne);
  EXPECT_NE(idA, 0u);
  EXPECT_NE(idA, idB);
  EXPECT_EQ(idOne, 1u);
  ZMT::IFlowItemHandle item;
  ASSERT_TRUE(one->CreateItem(TypeOf<VFlowTestPoint>(), item).IsSuccess());
  EXPECT_EQ(item.GetToken(), ZMT::IFlowItemToken(1, 101, 1));
}

TEST(FlowStore, ATypeRegisteredTwiceOrANullFactoryIsRefused) {
  auto& factory = Flow2Store::GetFlowStoreFactory();
  ZMT::IFlowStoreHandle store;
  auto twice = ZMT::MakeFlowItemFactories<VFlowTestPoint, VFlowTestEvent, VFlowTestPoint>();
  EXPECT_EQ(factory.CreateStore(store, twice, 5), IResult(IResult::AlreadyPresent));
  EXPECT_FALSE(store);
  auto withNull = TestFactories();
  withNull.push_back(nullptr);
  EXPECT_EQ(factory.CreateStore(store, withNull, 5), IResult(IResult::InvalidPointer));
  EXPECT_FALSE(store);
}

class FlowStoreTypes : public StoreFixture {};

TEST_F(FlowStoreTypes, KnownTypesAreListedAscendingAndFoundByIdAndName) {
  std::vector<std::uint32_t> ids;
  m_Store->GetTypeIds(ids);
  EXPECT_EQ(ids, (std::vector<std::uint32_t>{101, 102, 103}));
  std::vector<ZMT::IFlowItemTypeInfo> infos;
  m_Store->GetTypeInfos(infos);
  ASSERT_EQ(infos.size(), 3u);
  EXPECT_EQ(infos[2].m_Name, "FlowTestMixed");

  ZMT::IFlowItemTypeInfo info;
  ASSERT_TRUE(m_Store->GetTypeInfo(102u, info).IsSuccess());
  EXPECT_EQ(info.m_Name, "FlowTestEvent");
  ASSERT_TRUE(m_Store->GetTypeInfo(std::string("FlowTestPoint"), info).IsSuccess());
  EXPECT_EQ(info.m_TypeId, 101u);
  EXPECT_EQ(info.m_Description, "test point");
}

TEST_F(FlowStoreTypes, UnknownIdsNamesAndVersionsGiveTheirCodes) {
  ZMT::IFlowItemTypeInfo info;
  EXPECT_EQ(m_Store->GetTypeInfo(999u, info), IResult(IResult::InvalidId));
  EXPECT_EQ(m_Store->GetTypeInfo(std::string("NoSuchType"), info), IResult(IResult::InvalidName));

  ZMT::IFlowItemHandle item;
  ZMT::IFlowItemTypeInfo unknown = TypeOf<VFlowTestPoint>();
  unknown.m_TypeId = 999;
  EXPECT_EQ(m_Store->CreateItem(unknown, item), IResult(IResult::InvalidId));
  for (ZMT::IFlowItemVersion version :
       {ZMT::IFlowItemVersion{1, 2, 4}, ZMT::IFlowItemVersion{1, 1, 3},
        ZMT::IFlowItemVersion{2, 2, 3}}) {
    ZMT::IFlowItemTypeInfo other = TypeOf<VFlowTestPoint>();
    other.m_Version = version;
    EXPECT_EQ(m_Store->CreateItem(other, item), IResult(IResult::InvalidVersion));
    std::vector<ZMT::IFlowItemHandle> items;
    EXPECT_EQ(m_Store->CreateItems(other, 3, items), IResult(IResult::InvalidVersion));
    std::uint64_t live, peak, created;
    EXPECT_EQ(m_Store->GetItemCounts(other, live, peak, created), IResult(IResult::InvalidVersion));
  }
  EXPECT_FALSE(item);

  EXPECT_EQ(m_Store->FindItem(ZMT::IFlowItemToken(1, 999, 77), item),
            IResult(IResult::InvalidToken));
  EXPECT_EQ(m_Store->FindItem(ZMT::IFlowItemToken(5, 101, 77), item),
            IResult(IResult::InvalidToken));
  EXPECT_EQ(m_Store->FindItem(ZMT::IFlowItemToken(), item), IResult(IResult::InvalidToken));
}

TEST_F(FlowStoreTypes, EmptyOrForeignHandlesAreInvalid) {
  const ZMT::IFlowBufferConst* pBytes = nullptr;
  ZMT::IFlowItemHandle empty;
  EXPECT_EQ(m_Store->GetItemBuffer(empty, m_Buffers->GetItemWriter(), pBytes),
            IResult(IResult::InvalidHandle));
  bool equal = true;
  EXPECT_EQ(m_Store->CompareItems(empty, empty, m_Buffers->GetItemWriter(), equal),
            IResult(IResult::InvalidHandle));

  ZMT::IFlowStoreHandle other;
  ASSERT_TRUE(
      Flow2Store::GetFlowStoreFactory().CreateStore(other, TestFactories(), 77).IsSuccess());
  ZMT::IFlowItemHandle foreign;
  ASSERT_TRUE(other->CreateItem(TypeOf<VFlowTestPoint>(), foreign).IsSuccess());
  EXPECT_EQ(m_Store->GetItemBuffer(foreign, m_Buffers->GetItemWriter(), pBytes),
            IResult(IResult::InvalidHandle));
  EXPECT_EQ(pBytes, nullptr);
}

TEST_F(FlowStoreTypes, AFactoryThatGivesNoItemIsAnAllocationFailure) {
  auto failing = std::make_shared<ZMT::Detail::VFlowItemFactory<VFlowTestPoint>>(
      []() -> ZMT::IFlowItem* { return nullptr; });
  ZMT::IFlowStoreHandle store;
  ASSERT_TRUE(Flow2Store::GetFlowStoreFactory().CreateStore(store, {failing}, 3).IsSuccess());
  ZMT::IFlowItemHandle item;
  EXPECT_EQ(store->CreateItem(TypeOf<VFlowTestPoint>(), item), IResult(IResult::AllocationFailure));
  std::vector<ZMT::IFlowItemHandle> items(2);
  EXPECT_EQ(store->CreateItems(TypeOf<VFlowTestPoint>(), 4, items),
            IResult(IResult::AllocationFailure));
  EXPECT_TRUE(items.empty());

  auto throwing = std::make_shared<ZMT::Detail::VFlowItemFactory<VFlowTestPoint>>(
      std::function<ZMT::IFlowItem*()>());
  ASSERT_TRUE(Flow2Store::GetFlowStoreFactory().CreateStore(store, {throwing}, 3).IsSuccess());
  EXPECT_EQ(store->CreateItem(TypeOf<VFlowTestPoint>(), item), IResult(IResult::AllocationFailure));
}

TEST_F(FlowStoreTypes, TheStoreLivesAsLongAsAnyOfItsItems) {
  ZMT::IFlowItemHandle item = Create<VFlowTestEvent>();
  item.As<EventItem>()->m_Name = "kept";
  const ZMT::IFlowItemToken token = item.GetToken();
  m_Store.Reset();
  // The item still reaches a working store: its release goes back there.
  EXPECT_EQ(item.As<EventItem>()->m_Name, "kept");
  EXPECT_EQ(token.m_FlowStoreId, 77u);
  item.Reset(); // the last reference: the store goes now (checked by the leak sanitizer)
}

} // namespace
