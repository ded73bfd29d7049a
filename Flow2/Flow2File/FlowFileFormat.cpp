#include "Flow2/Flow2File/FlowFileFormat.h"

namespace Flow2File {

namespace {
constexpr int MaxSchemaDepth = 32;

bool PutU32(ZMT::IOutputStream& s, std::uint32_t value) {
  return s.Write(&value, 4);
}
bool PutString(ZMT::IOutputStream& s, const std::string& text) {
  return PutU32(s, static_cast<std::uint32_t>(text.size())) &&
         (text.empty() || s.Write(text.data(), text.size()));
}

bool Encode(ZMT::IOutputStream& s, const ZMT::ISchema& node) {
  bool ok = s.Write(&node.m_Type, 1) && s.Write(&node.m_HasName, 1) && s.Write(&node.m_Flags, 2) &&
            PutU32(s, node.m_Count) && PutString(s, node.m_Name);
  ok = ok && PutU32(s, static_cast<std::uint32_t>(node.m_EnumValues.size()));
  for (const auto& [name, value] : node.m_EnumValues)
    ok = ok && PutString(s, name) && PutU32(s, value);
  ok = ok && PutU32(s, static_cast<std::uint32_t>(node.m_Members.size()));
  for (const ZMT::ISchemaMember& member : node.m_Members)
    ok = ok && PutString(s, member.m_Name) && Encode(s, member.m_Schema);
  ok = ok && PutU32(s, static_cast<std::uint32_t>(node.m_Docs.size()));
  for (const std::string& doc : node.m_Docs)
    ok = ok && PutString(s, doc);
  ok = ok && PutU32(s, static_cast<std::uint32_t>(node.m_Renames.size()));
  for (const auto& [from, to] : node.m_Renames)
    ok = ok && PutString(s, from) && PutString(s, to);
  return ok;
}

/// A count of entries each taking at least `least` bytes must fit what is left.
bool GetCount(VByteCursor& c, std::uint32_t& o_rCount, std::size_t least) {
  return c.Get(o_rCount) && std::uint64_t(o_rCount) * least <= c.Left();
}

bool Decode(VByteCursor& c, ZMT::ISchema& node, int depth) {
  if (depth > MaxSchemaDepth) return false;
  std::uint32_t n = 0;
  if (!c.Get(node.m_Type) || !c.Get(node.m_HasName) || !c.Get(node.m_Flags) ||
      !c.Get(node.m_Count) || !c.String(node.m_Name) || !GetCount(c, n, 8))
    return false;
  if (node.m_Type >= ZMT::ISchema::TypeCount) return false;
  node.m_EnumValues.resize(n);
  for (auto& [name, value] : node.m_EnumValues)
    if (!c.String(name) || !c.Get(value)) return false;
  if (!GetCount(c, n, 4 + 28)) return false; // a member's name and the least node
  node.m_Members.resize(n);
  for (ZMT::ISchemaMember& member : node.m_Members)
    if (!c.String(member.m_Name) || !Decode(c, member.m_Schema, depth + 1)) return false;
  if (!GetCount(c, n, 4)) return false;
  node.m_Docs.resize(n);
  for (std::string& doc : node.m_Docs)
    if (!c.String(doc)) return false;
  if (!GetCount(c, n, 8)) return false;
  node.m_Renames.resize(n);
  for (auto& [from, to] : node.m_Renames)
    if (!c.String(from) || !c.String(to)) return false;
  return true;
}
} // namespace

bool VByteCursor::String(std::string& o_rText) {
  std::uint32_t size = 0;
  if (!Get(size) || size > m_Left) return false;
  o_rText.assign(reinterpret_cast<const char*>(m_pBytes), size);
  m_pBytes += size;
  m_Left -= size;
  return true;
}

bool EncodeSchema(ZMT::IOutputStream& io_rStream, const ZMT::ISchema& schema) {
  return Encode(io_rStream, schema);
}

bool DecodeSchema(VByteCursor& io_rCursor, ZMT::ISchema& o_rSchema) {
  o_rSchema = ZMT::ISchema();
  return Decode(io_rCursor, o_rSchema, 0);
}

bool EncodeTypeDefinition(ZMT::IOutputStream& s, const ZMT::IFlowItemTypeInfo& info,
                          const ZMT::ISchema& schema) {
  return PutString(s, info.m_Name) && PutU32(s, info.m_TypeId) &&
         PutU32(s, info.m_Version.m_Major) && PutU32(s, info.m_Version.m_Minor) &&
         PutU32(s, info.m_Version.m_Patch) && PutString(s, info.m_Description) && Encode(s, schema);
}

bool DecodeTypeDefinition(VByteCursor& c, ZMT::IFlowItemTypeInfo& o_rInfo,
                          ZMT::ISchema& o_rSchema) {
  return c.String(o_rInfo.m_Name) && c.Get(o_rInfo.m_TypeId) && c.Get(o_rInfo.m_Version.m_Major) &&
         c.Get(o_rInfo.m_Version.m_Minor) && c.Get(o_rInfo.m_Version.m_Patch) &&
         c.String(o_rInfo.m_Description) && DecodeSchema(c, o_rSchema) && c.Left() == 0;
}

} // namespace Flow2File
