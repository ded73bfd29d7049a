// Types this process doesn't know, and the rule that picks a reader for a file's type.

#include "StoreFixture.h"

#include <gtest/gtest.h>

namespace {

using namespace FlowTest;
using ZMT::IFlowItemHandle;
using ZMT::IFlowItemToken;
using ZMT::IFlowItemTypeInfo;
using ZMT::IResult;

/// The local id worked out by hand: seed 0, combined with id, major, minor, patch, top bit set.
std::uint32_t ExpectedLocalId(std::uint32_t id, std::uint32_t major, std::uint32_t minor,
                              std::uint32_t patch) {
  std::uint32_t seed = 0;
  for (std::uint32_t value : {id, major, minor, patch})
    seed ^= value + 0x9e3779b9u + (seed << 6) + (seed >> 2);
  return seed | 0x80000000u;
}

IFlowItemTypeInfo ForeignType() {
  return IFlowItemTypeInfo{"FlowForeign", 4000, {3, 1, 0}, "made elsewhere"};
}

class FlowUnknownTypes : public StoreFixture {};

TEST_F(FlowUnknownTypes, RegistrationGivesALocalIdAndChecksRepeats) {
  const ZMT::ISchema& schema = ZMT::Detail::FlowTypeStatics<VFlowTestEvent>().m_Schema;
  std::uint32_t typeId = 0;
  ASSERT_TRUE(m_Store->RegisterUnknownType(ForeignType(), schema, typeId).IsSuccess());
  EXPECT_EQ(typeId, ExpectedLocalId(4000, 3, 1, 0));
  EXPECT_NE(typeId & 0x80000000u, 0u);

  std::uint32_t again = 0;
  EXPECT_TRUE(m_Store->RegisterUnknownType(ForeignType(), schema, again).IsSuccess());
  EXPECT_EQ(again, typeId);
  IFlowItemTypeInfo renamed = ForeignType();
  renamed.m_Description = "other";
  EXPECT_EQ(m_Store->RegisterUnknownType(renamed, schema, again), IResult(IResult::Failed));
  const ZMT::ISchema& otherSchema = ZMT::Detail::FlowTypeStatics<VFlowTestPoint>().m_Schema;
  EXPECT_EQ(m_Store->RegisterUnknownType(ForeignType(), otherSchema, again),
            IResult(IResult::InvalidVersion));
}

TEST_F(FlowUnknownTypes, UnknownItemsKeepTheirBytesForARewrite) {
  const ZMT::ISchema& schema = ZMT::Detail::FlowTypeStatics<VFlowTestEvent>().m_Schema;
  std::uint32_t typeId = 0;
  ASSERT_TRUE(m_Store->RegisterUnknownType(ForeignType(), schema, typeId).IsSuccess());
  EventItem source;
  source.m_Name = std::string(5000, 'x'); // over a page
  const auto expected = Serialise(source);

  const IFlowItemToken token(3, typeId, 42);
  IFlowItemHandle item;
  ASSERT_TRUE(m_Store->GetOrCreateItem(token, BytesOf(source), item).IsSuccess());
  EXPECT_EQ(item->GetInfo().m_Name, "FlowForeign");
  EXPECT_EQ(item->GetSchema(), schema);
  EXPECT_EQ(item->GetSize(), expected.size());
  EXPECT_EQ(Serialise(*item), expected);
  std::string tag = "untouched";
  EXPECT_FALSE(item->GetTag(ZMT::TagId(2), tag));
  std::vector<std::uint8_t> none;
  VBytesIn in(none);
  EXPECT_FALSE(item->Read(in));

  // Found by token like any other item, cached after release too.
  IFlowItemHandle found;
  ASSERT_TRUE(m_Store->FindItem(token, found).IsSuccess());
  EXPECT_EQ(found, item);
  item.Reset();
  found.Reset();
  ASSERT_TRUE(m_Store->FindItem(token, found).IsSuccess());
  const ZMT::IFlowBufferConst* pBytes = nullptr;
  ASSERT_TRUE(m_Store->GetItemBuffer(found, m_Buffers->GetItemWriter(), pBytes).IsSuccess());
  EXPECT_EQ(pBytes->GetChainSize(), expected.size());

  // An unregistered local id has no type.
  EXPECT_EQ(m_Store->GetOrCreateItem(IFlowItemToken(1, 0x80000123u, 42), BytesOf(source), item),
            IResult(IResult::InvalidType));
}

TEST_F(FlowUnknownTypes, ReaderRuleFollowsNameIdAndVersion) {
  ZMT::IFlowItemFromBytes reader;
  const ZMT::ISchema& pointSchema = ZMT::Detail::FlowTypeStatics<VFlowTestPoint>().m_Schema;
  const ZMT::ISchema& eventSchema = ZMT::Detail::FlowTypeStatics<VFlowTestEvent>().m_Schema;
  auto with = [](ZMT::IFlowItemVersion version) {
    IFlowItemTypeInfo type = TypeOf<VFlowTestPoint>();
    type.m_Version = version;
    return type;
  };

  // Same type: native reader, and it makes items in this store.
  ASSERT_TRUE(m_Store->GetReader(TypeOf<VFlowTestPoint>(), pointSchema, reader).IsSuccess());
  PointItem source;
  source.m_Y = 4;
  IFlowItemHandle item;
  ASSERT_TRUE(reader(IFlowItemToken(1, 101, 5), BytesOf(source), item).IsSuccess());
  EXPECT_EQ(item.As<PointItem>()->m_Y, 4);
  EXPECT_EQ(reader(IFlowItemToken(2, 101, 5), nullptr, item), IResult(IResult::InvalidPointer));

  EXPECT_EQ(m_Store->GetReader(with({2, 2, 3}), pointSchema, reader),
            IResult(IResult::InvalidType));
  EXPECT_EQ(m_Store->GetReader(with({1, 3, 0}), pointSchema, reader),
            IResult(IResult::InvalidType));
  EXPECT_TRUE(m_Store->GetReader(with({1, 2, 9}), pointSchema, reader).IsSuccess()); // newer patch
  EXPECT_TRUE(m_Store->GetReader(with({1, 1, 0}), pointSchema, reader).IsSuccess()); // older
  // An older file with a schema this type can't reconcile.
  EXPECT_EQ(m_Store->GetReader(with({1, 1, 0}), eventSchema, reader),
            IResult(IResult::InvalidType));

  // An unknown type registers and reads as raw bytes under its local id.
  ASSERT_TRUE(m_Store->GetReader(ForeignType(), eventSchema, reader).IsSuccess());
  EventItem event;
  event.m_Name = "n";
  ASSERT_TRUE(reader(IFlowItemToken(7, 4000, 5), BytesOf(event), item).IsSuccess());
  EXPECT_EQ(item.GetToken(), IFlowItemToken(7, ExpectedLocalId(4000, 3, 1, 0), 5));
  EXPECT_EQ(Serialise(*item), Serialise(event));
  // The same unknown type with another schema can't be read.
  EXPECT_EQ(m_Store->GetReader(ForeignType(), pointSchema, reader),
            IResult(IResult::InvalidVersion));
}

} // namespace
