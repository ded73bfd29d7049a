#include "Flow2/Flow2Types/ISchema.h"

namespace ZMT {

namespace {
constexpr std::string_view Names[ISchema::TypeCount] = {
    "Void",   "Bool",   "Int8",       "Int16",   "Int32",   "Int64",  "UInt8",
    "UInt16", "UInt32", "UInt64",     "Float32", "Float64", "String", "Array",
    "List",   "Tuple",  "NamedTuple", "Enum8",   "Enum16",  "Enum32", "Ref"};
constexpr std::uint32_t Sizes[ISchema::TypeCount] = {0, 1, 1, 2, 4, 8, 1, 2, 4, 8, 4,
                                                     8, 0, 0, 0, 0, 0, 1, 2, 4, 0};
} // namespace

std::string_view ISchema::TypeName(std::uint32_t type) {
  return type < TypeCount ? Names[type] : std::string_view();
}

bool ISchema::TypeFromName(std::string_view name, EType& o_rType) {
  for (std::uint32_t i = 0; i < TypeCount; ++i)
    if (Names[i] == name) {
      o_rType = static_cast<EType>(i);
      return true;
    }
  return false;
}

std::uint32_t ISchema::ScalarSize(std::uint32_t type) {
  return type < TypeCount ? Sizes[type] : 0;
}

bool ISchema::operator==(const ISchema& other) const {
  if (m_Type != other.m_Type || m_HasName != other.m_HasName || m_Count != other.m_Count)
    return false;
  if (m_HasName && m_Name != other.m_Name) return false;
  if (m_EnumValues != other.m_EnumValues) return false;
  if (m_Members.size() != other.m_Members.size()) return false;
  for (std::size_t i = 0; i < m_Members.size(); ++i)
    if (m_Members[i].m_Name != other.m_Members[i].m_Name ||
        !(m_Members[i].m_Schema == other.m_Members[i].m_Schema))
      return false;
  return true;
}

} // namespace ZMT
