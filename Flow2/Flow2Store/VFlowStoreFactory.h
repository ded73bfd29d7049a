#pragma once
// The process-wide factory of stores, state factories and buffer factories.

#include "Flow2/Flow2Types/IFlowState.h"
#include "Flow2/Flow2Types/IFlowStore.h"

namespace Flow2Store {

class VFlowStoreFactory final : public ZMT::IFlowStoreFactory {
public:
  /// A flowStoreId of 0 draws a random one. AlreadyPresent if two factories register the same type
  /// id or name; FailedWithException if the random source fails.
  ZMT::IResult CreateStore(ZMT::IFlowStoreHandle& o_rStore,
                           const ZMT::IFlowItemFactories& factories,
                           std::uint64_t flowStoreId) override;
  ZMT::IResult CreateStateFactory(ZMT::IFlowStateFactoryHandle& o_rFactory) override;
  ZMT::IResult CreateBufferFactory(ZMT::IFlowBufferFactoryHandle& o_rFactory,
                                   std::pmr::memory_resource* i_pAllocator) override;
};

/// The one instance.
VFlowStoreFactory& GetFlowStoreFactory();

} // namespace Flow2Store
