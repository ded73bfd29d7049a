#pragma once
// The data of the three built-in item types: parameters that tag other items, events, and the
// trace of events behind an item.

#include "Flow2/Flow2Types/FlowTags.h"
#include "Flow2/Flow2Types/IFlowItemToken.h"

#include <cstdint>
#include <map>
#include <string>
#include <vector>

namespace ZMT {

/// Tags given to other items: the items they apply to and the tag texts by tag id.
struct VFlowParametersData {
  static constexpr const char* FlowClassName = "FlowParametersItem";
  std::vector<IFlowItemToken> m_Targets;
  std::map<std::int32_t, std::string> m_Tags;
  bool operator==(const VFlowParametersData&) const = default;
  template <class S, class V> static void FlowFields(S& s, V&& v) {
    v("Targets", "Items the parameters apply to", s.m_Targets);
    v("Tags", "Tag texts by tag id", s.m_Tags);
  }
  bool FlowTag(TagId tagId, std::string& o_rValue) const {
    const auto found = m_Tags.find(tagId.Value());
    if (!tagId.IsValid() || found == m_Tags.end()) return false;
    o_rValue = found->second;
    return true;
  }
};

/// Something that happened at a moment of the recording.
struct VFlowEventData {
  static constexpr const char* FlowClassName = "FlowEventItem";
  double m_TimeInSeconds = 0.0;
  std::string m_Name;
  std::string m_Context;
  bool operator==(const VFlowEventData&) const = default;
  template <class S, class V> static void FlowFields(S& s, V&& v) {
    v("TimeInSeconds", "When it happened", s.m_TimeInSeconds);
    v("Name", "What happened", s.m_Name);
    v("Context", "Where it happened, such as Left or Right", s.m_Context);
  }
};

/// The events that led to an item, oldest first.
struct VFlowEventTraceData {
  static constexpr const char* FlowClassName = "FlowEventTraceItem";
  std::vector<IFlowItemToken> m_EventTokens;
  bool operator==(const VFlowEventTraceData&) const = default;
  template <class S, class V> static void FlowFields(S& s, V&& v) {
    v("EventTokens", "Events behind the item", s.m_EventTokens);
  }
};

} // namespace ZMT
