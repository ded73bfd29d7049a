// Reads arbitrary bytes as a Flow file: opens it, reads every state it finds, seeks, and reads the
// static items. Type definitions in the input may describe the local types with other schemas,
// so the compiled readers are exercised too. Every input must end in a result, never a crash or
// a hang.
#include "FlowFuzzTypes.h"

#include "Flow2/Flow2File/VReader.h"
#include "Flow2/Flow2Store/VFlowStoreFactory.h"
#include "Utils/UtilsFileSystem/MemoryStreams.h"

#include <cstddef>
#include <cstdint>
#include <cstdlib>

namespace {
struct VEnvironment {
  VEnvironment() {
    auto& factory = Flow2Store::GetFlowStoreFactory();
    if (factory.CreateBufferFactory(m_Buffers, nullptr).IsFailure() ||
        factory.CreateStateFactory(m_States).IsFailure())
      std::abort();
  }
  ZMT::IFlowBufferFactoryHandle m_Buffers;
  ZMT::IFlowStateFactoryHandle m_States;
};
} // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* i_pData, size_t i_size) {
  static VEnvironment s_Environment;
  // A fresh store each time, so that no item read before hides a bad read now.
  ZMT::IFlowStoreHandle store;
  if (Flow2Store::GetFlowStoreFactory().CreateStore(store, FlowFuzz::Factories(), 5).IsFailure())
    std::abort();
  Flow2File::VReader reader(store, s_Environment.m_Buffers, s_Environment.m_States);
  UtilsFileSystem::VMemoryInputStream in(i_pData, i_size);
  const ZMT::IResult opened = reader.Open(&in);
  if (opened.IsFailure()) {
    if (reader.GetStateCount() != 0) std::abort();
    return 0;
  }
  const std::size_t states = std::min<std::size_t>(reader.GetStateCount(), 2000);
  for (std::size_t i = 0; i < states; ++i) {
    ZMT::IFlowStateHandle state;
    const ZMT::IResult result = reader.ReadState(i, state);
    if (result.IsSuccess() && !state) std::abort();
  }
  if (states) {
    const Flow2File::VReader::VStateEntry& last = reader.GetIndex()[states - 1];
    std::size_t index = 0;
    if (reader.FindState({last.m_Tick, 0, last.m_Session}, index).IsFailure()) std::abort();
    if (reader.GetIndex()[index].m_Tick != last.m_Tick) std::abort();
  }
  std::vector<ZMT::IFlowItemHandle> statics;
  reader.ReadStaticItems(statics);
  for (const ZMT::IFlowItemHandle& item : statics)
    if (!item) std::abort();
  return 0;
}
