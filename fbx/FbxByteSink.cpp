#include "FbxByteSink.h"
#include <algorithm>
#include <cstring>

namespace AnvilFbx {

void VFbxByteSink::append(const void* i_pData, size_t i_size) {
  const auto* p = static_cast<const uint8_t*>(i_pData);
  while (i_size > 0) {
    const size_t offset = size_t(m_size % kBlockSize);
    if (offset == 0 && m_size / kBlockSize == m_blocks.size())
      m_blocks.push_back(std::unique_ptr<uint8_t[]>(new uint8_t[kBlockSize])); // no zero fill
    const size_t n = std::min(i_size, kBlockSize - offset);
    std::memcpy(m_blocks[size_t(m_size / kBlockSize)].get() + offset, p, n);
    m_size += n;
    p += n;
    i_size -= n;
  }
}

std::span<uint8_t> VFbxByteSink::tail() {
  const size_t offset = size_t(m_size % kBlockSize);
  if (offset == 0 && m_size / kBlockSize == m_blocks.size())
    m_blocks.push_back(std::unique_ptr<uint8_t[]>(new uint8_t[kBlockSize])); // no zero fill
  return {m_blocks[size_t(m_size / kBlockSize)].get() + offset, kBlockSize - offset};
}

void VFbxByteSink::patch(uint64_t i_offset, const void* i_pData, size_t i_size) {
  const auto* p = static_cast<const uint8_t*>(i_pData);
  while (i_size > 0) {
    const size_t offset = size_t(i_offset % kBlockSize);
    const size_t n = std::min(i_size, kBlockSize - offset);
    std::memcpy(m_blocks[size_t(i_offset / kBlockSize)].get() + offset, p, n);
    i_offset += n;
    p += n;
    i_size -= n;
  }
}

bool VFbxByteSink::writeTo(std::FILE* i_pStream) const {
  uint64_t left = m_size;
  for (const auto& pBlock : m_blocks) {
    const size_t n = size_t(std::min<uint64_t>(left, kBlockSize));
    if (n == 0) break;
    if (std::fwrite(pBlock.get(), 1, n, i_pStream) != n) return false;
    left -= n;
  }
  return true;
}

} // namespace AnvilFbx
