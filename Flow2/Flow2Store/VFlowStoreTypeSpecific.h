#pragma once
// The store of one registered item type: creates, recycles and reads its items.

#include "Flow2/Flow2Store/VItemStoreBase.h"

#include <cstdint>
#include <vector>

namespace Flow2Store {

class VFlowStoreTypeSpecific final : public VItemStoreBase {
public:
  /// Reuses between two deliberate rebuilds of a recycled item: Base plus the created count's low
  /// five bits.
  static constexpr std::uint32_t ReuseCountdownBase = 400;
  /// A recycled item is rebuilt at the end of its countdown only when its last content was larger.
  static constexpr std::uint64_t RebuildAboveBytes = 64 * 1024;

  VFlowStoreTypeSpecific(std::shared_ptr<ZMT::IFlowItemFactory> i_pFactory,
                         ZMT::IFlowStore* i_pOwner, std::uint64_t flowStoreId);

  std::uint32_t GetTypeId() const { return m_TypeId; }
  const ZMT::IFlowItemVersion& GetVersion() const { return m_Version; }
  const ZMT::IFlowItemFactory& GetFactory() const { return *m_pFactory; }

  ZMT::IResult CreateItem(ZMT::IFlowItemHandle& o_rItem);
  ZMT::IResult CreateItems(std::uint32_t count, std::vector<ZMT::IFlowItemHandle>& io_rItems);
  /// The item of the token: the one held, or a new one read from the bytes with `read` (the
  /// native reader when empty). Takes the bytes over.
  ZMT::IResult GetOrCreateItem(const ZMT::IFlowItemToken& token, ZMT::IFlowBufferConst* i_pBytes,
                               const ZMT::IFlowItemReadFunction& read,
                               ZMT::IFlowItemHandle& o_rItem);

private:
  /// An entry with a default item, out of every list; null if the factory gave no item.
  VFlowStoreEntry* TakeEntry();
  /// Gives a taken entry the next token and makes it live.
  void Issue(VFlowStoreEntry* i_pEntry);

  std::uint64_t m_FlowStoreId;
  std::uint32_t m_NextItemId = 0;
  std::uint32_t m_TypeId;
  ZMT::IFlowItemVersion m_Version;
  std::uint32_t m_ReuseCountdown = ReuseCountdownBase;
  ZMT::IFlowItemReadFunction m_NativeReader;
};

} // namespace Flow2Store
