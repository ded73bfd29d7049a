#include "Flow2/Flow2Store/VFlowStateFactory.h"

#include <new>

namespace Flow2Store {

using ZMT::IResult;

VFlowStateFactory::VFlowStateFactory() : m_States([this] { return new VFlowState(this); }) {}

VFlowStateFactory::~VFlowStateFactory() = default;

void VFlowStateFactory::DropReference() {
  if (ZMT::Detail::DropExtraOwner(m_RefCount)) delete this;
}

IResult VFlowStateFactory::CreateState(ZMT::IFlowStateHandle& o_rState,
                                       const ZMT::VFlowTimestamp& time,
                                       const ZMT::VFlowTimestamp& periodic,
                                       const ZMT::VFlowTimestamp& absolute) {
  VFlowState* pState = nullptr;
  try {
    pState = m_States.Get();
  } catch (const std::bad_alloc&) {
    return IResult::AllocationFailure;
  }
  pState->Reset(time, periodic, absolute);
  AddReference();
  o_rState = ZMT::IFlowStateHandle::Adopt(pState);
  return IResult::Ok;
}

IResult VFlowStateFactory::CreateStateCopy(ZMT::IFlowStateHandle& o_rState,
                                           const ZMT::IFlowState& source) {
  ZMT::IFlowStateHandle state;
  const IResult result = CreateState(state, {}, {}, {});
  if (result.IsFailure()) return result;
  state->Assign(source);
  o_rState = std::move(state);
  return IResult::Ok;
}

void VFlowStateFactory::ReturnState(VFlowState* i_pState) {
  i_pState->Reset({}, {}, {});
  m_States.Return(i_pState);
  DropReference(); // may delete this
}

} // namespace Flow2Store
