#include "River/CoreOstraTypes/NameHash.h"

#include <gtest/gtest.h>

#include <string>

using namespace CoreOstraTypes;

// Reference values were computed once with an independent Python implementation of
// MurmurHash3 x86 32-bit (seed 0 unless stated); "Hello, world!", the pangram and the seeded
// "test" also match published reference vectors.
TEST(NameHash, MatchesReferenceValuesForEveryTailLength) {
  EXPECT_EQ(NameHash("a"), 0x3c2569b2u);
  EXPECT_EQ(NameHash("ab"), 0x9bbfd75fu);
  EXPECT_EQ(NameHash("abc"), 0xb3dd93fau);
  EXPECT_EQ(NameHash("abcd"), 0x43ed676au);
  EXPECT_EQ(NameHash("Hello, world!"), 0xc0363e43u);
  EXPECT_EQ(NameHash("LFHD"), 0xb45941ddu);
  EXPECT_EQ(NameHash("Pelvis"), 0x16ff0b47u);
  EXPECT_EQ(NameHash("Left Knee"), 0xcc85d585u);
  EXPECT_EQ(NameHash("The quick brown fox jumps over the lazy dog"), 0x2e4ff723u);
  EXPECT_EQ(NameHash("\xc3\xa9t\xc3\xa9"), 0x3393660fu); // UTF-8 bytes, high bit set
  EXPECT_EQ(MurmurHash3_x86_32("test", 4, 0x9747b28cu), 0x704b81dcu);
}

TEST(NameHash, EmptyNameIsUnsetAndNonEmptyNameNeverIs) {
  EXPECT_EQ(NameHash(""), InvalidId);
  // These four bytes hash to 0xFFFFFFFF (found by inverting the hash); the id is clamped.
  const std::string collider("\xb4\xf3\xc7\x77", 4);
  EXPECT_EQ(MurmurHash3_x86_32(collider.data(), collider.size(), 0), 0xFFFFFFFFu);
  EXPECT_EQ(NameHash(collider), 0xFFFFFFFEu);
}

TEST(NameHash, DependsOnEveryByteIncludingEmbeddedZeros) {
  const std::string withZero("ab\0c", 4);
  EXPECT_NE(NameHash(withZero), NameHash("ab"));
  EXPECT_NE(NameHash("Marker1"), NameHash("marker1"));
}
