#include "Flow2/Flow2Store/VFlowStreams.h"

#include <algorithm>
#include <cstring>
#include <exception>

namespace Flow2Store {

VFlowOutputStream::~VFlowOutputStream() {
  if (m_pHead) m_pHead->ReleaseChain();
}

bool VFlowOutputStream::AddPage() {
  ZMT::IFlowBuffer* pPage = nullptr;
  try {
    pPage = m_rFactory.AllocatePage();
  } catch (const std::exception&) {
    pPage = nullptr;
  }
  if (!pPage) {
    m_Failed = true;
    return false;
  }
  if (m_pTail)
    m_pTail->SetNext(pPage);
  else
    m_pHead = pPage;
  m_pTail = pPage;
  return true;
}

bool VFlowOutputStream::Write(const void* pBuffer, std::uint64_t size) {
  if (m_Failed) return false;
  const auto* pBytes = static_cast<const std::uint8_t*>(pBuffer);
  while (size > 0) {
    if ((!m_pTail || m_pTail->GetSize() == m_pTail->GetCapacity()) && !AddPage()) return false;
    std::uint8_t* pData = m_pTail->GetMutableData();
    const std::uint64_t used = m_pTail->GetSize();
    const std::uint64_t piece = std::min(size, m_pTail->GetCapacity() - used);
    if (!pData) {
      m_Failed = true;
      return false;
    }
    std::memcpy(pData + used, pBytes, piece);
    m_pTail->SetSize(used + piece);
    pBytes += piece;
    size -= piece;
  }
  return true;
}

ZMT::IFlowBuffer* VFlowOutputStream::Detach() {
  if (m_Failed || (!m_pHead && !AddPage())) return nullptr;
  m_pTail = nullptr;
  ZMT::IFlowBuffer* pHead = m_pHead;
  m_pHead = nullptr;
  return pHead;
}

bool VFlowInputStream::Read(void* pBuffer, std::uint64_t size) {
  if (m_Failed) return false;
  auto* pBytes = static_cast<std::uint8_t*>(pBuffer);
  while (size > 0) {
    while (m_pPage && m_Offset == m_pPage->GetSize()) {
      m_pPage = m_pPage->GetNext();
      m_Offset = 0;
    }
    if (!m_pPage) {
      m_Failed = true;
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

bool VFlowInputStream::AtEnd() const {
  if (!m_pPage) return true;
  if (m_Offset < m_pPage->GetSize()) return false;
  for (const ZMT::IFlowBufferConst* pPage = m_pPage->GetNext(); pPage; pPage = pPage->GetNext())
    if (pPage->GetSize() > 0) return false;
  return true;
}

} // namespace Flow2Store
