#pragma once
// Byte streams over Flow page chains: what the item serialisers and the file writer see beyond a
// plain stream.

#include "Utils/UtilsFileSystem/Streams.h"

#include <cstdint>

namespace ZMT {

class IFlowOutputStream : public IOutputStream {
public:
  using IOutputStream::Write;
  /// `size` contiguous bytes at the end of the stream, counted as written, for the caller to fill
  /// in place; gives `size`, or 0 (and nothing) when that many bytes can't be had in one piece.
  virtual std::uint64_t GetScratch(void*& o_rpData, std::uint64_t size) = 0;
  /// Bytes written so far.
  virtual std::uint64_t GetTotal() const = 0;
};

class IFlowInputStream : public IInputStream {
public:
  using IInputStream::Read;
  /// The rest of the current page, without moving; 0 at the end.
  virtual std::uint64_t GetContiguous(const void*& o_rpData) = 0;
  /// Moves to a byte of the current page, as handed out by GetContiguous.
  virtual void SetPosition(const void* i_pData) = 0;
  /// A hook for streams that translate positions; the plain form gives its argument back.
  virtual const void* Translate(const void* i_pData) const { return i_pData; }
};

} // namespace ZMT
