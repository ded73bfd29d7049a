#pragma once
// The record of one item type: name, id, version of the serialised form, description.

#include "Flow2/Flow2Types/ISchema.h"

#include <compare>
#include <cstdint>
#include <string>

namespace ZMT {

/// Version of a serialised form; compared field by field, major first.
struct IFlowItemVersion {
  std::uint32_t m_Major = 0;
  std::uint32_t m_Minor = 0;
  std::uint32_t m_Patch = 0;

  constexpr auto operator<=>(const IFlowItemVersion&) const = default;
};

struct IFlowItemTypeInfo {
  std::string m_Name;
  std::uint32_t m_TypeId = 0;
  IFlowItemVersion m_Version;
  std::string m_Description;

  bool operator==(const IFlowItemTypeInfo&) const = default;
};

/// The statics a factory hands out for its type: the type record and the schema tree.
struct IFlowItemStaticInfo {
  IFlowItemTypeInfo m_TypeInfo;
  ISchema m_Schema;
};

} // namespace ZMT
