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
  static constexpr std::uint32_t BucketCount = 16384;
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

protected:
  // All of these expect m_Mutex held.
  VFlowStoreEntry* Lookup(const ZMT::IFlowItemToken& token) const;
  void Link(VFlowStoreEntry* i_pEntry);
  void Unlink(VFlowStoreEntry* i_pEntry);
  void FreePushBack(VFlowStoreEntry* i_pEntry);
  void FreeUnlink(VFlowStoreEntry* i_pEntry);
  /// The oldest free entry, out of the free list and the table; null if none.
  VFlowStoreEntry* FreePopFront();
  /// Counts a new live entry; the first one holds a reference to the store.
  void MarkLive();
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
