#include "Flow2/Flow2Store/VFlowStreams.h"

#include "Flow2/Flow2Store/VFlowBuffers.h"

#include <algorithm>
#include <cstring>
#include <exception>
#include <string>

namespace Flow2Store {

VFlowOutputStream::~VFlowOutputStream() {
  if (m_pHead) m_pHead->ReleaseChain();
}

bool VFlowOutputStream::AddPage() {
  Sync();
  m_pFill = nullptr;
  ZMT::IFlowBuffer* pPage = nullptr;
  try {
    pPage = m_rFactory.AllocatePage();
  } catch (const std::exception&) {
    pPage = nullptr;
  }
  if (!pPage || !pPage->GetMutableData()) {
    if (pPage) pPage->Release();
    m_Failed = true;
    return false;
  }
  if (m_pTail)
    m_pTail->SetNext(pPage);
  else
    m_pHead = pPage;
  m_pTail = pPage;
  m_pFill = pPage;
  m_pFillData = pPage->GetMutableData();
  m_Used = pPage->GetSize();
  m_Capacity = pPage->GetCapacity();
  return true;
}

bool VFlowOutputStream::Write(const void* pBuffer, std::uint64_t size) {
  if (m_Failed) return false;
  if (size == 0) return true;
  m_Total += size;
  if (m_pFill && size <= m_Capacity - m_Used) { // the usual small write
    std::memcpy(m_pFillData + m_Used, pBuffer, size);
    m_Used += size;
    return true;
  }
  const auto* pBytes = static_cast<const std::uint8_t*>(pBuffer);
  while (size > 0) {
    if ((!m_pFill || m_Used == m_Capacity) && !AddPage()) return false;
    const std::uint64_t piece = std::min(size, m_Capacity - m_Used);
    std::memcpy(m_pFillData + m_Used, pBytes, piece);
    m_Used += piece;
    pBytes += piece;
    size -= piece;
  }
  return true;
}

bool VFlowOutputStream::Write(const std::shared_ptr<const ZMT::IBufferConst>& i_pBuffer) {
  if (m_Failed) return false;
  if (!i_pBuffer || i_pBuffer->GetSize() == 0) return true;
  ZMT::IFlowBuffer* pPage = nullptr;
  try {
    pPage = m_rFactory.WrapShared(i_pBuffer);
  } catch (const std::exception&) {
    pPage = nullptr;
  }
  if (!pPage) {
    m_Failed = true;
    return false;
  }
  Sync();
  m_pFill = nullptr; // the shared page is full by construction: the next byte starts a new page
  if (m_pTail)
    m_pTail->SetNext(pPage);
  else
    m_pHead = pPage;
  m_pTail = pPage;
  m_Total += i_pBuffer->GetSize();
  ++m_SharedCount;
  return true;
}

std::uint64_t VFlowOutputStream::GetScratch(void*& o_rpData, std::uint64_t size) {
  if (m_Failed || size == 0 || size > VFlowBufferFixed::Capacity) return 0;
  if ((!m_pFill || m_Capacity - m_Used < size) && !AddPage()) return 0;
  o_rpData = m_pFillData + m_Used;
  m_Used += size;
  m_Total += size;
  return size;
}

ZMT::IFlowBuffer* VFlowOutputStream::Detach() {
  if (m_Failed || (!m_pHead && !AddPage())) return nullptr;
  Sync();
  m_pFill = nullptr;
  m_pTail = nullptr;
  m_Total = 0;
  ZMT::IFlowBuffer* pHead = m_pHead;
  m_pHead = nullptr;
  return pHead;
}

ZMT::IFlowBuffer* VFlowOutputStream::TakeChain() {
  Sync();
  m_pFill = nullptr;
  ZMT::IFlowBuffer* pHead = m_pHead;
  m_pHead = m_pTail = nullptr;
  m_Total = 0;
  if (m_Failed) {
    m_Failed = false;
    if (pHead) pHead->ReleaseChain();
    return nullptr;
  }
  return pHead;
}

void VFlowInputStream::SkipEmpty() {
  while (m_pPage && m_Offset == m_pPage->GetSize()) {
    m_pPage = m_pPage->GetNext();
    m_Offset = 0;
  }
}

bool VFlowInputStream::Read(void* pBuffer, std::uint64_t size) {
  if (m_Failed) return false;
  auto* pBytes = static_cast<std::uint8_t*>(pBuffer);
  while (size > 0) {
    SkipEmpty();
    if (!m_pPage) {
      m_Failed = m_Ended = true;
      return false;
    }
    const std::uint64_t piece = std::min(size, m_pPage->GetSize() - m_Offset);
    std::memcpy(pBytes, m_pPage->GetData() + m_Offset, piece);
    m_Offset += piece;
    pBytes += piece;
    size -= piece;
  }
  return true;
}

bool VFlowInputStream::ReadShared(std::uint64_t size,
                                  std::shared_ptr<const ZMT::IBufferConst>& o_rBuffer) {
  if (m_Failed) return false;
  SkipEmpty();
  if (!m_pPage) return false;
  std::shared_ptr<const ZMT::IBufferConst> pShared = m_pPage->GetSharedBuffer();
  if (!pShared || m_pPage->GetSize() - m_Offset < size) return false;
  if (m_Offset == 0 && size == pShared->GetSize())
    o_rBuffer = std::move(pShared);
  else
    o_rBuffer = std::make_shared<VBufferAlias>(std::move(pShared), m_Offset, size);
  m_Offset += size;
  SkipEmpty();
  return true;
}

std::uint64_t VFlowInputStream::GetContiguous(const void*& o_rpData) {
  SkipEmpty();
  if (!m_pPage) return 0;
  o_rpData = m_pPage->GetData() + m_Offset;
  return m_pPage->GetSize() - m_Offset;
}

void VFlowInputStream::SetPosition(const void* i_pData) {
  if (!m_pPage) return;
  const auto* p = static_cast<const std::uint8_t*>(i_pData);
  const std::uint8_t* pBegin = m_pPage->GetData();
  if (p >= pBegin && p <= pBegin + m_pPage->GetSize())
    m_Offset = static_cast<std::uint64_t>(p - pBegin);
}

bool VFlowInputStream::ReadTerminated(std::string& o_rText) {
  o_rText.clear();
  if (m_Failed) return false;
  for (;;) {
    SkipEmpty();
    if (!m_pPage) {
      m_Failed = m_Ended = true;
      return false;
    }
    const auto* pBegin = reinterpret_cast<const char*>(m_pPage->GetData()) + m_Offset;
    const std::uint64_t left = m_pPage->GetSize() - m_Offset;
    const void* pZero = std::memchr(pBegin, 0, left);
    if (pZero) {
      const auto n = static_cast<std::uint64_t>(static_cast<const char*>(pZero) - pBegin);
      o_rText.append(pBegin, n);
      m_Offset += n + 1;
      return true;
    }
    o_rText.append(pBegin, left);
    m_Offset += left;
  }
}

bool VFlowInputStream::AtEnd() const {
  if (!m_pPage) return true;
  if (m_Offset < m_pPage->GetSize()) return false;
  for (const ZMT::IFlowBufferConst* pPage = m_pPage->GetNext(); pPage; pPage = pPage->GetNext())
    if (pPage->GetSize() > 0) return false;
  return true;
}

} // namespace Flow2Store
