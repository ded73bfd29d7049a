#pragma once
// Byte streams over buffer chains: the output grows a chain page by page, the input walks one.

#include "Flow2/Flow2Types/IFlowBuffer.h"
#include "Flow2/Flow2Types/IFlowStreams.h"

#include <cstdint>

namespace Flow2Store {

class VFlowOutputStream final : public ZMT::IFlowOutputStream {
public:
  explicit VFlowOutputStream(ZMT::IFlowBufferFactory& io_rFactory) : m_rFactory(io_rFactory) {}
  ~VFlowOutputStream() override;
  VFlowOutputStream(const VFlowOutputStream&) = delete;
  VFlowOutputStream& operator=(const VFlowOutputStream&) = delete;

  using ZMT::IFlowOutputStream::Write;
  /// False once a page couldn't be had; the stream stays failed.
  bool Write(const void* pBuffer, std::uint64_t size) override;
  /// Links the buffer in as a page of its own, by reference; later bytes go to a new page.
  bool Write(const std::shared_ptr<const ZMT::IBufferConst>& i_pBuffer) override;
  std::uint64_t GetScratch(void*& o_rpData, std::uint64_t size) override;
  std::uint64_t GetTotal() const override { return m_Total; }
  bool IsFailed() const { return m_Failed; }
  /// Shared buffers linked in so far.
  std::uint64_t GetSharedCount() const { return m_SharedCount; }

  /// Hands the chain over to the caller: at least one page, empty if nothing was written. Null if
  /// the stream failed.
  ZMT::IFlowBuffer* Detach();
  /// Hands the chain over as it stands (null when nothing was written, or the stream failed) and
  /// starts afresh, failure flag included.
  ZMT::IFlowBuffer* TakeChain();
  /// The first page, null before the first byte (the file writer sets a chunk's size there).
  ZMT::IFlowBuffer* Head() {
    Sync();
    return m_pHead;
  }

private:
  bool AddPage();
  /// Gives the page being filled its size; writes keep it in m_Used meanwhile.
  void Sync() {
    if (m_pFill) m_pFill->SetSize(m_Used);
  }

  ZMT::IFlowBufferFactory& m_rFactory;
  ZMT::IFlowBuffer* m_pHead = nullptr;
  ZMT::IFlowBuffer* m_pTail = nullptr;
  /// The fixed page being filled, with its bytes, used size and capacity, so that a small write
  /// is one copy; null when the tail is full or shared.
  ZMT::IFlowBuffer* m_pFill = nullptr;
  std::uint8_t* m_pFillData = nullptr;
  std::uint64_t m_Used = 0;
  std::uint64_t m_Capacity = 0;
  std::uint64_t m_Total = 0;
  std::uint64_t m_SharedCount = 0;
  bool m_Failed = false;
};

class VFlowInputStream final : public ZMT::IFlowInputStream {
public:
  explicit VFlowInputStream(const ZMT::IFlowBufferConst* i_pChain) : m_pPage(i_pChain) {}

  using ZMT::IFlowInputStream::Read;
  bool Read(void* pBuffer, std::uint64_t size) override;
  bool IsFailed() const override { return m_Failed; }
  /// A part of a shared page as an alias of its buffer, the whole page as the buffer itself;
  /// false for a plain page.
  bool ReadShared(std::uint64_t size, std::shared_ptr<const ZMT::IBufferConst>& o_rBuffer) override;
  std::uint64_t GetContiguous(const void*& o_rpData) override;
  void SetPosition(const void* i_pData) override;
  /// Reads up to and including a 0 byte, across pages; false, failed and ended, without one.
  bool ReadTerminated(std::string& o_rText);
  /// Whether every byte of the chain has been read.
  bool AtEnd() const;
  /// Whether a read ran out of pages.
  bool IsEnded() const { return m_Ended; }

private:
  void SkipEmpty();

  const ZMT::IFlowBufferConst* m_pPage;
  std::uint64_t m_Offset = 0;
  bool m_Failed = false;
  bool m_Ended = false;
};

} // namespace Flow2Store
