#pragma once
// The marker item the Flow store and Flow file benchmarks share: three coordinates, a residual
// and flags, 32 bytes on file.
#include "Flow2/Flow2Types/VFlowItem.h"
#include <cstdint>

namespace Bench {

struct VMarker {
  static constexpr const char* FlowClassName = "BenchMarker";
  double m_X = 0, m_Y = 0, m_Z = 0;
  float m_Residual = 0;
  std::uint32_t m_Flags = 0;
  template <class S, class V> static void FlowFields(S& s, V&& v) {
    v("X", "", s.m_X);
    v("Y", "", s.m_Y);
    v("Z", "", s.m_Z);
    v("Residual", "", s.m_Residual);
    v("Flags", "", s.m_Flags);
  }
};
struct VFlowBenchMarker : VMarker {
  static constexpr const char* FlowTypeName = "FlowBenchMarker";
  static constexpr std::uint32_t FlowTypeId = 1;
  static constexpr ZMT::IFlowItemVersion FlowVersion{1, 0, 0};
};
using MarkerItem = ZMT::Detail::VFlowItem<VFlowBenchMarker>;

} // namespace Bench
