#pragma once
// Hands out states from per-thread pools and takes them back, cleared, when their last owner
// drops them. Every state handed out holds a reference to the factory.

#include "Flow2/Flow2Store/VFlowState.h"
#include "Flow2/Flow2Store/VObjectPool.h"
#include "Flow2/Flow2Types/IFlowState.h"

#include <atomic>

namespace Flow2Store {

class VFlowStateFactory final : public ZMT::IFlowStateFactory {
public:
  VFlowStateFactory();

  ZMT::IResult CreateState(ZMT::IFlowStateHandle& o_rState, const ZMT::VFlowTimestamp& time,
                           const ZMT::VFlowTimestamp& periodic,
                           const ZMT::VFlowTimestamp& absolute) override;
  ZMT::IResult CreateStateCopy(ZMT::IFlowStateHandle& o_rState,
                               const ZMT::IFlowState& source) override;
  void AddReference() override { m_RefCount.fetch_add(1, std::memory_order_relaxed); }
  void DropReference() override;
  ~VFlowStateFactory() override;

  void ReturnState(VFlowState* i_pState);

private:
  std::atomic<std::uint32_t> m_RefCount{0};
  Detail::VObjectPool<VFlowState> m_States;
};

} // namespace Flow2Store
