#include "Flow2/Flow2Types/FlowCompile.h"

#include <algorithm>
#include <cstdint>
#include <map>

namespace ZMT {

namespace {
constexpr int MaxDepth = 64;

bool IsEnum(std::uint32_t type) {
  return type == ISchema::Enum8 || type == ISchema::Enum16 || type == ISchema::Enum32;
}

std::uint64_t EnumLimit(std::uint32_t type) {
  return type == ISchema::Enum8 ? 0xFFu : type == ISchema::Enum16 ? 0xFFFFu : 0xFFFFFFFFu;
}

using VRenames = std::vector<std::pair<std::string, std::string>>;

/// Brings the file's names to their local form through the two rename histories: entries both
/// have must agree; newer local entries apply forward (oldest first), newer file entries backward
/// (newest first). False when the common entries differ.
bool ApplyHistory(const VRenames& file, const VRenames& local,
                  std::vector<std::string>& io_rNames) {
  const std::size_t common = std::min(file.size(), local.size());
  for (std::size_t i = 0; i < common; ++i)
    if (file[i] != local[i]) return false;
  for (std::size_t i = common; i < local.size(); ++i) {
    if (local[i].first.empty()) continue;
    for (std::string& name : io_rNames)
      if (name == local[i].first) name = local[i].second;
  }
  for (std::size_t i = file.size(); i-- > common;)
    for (std::string& name : io_rNames)
      if (name == file[i].second) name = file[i].first;
  return true;
}

struct VEnumMap {
  std::vector<std::uint32_t> m_Ignored;
  std::vector<std::pair<std::uint32_t, std::uint32_t>> m_Pairs;
};

/// The file's enum values mapped to local ones by name; messages for those that can't be.
bool MapEnum(const ISchema& file, const ISchema& local, VEnumMap& o_rMap,
             std::vector<std::string>* o_pErrors, const std::string& path) {
  std::vector<std::string> names;
  for (const auto& [name, value] : file.m_EnumValues)
    names.push_back(name);
  if (!ApplyHistory(file.m_Renames, local.m_Renames, names)) {
    if (o_pErrors) o_pErrors->push_back(path + "Mismatch in enum history");
    return false;
  }
  bool ok = true;
  for (std::size_t i = 0; i < names.size(); ++i) {
    const std::uint32_t fileValue = file.m_EnumValues[i].second;
    if (names[i].empty()) {
      o_rMap.m_Ignored.push_back(fileValue);
      continue;
    }
    auto it = std::find_if(local.m_EnumValues.begin(), local.m_EnumValues.end(),
                           [&](const auto& v) { return v.first == names[i]; });
    if (it == local.m_EnumValues.end()) {
      if (o_pErrors)
        o_pErrors->push_back(path + "Enum value " + file.m_EnumValues[i].first +
                             " could not be mapped");
      ok = false;
    } else if (it->second > EnumLimit(local.m_Type)) {
      if (o_pErrors)
        o_pErrors->push_back(path + "Enum value " + it->first + " too large for enum storage type");
      ok = false;
    } else {
      o_rMap.m_Pairs.emplace_back(fileValue, it->second);
    }
  }
  std::sort(o_rMap.m_Ignored.begin(), o_rMap.m_Ignored.end());
  std::sort(o_rMap.m_Pairs.begin(), o_rMap.m_Pairs.end());
  // Two file values with one number would make the mapping ambiguous.
  for (std::size_t i = 1; i < o_rMap.m_Pairs.size(); ++i)
    if (o_rMap.m_Pairs[i].first == o_rMap.m_Pairs[i - 1].first) ok = false;
  return ok;
}

IReaderPtr CompileNode(const ISchema& file, const ISchema& local, const IReaderInfo& info,
                       std::uint64_t offset, int depth) {
  if (depth > MaxDepth || !info.m_Create) return nullptr;
  IReaderInfo::IParams params{file, {}, offset};

  if (file.m_Type == ISchema::NamedTuple && local.m_Type == ISchema::NamedTuple) {
    if (info.m_Children.size() != local.m_Members.size()) return nullptr;
    std::vector<std::string> names;
    names.reserve(file.m_Members.size());
    for (const ISchemaMember& member : file.m_Members)
      names.push_back(member.m_Name);
    if (!ApplyHistory(file.m_Renames, local.m_Renames, names)) return nullptr;
    bool anyFound = false;
    for (std::size_t i = 0; i < file.m_Members.size(); ++i) {
      auto it = std::find_if(local.m_Members.begin(), local.m_Members.end(),
                             [&](const ISchemaMember& m) { return m.m_Name == names[i]; });
      IReaderPtr pChild;
      if (it != local.m_Members.end()) {
        const auto j = static_cast<std::size_t>(it - local.m_Members.begin());
        pChild = CompileNode(file.m_Members[i].m_Schema, it->m_Schema, *info.m_Children[j],
                             info.m_ChildOffsets[j], depth + 1);
        anyFound = true;
      } else {
        pChild = IO::MakeSkip(file.m_Members[i].m_Schema);
        if (pChild && pChild->m_Size != 0)
          pChild = std::make_shared<IO::VReaderSkipBytesNoCollapse>(pChild->m_Size);
      }
      if (!pChild) return nullptr;
      params.m_Children.push_back(std::move(pChild));
    }
    // Classes with members but none in common are different types, not versions of one.
    if (!anyFound && !file.m_Members.empty() && !local.m_Members.empty()) return nullptr;
    return info.m_Create(params);
  }

  if (IsEnum(file.m_Type) && IsEnum(local.m_Type)) {
    VEnumMap map;
    if (!MapEnum(file, local, map, nullptr, {})) return nullptr;
    const bool identity = map.m_Ignored.empty() &&
                          std::all_of(map.m_Pairs.begin(), map.m_Pairs.end(),
                                      [](const auto& pair) { return pair.first == pair.second; });
    if (identity) return info.m_Create(params);
    return std::make_shared<IO::VReaderMappedEnum>(
        offset, ISchema::ScalarSize(file.m_Type), ISchema::ScalarSize(local.m_Type),
        std::move(map.m_Ignored), std::move(map.m_Pairs));
  }

  if (file.m_Members.size() != local.m_Members.size() ||
      info.m_Children.size() != local.m_Members.size())
    return nullptr;
  for (std::size_t i = 0; i < file.m_Members.size(); ++i) {
    IReaderPtr pChild = CompileNode(file.m_Members[i].m_Schema, local.m_Members[i].m_Schema,
                                    *info.m_Children[i], info.m_ChildOffsets[i], depth + 1);
    if (!pChild) return nullptr;
    params.m_Children.push_back(std::move(pChild));
  }
  return info.m_Create(params);
}

std::string Join(const std::string& path, const std::string& name) {
  if (path.empty()) return name;
  return name.empty() ? path : path + "." + name;
}

void CompareNode(const ISchema& a, const ISchema& b, const std::string& path,
                 std::vector<std::string>& o_rErrors, std::vector<std::string>& o_rWarnings,
                 int depth) {
  if (depth > MaxDepth) return;
  const std::string where = path.empty() ? std::string(a.m_Name) : path;
  if (a.m_Type != b.m_Type) {
    if (IsEnum(a.m_Type) && IsEnum(b.m_Type)) {
      o_rWarnings.push_back(where + ": Type changed from " +
                            std::string(ISchema::TypeName(a.m_Type)) + " to " +
                            std::string(ISchema::TypeName(b.m_Type)));
    } else {
      (AcceptsFileType(b.m_Type, a.m_Type) ? o_rWarnings : o_rErrors)
          .push_back(where + ": Type changed from " + std::string(ISchema::TypeName(a.m_Type)) +
                     " to " + std::string(ISchema::TypeName(b.m_Type)));
      return;
    }
  }
  if (IsEnum(a.m_Type)) {
    if (a.m_EnumValues != b.m_EnumValues) {
      o_rWarnings.push_back(where + ": Enum was modified");
      VEnumMap map;
      MapEnum(a, b, map, &o_rErrors, where + ": ");
    }
    return;
  }
  switch (a.m_Type) {
  case ISchema::NamedTuple: {
    const std::size_t common = std::min(a.m_Renames.size(), b.m_Renames.size());
    if (!std::equal(a.m_Renames.begin(), a.m_Renames.begin() + common, b.m_Renames.begin())) {
      o_rErrors.push_back(where + ": Schema history has been modified");
      return;
    }
    std::vector<std::string> names;
    for (const ISchemaMember& member : a.m_Members)
      names.push_back(member.m_Name);
    ApplyHistory(a.m_Renames, b.m_Renames, names);
    std::vector<std::size_t> order; // positions in b of a's members found there
    for (std::size_t i = 0; i < names.size(); ++i) {
      auto it = std::find_if(b.m_Members.begin(), b.m_Members.end(),
                             [&](const ISchemaMember& m) { return m.m_Name == names[i]; });
      if (it == b.m_Members.end()) {
        o_rWarnings.push_back(Join(where, a.m_Members[i].m_Name) + " member was removed.");
        continue;
      }
      order.push_back(static_cast<std::size_t>(it - b.m_Members.begin()));
      CompareNode(a.m_Members[i].m_Schema, it->m_Schema, Join(where, names[i]), o_rErrors,
                  o_rWarnings, depth + 1);
    }
    for (const ISchemaMember& member : b.m_Members)
      if (std::find(names.begin(), names.end(), member.m_Name) == names.end())
        o_rWarnings.push_back(Join(where, member.m_Name) + " member was added.");
    if (!std::is_sorted(order.begin(), order.end()))
      o_rWarnings.push_back(where + ": members were re-ordered");
    return;
  }
  case ISchema::Tuple:
  case ISchema::Ref:
    if (a.m_Members.size() != b.m_Members.size()) {
      o_rErrors.push_back(where + ": Tuple size changed from " +
                          std::to_string(a.m_Members.size()) + " to " +
                          std::to_string(b.m_Members.size()));
      return;
    }
    break;
  case ISchema::Array:
    if (a.m_Count != b.m_Count) {
      o_rErrors.push_back(where + ": Array length changed from " + std::to_string(a.m_Count) +
                          " to " + std::to_string(b.m_Count));
      return;
    }
    break;
  default:
    break;
  }
  const std::size_t n = std::min(a.m_Members.size(), b.m_Members.size());
  for (std::size_t i = 0; i < n; ++i) {
    // Built by appending: GCC 12 warns falsely (-Wrestrict) on "[" + std::to_string(i).
    std::string index(1, '[');
    index += std::to_string(i);
    index += ']';
    CompareNode(a.m_Members[i].m_Schema, b.m_Members[i].m_Schema, Join(where, index), o_rErrors,
                o_rWarnings, depth + 1);
  }
}
} // namespace

bool AcceptsFileType(std::uint32_t field, std::uint32_t file) {
  if (field == file) return true;
  switch (field) {
  case ISchema::Int8:
  case ISchema::UInt8:
    return file == ISchema::Bool;
  case ISchema::Int16:
    return file == ISchema::Int8 || file == ISchema::UInt8 || file == ISchema::Bool;
  case ISchema::Int32:
    return file == ISchema::Int16 || file == ISchema::UInt16 || file == ISchema::Int8 ||
           file == ISchema::UInt8 || file == ISchema::Bool;
  case ISchema::Int64:
    return file == ISchema::Int32 || file == ISchema::UInt32 || file == ISchema::Int16 ||
           file == ISchema::UInt16 || file == ISchema::Int8 || file == ISchema::UInt8 ||
           file == ISchema::Bool;
  case ISchema::UInt16:
    return file == ISchema::UInt8 || file == ISchema::Bool;
  case ISchema::UInt32:
    return file == ISchema::UInt16 || file == ISchema::UInt8 || file == ISchema::Bool;
  case ISchema::UInt64:
    return file == ISchema::UInt32 || file == ISchema::UInt16 || file == ISchema::UInt8 ||
           file == ISchema::Bool;
  case ISchema::Float32:
    return file == ISchema::Float64;
  case ISchema::Float64:
    return file == ISchema::Float32;
  case ISchema::Enum8:
  case ISchema::Enum16:
  case ISchema::Enum32:
    return IsEnum(file);
  default:
    return false;
  }
}

namespace IO {
IReaderPtr Collapse(std::vector<IReaderPtr> children, std::uint64_t offset, std::uint64_t size) {
  std::vector<IReaderPtr> out;
  out.reserve(children.size());
  for (IReaderPtr& pChild : children) {
    if (!out.empty() && pChild->m_Size != 0 && out.back()->m_Size != 0 &&
        out.back()->m_Offset != IReaderCollapsable::NoOffset &&
        out.back()->m_Offset + out.back()->m_Size == pChild->m_Offset &&
        std::uint64_t(out.back()->m_Size) + pChild->m_Size <= 0xFFFFFFFFu) {
      out.back() =
          std::make_shared<VReaderBytes>(out.back()->m_Offset, out.back()->m_Size + pChild->m_Size);
    } else {
      out.push_back(std::move(pChild));
    }
  }
  if (out.size() == 1 && out[0]->m_Offset == 0 && out[0]->m_Size == size)
    return std::make_shared<VReaderBytes>(offset, static_cast<std::uint32_t>(size));
  return std::make_shared<VReaderTuple>(offset, std::move(out));
}
} // namespace IO

IReaderPtr Compile(const ISchema& fileSchema, const ISchema& localSchema, const IReaderInfo& info) {
  try {
    return CompileNode(fileSchema, localSchema, info, 0, 0);
  } catch (const std::exception&) {
    return nullptr;
  }
}

void CompareSchemas(const ISchema& oldSchema, const ISchema& newSchema,
                    std::vector<std::string>& o_rErrors, std::vector<std::string>& o_rWarnings) {
  CompareNode(oldSchema, newSchema, {}, o_rErrors, o_rWarnings, 0);
}

} // namespace ZMT
