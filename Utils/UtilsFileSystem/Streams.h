#pragma once
// Byte stream interfaces shared by file output, Flow files and memory-mapped input.

#include <cstdint>
#include <utility>
#include <vector>

namespace ZMT {

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
};

class IInputStreamSeekable : public IInputStream, public virtual ISeekable {};

} // namespace ZMT
