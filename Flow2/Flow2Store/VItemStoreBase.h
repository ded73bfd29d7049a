#pragma once
// What every type store shares: a fixed hash table over tokens, the free list of cached items
// (oldest first), the counters, and one mutex over all of them.

#include "Flow2/Flow2Store/VFlowStoreEntry.h"
#include "Flow2/Flow2Types/IFlowItemFactory.h"
#include "Flow2/Flow2Types/IFlowStore.h"

#include <cstdint>
#include <memory>
#include <mutex>
#include <string>

namespace Flow2Store {

class VItemStoreBase {
public:
  static constexpr std::uint32_t BucketCount = 16384; // a power of two
  /// The free list is trimmed when longer than this and than FreeLiveRatio times the live count.
  static constexpr std::uint64_t FreeLimit = 100;
  static constexpr std::uint64_t FreeLiveRatio = 8;

  VItemStoreBase(std::shared_ptr<ZMT::IFlowItemFactory> i_pFactory, ZMT::IFlowStore* i_pOwner,
                 std::string name);
  virtual ~VItemStoreBase();
  VItemStoreBase(const VItemStoreBase&) = delete;
  VItemStoreBase& operator=(const VItemStoreBase&) = delete;

  const std::string& GetName() const { return m_Name; }

  /// The live or cached item of a token; InvalidToken if there is none.
  ZMT::IResult FindItem(const ZMT::IFlowItemToken& token, ZMT::IFlowItemHandle& o_rItem);
  /// Called by an entry's last owner.
  void ReleaseEntry(VFlowStoreEntry* i_pEntry) { ReleaseEntries(&i_pEntry, 1); }
  /// Called by the last owners of several entries of this store: one lock for all.
  void ReleaseEntries(VFlowStoreEntry* const* i_ppEntries, std::size_t count);
  /// The entry's bytes, written once; InvalidHandle if the entry isn't live in this store.
  ZMT::IResult GetItemBuffer(VFlowStoreEntry* i_pEntry, ZMT::IFlowItemWriter& writer,
                             const ZMT::IFlowBufferConst*& o_rpBytes);
  void GetCounts(std::uint64_t& o_rLive, std::uint64_t& o_rPeak, std::uint64_t& o_rCreated) const;
  std::uint64_t GetFreeCount() const;

  /// The bucket of a token: its item id plus a spread of its type and store ids, so that the
  /// consecutive ids a type store hands out fill consecutive buckets (eight to a cache line)
  /// instead of one cold line each, while tokens of other stores and types start elsewhere.
  static std::uint32_t BucketOf(const ZMT::IFlowItemToken& token) {
    const std::uint64_t spread =
        (token.m_FlowStoreId ^ (std::uint64_t(token.m_TypeId) << 32 | token.m_TypeId)) *
        0x9E3779B97F4A7C15ull;
    return (token.m_ItemId + static_cast<std::uint32_t>(spread >> 40)) & (BucketCount - 1);
  }

protected:
  // All of these expect m_Mutex held. The list and table work is inline: creating and releasing
  // run it once per item.
  VFlowStoreEntry* Lookup(const ZMT::IFlowItemToken& token) const;
  void Link(VFlowStoreEntry* i_pEntry) {
    VFlowStoreEntry*& rHead = m_pBuckets[BucketOf(i_pEntry->m_Token)];
    i_pEntry->m_pHashNext = rHead;
    rHead = i_pEntry;
    i_pEntry->m_Linked = true;
    ++m_LinkedCount;
  }
  void Unlink(VFlowStoreEntry* i_pEntry) {
    if (!i_pEntry->m_Linked) return;
    VFlowStoreEntry** ppLink = &m_pBuckets[BucketOf(i_pEntry->m_Token)];
    while (*ppLink && *ppLink != i_pEntry)
      ppLink = &(*ppLink)->m_pHashNext;
    if (*ppLink) *ppLink = i_pEntry->m_pHashNext;
    i_pEntry->m_pHashNext = nullptr;
    i_pEntry->m_Linked = false;
    --m_LinkedCount;
  }
  void FreePushBack(VFlowStoreEntry* i_pEntry) {
    i_pEntry->m_pFreePrev = m_pFreeTail;
    i_pEntry->m_pFreeNext = nullptr;
    if (m_pFreeTail)
      m_pFreeTail->m_pFreeNext = i_pEntry;
    else
      m_pFreeHead = i_pEntry;
    m_pFreeTail = i_pEntry;
    i_pEntry->m_Free = true;
    ++m_FreeCount;
  }
  void FreeUnlink(VFlowStoreEntry* i_pEntry) {
    if (!i_pEntry->m_Free) return;
    if (i_pEntry->m_pFreePrev)
      i_pEntry->m_pFreePrev->m_pFreeNext = i_pEntry->m_pFreeNext;
    else
      m_pFreeHead = i_pEntry->m_pFreeNext;
    if (i_pEntry->m_pFreeNext)
      i_pEntry->m_pFreeNext->m_pFreePrev = i_pEntry->m_pFreePrev;
    else
      m_pFreeTail = i_pEntry->m_pFreePrev;
    i_pEntry->m_pFreePrev = i_pEntry->m_pFreeNext = nullptr;
    i_pEntry->m_Free = false;
    --m_FreeCount;
  }
  /// The oldest free entry, out of the free list and the table; null if none.
  VFlowStoreEntry* FreePopFront() {
    VFlowStoreEntry* pEntry = m_pFreeHead;
    if (!pEntry) return nullptr;
    FreeUnlink(pEntry);
    Unlink(pEntry);
    return pEntry;
  }
  /// Counts a new live entry; the first one holds a reference to the store.
  void MarkLive() {
    if (++m_LiveCount > m_PeakLiveCount) m_PeakLiveCount = m_LiveCount;
    if (m_LiveCount == 1) m_pOwner->AddReference();
  }
  /// A found entry gains an owner: a cached one comes back to life with one owner.
  void Revive(VFlowStoreEntry* i_pEntry);

  mutable std::mutex m_Mutex;
  std::shared_ptr<ZMT::IFlowItemFactory> m_pFactory;
  ZMT::IFlowStore* m_pOwner;
  std::string m_Name;
  std::unique_ptr<VFlowStoreEntry*[]> m_pBuckets;
  std::uint64_t m_LinkedCount = 0;
  VFlowStoreEntry* m_pFreeHead = nullptr;
  VFlowStoreEntry* m_pFreeTail = nullptr;
  std::uint64_t m_FreeCount = 0;
  std::uint64_t m_LiveCount = 0;
  std::uint64_t m_PeakLiveCount = 0;
  std::uint64_t m_CreatedCount = 0;
};

} // namespace Flow2Store
