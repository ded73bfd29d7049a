#include "Flow2/Flow2File/VItemPositionStore.h"

namespace Flow2File {

VItemPositionStore::VItemPositionStore() : m_Buckets(BucketCount, nullptr) {}

VItemPositionStore::VItemPosition** VItemPositionStore::Bucket(const ZMT::IFlowItemToken& token) {
  // The item id plus a spread of type and store: a state's new items, numbered consecutively,
  // land in consecutive buckets, one chain each.
  const std::uint64_t spread =
      (token.m_FlowStoreId ^ (std::uint64_t(token.m_TypeId) << 32 | token.m_TypeId)) *
      0x9E3779B97F4A7C15ull;
  return &m_Buckets[(token.m_ItemId + static_cast<std::uint32_t>(spread >> 40)) &
                    (BucketCount - 1)];
}

VItemPositionStore::VItemPosition* VItemPositionStore::Allocate() {
  if (!m_pFree) {
    m_Blocks.push_back(std::make_unique<VItemPosition[]>(BlockSize));
    VItemPosition* pBlock = m_Blocks.back().get();
    for (std::size_t i = 0; i < BlockSize; ++i) {
      pBlock[i].m_pNext = m_pFree;
      m_pFree = &pBlock[i];
    }
  }
  VItemPosition* pEntry = m_pFree;
  m_pFree = pEntry->m_pNext;
  *pEntry = VItemPosition();
  ++m_Size;
  return pEntry;
}

void VItemPositionStore::Recycle(VItemPosition* i_pEntry) {
  i_pEntry->m_pNext = m_pFree;
  m_pFree = i_pEntry;
  --m_Size;
}

void VItemPositionStore::Push(VList& io_rList, VItemPosition* i_pEntry) {
  i_pEntry->m_pPrev = nullptr;
  i_pEntry->m_pNext = io_rList.m_pHead;
  if (io_rList.m_pHead) io_rList.m_pHead->m_pPrev = i_pEntry;
  io_rList.m_pHead = i_pEntry;
}

void VItemPositionStore::Unhook(VList& io_rList, VItemPosition* i_pEntry) {
  if (i_pEntry->m_pPrev)
    i_pEntry->m_pPrev->m_pNext = i_pEntry->m_pNext;
  else
    io_rList.m_pHead = i_pEntry->m_pNext;
  if (i_pEntry->m_pNext) i_pEntry->m_pNext->m_pPrev = i_pEntry->m_pPrev;
  i_pEntry->m_pPrev = i_pEntry->m_pNext = nullptr;
}

void VItemPositionStore::RemoveFromBucket(VItemPosition* i_pEntry) {
  *i_pEntry->m_ppBucketLink = i_pEntry->m_pBucketNext;
  if (i_pEntry->m_pBucketNext) i_pEntry->m_pBucketNext->m_ppBucketLink = i_pEntry->m_ppBucketLink;
  i_pEntry->m_pBucketNext = nullptr;
  i_pEntry->m_ppBucketLink = nullptr;
  // The entry may head the bucket a pending Record would insert into; that pointer stays good.
}

VItemPositionStore::VListPair& VItemPositionStore::Lists(std::uint32_t typeId) {
  // Items come in runs of one type: the last type's lists are kept at hand.
  if (!m_pLastLists || m_LastListsType != typeId) {
    m_pLastLists = &m_Lists[typeId]; // map nodes never move
    m_LastListsType = typeId;
  }
  return *m_pLastLists;
}

bool VItemPositionStore::Find(const ZMT::IFlowItemToken& token, std::uint64_t& o_rPosition) {
  VItemPosition** ppBucket = Bucket(token);
  VItemPosition* pEntry = *ppBucket;
  while (pEntry && !(pEntry->m_Token == token))
    pEntry = pEntry->m_pBucketNext;
  if (!pEntry) {
    m_ppMissBucket = ppBucket;
    m_MissToken = token;
    return false;
  }
  if (pEntry->m_Generation != Permanent && pEntry->m_Generation != m_Generation) {
    VListPair& lists = Lists(token.m_TypeId);
    Unhook(lists.m_Previous, pEntry);
    Push(lists.m_Current, pEntry);
    pEntry->m_Generation = m_Generation;
  }
  o_rPosition = pEntry->m_Position;
  return true;
}

void VItemPositionStore::Record(const ZMT::IFlowItemToken& token, std::uint64_t position,
                                bool permanent) {
  VItemPosition** ppBucket = nullptr;
  VItemPosition* pFound = nullptr;
  if (m_ppMissBucket && m_MissToken == token) {
    ppBucket = m_ppMissBucket; // Find has just looked: the token has no entry
  } else {
    ppBucket = Bucket(token);
    pFound = *ppBucket;
    while (pFound && !(pFound->m_Token == token))
      pFound = pFound->m_pBucketNext;
  }
  m_ppMissBucket = nullptr;
  if (pFound && !permanent) return;
  if (pFound) {
    if (pFound->m_Generation != Permanent) {
      VListPair& lists = Lists(token.m_TypeId);
      Unhook(pFound->m_Generation == m_Generation ? lists.m_Current : lists.m_Previous, pFound);
    }
    RemoveFromBucket(pFound);
    Recycle(pFound);
  }
  VItemPosition* pEntry = Allocate();
  pEntry->m_Token = token;
  pEntry->m_Position = position;
  if (permanent) {
    pEntry->m_Generation = Permanent;
  } else {
    pEntry->m_Generation = m_Generation;
    Push(Lists(token.m_TypeId).m_Current, pEntry);
  }
  pEntry->m_pBucketNext = *ppBucket;
  pEntry->m_ppBucketLink = ppBucket;
  if (*ppBucket) (*ppBucket)->m_ppBucketLink = &pEntry->m_pBucketNext;
  *ppBucket = pEntry;
}

void VItemPositionStore::EndState() {
  ++m_Generation;
  for (auto& [typeId, lists] : m_Lists) {
    if (lists.m_Current.Empty()) continue;
    while (VItemPosition* pEntry = lists.m_Previous.m_pHead) {
      Unhook(lists.m_Previous, pEntry);
      RemoveFromBucket(pEntry);
      Recycle(pEntry);
    }
    std::swap(lists.m_Current, lists.m_Previous);
  }
}

void VItemPositionStore::Clear() {
  std::fill(m_Buckets.begin(), m_Buckets.end(), nullptr);
  m_Lists.clear();
  m_pLastLists = nullptr;
  m_pFree = nullptr;
  m_ppMissBucket = nullptr;
  m_Blocks.clear();
  m_Generation = 0;
  m_Size = 0;
}

} // namespace Flow2File
