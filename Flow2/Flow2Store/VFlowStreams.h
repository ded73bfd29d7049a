#pragma once
// Byte streams over buffer chains: the output grows a chain page by page, the input walks one.

#include "Flow2/Flow2Types/IFlowBuffer.h"
#include "Utils/UtilsFileSystem/Streams.h"

#include <cstdint>

namespace Flow2Store {

class VFlowOutputStream final : public ZMT::IOutputStream {
public:
  explicit VFlowOutputStream(ZMT::IFlowBufferFactory& io_rFactory) : m_rFactory(io_rFactory) {}
  ~VFlowOutputStream() override;

  /// False once a page couldn't be had; the stream stays failed.
  bool Write(const void* pBuffer, std::uint64_t size) override;
  bool IsFailed() const { return m_Failed; }
  /// Hands the chain over to the caller: at least one page, empty if nothing was written. Null if
  /// the stream failed.
  ZMT::IFlowBuffer* Detach();

private:
  bool AddPage();

  ZMT::IFlowBufferFactory& m_rFactory;
  ZMT::IFlowBuffer* m_pHead = nullptr;
  ZMT::IFlowBuffer* m_pTail = nullptr;
  bool m_Failed = false;
};

class VFlowInputStream final : public ZMT::IInputStream {
public:
  explicit VFlowInputStream(const ZMT::IFlowBufferConst* i_pChain) : m_pPage(i_pChain) {}

  bool Read(void* pBuffer, std::uint64_t size) override;
  bool IsFailed() const override { return m_Failed; }
  /// Whether every byte of the chain has been read.
  bool AtEnd() const;

private:
  const ZMT::IFlowBufferConst* m_pPage;
  std::uint64_t m_Offset = 0;
  bool m_Failed = false;
};

} // namespace Flow2Store
