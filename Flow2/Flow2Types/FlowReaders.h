#pragma once
// Field readers: small objects that read one value of a file's schema into a local value, built
// once per type and file by comparing the two schemas (FlowCompile.h). Where the layouts agree
// the tree collapses to plain block copies straight into the target.
//
// A compiled reader keeps scratch storage for skipping, so one reader serves one thread at a time.

#include "Flow2/Flow2Types/FlowFieldTraits.h"
#include "Flow2/Flow2Types/ISchema.h"
#include "Utils/UtilsFileSystem/IResult.h"
#include "Utils/UtilsFileSystem/Streams.h"

#include <algorithm>
#include <array>
#include <cstdint>
#include <map>
#include <memory>
#include <set>
#include <string>
#include <type_traits>
#include <utility>
#include <vector>

namespace ZMT {

class IReader {
public:
  /// Reads one value into the object at `o_pTarget` (null: read and drop it).
  virtual IResult Read(IInputStream& io_rStream, void* o_pTarget) = 0;
  virtual ~IReader() = default;
};

/// A reader that knows where its field lies in its parent and whether it is a plain block copy.
class IReaderCollapsable : public IReader {
public:
  static constexpr std::uint64_t NoOffset = ~std::uint64_t(0);
  /// Byte offset of the field in its parent; NoOffset for a reader that stores nothing.
  std::uint64_t m_Offset = NoOffset;
  /// The field's size when the reader copies exactly that many bytes into it; 0 otherwise.
  std::uint32_t m_Size = 0;
};

using IReaderPtr = std::shared_ptr<IReaderCollapsable>;

namespace IO {

/// Combines children's results: any failure at once; otherwise Ok, OkButPartial or OkButNoEffect.
class VResultCombiner {
public:
  /// False for a failure, which the caller returns as it is.
  bool Add(IResult result) {
    if (result.IsFailure()) return false;
    if (result.Code() == IResult::Ok || result.Code() == IResult::OkButPartial) m_Effect = true;
    if (result.Code() == IResult::OkButNoEffect || result.Code() == IResult::OkButPartial)
      m_Partial = true;
    return true;
  }
  IResult Result() const {
    if (!m_Effect && m_Partial) return IResult::OkButNoEffect;
    return m_Partial ? IResult::OkButPartial : IResult::Ok;
  }

private:
  bool m_Effect = false;
  bool m_Partial = false;
};

inline void* AtOffset(void* o_pTarget, std::uint64_t offset) {
  return o_pTarget ? static_cast<std::uint8_t*>(o_pTarget) + offset : nullptr;
}

/// m_Size bytes straight into the target.
class VReaderBytes final : public IReaderCollapsable {
public:
  VReaderBytes(std::uint64_t offset, std::uint32_t size) {
    m_Offset = offset;
    m_Size = size;
  }
  IResult Read(IInputStream& io_rStream, void* o_pTarget) override {
    return io_rStream.Read(o_pTarget, m_Size) ? IResult::Ok : IResult::Failed;
  }
};

/// Reads a From and stores a To, by plain cast (a bool is any non-zero byte).
template <class From, class To> class VReaderConverter final : public IReaderCollapsable {
public:
  explicit VReaderConverter(std::uint64_t offset) { m_Offset = offset; }
  IResult Read(IInputStream& io_rStream, void* o_pTarget) override {
    From value{};
    if constexpr (std::is_same_v<From, bool>) {
      std::uint8_t b = 0;
      if (!io_rStream.Read(&b, 1)) return IResult::Failed;
      value = b != 0;
    } else if (!io_rStream.Read(&value, sizeof value)) {
      return IResult::Failed;
    }
    *static_cast<To*>(o_pTarget) = Convert(value);
    return IResult::Ok;
  }

private:
  static To Convert(From value) {
    if constexpr (std::is_same_v<To, bool>) {
      return value != From{};
    } else if constexpr (std::is_floating_point_v<From> && std::is_same_v<To, std::uint64_t>) {
      // The two-range cast: values from 2^63 up don't fit the signed conversion.
      constexpr From Half = static_cast<From>(9223372036854775808.0);
      return value >= Half ? static_cast<std::uint64_t>(value - Half) + (std::uint64_t(1) << 63)
                           : static_cast<std::uint64_t>(value);
    } else {
      return static_cast<To>(value);
    }
  }
};

/// Calls its children in order, each at its offset in the target.
class VReaderTuple final : public IReaderCollapsable {
public:
  VReaderTuple(std::uint64_t offset, std::vector<IReaderPtr> children)
      : m_Children(std::move(children)) {
    m_Offset = offset;
  }
  IResult Read(IInputStream& io_rStream, void* o_pTarget) override {
    VResultCombiner combined;
    for (const IReaderPtr& pChild : m_Children) {
      void* pField = pChild->m_Offset == NoOffset ? nullptr : AtOffset(o_pTarget, pChild->m_Offset);
      const IResult result = pChild->Read(io_rStream, pField);
      if (!combined.Add(result)) return result;
    }
    return combined.Result();
  }
  const std::vector<IReaderPtr>& Children() const { return m_Children; }

private:
  std::vector<IReaderPtr> m_Children;
};

/// An enum whose values were renumbered or retired: file values map to local ones by name.
class VReaderMappedEnum final : public IReaderCollapsable {
public:
  /// Both lists sorted by file value.
  VReaderMappedEnum(std::uint64_t offset, std::uint32_t fileWidth, std::uint32_t localWidth,
                    std::vector<std::uint32_t> ignored,
                    std::vector<std::pair<std::uint32_t, std::uint32_t>> pairs)
      : m_FileWidth(fileWidth), m_LocalWidth(localWidth), m_Ignored(std::move(ignored)),
        m_Pairs(std::move(pairs)) {
    m_Offset = offset;
  }
  IResult Read(IInputStream& io_rStream, void* o_pTarget) override;

private:
  std::uint32_t m_FileWidth;
  std::uint32_t m_LocalWidth;
  std::vector<std::uint32_t> m_Ignored;
  std::vector<std::pair<std::uint32_t, std::uint32_t>> m_Pairs;
};

/// u32 length, then the bytes.
class VReaderString final : public IReaderCollapsable {
public:
  explicit VReaderString(std::uint64_t offset) { m_Offset = offset; }
  IResult Read(IInputStream& io_rStream, void* o_pTarget) override {
    return TFlowField<std::string>::Read(io_rStream, *static_cast<std::string*>(o_pTarget))
               ? IResult::Ok
               : IResult::Failed;
  }
};

/// Reads and drops m_Size bytes.
class VReaderSkipBytes final : public IReaderCollapsable {
public:
  explicit VReaderSkipBytes(std::uint32_t size) { m_Size = size; }
  IResult Read(IInputStream& io_rStream, void*) override;

private:
  std::vector<std::uint8_t> m_Scratch;
};

/// The same, with the size where collapsing doesn't see it.
class VReaderSkipBytesNoCollapse final : public IReaderCollapsable {
public:
  explicit VReaderSkipBytesNoCollapse(std::uint64_t size) : m_SkipSize(size) {}
  IResult Read(IInputStream& io_rStream, void*) override;
  std::uint64_t SkipSize() const { return m_SkipSize; }

private:
  std::uint64_t m_SkipSize;
  std::vector<std::uint8_t> m_Scratch;
};

/// A fixed count of variable elements, each skipped by the child.
class VReaderSkipArray final : public IReaderCollapsable {
public:
  VReaderSkipArray(std::uint32_t count, IReaderPtr pChild)
      : m_Count(count), m_pChild(std::move(pChild)) {}
  IResult Read(IInputStream& io_rStream, void*) override;

private:
  std::uint32_t m_Count;
  IReaderPtr m_pChild;
};

/// u32 count, then the child that many times.
class VReaderSkipContainer final : public IReaderCollapsable {
public:
  explicit VReaderSkipContainer(IReaderPtr pChild) : m_pChild(std::move(pChild)) {}
  IResult Read(IInputStream& io_rStream, void*) override;

private:
  IReaderPtr m_pChild;
};

/// u32 count, then count times the element size, dropped.
class VReaderSkipContiguousVector final : public IReaderCollapsable {
public:
  explicit VReaderSkipContiguousVector(std::uint32_t elementSize) : m_ElementSize(elementSize) {}
  IResult Read(IInputStream& io_rStream, void*) override;

private:
  std::uint32_t m_ElementSize;
  std::vector<std::uint8_t> m_Scratch;
};

/// The children in order, each with no target.
class VReaderSkipTuple final : public IReaderCollapsable {
public:
  explicit VReaderSkipTuple(std::vector<IReaderPtr> children) : m_Children(std::move(children)) {}
  IResult Read(IInputStream& io_rStream, void*) override;

private:
  std::vector<IReaderPtr> m_Children;
};

/// N elements, each by the child.
template <class T, std::size_t N> class VReaderArray final : public IReaderCollapsable {
public:
  VReaderArray(std::uint64_t offset, IReaderPtr pChild) : m_pChild(std::move(pChild)) {
    m_Offset = offset;
  }
  IResult Read(IInputStream& io_rStream, void* o_pTarget) override {
    auto& target = *static_cast<std::array<T, N>*>(o_pTarget);
    VResultCombiner combined;
    for (T& element : target) {
      const IResult result = m_pChild->Read(io_rStream, &element);
      if (!combined.Add(result)) return result;
    }
    return combined.Result();
  }

private:
  IReaderPtr m_pChild;
};

/// u32 count, then each element default-made, read by the child and appended.
template <class T> class VReaderVector final : public IReaderCollapsable {
public:
  VReaderVector(std::uint64_t offset, IReaderPtr pChild) : m_pChild(std::move(pChild)) {
    m_Offset = offset;
  }
  IResult Read(IInputStream& io_rStream, void* o_pTarget) override {
    auto& target = *static_cast<std::vector<T>*>(o_pTarget);
    std::uint32_t count = 0;
    if (!io_rStream.Read(&count, sizeof count)) return IResult::Failed;
    target.clear();
    // A corrupt count ends in a failed read, not in a huge reservation.
    target.reserve(std::min<std::uint32_t>(count, Detail::ReadGrowStep / 8));
    VResultCombiner combined;
    for (std::uint32_t i = 0; i < count; ++i) {
      T element{};
      const IResult result = m_pChild->Read(io_rStream, &element);
      if (!combined.Add(result)) return result;
      target.push_back(std::move(element));
    }
    return combined.Result();
  }

private:
  IReaderPtr m_pChild;
};

/// u32 count, then all elements in one block: for elements without gaps.
template <class T> class VReaderContiguousVector final : public IReaderCollapsable {
public:
  explicit VReaderContiguousVector(std::uint64_t offset) { m_Offset = offset; }
  IResult Read(IInputStream& io_rStream, void* o_pTarget) override {
    auto& target = *static_cast<std::vector<T>*>(o_pTarget);
    std::uint32_t count = 0;
    if (!io_rStream.Read(&count, sizeof count)) return IResult::Failed;
    target.clear();
    constexpr std::uint32_t Step = std::max<std::uint32_t>(1, Detail::ReadGrowStep / sizeof(T));
    while (target.size() < count) {
      const std::size_t have = target.size();
      const std::size_t step = std::min<std::size_t>(count - have, Step);
      target.resize(have + step);
      if (!io_rStream.Read(target.data() + have, step * sizeof(T))) return IResult::Failed;
    }
    return IResult::Ok;
  }
};

/// u32 count, then (key, value) tuples; an element that read to no effect isn't inserted, and the
/// last of duplicate keys wins.
template <class K, class V> class VReaderMap final : public IReaderCollapsable {
public:
  VReaderMap(std::uint64_t offset, IReaderPtr pChild) : m_pChild(std::move(pChild)) {
    m_Offset = offset;
  }
  IResult Read(IInputStream& io_rStream, void* o_pTarget) override {
    auto& target = *static_cast<std::map<K, V>*>(o_pTarget);
    std::uint32_t count = 0;
    if (!io_rStream.Read(&count, sizeof count)) return IResult::Failed;
    target.clear();
    VResultCombiner combined;
    for (std::uint32_t i = 0; i < count; ++i) {
      std::pair<K, V> element{};
      const IResult result = m_pChild->Read(io_rStream, &element);
      if (!combined.Add(result)) return result;
      if (result.Code() != IResult::OkButNoEffect)
        target.insert_or_assign(std::move(element.first), std::move(element.second));
    }
    return combined.Result();
  }

private:
  IReaderPtr m_pChild;
};

/// u32 count, then the keys; as the map.
template <class K> class VReaderSet final : public IReaderCollapsable {
public:
  VReaderSet(std::uint64_t offset, IReaderPtr pChild) : m_pChild(std::move(pChild)) {
    m_Offset = offset;
  }
  IResult Read(IInputStream& io_rStream, void* o_pTarget) override {
    auto& target = *static_cast<std::set<K>*>(o_pTarget);
    std::uint32_t count = 0;
    if (!io_rStream.Read(&count, sizeof count)) return IResult::Failed;
    target.clear();
    VResultCombiner combined;
    for (std::uint32_t i = 0; i < count; ++i) {
      K key{};
      const IResult result = m_pChild->Read(io_rStream, &key);
      if (!combined.Add(result)) return result;
      if (result.Code() != IResult::OkButNoEffect) target.insert(std::move(key));
    }
    return combined.Result();
  }

private:
  IReaderPtr m_pChild;
};

/// A reader that skips one value of the schema node exactly, storing nothing.
IReaderPtr MakeSkip(const ISchema& i_rNode);

} // namespace IO
} // namespace ZMT
