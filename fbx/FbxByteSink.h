#pragma once
// An append-only byte buffer in fixed-size blocks, so that growth never copies and a written
// region can still be patched (record headers are filled in once their record ends).
#include <cstdint>
#include <cstdio>
#include <memory>
#include <span>
#include <vector>

namespace AnvilFbx {

class VFbxByteSink {
public:
  static constexpr size_t kBlockSize = size_t(1) << 20;

  void append(const void* i_pData, size_t i_size);
  /// Overwrites bytes already appended.
  void patch(uint64_t i_offset, const void* i_pData, size_t i_size);
  /// Room to write in place at the end: the rest of the last block, or a new block.
  std::span<uint8_t> tail();
  /// Takes `i_size` bytes written into the room `tail` gave as appended.
  void grow(size_t i_size) { m_size += i_size; }
  /// Drops the bytes after the first `i_size`; their blocks stay for reuse.
  void truncate(uint64_t i_size) {
    if (i_size < m_size) m_size = i_size;
  }
  uint64_t size() const { return m_size; }
  /// Writes everything to the stream; false on a short write.
  bool writeTo(std::FILE* i_pStream) const;
  /// Bytes reserved by the blocks.
  size_t capacity() const { return m_blocks.size() * kBlockSize; }

private:
  std::vector<std::unique_ptr<uint8_t[]>> m_blocks;
  uint64_t m_size = 0;
};

} // namespace AnvilFbx
