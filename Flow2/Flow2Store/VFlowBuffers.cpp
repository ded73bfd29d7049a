#include "Flow2/Flow2Store/VFlowBuffers.h"

#include "Flow2/Flow2Store/VFlowBufferFactory.h"

#include <algorithm>
#include <new>

namespace Flow2Store {

std::uint64_t VFlowBufferCommon::GetChainSize() const {
  std::uint64_t size = 0;
  for (const ZMT::IFlowBufferConst* pPage = this; pPage; pPage = pPage->GetNext())
    size += pPage->GetSize();
  return size;
}

bool VFlowBufferCommon::HasSharedBuffer() const {
  for (const ZMT::IFlowBufferConst* pPage = this; pPage; pPage = pPage->GetNext())
    if (pPage->GetSharedBuffer()) return true;
  return false;
}

void VFlowBufferCommon::ReleaseChain() {
  ZMT::IFlowBuffer* pPage = this;
  while (pPage) {
    ZMT::IFlowBuffer* pNext = pPage->GetMutableNext();
    pPage->Release();
    pPage = pNext;
  }
}

template <std::uint64_t N> void VFlowBufferInline<N>::Release() {
  Reset();
  if (m_pFactory)
    m_pFactory->ReturnPage(this);
  else
    delete this;
}

template class VFlowBufferInline<4096>;
template class VFlowBufferInline<224>;

void VFlowBufferShared::Release() {
  Reset();
  if (m_pFactory)
    m_pFactory->ReturnShared(this);
  else
    delete this;
}

std::uint8_t* VFlowBufferShared::GetMutableData() {
  if (!m_pShared || m_pShared.use_count() != 1) return nullptr;
  auto* pBuffer = dynamic_cast<const ZMT::IBuffer*>(m_pShared.get());
  return pBuffer ? const_cast<ZMT::IBuffer*>(pBuffer)->GetMutableData() : nullptr;
}

std::shared_ptr<ZMT::IBuffer> VInPlaceBuffer::Create(std::uint64_t size,
                                                     std::pmr::memory_resource* i_pAllocator) {
  std::pmr::memory_resource* pAllocator =
      i_pAllocator ? i_pAllocator : std::pmr::new_delete_resource();
  const std::size_t blockSize = HeaderSize() + size;
  void* pBlock = pAllocator->allocate(blockSize, alignof(std::max_align_t));
  auto* pBuffer = new (pBlock) VInPlaceBuffer(size, pAllocator);
  try {
    return std::shared_ptr<ZMT::IBuffer>(pBuffer, [](ZMT::IBuffer* p) {
      auto* pInPlace = static_cast<VInPlaceBuffer*>(p);
      std::pmr::memory_resource* pOwner = pInPlace->m_pAllocator;
      const std::size_t bytes = HeaderSize() + pInPlace->m_Size;
      pInPlace->~VInPlaceBuffer();
      pOwner->deallocate(pInPlace, bytes, alignof(std::max_align_t));
    });
  } catch (...) {
    pBuffer->~VInPlaceBuffer();
    pAllocator->deallocate(pBlock, blockSize, alignof(std::max_align_t));
    throw;
  }
}

VBufferAlias::VBufferAlias(std::shared_ptr<const ZMT::IBufferConst> i_pBuffer, std::uint64_t offset,
                           std::uint64_t size)
    : m_pBuffer(std::move(i_pBuffer)) {
  const std::uint64_t total = m_pBuffer ? m_pBuffer->GetSize() : 0;
  m_Offset = std::min(offset, total);
  m_Size = std::min(size, total - m_Offset);
}

} // namespace Flow2Store
