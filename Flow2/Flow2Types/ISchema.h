#pragma once
// A self-contained description of a serialised value: one tree per item type.

#include <cstdint>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

namespace ZMT {

struct ISchemaMember;

class ISchema {
public:
  /// Supported types.
  enum EType : std::uint8_t {
    Void = 0,
    Bool = 1,
    Int8 = 2,
    Int16 = 3,
    Int32 = 4,
    Int64 = 5,
    UInt8 = 6,
    UInt16 = 7,
    UInt32 = 8,
    UInt64 = 9,
    Float32 = 10,
    Float64 = 11,
    String = 12,
    Array = 13,
    List = 14,
    Tuple = 15,
    NamedTuple = 16,
    Enum8 = 17,
    Enum16 = 18,
    Enum32 = 19,
    Ref = 20,
  };
  static constexpr std::uint32_t TypeCount = 21;

  /// The name of a type value; empty for a value outside the 21 types.
  static std::string_view TypeName(std::uint32_t type);
  /// The type value of a name; false for a name that isn't one of the 21.
  static bool TypeFromName(std::string_view name, EType& o_rType);
  /// Bytes on the wire of a fixed-size scalar type; 0 for Void and every variable or composite
  /// type.
  static std::uint32_t ScalarSize(std::uint32_t type);

  std::uint8_t m_Type = Void;
  /// m_Name takes part in comparison only when this is set.
  std::uint8_t m_HasName = 0;
  /// Stored and copied, never compared or interpreted.
  std::uint16_t m_Flags = 0;
  /// Element count of an Array.
  std::uint32_t m_Count = 0;
  /// Class name of a NamedTuple or enum.
  std::string m_Name;
  std::vector<std::pair<std::string, std::uint32_t>> m_EnumValues;
  /// Children: one unnamed member for List and Array, unnamed members for Tuple, named members
  /// for NamedTuple.
  std::vector<ISchemaMember> m_Members;
  /// The class text followed by each member's text, when built with documentation.
  std::vector<std::string> m_Docs;
  /// Member renames, oldest first: (from, to).
  std::vector<std::pair<std::string, std::string>> m_Renames;

  /// Structural equality: type, name flag, count, name (if flagged), enum values and members.
  /// Flags, documentation and renames don't count.
  bool operator==(const ISchema& other) const;
};

struct ISchemaMember {
  std::string m_Name;
  ISchema m_Schema;
};

} // namespace ZMT
