// The writer's store of item positions: entries live while every following state of their type
// refers to them, tokens sharing a bucket stay apart, and a lookup that missed doesn't steer the
// next record into the wrong bucket.

#include "Flow2/Flow2File/VItemPositionStore.h"

#include <gtest/gtest.h>

namespace {

using Flow2File::VItemPositionStore;
using ZMT::IFlowItemToken;

IFlowItemToken Token(std::uint32_t itemId, std::uint32_t typeId = 7) {
  IFlowItemToken token;
  token.m_ItemId = itemId;
  token.m_TypeId = typeId;
  token.m_FlowStoreId = 3;
  return token;
}

TEST(FlowPositionStore, EntriesAgeOutUnlessReferredToAndBucketsStayApart) {
  VItemPositionStore positions;
  // Ids BucketCount apart share a bucket: 12 entries in 4 chains of 3.
  std::vector<IFlowItemToken> tokens;
  for (std::uint32_t chain = 0; chain < 4; ++chain)
    for (std::uint32_t i = 0; i < 3; ++i)
      tokens.push_back(Token(chain + i * VItemPositionStore::BucketCount));
  std::uint64_t position = 0;
  for (std::size_t i = 0; i < tokens.size(); ++i) {
    ASSERT_FALSE(positions.Find(tokens[i], position));
    positions.Record(tokens[i], 100 + i, false);
  }
  positions.EndState();
  EXPECT_EQ(positions.Size(), tokens.size());

  // The next state refers to every other one, from the middle and the ends of the chains.
  for (std::size_t i = 0; i < tokens.size(); i += 2) {
    ASSERT_TRUE(positions.Find(tokens[i], position));
    EXPECT_EQ(position, 100 + i);
  }
  positions.EndState();
  // A state of another type doesn't age these.
  positions.Record(Token(1, 8), 5, false);
  positions.EndState();
  for (std::size_t i = 0; i < tokens.size(); ++i)
    EXPECT_EQ(positions.Find(tokens[i], position), i % 2 == 0) << i;
  EXPECT_EQ(positions.Size(), tokens.size() / 2 + 1);

  // A state of this type that refers to none of them: gone one state later, except permanent ones.
  positions.Record(tokens[0], 1, true);
  positions.Record(Token(99), 2, false);
  positions.EndState();
  positions.Record(Token(98), 3, false);
  positions.EndState();
  EXPECT_TRUE(positions.Find(tokens[0], position));
  EXPECT_EQ(position, 1u);
  for (std::size_t i = 1; i < tokens.size(); ++i)
    EXPECT_FALSE(positions.Find(tokens[i], position)) << i;
}

TEST(FlowPositionStore, ARecordAfterAMissOfAnotherTokenGoesToItsOwnBucket) {
  VItemPositionStore positions;
  const IFlowItemToken a = Token(10), b = Token(11),
                       c = Token(10 + VItemPositionStore::BucketCount);
  std::uint64_t position = 0;
  ASSERT_FALSE(positions.Find(a, position));
  positions.Record(b, 20, false); // not the token that missed
  ASSERT_TRUE(positions.Find(b, position));
  EXPECT_EQ(position, 20u);
  EXPECT_FALSE(positions.Find(a, position));

  // The missed token recorded later, after another token joined its bucket, keeps both.
  ASSERT_FALSE(positions.Find(a, position));
  positions.Record(c, 30, false);
  ASSERT_FALSE(positions.Find(a, position));
  positions.Record(a, 40, false);
  ASSERT_TRUE(positions.Find(c, position));
  EXPECT_EQ(position, 30u);
  ASSERT_TRUE(positions.Find(a, position));
  EXPECT_EQ(position, 40u);
  // A transient record never replaces an entry.
  positions.Record(a, 50, false);
  ASSERT_TRUE(positions.Find(a, position));
  EXPECT_EQ(position, 40u);
  EXPECT_EQ(positions.Size(), 3u);
}

} // namespace
