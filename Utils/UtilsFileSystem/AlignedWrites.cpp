#include "Utils/UtilsFileSystem/AlignedWrites.h"

#include "Utils/UtilsFileSystem/FileIO.h"

namespace UtilsFileSystem {

void VAlignedWrites::Seeked(std::uint64_t position) {
  m_Position = position;
  m_Realign = m_Position % FullBufferSize != 0;
}

bool VAlignedWrites::WriteLocked(std::FILE* pFile, const void* pBuffer, std::uint64_t size) {
  const auto* pBytes = static_cast<const std::uint8_t*>(pBuffer);
  if (m_Realign) {
    const std::uint64_t boundary = (m_Position / FullBufferSize + 1) * FullBufferSize;
    if (m_Position + size < boundary) {
      m_Position += size;
    } else {
      const std::uint64_t head = boundary - m_Position;
      if (head && ::fwrite_unlocked(pBytes, static_cast<std::size_t>(head), 1, pFile) != 1)
        return false;
      if (::fflush_unlocked(pFile) != 0) return false;
      m_Realign = false;
      pBytes += head;
      size -= head;
    }
  }
  return size == 0 || ::fwrite_unlocked(pBytes, static_cast<std::size_t>(size), 1, pFile) == 1;
}

} // namespace UtilsFileSystem
