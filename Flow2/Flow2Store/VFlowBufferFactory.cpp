#include "Flow2/Flow2Store/VFlowBufferFactory.h"

#include "Flow2/Flow2Store/VFlowStreams.h"

#include <exception>

namespace Flow2Store {

using ZMT::IResult;

VFlowBufferFactory::VFlowBufferFactory(std::pmr::memory_resource* i_pAllocator)
    : m_pAllocator(i_pAllocator ? i_pAllocator : std::pmr::new_delete_resource()),
      m_Pages([this] { return new VFlowBufferFixed(this); }),
      m_SmallPages([this] { return new VFlowBufferSmall(this); }),
      m_SharedPages([this] { return new VFlowBufferShared(this); }) {}

VFlowBufferFactory::~VFlowBufferFactory() = default;

void VFlowBufferFactory::DropReference() {
  if (ZMT::Detail::DropExtraOwner(m_RefCount)) delete this;
}

ZMT::IFlowBuffer* VFlowBufferFactory::AllocatePage() {
  VFlowBufferFixed* pPage = m_Pages.Get();
  AddReference();
  return pPage;
}

ZMT::IFlowBuffer* VFlowBufferFactory::AllocateChain(std::uint64_t size) {
  if (size <= VFlowBufferSmall::Capacity) {
    // Most item bodies are small and live as long as their item: a small page holds one.
    VFlowBufferSmall* pPage = m_SmallPages.Get();
    AddReference();
    pPage->SetSize(size);
    return pPage;
  }
  ZMT::IFlowBuffer* pHead = nullptr;
  ZMT::IFlowBuffer* pTail = nullptr;
  try {
    do {
      ZMT::IFlowBuffer* pPage = AllocatePage();
      const std::uint64_t piece =
          size < VFlowBufferFixed::Capacity ? size : VFlowBufferFixed::Capacity;
      pPage->SetSize(piece);
      size -= piece;
      if (pTail)
        pTail->SetNext(pPage);
      else
        pHead = pPage;
      pTail = pPage;
    } while (size > 0);
  } catch (...) {
    if (pHead) pHead->ReleaseChain();
    throw;
  }
  return pHead;
}

ZMT::IFlowBuffer*
VFlowBufferFactory::WrapShared(std::shared_ptr<const ZMT::IBufferConst> i_pBuffer) {
  VFlowBufferShared* pPage = m_SharedPages.Get();
  pPage->Wrap(std::move(i_pBuffer));
  AddReference();
  return pPage;
}

std::shared_ptr<ZMT::IBuffer> VFlowBufferFactory::AllocateInPlace(std::uint64_t size) {
  return VInPlaceBuffer::Create(size, m_pAllocator);
}

std::shared_ptr<ZMT::IBuffer> VFlowBufferFactory::AllocateStandard(std::uint64_t size) {
  return VInPlaceBuffer::Create(size, std::pmr::new_delete_resource());
}

void VFlowBufferFactory::ReturnPage(VFlowBufferFixed* i_pPage) {
  m_Pages.Return(i_pPage);
  DropReference(); // may delete this
}

void VFlowBufferFactory::ReturnPage(VFlowBufferSmall* i_pPage) {
  m_SmallPages.Return(i_pPage);
  DropReference(); // may delete this
}

void VFlowBufferFactory::ReturnShared(VFlowBufferShared* i_pPage) {
  m_SharedPages.Return(i_pPage);
  DropReference(); // may delete this
}

IResult VFlowBufferFactory::Write(const ZMT::IFlowItem& i_rItem, ZMT::IFlowBuffer*& o_rpBuffer) {
  VFlowOutputStream stream(*this);
  bool written = false;
  try {
    written = i_rItem.Write(stream);
  } catch (const std::exception&) {
    return IResult::FailedWithException;
  }
  if (stream.IsFailed()) return IResult::AllocationFailure;
  if (!written) return IResult::SerialisationFailure;
  o_rpBuffer = stream.Detach();
  return o_rpBuffer ? IResult(IResult::Ok) : IResult(IResult::AllocationFailure);
}

IResult VFlowBufferFactory::Read(const ZMT::IFlowBufferConst* i_pBuffer, ZMT::IFlowItem& io_rItem) {
  if (!i_pBuffer) return IResult::InvalidPointer;
  VFlowInputStream stream(i_pBuffer);
  try {
    if (!io_rItem.Read(stream) || stream.IsFailed()) return IResult::SerialisationFailure;
  } catch (const std::exception&) {
    return IResult::SerialisationFailure;
  }
  return IResult::Ok;
}

} // namespace Flow2Store
