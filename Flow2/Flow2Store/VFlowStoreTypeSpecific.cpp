#include "Flow2/Flow2Store/VFlowStoreTypeSpecific.h"

#include "Flow2/Flow2Store/VFlowStreams.h"

#include <exception>

namespace Flow2Store {

using ZMT::IResult;

VFlowStoreTypeSpecific::VFlowStoreTypeSpecific(std::shared_ptr<ZMT::IFlowItemFactory> i_pFactory,
                                               ZMT::IFlowStore* i_pOwner, std::uint64_t flowStoreId)
    : VItemStoreBase(i_pFactory, i_pOwner, i_pFactory->GetInfo().m_TypeInfo.m_Name),
      m_FlowStoreId(flowStoreId), m_TypeId(i_pFactory->GetInfo().m_TypeInfo.m_TypeId),
      m_Version(i_pFactory->GetInfo().m_TypeInfo.m_Version),
      m_NativeReader(i_pFactory->GetReader(nullptr)) {}

VFlowStoreEntry* VFlowStoreTypeSpecific::TakeEntry() {
  VFlowStoreEntry* pEntry = FreePopFront();
  if (pEntry) {
    // Now and then a recycled item that last held much is rebuilt, so that one that grew large
    // containers doesn't stay large for ever; items of an everyday size keep their capacity.
    const bool rebuild =
        m_ReuseCountdown == 0 && pEntry->m_pItem && pEntry->m_pItem->GetSize() > RebuildAboveBytes;
    if (m_ReuseCountdown == 0)
      m_ReuseCountdown = static_cast<std::uint32_t>(m_CreatedCount & 31) + ReuseCountdownBase;
    if (!rebuild) {
      pEntry->DropBytes();
      if (pEntry->m_pItem && !pEntry->m_pItem->Clear()) {
        delete pEntry->m_pItem;
        pEntry->m_pItem = nullptr;
      }
      --m_ReuseCountdown;
    } else {
      delete pEntry->m_pItem;
      pEntry->m_pItem = nullptr;
      pEntry->DropBytes();
    }
    pEntry->m_Token = ZMT::IFlowItemToken();
  } else {
    try {
      pEntry = new VFlowStoreEntry(this);
    } catch (const std::exception&) {
      return nullptr;
    }
  }
  if (!pEntry->m_pItem) {
    try {
      pEntry->m_pItem = m_pFactory->Create();
    } catch (const std::exception&) {
      pEntry->m_pItem = nullptr;
    }
    if (!pEntry->m_pItem) {
      FreePushBack(pEntry);
      return nullptr;
    }
    ++m_CreatedCount;
  }
  return pEntry;
}

void VFlowStoreTypeSpecific::Issue(VFlowStoreEntry* i_pEntry) {
  i_pEntry->m_Token = ZMT::IFlowItemToken(++m_NextItemId, m_TypeId, m_FlowStoreId);
  i_pEntry->m_RefCount.store(0, std::memory_order_relaxed);
  // New ids walk the table one bucket at a time: fetch the next cache line of buckets early.
  const std::uint32_t bucket = BucketOf(i_pEntry->m_Token);
  if ((bucket & 7) == 0) __builtin_prefetch(&m_pBuckets[(bucket + 8) & (BucketCount - 1)], 1);
  Link(i_pEntry);
  MarkLive();
}

IResult VFlowStoreTypeSpecific::CreateItem(ZMT::IFlowItemHandle& o_rItem) {
  VFlowStoreEntry* pEntry = nullptr;
  {
    std::lock_guard<std::mutex> lock(m_Mutex);
    pEntry = TakeEntry();
    if (!pEntry) return IResult::AllocationFailure;
    Issue(pEntry);
  }
  o_rItem = ZMT::IFlowItemHandle::Adopt(pEntry);
  return IResult::Ok;
}

IResult VFlowStoreTypeSpecific::CreateItems(std::uint32_t count,
                                            std::vector<ZMT::IFlowItemHandle>& io_rItems) {
  io_rItems.clear(); // releases what the caller held, before the lock is taken
  io_rItems.reserve(count);
  bool failed = false;
  {
    std::lock_guard<std::mutex> lock(m_Mutex);
    for (std::uint32_t i = 0; i < count; ++i) {
      VFlowStoreEntry* pEntry = TakeEntry();
      if (!pEntry) {
        failed = true;
        break;
      }
      Issue(pEntry);
      io_rItems.push_back(ZMT::IFlowItemHandle::Adopt(pEntry));
    }
  }
  if (!failed) return IResult::Ok;
  io_rItems.clear();
  return IResult::AllocationFailure;
}

IResult VFlowStoreTypeSpecific::GetOrCreateItem(const ZMT::IFlowItemToken& token,
                                                ZMT::IFlowBufferConst* i_pBytes,
                                                const ZMT::IFlowItemReadFunction& read,
                                                ZMT::IFlowItemHandle& o_rItem) {
  VFlowStoreEntry* pEntry = nullptr;
  bool found = false;
  {
    std::lock_guard<std::mutex> lock(m_Mutex);
    if (VFlowStoreEntry* pFound = Lookup(token)) {
      Revive(pFound);
      pEntry = pFound;
      found = true;
    } else {
      pEntry = TakeEntry();
      if (!pEntry) {
        i_pBytes->ReleaseChain();
        return IResult::AllocationFailure;
      }
    }
  }
  if (found) { // already held: the new bytes aren't needed
    i_pBytes->ReleaseChain();
    o_rItem = ZMT::IFlowItemHandle::Adopt(pEntry);
    return IResult::Ok;
  }

  // The taken entry is out of every list: nobody else can see it while it reads.
  pEntry->m_pBytes = i_pBytes;
  VFlowInputStream stream(i_pBytes);
  bool readOk = false;
  try {
    readOk = (read ? read : m_NativeReader)(stream, *pEntry->m_pItem) && !stream.IsFailed();
  } catch (const std::exception&) {
    readOk = false;
  }
  if (!readOk) {
    std::lock_guard<std::mutex> lock(m_Mutex);
    FreePushBack(pEntry); // the bytes stay attached until the entry is reused
    return IResult::SerialisationFailure;
  }

  {
    std::lock_guard<std::mutex> lock(m_Mutex);
    if (VFlowStoreEntry* pWinner = Lookup(token)) {
      // Another thread read the same token first.
      pEntry->DropBytes();
      FreePushBack(pEntry);
      Revive(pWinner);
      pEntry = pWinner;
    } else {
      pEntry->m_Token = token;
      pEntry->m_RefCount.store(0, std::memory_order_relaxed);
      Link(pEntry);
      MarkLive();
    }
  }
  o_rItem = ZMT::IFlowItemHandle::Adopt(pEntry);
  return IResult::Ok;
}

} // namespace Flow2Store
