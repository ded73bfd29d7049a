#pragma once
// Item types for the Flow file fuzz target and its seed maker: a fixed-size marker that reads
// as one block, and a type with every variable shape.

#include "Flow2/Flow2Types/VFlowItem.h"

#include <array>
#include <cstdint>
#include <map>
#include <set>
#include <string>
#include <vector>

namespace FlowFuzz {

enum class EState : std::uint16_t { Off = 0, On = 1, Lost = 2 };

struct VMarker {
  static constexpr const char* FlowClassName = "FuzzMarker";
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
struct VFlowMarker : VMarker {
  static constexpr const char* FlowTypeName = "FlowFuzzMarker";
  static constexpr std::uint32_t FlowTypeId = 1;
  static constexpr ZMT::IFlowItemVersion FlowVersion{1, 2, 0};
};

struct VRich {
  static constexpr const char* FlowClassName = "FuzzRich";
  std::string m_Name;
  std::vector<std::uint32_t> m_Ids;
  std::map<std::string, double> m_Values;
  std::set<std::int16_t> m_Keys;
  std::array<VMarker, 2> m_Pair{};
  std::vector<VMarker> m_Markers;
  EState m_State = EState::Off;
  bool m_Flag = false;
  std::pair<std::int64_t, float> m_Tuple{};
  template <class S, class V> static void FlowFields(S& s, V&& v) {
    v("Name", "", s.m_Name);
    v("Ids", "", s.m_Ids);
    v("Values", "", s.m_Values);
    v("Keys", "", s.m_Keys);
    v("Pair", "", s.m_Pair);
    v("Markers", "", s.m_Markers);
    v("State", "", s.m_State);
    v("Flag", "", s.m_Flag);
    v("Tuple", "", s.m_Tuple);
  }
};
struct VFlowRich : VRich {
  static constexpr const char* FlowTypeName = "FlowFuzzRich";
  static constexpr std::uint32_t FlowTypeId = 2;
  static constexpr ZMT::IFlowItemVersion FlowVersion{1, 2, 0};
};

inline ZMT::IFlowItemFactories Factories() {
  return ZMT::MakeFlowItemFactories<VFlowMarker, VFlowRich>();
}

} // namespace FlowFuzz

template <> struct ZMT::TFlowEnumDescription<FlowFuzz::EState> {
  static constexpr const char* Name = "State";
  static std::vector<std::pair<std::string, std::uint32_t>> Values() {
    return {{"Off", 0}, {"On", 1}, {"Lost", 2}};
  }
};
