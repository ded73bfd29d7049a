#include "River/CoreOstraTypes/NameHash.h"

#include <cstring>

namespace CoreOstraTypes {

namespace {

constexpr std::uint32_t Rotl32(std::uint32_t x, int r) {
  return (x << r) | (x >> (32 - r));
}

constexpr std::uint32_t FinalMix(std::uint32_t h) {
  h ^= h >> 16;
  h *= 0x85ebca6bu;
  h ^= h >> 13;
  h *= 0xc2b2ae35u;
  h ^= h >> 16;
  return h;
}

} // namespace

std::uint32_t MurmurHash3_x86_32(const void* data, std::size_t length, std::uint32_t seed) {
  const auto* bytes = static_cast<const unsigned char*>(data);
  const std::size_t blockCount = length / 4;
  constexpr std::uint32_t c1 = 0xcc9e2d51u;
  constexpr std::uint32_t c2 = 0x1b873593u;
  std::uint32_t h1 = seed;

  for (std::size_t i = 0; i < blockCount; ++i) {
    // Blocks are read little-endian whatever the platform, so ids are portable.
    const unsigned char* p = bytes + 4 * i;
    std::uint32_t k1 = std::uint32_t(p[0]) | (std::uint32_t(p[1]) << 8) |
                       (std::uint32_t(p[2]) << 16) | (std::uint32_t(p[3]) << 24);
    k1 *= c1;
    k1 = Rotl32(k1, 15);
    k1 *= c2;
    h1 ^= k1;
    h1 = Rotl32(h1, 13);
    h1 = h1 * 5 + 0xe6546b64u;
  }

  const unsigned char* tail = bytes + 4 * blockCount;
  std::uint32_t k1 = 0;
  switch (length & 3) {
  case 3:
    k1 ^= std::uint32_t(tail[2]) << 16;
    [[fallthrough]];
  case 2:
    k1 ^= std::uint32_t(tail[1]) << 8;
    [[fallthrough]];
  case 1:
    k1 ^= tail[0];
    k1 *= c1;
    k1 = Rotl32(k1, 15);
    k1 *= c2;
    h1 ^= k1;
  }

  h1 ^= static_cast<std::uint32_t>(length);
  return FinalMix(h1);
}

std::uint32_t NameHash(std::string_view name) {
  if (name.empty()) return InvalidId;
  const std::uint32_t hash = MurmurHash3_x86_32(name.data(), name.size(), 0);
  return hash == InvalidId ? InvalidId - 1 : hash;
}

} // namespace CoreOstraTypes
