#pragma once
// Making an item of a described type in a store, typed.

#include "Flow2/Flow2Types/IFlowHandles.h"
#include "Flow2/Flow2Types/IFlowStore.h"
#include "Flow2/Flow2Types/VFlowItem.h"

namespace ZMT {

/// A new item of type T in the store, held by `o_rItem`; null when the store lacks the type or
/// is empty.
template <class T> T* CreateFlowItem(IFlowStoreHandle& io_rStore, IFlowItemHandle& o_rItem) {
  // The type's own record: no copy of its name per item.
  const IFlowItemTypeInfo& info = Detail::FlowTypeStatics<T>().m_TypeInfo;
  if (!io_rStore || io_rStore->CreateItem(info, o_rItem).IsFailure()) return nullptr;
  return o_rItem.As<Detail::VFlowItem<T>>();
}

} // namespace ZMT
