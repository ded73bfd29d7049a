#include "Flow2/Flow2Types/FlowReaders.h"

#include <cstring>
#include <limits>

namespace ZMT::IO {

namespace {
/// Skips by reading through a scratch of at most this many bytes at a time.
constexpr std::uint64_t SkipPiece = 4096;

IResult SkipThrough(IInputStream& io_rStream, std::vector<std::uint8_t>& io_rScratch,
                    std::uint64_t size) {
  if (size == 0) return IResult::OkButNoEffect;
  if (io_rScratch.size() < std::min(size, SkipPiece)) io_rScratch.resize(std::min(size, SkipPiece));
  while (size > 0) {
    const std::uint64_t piece = std::min<std::uint64_t>(size, io_rScratch.size());
    if (!io_rStream.Read(io_rScratch.data(), piece)) return IResult::Failed;
    size -= piece;
  }
  return IResult::OkButNoEffect;
}

/// Whether a value of the node always takes no bytes (then a count of them needs no loop).
bool TakesNoBytes(const ISchema& node) {
  switch (node.m_Type) {
  case ISchema::Void:
    return true;
  case ISchema::Array:
    return node.m_Count == 0 ||
           (node.m_Members.size() == 1 && TakesNoBytes(node.m_Members[0].m_Schema));
  case ISchema::Tuple:
  case ISchema::NamedTuple:
  case ISchema::Ref:
    for (const ISchemaMember& member : node.m_Members)
      if (!TakesNoBytes(member.m_Schema)) return false;
    return true;
  default:
    return false;
  }
}
} // namespace

IResult VReaderMappedEnum::Read(IInputStream& io_rStream, void* o_pTarget) {
  std::uint32_t value = 0;
  if (!io_rStream.Read(&value, m_FileWidth)) return IResult::Failed; // little-endian
  if (std::binary_search(m_Ignored.begin(), m_Ignored.end(), value)) return IResult::OkButNoEffect;
  if (!m_Pairs.empty()) {
    auto it = std::lower_bound(m_Pairs.begin(), m_Pairs.end(), value,
                               [](const auto& pair, std::uint32_t v) { return pair.first < v; });
    if (it == m_Pairs.end() || it->first != value) return IResult::Failed;
    value = it->second;
  }
  std::memcpy(o_pTarget, &value, m_LocalWidth);
  return IResult::Ok;
}

IResult VReaderSkipBytes::Read(IInputStream& io_rStream, void*) {
  return SkipThrough(io_rStream, m_Scratch, m_Size);
}

IResult VReaderSkipBytesNoCollapse::Read(IInputStream& io_rStream, void*) {
  return SkipThrough(io_rStream, m_Scratch, m_SkipSize);
}

IResult VReaderSkipArray::Read(IInputStream& io_rStream, void*) {
  for (std::uint32_t i = 0; i < m_Count; ++i)
    if (m_pChild->Read(io_rStream, nullptr).IsFailure()) return IResult::Failed;
  return IResult::OkButNoEffect;
}

IResult VReaderSkipContainer::Read(IInputStream& io_rStream, void*) {
  std::uint32_t count = 0;
  if (!io_rStream.Read(&count, sizeof count)) return IResult::Failed;
  for (std::uint32_t i = 0; i < count; ++i)
    if (m_pChild->Read(io_rStream, nullptr).IsFailure()) return IResult::Failed;
  return IResult::OkButNoEffect;
}

IResult VReaderSkipContiguousVector::Read(IInputStream& io_rStream, void*) {
  std::uint32_t count = 0;
  if (!io_rStream.Read(&count, sizeof count)) return IResult::Failed;
  return SkipThrough(io_rStream, m_Scratch, std::uint64_t(count) * m_ElementSize).IsFailure()
             ? IResult::Failed
             : IResult::OkButNoEffect;
}

IResult VReaderSkipTuple::Read(IInputStream& io_rStream, void*) {
  for (const IReaderPtr& pChild : m_Children)
    if (pChild->Read(io_rStream, nullptr).IsFailure()) return IResult::Failed;
  return IResult::OkButNoEffect;
}

namespace {
/// A skip of a fixed number of bytes, collapsable while the size fits its field.
IReaderPtr SkipOf(std::uint64_t size) {
  if (size <= std::numeric_limits<std::uint32_t>::max())
    return std::make_shared<VReaderSkipBytes>(static_cast<std::uint32_t>(size));
  return std::make_shared<VReaderSkipBytesNoCollapse>(size);
}

/// Bytes of one fixed-size value as its skip reader sees it; 0 for a variable one.
std::uint64_t FixedSkipSize(const IReaderPtr& pSkip) {
  if (pSkip->m_Size != 0) return pSkip->m_Size;
  if (auto* p = dynamic_cast<VReaderSkipBytesNoCollapse*>(pSkip.get())) return p->SkipSize();
  return 0;
}
} // namespace

IReaderPtr MakeSkip(const ISchema& node) {
  if (TakesNoBytes(node)) return std::make_shared<VReaderSkipBytes>(0);
  switch (node.m_Type) {
  case ISchema::Bool:
  case ISchema::Int8:
  case ISchema::UInt8:
  case ISchema::Enum8:
  case ISchema::Int16:
  case ISchema::UInt16:
  case ISchema::Enum16:
  case ISchema::Int32:
  case ISchema::UInt32:
  case ISchema::Float32:
  case ISchema::Enum32:
  case ISchema::Int64:
  case ISchema::UInt64:
  case ISchema::Float64:
    return std::make_shared<VReaderSkipBytes>(ISchema::ScalarSize(node.m_Type));
  case ISchema::String:
    return std::make_shared<VReaderSkipContiguousVector>(1);
  case ISchema::Array: {
    if (node.m_Members.size() != 1) return nullptr;
    IReaderPtr pElement = MakeSkip(node.m_Members[0].m_Schema);
    if (!pElement) return nullptr;
    if (const std::uint64_t size = FixedSkipSize(pElement)) return SkipOf(size * node.m_Count);
    return std::make_shared<VReaderSkipArray>(node.m_Count, std::move(pElement));
  }
  case ISchema::List: {
    if (node.m_Members.size() != 1) return nullptr;
    if (TakesNoBytes(node.m_Members[0].m_Schema))
      return std::make_shared<VReaderSkipContiguousVector>(0);
    IReaderPtr pElement = MakeSkip(node.m_Members[0].m_Schema);
    if (!pElement) return nullptr;
    const std::uint64_t size = FixedSkipSize(pElement);
    if (size != 0 && size <= std::numeric_limits<std::uint32_t>::max())
      return std::make_shared<VReaderSkipContiguousVector>(static_cast<std::uint32_t>(size));
    return std::make_shared<VReaderSkipContainer>(std::move(pElement));
  }
  case ISchema::Tuple:
  case ISchema::NamedTuple:
  case ISchema::Ref: {
    std::vector<IReaderPtr> children;
    children.reserve(node.m_Members.size());
    for (const ISchemaMember& member : node.m_Members) {
      IReaderPtr pChild = MakeSkip(member.m_Schema);
      if (!pChild) return nullptr;
      children.push_back(std::move(pChild));
    }
    return std::make_shared<VReaderSkipTuple>(std::move(children));
  }
  default:
    return nullptr; // not a type: nothing can be skipped safely
  }
}

} // namespace ZMT::IO
