// Tokens and their hash (checked against boost's own combine), and schema trees.

#include "FlowTestTypes.h"

#include "Flow2/Flow2Types/IFlowItemToken.h"
#include "Flow2/Flow2Types/ISchema.h"

#include <boost/functional/hash.hpp>
#include <gtest/gtest.h>

#include <random>
#include <unordered_set>

namespace {

using ZMT::IFlowItemToken;
using ZMT::ISchema;

std::size_t BoostTokenHash(std::uint32_t itemId, std::uint32_t typeId, std::uint64_t storeId) {
  std::size_t seed = 0;
  boost::hash_combine(seed, itemId);
  boost::hash_combine(seed, typeId);
  boost::hash_combine(seed, storeId);
  return seed;
}

TEST(FlowToken, DefaultIsAllOnesAndHashesLikeBoost) {
  const IFlowItemToken a;
  const IFlowItemToken b;
  EXPECT_EQ(a, b);
  EXPECT_TRUE(a.IsDefault());
  EXPECT_EQ(a.m_ItemId, 0xFFFFFFFFu);
  EXPECT_EQ(a.m_FlowStoreId, 0xFFFFFFFFFFFFFFFFull);
  EXPECT_EQ(ZMT::hash_value(a), BoostTokenHash(0xFFFFFFFFu, 0xFFFFFFFFu, 0xFFFFFFFFFFFFFFFFull));
}

TEST(FlowToken, HashMatchesBoostCombineForManyTokens) {
  std::mt19937_64 random(15);
  for (int i = 0; i < 1000; ++i) {
    const auto itemId = static_cast<std::uint32_t>(random());
    const auto typeId = static_cast<std::uint32_t>(random());
    const std::uint64_t storeId = random();
    const IFlowItemToken token(itemId, typeId, storeId);
    ASSERT_EQ(ZMT::hash_value(token), BoostTokenHash(itemId, typeId, storeId));
    ASSERT_EQ(std::hash<IFlowItemToken>()(token), ZMT::hash_value(token));
  }
  // A fixed value, so that a change in both boost and here would still show.
  EXPECT_EQ(ZMT::hash_value(IFlowItemToken(0, 0, 0)), BoostTokenHash(0, 0, 0));
  EXPECT_NE(ZMT::hash_value(IFlowItemToken(1, 2, 3)), ZMT::hash_value(IFlowItemToken(2, 1, 3)));
}

TEST(FlowToken, EqualityNeedsAllThreeFieldsAndTopBitMarksUnknownTypes) {
  const IFlowItemToken token(1, 2, 3);
  EXPECT_NE(token, IFlowItemToken(1, 2, 4));
  EXPECT_NE(token, IFlowItemToken(1, 3, 3));
  EXPECT_NE(token, IFlowItemToken(0, 2, 3));
  EXPECT_FALSE(token.IsUnknownType());
  EXPECT_TRUE(IFlowItemToken(1, 0x80000001u, 3).IsUnknownType());
}

TEST(FlowSchema, TypeNamesRoundTripAndStopAt21) {
  for (std::uint32_t type = 0; type < ISchema::TypeCount; ++type) {
    ISchema::EType back = ISchema::Void;
    ASSERT_TRUE(ISchema::TypeFromName(ISchema::TypeName(type), back)) << type;
    EXPECT_EQ(back, type);
  }
  EXPECT_EQ(ISchema::TypeName(ISchema::NamedTuple), "NamedTuple");
  EXPECT_EQ(ISchema::TypeName(ISchema::Ref), "Ref");
  EXPECT_TRUE(ISchema::TypeName(21).empty());
  ISchema::EType unused;
  EXPECT_FALSE(ISchema::TypeFromName("Float16", unused));
  EXPECT_EQ(ISchema::ScalarSize(ISchema::Int64), 8u);
  EXPECT_EQ(ISchema::ScalarSize(ISchema::Enum16), 2u);
}

TEST(FlowSchema, GeneratedTreeFollowsTheClassDescription) {
  const ISchema& schema = ZMT::Detail::FlowTypeStatics<FlowTest::VFlowTestMixed>().m_Schema;
  EXPECT_EQ(schema.m_Type, ISchema::NamedTuple);
  EXPECT_EQ(schema.m_Name, "Mixed");
  ASSERT_EQ(schema.m_Members.size(), 6u);
  EXPECT_EQ(schema.m_Members[0].m_Name, "Ids");
  EXPECT_EQ(schema.m_Members[0].m_Schema.m_Type, ISchema::List);
  EXPECT_EQ(schema.m_Members[0].m_Schema.m_Members[0].m_Schema.m_Type, ISchema::UInt32);
  const ISchema& values = schema.m_Members[1].m_Schema;
  EXPECT_EQ(values.m_Type, ISchema::List);
  EXPECT_EQ(values.m_Members[0].m_Schema.m_Type, ISchema::Tuple);
  EXPECT_EQ(values.m_Members[0].m_Schema.m_Members[0].m_Schema.m_Type, ISchema::String);
  EXPECT_EQ(values.m_Members[0].m_Schema.m_Members[1].m_Schema.m_Type, ISchema::Float64);
  EXPECT_EQ(schema.m_Members[2].m_Schema.m_Type, ISchema::Array);
  EXPECT_EQ(schema.m_Members[2].m_Schema.m_Count, 3u);
  EXPECT_EQ(schema.m_Members[3].m_Schema.m_Type, ISchema::Enum16);
  EXPECT_EQ(schema.m_Members[4].m_Schema.m_Type, ISchema::Bool);
  const ISchema& points = schema.m_Members[5].m_Schema.m_Members[0].m_Schema;
  EXPECT_EQ(points.m_Type, ISchema::NamedTuple);
  EXPECT_EQ(points.m_Name, "Point");

  const ISchema& point = ZMT::Detail::FlowTypeStatics<FlowTest::VFlowTestPoint>().m_Schema;
  ASSERT_EQ(point.m_Docs.size(), 5u); // class text, then one per member
  EXPECT_EQ(point.m_Docs[0], "A position in millimetres.");
  EXPECT_EQ(point.m_Docs[4], "quality");
}

TEST(FlowSchema, EqualityIgnoresFlagsDocsAndRenamesOnly) {
  const ISchema base = ZMT::Detail::FlowTypeStatics<FlowTest::VFlowTestMixed>().m_Schema;
  ISchema other = base;
  other.m_Flags = 9;
  other.m_Docs = {"changed"};
  other.m_Renames = {{"Old", "Ids"}};
  EXPECT_EQ(other, base);

  other = base;
  other.m_Members[2].m_Schema.m_Count = 4;
  EXPECT_FALSE(other == base);
  other = base;
  other.m_Members[0].m_Name = "Id";
  EXPECT_FALSE(other == base);
  other = base;
  other.m_Members.pop_back();
  EXPECT_FALSE(other == base);
  other = base;
  other.m_Members[3].m_Schema.m_EnumValues.push_back({"None", 0});
  EXPECT_FALSE(other == base);

  // A name counts only when flagged.
  ISchema a;
  ISchema b;
  a.m_Name = "A";
  b.m_Name = "B";
  EXPECT_EQ(a, b);
  a.m_HasName = b.m_HasName = 1;
  EXPECT_FALSE(a == b);
}

} // namespace
