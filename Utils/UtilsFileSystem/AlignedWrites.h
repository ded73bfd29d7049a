#pragma once
// Keeps the flushes of a fully buffered file (FullBufferSize) on multiples of its buffer size after
// a seek has moved the writing off them: the kernel then takes whole aligned blocks and needn't
// zero the pages a block half covers.

#include <cstdint>
#include <cstdio>

namespace UtilsFileSystem {

class VAlignedWrites {
public:
  /// The file's position after a successful seek. Off a multiple of FullBufferSize, the buffer is
  /// flushed once when the writing reaches the next multiple.
  void Seeked(std::uint64_t position);
  /// fwrite_unlocked of one block; the caller holds the file's lock.
  bool WriteLocked(std::FILE* pFile, const void* pBuffer, std::uint64_t size);

private:
  /// Where the next byte goes, kept only while a realigning flush is pending.
  std::uint64_t m_Position = 0;
  bool m_Realign = false;
};

} // namespace UtilsFileSystem
