#pragma once
// The bytes of a file before they go out: a list of segments, each either a run of the sink's
// own fixed-size blocks (growth never copies, and a written region can still be patched: record
// headers are filled in once their record ends) or a view of bytes that the caller keeps alive,
// such as large key arrays, which are then written without being copied.
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
  /// Appends bytes by reference: they must stay alive and unchanged until the sink is written,
  /// and cannot be patched.
  void appendView(const void* i_pData, size_t i_size);
  /// Room to write in place at the end: the rest of the current block, or a new block.
  std::span<uint8_t> tail();
  /// Takes `i_size` bytes written into the room `tail` gave as appended.
  void grow(size_t i_size);
  /// Drops the bytes after the first `i_size`; their blocks stay for reuse.
  void truncate(uint64_t i_size);
  /// Overwrites bytes already appended (not those of a view).
  void patch(uint64_t i_offset, const void* i_pData, size_t i_size);
  uint64_t size() const { return m_size; }
  /// Writes everything to the stream; false on a short write.
  bool writeTo(std::FILE* i_pStream) const;
  /// Bytes reserved by the blocks.
  size_t capacity() const { return m_blocks.size() * kBlockSize; }

private:
  struct Segment {
    uint64_t start;
    const uint8_t* pData;
    size_t size;
    long block; // index of the owning block, -1 for a view
  };
  std::vector<std::unique_ptr<uint8_t[]>> m_blocks;
  std::vector<Segment> m_segments;
  size_t m_block = 0; // the block being filled
  size_t m_used = 0;  // bytes used in it
  uint64_t m_size = 0;
};

} // namespace AnvilFbx
