#include "FbxByteSink.h"
#include <algorithm>
#include <cerrno>
#include <cstring>
#include <stdexcept>
#include <sys/uio.h>
#include <unistd.h>

namespace AnvilFbx {

std::span<uint8_t> VFbxByteSink::tail() {
  if (m_used == kBlockSize) {
    ++m_block;
    m_used = 0;
  }
  if (m_block == m_blocks.size())
    m_blocks.push_back(std::unique_ptr<uint8_t[]>(new uint8_t[kBlockSize])); // no zero fill
  return {m_blocks[m_block].get() + m_used, kBlockSize - m_used};
}

void VFbxByteSink::grow(size_t i_size) {
  if (i_size == 0) return;
  const uint8_t* p = m_blocks[m_block].get() + m_used;
  Segment* pLast = m_segments.empty() ? nullptr : &m_segments.back();
  if (pLast && pLast->block == long(m_block) && pLast->pData + pLast->size == p)
    pLast->size += i_size;
  else
    m_segments.push_back({m_size, p, i_size, long(m_block)});
  m_used += i_size;
  m_size += i_size;
}

void VFbxByteSink::append(const void* i_pData, size_t i_size) {
  const auto* p = static_cast<const uint8_t*>(i_pData);
  while (i_size > 0) {
    const std::span<uint8_t> room = tail();
    const size_t n = std::min(i_size, room.size());
    std::memcpy(room.data(), p, n);
    grow(n);
    p += n;
    i_size -= n;
  }
}

void VFbxByteSink::appendView(const void* i_pData, size_t i_size) {
  if (i_size == 0) return;
  m_segments.push_back({m_size, static_cast<const uint8_t*>(i_pData), i_size, -1});
  m_size += i_size;
}

void VFbxByteSink::truncate(uint64_t i_size) {
  if (i_size >= m_size) return;
  while (!m_segments.empty() && m_segments.back().start >= i_size)
    m_segments.pop_back();
  if (!m_segments.empty()) {
    Segment& last = m_segments.back();
    last.size = std::min<uint64_t>(last.size, i_size - last.start);
  }
  m_size = i_size;
  // Own blocks fill on from the end of the last own segment left.
  m_block = 0;
  m_used = 0;
  for (auto it = m_segments.rbegin(); it != m_segments.rend(); ++it) {
    if (it->block < 0) continue;
    m_block = size_t(it->block);
    m_used = size_t(it->pData + it->size - m_blocks[m_block].get());
    break;
  }
}

void VFbxByteSink::patch(uint64_t i_offset, const void* i_pData, size_t i_size) {
  if (i_offset > m_size || i_size > m_size - i_offset)
    throw std::out_of_range("patch outside the written bytes");
  const auto* p = static_cast<const uint8_t*>(i_pData);
  auto it = std::upper_bound(
      m_segments.begin(), m_segments.end(), i_offset,
      [](uint64_t i_at, const Segment& i_rSegment) { return i_at < i_rSegment.start; });
  while (i_size > 0) {
    if (it == m_segments.begin()) throw std::out_of_range("patch outside the written bytes");
    const Segment& segment = *(it - 1);
    if (segment.block < 0 || i_offset >= segment.start + segment.size)
      throw std::out_of_range("patch outside the sink's own bytes");
    const size_t at = size_t(i_offset - segment.start);
    const size_t n = std::min(i_size, segment.size - at);
    std::memcpy(const_cast<uint8_t*>(segment.pData) + at, p, n);
    i_offset += n;
    p += n;
    i_size -= n;
    ++it;
  }
}

bool VFbxByteSink::writeTo(std::FILE* i_pStream) const {
  // Many segments at a time straight to the file when the stream has one; through the stream
  // otherwise.
  const int fd = ::fileno(i_pStream);
  if (fd >= 0 && std::fflush(i_pStream) == 0) {
    constexpr size_t kBatch = 512;
    iovec batch[kBatch];
    for (size_t first = 0; first < m_segments.size();) {
      const size_t count = std::min(kBatch, m_segments.size() - first);
      for (size_t i = 0; i < count; ++i)
        batch[i] = {const_cast<uint8_t*>(m_segments[first + i].pData), m_segments[first + i].size};
      iovec* pNext = batch;
      size_t left = count;
      while (left > 0) {
        const ssize_t written = ::writev(fd, pNext, int(left));
        if (written < 0 && errno == EINTR) continue;
        if (written <= 0) return false;
        // Skip what went out, resuming inside a part-written segment.
        size_t done = size_t(written);
        while (left > 0 && done >= pNext->iov_len) {
          done -= pNext->iov_len;
          ++pNext;
          --left;
        }
        if (left > 0) {
          pNext->iov_base = static_cast<uint8_t*>(pNext->iov_base) + done;
          pNext->iov_len -= done;
        }
      }
      first += count;
    }
    return true;
  }
  for (const Segment& segment : m_segments)
    if (std::fwrite(segment.pData, 1, segment.size, i_pStream) != segment.size) return false;
  return true;
}

} // namespace AnvilFbx
