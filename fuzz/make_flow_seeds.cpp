// Writes a few small Flow files as seeds for fuzz_flow_file: states with markers and rich items,
// items by reference, a second session, static items.
#include "FlowFuzzTypes.h"

#include "Flow2/Flow2File/VWriter.h"
#include "Flow2/Flow2Store/VFlowStoreFactory.h"
#include "Utils/UtilsFileSystem/MemoryStreams.h"

#include <cstdio>
#include <cstdlib>
#include <string>

namespace {
constexpr std::int64_t Period = 135000000 / 60;

void Check(bool ok) {
  if (!ok) std::abort();
}

void Save(const std::string& path, const std::vector<std::uint8_t>& bytes) {
  std::FILE* pFile = std::fopen(path.c_str(), "wb");
  Check(pFile && std::fwrite(bytes.data(), 1, bytes.size(), pFile) == bytes.size());
  std::fclose(pFile);
}
} // namespace

int main(int argc, char** argv) {
  const std::string folder = argc > 1 ? argv[1] : ".";
  auto& factory = Flow2Store::GetFlowStoreFactory();
  for (int seed = 0; seed < 3; ++seed) {
    ZMT::IFlowStoreHandle store;
    ZMT::IFlowBufferFactoryHandle buffers;
    ZMT::IFlowStateFactoryHandle states;
    Check(factory.CreateStore(store, FlowFuzz::Factories(), 9).IsSuccess());
    Check(factory.CreateBufferFactory(buffers, nullptr).IsSuccess());
    Check(factory.CreateStateFactory(states).IsSuccess());
    const auto& richType = ZMT::Detail::FlowTypeStatics<FlowFuzz::VFlowRich>().m_TypeInfo;
    const auto& markerType = ZMT::Detail::FlowTypeStatics<FlowFuzz::VFlowMarker>().m_TypeInfo;
    ZMT::IFlowItemHandle rich;
    Check(store->CreateItem(richType, rich).IsSuccess());
    auto* pRich = rich.As<ZMT::Detail::VFlowItem<FlowFuzz::VFlowRich>>();
    pRich->m_Name = "rich";
    pRich->m_Ids = {1, 2, 3};
    pRich->m_Values = {{"a", 1.0}};
    pRich->m_Keys = {-1, 5};
    pRich->m_Markers.resize(2);
    pRich->m_State = FlowFuzz::EState::Lost;
    pRich->m_Flag = true;

    UtilsFileSystem::VMemoryOutputStream out;
    Flow2File::VWriter writer(buffers, store);
    Check(writer.Open(&out).IsSuccess());
    for (int session = 1; session <= 1 + seed % 2; ++session)
      for (int f = 0; f < 4 + seed * 3; f += 1 + (f % 3 == 2)) {
        ZMT::IFlowStateHandle state;
        Check(states
                  ->CreateState(state, {f * Period, std::uint64_t(Period), std::uint32_t(session)},
                                {}, {})
                  .IsSuccess());
        for (int m = 0; m < 3; ++m) {
          ZMT::IFlowItemHandle marker;
          Check(store->CreateItem(markerType, marker).IsSuccess());
          marker.As<ZMT::Detail::VFlowItem<FlowFuzz::VFlowMarker>>()->m_X = f + m;
          state->AddItem(marker);
        }
        state->AddItem(rich);
        Check(writer.WriteState(*state).IsSuccess());
      }
    Check(writer.WriteItems({rich}, false).IsSuccess());
    Check(writer.Close().IsSuccess());
    Save(folder + "/seed" + std::to_string(seed + 1) + ".mcp", out.Bytes());
  }
  return 0;
}
