#pragma once
// The unit of storage for one item: token, item, owner count, and its places in the type store's
// hash table and free list.

#include "Flow2/Flow2Types/IFlowBuffer.h"
#include "Flow2/Flow2Types/IFlowHandles.h"

namespace Flow2Store {

class VItemStoreBase;

class VFlowStoreEntry final : public ZMT::IFlowStoreEntry {
public:
  explicit VFlowStoreEntry(VItemStoreBase* i_pStore) : m_pStore(i_pStore) {}
  ~VFlowStoreEntry() override {
    delete m_pItem;
    DropBytes();
  }
  void Release() override;

  void DropBytes() {
    if (m_pBytes) m_pBytes->ReleaseChain();
    m_pBytes = nullptr;
  }

  VFlowStoreEntry* m_pHashNext = nullptr;
  VFlowStoreEntry* m_pFreePrev = nullptr;
  VFlowStoreEntry* m_pFreeNext = nullptr;
  bool m_Linked = false;
  bool m_Free = false;
  /// The serialised form, made on demand and kept until the entry is reused.
  ZMT::IFlowBufferConst* m_pBytes = nullptr;
  VItemStoreBase* const m_pStore;
};

} // namespace Flow2Store
