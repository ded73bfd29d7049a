#pragma once

#include "River/CoreOstraTypes/NameHash.h"

#include <cstdint>
#include <string>

namespace CoreOstraTypes {

/// A named rotation observation, the counterpart of a marker for rotation targets. The same
/// record serves VSubject and VSubjectParametrised.
struct VRotationObservationRecord {
  std::string m_Name;
  std::uint32_t m_RotationId = InvalidId; ///< NameHash of the name
  bool operator==(const VRotationObservationRecord&) const = default;
  static constexpr const char* FlowClassName = "RotationObservation";
  template <class S, class V> static void FlowFields(S& s, V&& v) {
    v("Name", "", s.m_Name);
    v("RotationId", "", s.m_RotationId);
  }
};

} // namespace CoreOstraTypes
