#pragma once
// Intrusive handles to store entries (items), stores and states. A handle is one pointer wide.
//
// Reference counts count the extra owners: a count of 0 means exactly one owner. The owner that
// drops the reference while the count is 0 releases the object; Release re-tests under its own
// lock so that a racing revival through the store is never lost.

#include "Flow2/Flow2Types/IFlowItem.h"
#include "Flow2/Flow2Types/IFlowItemToken.h"

#include <atomic>
#include <cstdint>
#include <utility>

namespace ZMT {

namespace Detail {
/// Drops one reference of a count where 0 means one owner; true when the caller was the last
/// owner and must release the object.
inline bool DropExtraOwner(std::atomic<std::uint32_t>& io_rCount) {
  std::uint32_t count = io_rCount.load(std::memory_order_acquire);
  while (count != 0)
    if (io_rCount.compare_exchange_weak(count, count - 1, std::memory_order_acq_rel)) return false;
  return true;
}
} // namespace Detail

/// What an item handle points at: one item in a store with its token.
class IFlowStoreEntry {
public:
  virtual ~IFlowStoreEntry() = default;
  /// Called by the last owner; returns the entry to its store.
  virtual void Release() = 0;

  IFlowItemToken m_Token;
  IFlowItem* m_pItem = nullptr;
  /// Extra owners: 0 means one owner.
  std::atomic<std::uint32_t> m_RefCount{0};
};

class IFlowItemHandle {
public:
  IFlowItemHandle() = default;
  /// Takes over one ownership that the caller already holds on the entry.
  static IFlowItemHandle Adopt(IFlowStoreEntry* i_pEntry) {
    IFlowItemHandle handle;
    handle.m_pEntry = i_pEntry;
    return handle;
  }
  IFlowItemHandle(const IFlowItemHandle& other) : m_pEntry(other.m_pEntry) {
    if (m_pEntry) m_pEntry->m_RefCount.fetch_add(1, std::memory_order_relaxed);
  }
  IFlowItemHandle(IFlowItemHandle&& other) noexcept
      : m_pEntry(std::exchange(other.m_pEntry, nullptr)) {}
  IFlowItemHandle& operator=(IFlowItemHandle other) noexcept {
    std::swap(m_pEntry, other.m_pEntry);
    return *this;
  }
  ~IFlowItemHandle() { Reset(); }

  void Reset() {
    if (IFlowStoreEntry* pEntry = std::exchange(m_pEntry, nullptr))
      if (Detail::DropExtraOwner(pEntry->m_RefCount)) pEntry->Release();
  }

  /// Gives up the handle's ownership to the caller without dropping it.
  IFlowStoreEntry* Detach() { return std::exchange(m_pEntry, nullptr); }

  explicit operator bool() const { return m_pEntry != nullptr; }
  bool operator==(const IFlowItemHandle& other) const { return m_pEntry == other.m_pEntry; }
  IFlowStoreEntry* GetEntry() const { return m_pEntry; }
  IFlowItem* Get() const { return m_pEntry ? m_pEntry->m_pItem : nullptr; }
  IFlowItem* operator->() const { return Get(); }
  IFlowItem& operator*() const { return *Get(); }
  /// The token of the item; the default token for an empty handle.
  IFlowItemToken GetToken() const { return m_pEntry ? m_pEntry->m_Token : IFlowItemToken(); }
  /// The item as its typed form, null if empty or of another type.
  template <class T> T* As() const { return dynamic_cast<T*>(Get()); }

private:
  IFlowStoreEntry* m_pEntry = nullptr;
};

/// Handle to an object with AddReference and DropReference (stores, states, factories).
template <class I> class IIntrusiveHandle {
public:
  IIntrusiveHandle() = default;
  /// Takes over one ownership that the caller already holds.
  static IIntrusiveHandle Adopt(I* i_pObject) {
    IIntrusiveHandle handle;
    handle.m_pObject = i_pObject;
    return handle;
  }
  IIntrusiveHandle(const IIntrusiveHandle& other) : m_pObject(other.m_pObject) {
    if (m_pObject) m_pObject->AddReference();
  }
  IIntrusiveHandle(IIntrusiveHandle&& other) noexcept
      : m_pObject(std::exchange(other.m_pObject, nullptr)) {}
  IIntrusiveHandle& operator=(IIntrusiveHandle other) noexcept {
    std::swap(m_pObject, other.m_pObject);
    return *this;
  }
  ~IIntrusiveHandle() { Reset(); }

  void Reset() {
    if (I* pObject = std::exchange(m_pObject, nullptr)) pObject->DropReference();
  }
  explicit operator bool() const { return m_pObject != nullptr; }
  I* Get() const { return m_pObject; }
  I* operator->() const { return m_pObject; }
  I& operator*() const { return *m_pObject; }

private:
  I* m_pObject = nullptr;
};

class IFlowStore;
class IFlowState;
using IFlowStoreHandle = IIntrusiveHandle<IFlowStore>;
using IFlowStateHandle = IIntrusiveHandle<IFlowState>;

} // namespace ZMT
