#pragma once
// The buffer kinds: fixed pages, pages wrapping a shared buffer, in-place and heap buffers, and
// views.

#include "Flow2/Flow2Types/IFlowBuffer.h"

#include <cstdint>
#include <memory>
#include <memory_resource>
#include <vector>

namespace Flow2Store {

class VFlowBufferFactory;

/// The next link and the walks along a chain.
class VFlowBufferCommon : public ZMT::IFlowBuffer {
public:
  const ZMT::IFlowBufferConst* GetNext() const override { return m_pNext; }
  std::uint64_t GetChainSize() const override;
  bool HasSharedBuffer() const override;
  void ReleaseChain() override;
  ZMT::IFlowBuffer* GetMutableNext() override { return m_pNext; }
  void SetNext(ZMT::IFlowBuffer* i_pNext) override { m_pNext = i_pNext; }

protected:
  ZMT::IFlowBuffer* m_pNext = nullptr;
};

/// A page of N bytes held inline.
template <std::uint64_t N> class VFlowBufferInline final : public VFlowBufferCommon {
public:
  static constexpr std::uint64_t Capacity = N;

  explicit VFlowBufferInline(VFlowBufferFactory* i_pFactory) : m_pFactory(i_pFactory) {}

  const std::uint8_t* GetData() const override { return m_Data; }
  std::uint64_t GetSize() const override { return m_Size; }
  std::uint64_t GetCapacity() const override { return Capacity; }
  std::shared_ptr<const ZMT::IBufferConst> GetSharedBuffer() const override { return nullptr; }
  void Release() override;
  bool SetSize(std::uint64_t size) override {
    if (size > Capacity) return false;
    m_Size = size;
    return true;
  }
  std::uint8_t* GetMutableData() override { return m_Data; }

  /// Back to an empty unlinked page.
  void Reset() {
    m_Size = 0;
    m_pNext = nullptr;
  }

private:
  // The header first: taking and returning a page touches one cache line.
  std::uint64_t m_Size = 0;
  VFlowBufferFactory* m_pFactory;
  std::uint8_t m_Data[Capacity];
};

/// The page streams fill.
using VFlowBufferFixed = VFlowBufferInline<4096>;
/// A page for a body that fits 224 bytes (the page is 256): a chain of small items' bodies, kept
/// by the store with each item, then takes a few cache lines instead of a whole page.
using VFlowBufferSmall = VFlowBufferInline<224>;
extern template class VFlowBufferInline<4096>;
extern template class VFlowBufferInline<224>;

/// A page presenting the bytes of a shared buffer.
class VFlowBufferShared final : public VFlowBufferCommon {
public:
  explicit VFlowBufferShared(VFlowBufferFactory* i_pFactory) : m_pFactory(i_pFactory) {}

  const std::uint8_t* GetData() const override {
    return m_pShared ? m_pShared->GetData() : nullptr;
  }
  std::uint64_t GetSize() const override { return m_pShared ? m_pShared->GetSize() : 0; }
  std::uint64_t GetCapacity() const override { return GetSize(); }
  std::shared_ptr<const ZMT::IBufferConst> GetSharedBuffer() const override { return m_pShared; }
  void Release() override;
  bool SetSize(std::uint64_t size) override { return size == GetSize(); }
  /// Writable only when nobody else holds the wrapped buffer and it is itself writable.
  std::uint8_t* GetMutableData() override;

  void Wrap(std::shared_ptr<const ZMT::IBufferConst> i_pShared) {
    m_pShared = std::move(i_pShared);
  }
  void Reset() {
    m_pShared.reset();
    m_pNext = nullptr;
  }

private:
  std::shared_ptr<const ZMT::IBufferConst> m_pShared;
  VFlowBufferFactory* m_pFactory;
};

/// Header and bytes in one block from an allocator.
class VInPlaceBuffer final : public ZMT::IBuffer {
public:
  /// Raises std::bad_alloc if the allocator can't give the block.
  static std::shared_ptr<ZMT::IBuffer> Create(std::uint64_t size,
                                              std::pmr::memory_resource* i_pAllocator);

  const std::uint8_t* GetData() const override { return Bytes(); }
  std::uint64_t GetSize() const override { return m_Size; }
  std::uint8_t* GetMutableData() override { return Bytes(); }

private:
  VInPlaceBuffer(std::uint64_t size, std::pmr::memory_resource* i_pAllocator)
      : m_Size(size), m_pAllocator(i_pAllocator) {}
  std::uint8_t* Bytes() const {
    return reinterpret_cast<std::uint8_t*>(const_cast<VInPlaceBuffer*>(this)) + HeaderSize();
  }
  static constexpr std::size_t HeaderSize() {
    return (sizeof(VInPlaceBuffer) + alignof(std::max_align_t) - 1) &
           ~(alignof(std::max_align_t) - 1);
  }

  std::uint64_t m_Size;
  std::pmr::memory_resource* m_pAllocator;
};

/// A buffer backed by a heap vector.
class IStandardBuffer final : public ZMT::IBuffer {
public:
  explicit IStandardBuffer(std::uint64_t size) : m_Bytes(size) {}
  const std::uint8_t* GetData() const override { return m_Bytes.data(); }
  std::uint64_t GetSize() const override { return m_Bytes.size(); }
  std::uint8_t* GetMutableData() override { return m_Bytes.data(); }

private:
  std::vector<std::uint8_t> m_Bytes;
};

/// A view of part of another buffer, which it keeps alive.
class VBufferAlias final : public ZMT::IBufferConst {
public:
  /// The view is clipped to the buffer's bytes.
  VBufferAlias(std::shared_ptr<const ZMT::IBufferConst> i_pBuffer, std::uint64_t offset,
               std::uint64_t size);
  const std::uint8_t* GetData() const override {
    return m_pBuffer ? m_pBuffer->GetData() + m_Offset : nullptr;
  }
  std::uint64_t GetSize() const override { return m_Size; }

private:
  std::shared_ptr<const ZMT::IBufferConst> m_pBuffer;
  std::uint64_t m_Offset;
  std::uint64_t m_Size;
};

} // namespace Flow2Store
