#pragma once
// Tokens of item bodies read lately, by the position of their bytes in the file, so that a
// reference to a body finds its item in the store instead of reading it again.
//
// A fixed direct-mapped table: after the first record nothing allocates, and a newer position
// takes the slot of an older one, whose body is then simply read again if something refers to it.

#include "Flow2/Flow2Types/IFlowItemToken.h"

#include <algorithm>
#include <cstdint>
#include <memory>

namespace Flow2File {

class VKnownPositions {
public:
  static constexpr std::size_t SlotCount = std::size_t(1) << 16;

  void Record(std::uint64_t position, const ZMT::IFlowItemToken& token) {
    if (!m_pSlots) m_pSlots = std::make_unique<VSlot[]>(SlotCount);
    VSlot& slot = m_pSlots[SlotOf(position)];
    slot.m_Position = position;
    slot.m_Token = token;
  }
  bool Find(std::uint64_t position, ZMT::IFlowItemToken& o_rToken) const {
    if (!m_pSlots) return false;
    const VSlot& slot = m_pSlots[SlotOf(position)];
    if (slot.m_Position != position) return false;
    o_rToken = slot.m_Token;
    return true;
  }
  void Clear() {
    if (m_pSlots) std::fill_n(m_pSlots.get(), SlotCount, VSlot());
  }

private:
  static constexpr std::uint64_t Empty = ~std::uint64_t(0);
  struct VSlot {
    std::uint64_t m_Position = Empty;
    ZMT::IFlowItemToken m_Token;
  };
  /// A full 64-bit mix (the finaliser of splitmix64): bodies a fixed number of bytes apart
  /// spread over the whole table, which a single multiplication doesn't do for every stride.
  static std::size_t SlotOf(std::uint64_t position) {
    std::uint64_t x = position;
    x = (x ^ (x >> 30)) * 0xBF58476D1CE4E5B9ull;
    x = (x ^ (x >> 27)) * 0x94D049BB133111EBull;
    return static_cast<std::size_t>((x ^ (x >> 31)) & (SlotCount - 1));
  }

  std::unique_ptr<VSlot[]> m_pSlots;
};

} // namespace Flow2File
