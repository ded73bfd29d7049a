#pragma once
// Byte stream interfaces shared by file output, Flow files and memory-mapped input.

#include <cstdint>
#include <memory>
#include <utility>
#include <vector>

namespace ZMT {

/// Bytes held by someone else; streams can hand such a buffer on instead of copying it.
class IBufferConst {
public:
  virtual ~IBufferConst() = default;
  virtual const std::uint8_t* GetData() const = 0;
  virtual std::uint64_t GetSize() const = 0;
  /// Hooks around a use of the bytes by another component; nothing needs them yet.
  virtual void OnAttach() const {}
  virtual void OnDetach() const {}
};

class IBuffer : public IBufferConst {
public:
  virtual std::uint8_t* GetMutableData() = 0;
};

/// A list of (pointer, size) pieces written or read in order.
using VGatherList = std::vector<std::pair<const void*, std::uint64_t>>;
using VScatterList = std::vector<std::pair<void*, std::uint64_t>>;

class IOutputStream {
public:
  virtual ~IOutputStream() = default;
  /// Writes `size` bytes; false on failure (the caller may look at errno).
  virtual bool Write(const void* pBuffer, std::uint64_t size) = 0;
  /// Writes the pieces in order and stops at the first failure.
  virtual bool Write(const VGatherList& pieces) {
    for (const auto& [pData, size] : pieces)
      if (!Write(pData, size)) return false;
    return true;
  }
  /// Writes a buffer's bytes; a stream that can keep the buffer by reference does so.
  virtual bool Write(const std::shared_ptr<const IBufferConst>& i_pBuffer) {
    return !i_pBuffer || i_pBuffer->GetSize() == 0 ||
           Write(i_pBuffer->GetData(), i_pBuffer->GetSize());
  }
};

class ISeekable {
public:
  virtual ~ISeekable() = default;
  virtual bool GetSize(std::uint64_t& o_rSize) = 0;
  virtual bool GetPosition(std::uint64_t& o_rPosition) = 0;
  /// Moves to `position` bytes from the start.
  virtual bool Seek(std::int64_t position) = 0;
};

class IOutputStreamSeekable : public IOutputStream, public virtual ISeekable {};

class IInputStream {
public:
  virtual ~IInputStream() = default;
  /// Reads exactly `size` bytes; false when they aren't all there.
  virtual bool Read(void* pBuffer, std::uint64_t size) = 0;
  /// Whether an earlier read failed.
  virtual bool IsFailed() const = 0;
  /// Reads the pieces in order and stops at the first failure.
  virtual bool Read(const VScatterList& pieces) {
    for (const auto& [pData, size] : pieces)
      if (!Read(pData, size)) return false;
    return true;
  }
  /// The next `size` bytes as a buffer shared with the stream, without copying; false (reading
  /// nothing) where the stream can't do that, and the caller copies.
  virtual bool ReadShared(std::uint64_t size, std::shared_ptr<const IBufferConst>& o_rBuffer) {
    return false;
  }
};

class IInputStreamSeekable : public IInputStream, public virtual ISeekable {};

} // namespace ZMT
