// The reader's table of recent body positions: a hit is always the token recorded for exactly
// that position, the latest record is always a hit, and Clear forgets everything.

#include "Flow2/Flow2File/VKnownPositions.h"

#include <gtest/gtest.h>

namespace {

using Flow2File::VKnownPositions;
using ZMT::IFlowItemToken;

TEST(FlowKnownPositions, HitsAreExactAndTheLatestRecordIsKept) {
  VKnownPositions known;
  IFlowItemToken token;
  EXPECT_FALSE(known.Find(0, token));

  // Far more positions than slots, a few dozen bytes apart like item bodies.
  constexpr std::uint64_t Count = 4 * VKnownPositions::SlotCount;
  std::uint64_t hits = 0;
  for (std::uint64_t i = 0; i < Count; ++i) {
    const std::uint64_t position = 40 + i * 44;
    known.Record(position, IFlowItemToken(std::uint32_t(i), 7, i * 3));
    ASSERT_TRUE(known.Find(position, token));
    ASSERT_EQ(token, IFlowItemToken(std::uint32_t(i), 7, i * 3));
  }
  for (std::uint64_t i = 0; i < Count; ++i) {
    const std::uint64_t position = 40 + i * 44;
    if (!known.Find(position, token)) continue;
    ++hits;
    ASSERT_EQ(token, IFlowItemToken(std::uint32_t(i), 7, i * 3)) << "position " << position;
  }
  EXPECT_GT(hits, VKnownPositions::SlotCount * 9 / 10); // the positions spread over the table
  EXPECT_LE(hits, VKnownPositions::SlotCount);
  EXPECT_FALSE(known.Find(41, token)); // between bodies

  known.Clear();
  EXPECT_FALSE(known.Find(40 + (Count - 1) * 44, token));
}

} // namespace
