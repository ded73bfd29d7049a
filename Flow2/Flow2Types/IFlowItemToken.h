#pragma once
// The identity of one Flow item and its 64-bit hash.

#include <cstddef>
#include <cstdint>
#include <functional>

namespace ZMT {

struct IFlowItemToken {
  static constexpr const char* SchemaName = "FlowItemToken";
  static constexpr const char* FlowClassName = SchemaName;

  /// Unique among items of this type originating from the same store.
  std::uint32_t m_ItemId = 0xFFFFFFFFu;
  /// Unique to the item type in the whole network; the top bit marks a type this process doesn't
  /// know (a local id of the unknown-type store).
  std::uint32_t m_TypeId = 0xFFFFFFFFu;
  /// Unique to the store the item originated in.
  std::uint64_t m_FlowStoreId = 0xFFFFFFFFFFFFFFFFull;

  constexpr IFlowItemToken() = default;
  constexpr IFlowItemToken(std::uint32_t itemId, std::uint32_t typeId, std::uint64_t storeId)
      : m_ItemId(itemId), m_TypeId(typeId), m_FlowStoreId(storeId) {}

  constexpr bool operator==(const IFlowItemToken&) const = default;
  constexpr bool IsDefault() const { return *this == IFlowItemToken(); }
  /// Whether the type id is a local id of an unknown type (top bit set).
  constexpr bool IsUnknownType() const { return static_cast<std::int32_t>(m_TypeId) < 0; }

  template <class S, class V> static void FlowFields(S& s, V&& v) {
    v("ItemId", "", s.m_ItemId);
    v("TypeId", "", s.m_TypeId);
    v("FlowStoreId", "", s.m_FlowStoreId);
  }
};

namespace Detail {
/// One step of the 64-bit combine chain used for token hashes.
constexpr std::uint64_t HashCombine64(std::uint64_t seed, std::uint64_t k) {
  constexpr std::uint64_t m = 0xc6a4a7935bd1e995ull;
  k *= m;
  k ^= k >> 47;
  k *= m;
  seed ^= k;
  seed *= m;
  return seed + 0xe6546b64ull;
}

/// One step of the 32-bit combine chain used for unknown-type local ids.
constexpr std::uint32_t HashCombine32(std::uint32_t seed, std::uint32_t value) {
  return seed ^ (value + 0x9e3779b9u + (seed << 6) + (seed >> 2));
}
} // namespace Detail

/// Seed 0 combined with the item id, then the type id, then the store id.
constexpr std::uint64_t hash_value(const IFlowItemToken& token) {
  std::uint64_t seed = 0;
  seed = Detail::HashCombine64(seed, token.m_ItemId);
  seed = Detail::HashCombine64(seed, token.m_TypeId);
  return Detail::HashCombine64(seed, token.m_FlowStoreId);
}

} // namespace ZMT

template <> struct std::hash<ZMT::IFlowItemToken> {
  std::size_t operator()(const ZMT::IFlowItemToken& token) const noexcept {
    return static_cast<std::size_t>(ZMT::hash_value(token));
  }
};
