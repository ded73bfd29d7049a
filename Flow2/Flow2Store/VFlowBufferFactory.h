#pragma once
// Hands out pages from per-thread pools, wraps shared buffers, and serialises items into chains.

#include "Flow2/Flow2Store/VFlowBuffers.h"
#include "Flow2/Flow2Store/VObjectPool.h"
#include "Flow2/Flow2Types/IFlowBuffer.h"

#include <atomic>
#include <memory_resource>

namespace Flow2Store {

class VFlowBufferFactory final : public ZMT::IFlowBufferFactory,
                                 public ZMT::IFlowItemWriter,
                                 public ZMT::IFlowItemReader {
public:
  /// A null allocator means the heap.
  explicit VFlowBufferFactory(std::pmr::memory_resource* i_pAllocator);
  ~VFlowBufferFactory() override;

  ZMT::IFlowBuffer* AllocateChain(std::uint64_t size) override;
  ZMT::IFlowBuffer* AllocatePage() override;
  ZMT::IFlowBuffer* WrapShared(std::shared_ptr<const ZMT::IBufferConst> i_pBuffer) override;
  std::shared_ptr<ZMT::IBuffer> AllocateInPlace(std::uint64_t size) override;
  std::shared_ptr<ZMT::IBuffer> AllocateStandard(std::uint64_t size) override;
  ZMT::IFlowItemWriter& GetItemWriter() override { return *this; }
  ZMT::IFlowItemReader& GetItemReader() override { return *this; }
  void AddReference() override { m_RefCount.fetch_add(1, std::memory_order_relaxed); }
  void DropReference() override;
  std::uint32_t GetReferenceCount() const override { return m_RefCount.load(); }

  /// Serialises the item; SerialisationFailure if it won't write, AllocationFailure if pages ran
  /// out.
  ZMT::IResult Write(const ZMT::IFlowItem& i_rItem, ZMT::IFlowBuffer*& o_rpBuffer) override;
  /// SerialisationFailure if the item won't read or the bytes run out.
  ZMT::IResult Read(const ZMT::IFlowBufferConst* i_pBuffer, ZMT::IFlowItem& io_rItem) override;

  /// Called by pages when released. Every page handed out holds a reference to the factory.
  void ReturnPage(VFlowBufferFixed* i_pPage);
  void ReturnPage(VFlowBufferSmall* i_pPage);
  void ReturnShared(VFlowBufferShared* i_pPage);

private:
  std::pmr::memory_resource* m_pAllocator;
  std::atomic<std::uint32_t> m_RefCount{0};
  Detail::VObjectPool<VFlowBufferFixed> m_Pages;
  Detail::VObjectPool<VFlowBufferSmall> m_SmallPages;
  Detail::VObjectPool<VFlowBufferShared> m_SharedPages;
};

} // namespace Flow2Store
