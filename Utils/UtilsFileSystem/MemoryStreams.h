#pragma once
// Seekable streams over memory: an input over bytes someone else holds, and an output that grows
// a byte vector (writing after a seek overwrites, as a file does).

#include "Utils/UtilsFileSystem/Streams.h"

#include <algorithm>
#include <cstdint>
#include <cstring>
#include <vector>

namespace UtilsFileSystem {

class VMemoryInputStream final : public ZMT::IInputStreamSeekable {
public:
  VMemoryInputStream(const std::uint8_t* i_pBytes, std::uint64_t size)
      : m_pBytes(i_pBytes), m_Size(size) {}
  explicit VMemoryInputStream(const std::vector<std::uint8_t>& bytes)
      : VMemoryInputStream(bytes.data(), bytes.size()) {}

  using ZMT::IInputStream::Read;
  bool Read(void* o_pBuffer, std::uint64_t size) override {
    if (m_Failed || size > m_Size - m_Position) return !(m_Failed = true);
    if (size) std::memcpy(o_pBuffer, m_pBytes + m_Position, size);
    m_Position += size;
    return true;
  }
  bool IsFailed() const override { return m_Failed; }
  bool GetSize(std::uint64_t& o_rSize) override {
    o_rSize = m_Size;
    return true;
  }
  bool GetPosition(std::uint64_t& o_rPosition) override {
    o_rPosition = m_Position;
    return true;
  }
  /// Any position up to the end; clears an earlier failure.
  bool Seek(std::int64_t position) override {
    if (position < 0 || static_cast<std::uint64_t>(position) > m_Size) return false;
    m_Position = static_cast<std::uint64_t>(position);
    m_Failed = false;
    return true;
  }

private:
  const std::uint8_t* m_pBytes;
  std::uint64_t m_Size;
  std::uint64_t m_Position = 0;
  bool m_Failed = false;
};

class VMemoryOutputStream final : public ZMT::IOutputStreamSeekable {
public:
  using ZMT::IOutputStream::Write;
  bool Write(const void* i_pBuffer, std::uint64_t size) override {
    if (m_Position + size > m_Bytes.size()) m_Bytes.resize(m_Position + size);
    if (size) std::memcpy(m_Bytes.data() + m_Position, i_pBuffer, size);
    m_Position += size;
    return true;
  }
  bool GetSize(std::uint64_t& o_rSize) override {
    o_rSize = m_Bytes.size();
    return true;
  }
  bool GetPosition(std::uint64_t& o_rPosition) override {
    o_rPosition = m_Position;
    return true;
  }
  bool Seek(std::int64_t position) override {
    if (position < 0 || static_cast<std::uint64_t>(position) > m_Bytes.size()) return false;
    m_Position = static_cast<std::uint64_t>(position);
    return true;
  }
  const std::vector<std::uint8_t>& Bytes() const { return m_Bytes; }

private:
  std::vector<std::uint8_t> m_Bytes;
  std::uint64_t m_Position = 0;
};

} // namespace UtilsFileSystem
