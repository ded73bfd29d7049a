#pragma once
// Byte buffers: plain buffers, and Flow buffers that chain fixed pages into one value.

#include "Flow2/Flow2Types/IFlowHandles.h"
#include "Flow2/Flow2Types/IFlowItem.h"
#include "Utils/UtilsFileSystem/IResult.h"
#include "Utils/UtilsFileSystem/Streams.h"

#include <cstdint>
#include <memory>

namespace ZMT {

// IBufferConst and IBuffer live with the byte streams (Utils/UtilsFileSystem/Streams.h).

/// One page of a chain. The chain's value is the pages' bytes in order.
class IFlowBufferConst : public IBufferConst {
public:
  virtual std::uint64_t GetCapacity() const = 0;
  /// The wrapped buffer of a page that shares someone else's bytes; null for a page that owns its
  /// bytes.
  virtual std::shared_ptr<const IBufferConst> GetSharedBuffer() const = 0;
  virtual const IFlowBufferConst* GetNext() const = 0;
  /// Bytes of this page and all that follow.
  virtual std::uint64_t GetChainSize() const = 0;
  /// Whether any page from here on wraps a shared buffer.
  virtual bool HasSharedBuffer() const = 0;
  /// Releases this page and all that follow.
  virtual void ReleaseChain() = 0;
  /// Releases this page only.
  virtual void Release() = 0;
};

class IFlowBuffer : public IFlowBufferConst {
public:
  /// False, changing nothing, when the size exceeds the capacity.
  virtual bool SetSize(std::uint64_t size) = 0;
  /// Null when the bytes can't be written (a shared page whose bytes others hold too).
  virtual std::uint8_t* GetMutableData() = 0;
  virtual IFlowBuffer* GetMutableNext() = 0;
  virtual void SetNext(IFlowBuffer* i_pNext) = 0;
};

class IFlowItemWriter {
public:
  virtual ~IFlowItemWriter() = default;
  /// Serialises the item into a new chain owned by the caller.
  virtual IResult Write(const IFlowItem& i_rItem, IFlowBuffer*& o_rpBuffer) = 0;
};

class IFlowItemReader {
public:
  virtual ~IFlowItemReader() = default;
  /// Reads the item from the chain, which stays the caller's.
  virtual IResult Read(const IFlowBufferConst* i_pBuffer, IFlowItem& io_rItem) = 0;
};

class IFlowBufferFactory {
public:
  virtual ~IFlowBufferFactory() = default;
  /// Pages enough for `size` bytes, each full but the last; one page for at most a page's worth.
  /// A page's capacity may be smaller than a stream's page when the whole size fits it.
  virtual IFlowBuffer* AllocateChain(std::uint64_t size) = 0;
  virtual IFlowBuffer* AllocatePage() = 0;
  /// A page that presents the bytes of a shared buffer.
  virtual IFlowBuffer* WrapShared(std::shared_ptr<const IBufferConst> i_pBuffer) = 0;
  /// A buffer whose header and bytes are one block from the factory's allocator.
  virtual std::shared_ptr<IBuffer> AllocateInPlace(std::uint64_t size) = 0;
  /// A buffer whose header and bytes are one block from the heap.
  virtual std::shared_ptr<IBuffer> AllocateStandard(std::uint64_t size) = 0;
  virtual IFlowItemWriter& GetItemWriter() = 0;
  virtual IFlowItemReader& GetItemReader() = 0;
  virtual void AddReference() = 0;
  virtual void DropReference() = 0;
  virtual std::uint32_t GetReferenceCount() const = 0;
};

using IFlowBufferFactoryHandle = IIntrusiveHandle<IFlowBufferFactory>;

} // namespace ZMT
