#include "Flow2/Flow2Store/VItemStoreBase.h"

#include <algorithm>
#include <utility>

namespace Flow2Store {

using ZMT::IResult;

void VFlowStoreEntry::Release() {
  m_pStore->ReleaseEntry(this);
}

VItemStoreBase::VItemStoreBase(std::shared_ptr<ZMT::IFlowItemFactory> i_pFactory,
                               ZMT::IFlowStore* i_pOwner, std::string name)
    : m_pFactory(std::move(i_pFactory)), m_pOwner(i_pOwner), m_Name(std::move(name)),
      m_pBuckets(new VFlowStoreEntry*[BucketCount]()) {}

VItemStoreBase::~VItemStoreBase() {
  // Live entries hold the store, so only the free list is left.
  while (VFlowStoreEntry* pEntry = FreePopFront())
    delete pEntry;
}

VFlowStoreEntry* VItemStoreBase::Lookup(const ZMT::IFlowItemToken& token) const {
  for (VFlowStoreEntry* pEntry = m_pBuckets[BucketOf(token)]; pEntry; pEntry = pEntry->m_pHashNext)
    if (pEntry->m_Token == token) return pEntry;
  return nullptr;
}

void VItemStoreBase::Revive(VFlowStoreEntry* i_pEntry) {
  if (i_pEntry->m_Free) {
    FreeUnlink(i_pEntry);
    i_pEntry->m_RefCount.store(0, std::memory_order_relaxed);
    MarkLive();
  } else {
    i_pEntry->m_RefCount.fetch_add(1, std::memory_order_relaxed);
  }
}

IResult VItemStoreBase::FindItem(const ZMT::IFlowItemToken& token, ZMT::IFlowItemHandle& o_rItem) {
  VFlowStoreEntry* pEntry = nullptr;
  {
    std::lock_guard<std::mutex> lock(m_Mutex);
    pEntry = Lookup(token);
    if (!pEntry) return IResult::InvalidToken;
    Revive(pEntry);
  }
  // Outside the lock: replacing the handle may release another entry of this store.
  o_rItem = ZMT::IFlowItemHandle::Adopt(pEntry);
  return IResult::Ok;
}

void VItemStoreBase::ReleaseEntries(VFlowStoreEntry* const* i_ppEntries, std::size_t count) {
  bool dropStore = false;
  {
    std::lock_guard<std::mutex> lock(m_Mutex);
    for (std::size_t i = 0; i < count; ++i) {
      VFlowStoreEntry* pEntry = i_ppEntries[i];
      // An owner added by a racing lookup takes the release over.
      if (pEntry->m_RefCount.load(std::memory_order_relaxed) != 0) {
        pEntry->m_RefCount.fetch_sub(1, std::memory_order_relaxed);
        continue;
      }
      FreePushBack(pEntry);
      if (m_FreeCount > FreeLimit && m_FreeCount > FreeLiveRatio * m_LiveCount)
        for (int j = 0; j < 2; ++j)
          delete FreePopFront();
      dropStore = --m_LiveCount == 0;
    }
  }
  if (dropStore) m_pOwner->DropReference();
}

IResult VItemStoreBase::GetItemBuffer(VFlowStoreEntry* i_pEntry, ZMT::IFlowItemWriter& writer,
                                      const ZMT::IFlowBufferConst*& o_rpBytes) {
  {
    std::lock_guard<std::mutex> lock(m_Mutex);
    if (i_pEntry->m_pStore != this || i_pEntry->m_Free || Lookup(i_pEntry->m_Token) != i_pEntry)
      return IResult::InvalidHandle;
    if (i_pEntry->m_pBytes) {
      o_rpBytes = i_pEntry->m_pBytes;
      return IResult::Ok;
    }
  }
  // The caller's handle keeps the entry live; items are not changed once shared.
  ZMT::IFlowBuffer* pBytes = nullptr;
  const IResult result = writer.Write(*i_pEntry->m_pItem, pBytes);
  if (result.IsFailure()) return result;
  std::lock_guard<std::mutex> lock(m_Mutex);
  if (i_pEntry->m_pBytes)
    pBytes->ReleaseChain(); // another thread was first
  else
    i_pEntry->m_pBytes = pBytes;
  o_rpBytes = i_pEntry->m_pBytes;
  return IResult::Ok;
}

void VItemStoreBase::GetCounts(std::uint64_t& o_rLive, std::uint64_t& o_rPeak,
                               std::uint64_t& o_rCreated) const {
  std::lock_guard<std::mutex> lock(m_Mutex);
  o_rLive = m_LiveCount;
  o_rPeak = m_PeakLiveCount;
  o_rCreated = m_CreatedCount;
}

std::uint64_t VItemStoreBase::GetFreeCount() const {
  std::lock_guard<std::mutex> lock(m_Mutex);
  return m_FreeCount;
}

} // namespace Flow2Store
