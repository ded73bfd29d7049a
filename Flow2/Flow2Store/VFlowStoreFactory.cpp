#include "Flow2/Flow2Store/VFlowStoreFactory.h"

#include "Flow2/Flow2Store/FlowStoreId.h"
#include "Flow2/Flow2Store/VFlowBufferFactory.h"
#include "Flow2/Flow2Store/VFlowStateFactory.h"
#include "Flow2/Flow2Store/VFlowStore.h"

#include <boost/uuid/entropy_error.hpp>

#include <new>

namespace Flow2Store {

using ZMT::IResult;

IResult VFlowStoreFactory::CreateStore(ZMT::IFlowStoreHandle& o_rStore,
                                       const ZMT::IFlowItemFactories& factories,
                                       std::uint64_t flowStoreId) {
  if (flowStoreId == 0) {
    try {
      flowStoreId = NewFlowStoreId();
    } catch (const boost::uuids::entropy_error&) {
      return IResult::FailedWithException;
    }
  }
  return VFlowStore::Create(factories, flowStoreId, o_rStore);
}

IResult VFlowStoreFactory::CreateStateFactory(ZMT::IFlowStateFactoryHandle& o_rFactory) {
  try {
    o_rFactory = ZMT::IFlowStateFactoryHandle::Adopt(new VFlowStateFactory());
  } catch (const std::bad_alloc&) {
    return IResult::AllocationFailure;
  }
  return IResult::Ok;
}

IResult VFlowStoreFactory::CreateBufferFactory(ZMT::IFlowBufferFactoryHandle& o_rFactory,
                                               std::pmr::memory_resource* i_pAllocator) {
  try {
    o_rFactory = ZMT::IFlowBufferFactoryHandle::Adopt(new VFlowBufferFactory(i_pAllocator));
  } catch (const std::bad_alloc&) {
    return IResult::AllocationFailure;
  }
  return IResult::Ok;
}

VFlowStoreFactory& GetFlowStoreFactory() {
  static VFlowStoreFactory s_Factory;
  return s_Factory;
}

} // namespace Flow2Store
