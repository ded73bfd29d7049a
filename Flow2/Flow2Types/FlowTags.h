#pragma once
// The shared forms of GetTag: each matches one tag id and produces one string.

#include "Flow2/Flow2Types/ITypedId.h"

#include <string>

namespace ZMT::FlowTags {

constexpr int Name = 2;
constexpr int SubjectId = 3;
constexpr int DeviceId = 4;
constexpr int DeviceName = 5;

/// The text when the tag is `expected`; otherwise false and the value untouched.
inline bool TagText(TagId tagId, int expected, const std::string& text, std::string& o_rValue) {
  if (tagId.Value() != expected) return false;
  o_rValue = text;
  return true;
}

/// A number in decimal, no separators, when the tag is `expected`.
template <class N> bool TagNumber(TagId tagId, int expected, N number, std::string& o_rValue) {
  if (tagId.Value() != expected) return false;
  o_rValue = std::to_string(number);
  return true;
}

} // namespace ZMT::FlowTags
