#include "Utils/UtilsFileSystem/MemoryMappedInputStream.h"

#include "DebugServices/GlobalLog.h"
#include "Utils/UtilsFileSystem/FileIO.h"

#include <algorithm>
#include <cstring>
#include <stdexcept>

namespace UtilsFileSystem {

namespace {
std::uint64_t RoundPageSize(std::uint64_t size) {
  const std::uint64_t system = VMemoryMappedInputFile::SystemPageSize();
  if (size < system) return system;
  return (size + system - 1) / system * system;
}
} // namespace

VMemoryMappedInputStream::VMemoryMappedInputStream(std::uint64_t pageSize, std::uint32_t maxPages)
    : m_PageSize(RoundPageSize(pageSize)), m_MaxPages(std::max<std::uint32_t>(maxPages, 1)) {
  m_Pages.reserve(m_MaxPages);
}

VMemoryMappedInputStream::VMemoryMappedInputStream(const boost::filesystem::path& path,
                                                   std::uint64_t pageSize, std::uint32_t maxPages)
    : VMemoryMappedInputStream(pageSize, maxPages) {
  const ZMT::IResult result = Open(path);
  if (result == ZMT::IResult::FileNotFound) throw std::runtime_error("File not found");
  if (result.IsFailure()) throw std::runtime_error("Failed to open file");
}

VMemoryMappedInputStream::VMemoryMappedInputStream(VMemoryMappedInputStream&& other) noexcept
    : m_File(std::move(other.m_File)), m_Pages(std::move(other.m_Pages)),
      m_PageSize(other.m_PageSize), m_MaxPages(other.m_MaxPages), m_SwapCount(other.m_SwapCount),
      m_Position(other.m_Position), m_Failed(other.m_Failed) {
  other.m_Pages.clear();
}

VMemoryMappedInputStream::~VMemoryMappedInputStream() {
  Close();
}

ZMT::IResult VMemoryMappedInputStream::Open(const boost::filesystem::path& path) {
  Close();
  m_Failed = false;
  m_Position = 0;
  m_SwapCount = 0;
  return m_File.Open(path);
}

void VMemoryMappedInputStream::Close() {
  for (const VPage& page : m_Pages)
    VMemoryMappedInputFile::Unmap(page.m_pData, page.m_Size);
  m_Pages.clear();
  if (m_File.IsOpen()) {
    ZMT_LOG("System", ZMT::ELogVerbose,
            "VMemoryMappedInputStream stats: %1% swaps, %2% pages in file.", m_SwapCount,
            m_File.GetFileSize() / m_PageSize + 1);
    m_File.Close();
  }
}

bool VMemoryMappedInputStream::Ensure(std::uint64_t position) {
  if (!m_Pages.empty() && position >= m_Pages[0].m_Begin && position < m_Pages[0].m_End)
    return true;
  for (std::size_t i = 1; i < m_Pages.size(); ++i)
    if (position >= m_Pages[i].m_Begin && position < m_Pages[i].m_End) {
      std::rotate(m_Pages.begin(), m_Pages.begin() + static_cast<std::ptrdiff_t>(i),
                  m_Pages.begin() + static_cast<std::ptrdiff_t>(i) + 1);
      return true;
    }
  if (position >= m_File.GetFileSize()) return false;
  VPage page;
  page.m_Begin = position / m_PageSize * m_PageSize;
  page.m_Size = std::min(m_PageSize, m_File.GetFileSize() - page.m_Begin);
  page.m_End = page.m_Begin + page.m_Size;
  if (m_Pages.size() >= m_MaxPages) {
    VMemoryMappedInputFile::Unmap(m_Pages.back().m_pData, m_Pages.back().m_Size);
    m_Pages.pop_back();
  }
  page.m_pData = m_File.Map(page.m_Begin, page.m_Size);
  if (!page.m_pData) return false;
  m_Pages.insert(m_Pages.begin(), page);
  ++m_SwapCount;
  return true;
}

bool VMemoryMappedInputStream::Read(void* o_pBuffer, std::uint64_t size) {
  if (m_Failed || !m_File.IsOpen()) {
    m_Failed = true;
    return false;
  }
  if (size > m_File.GetFileSize() - std::min(m_Position, m_File.GetFileSize())) {
    m_Failed = true;
    return false;
  }
  auto* pOut = static_cast<std::uint8_t*>(o_pBuffer);
  while (size > 0) {
    if (!Ensure(m_Position)) {
      m_Failed = true;
      return false;
    }
    const VPage& page = m_Pages[0];
    const std::uint64_t piece = std::min(size, page.m_End - m_Position);
    std::memcpy(pOut, page.m_pData + (m_Position - page.m_Begin), piece);
    pOut += piece;
    m_Position += piece;
    size -= piece;
  }
  return true;
}

std::uint64_t VMemoryMappedInputStream::GetContiguous(const std::uint8_t*& o_rpData) {
  if (!m_File.IsOpen() || !Ensure(m_Position)) return 0;
  const VPage& page = m_Pages[0];
  o_rpData = page.m_pData + (m_Position - page.m_Begin);
  return page.m_End - m_Position;
}

bool VMemoryMappedInputStream::GetSize(std::uint64_t& o_rSize) const {
  if (!m_File.IsOpen()) return false;
  o_rSize = m_File.GetFileSize();
  return true;
}

bool VMemoryMappedInputStream::GetPosition(std::uint64_t& o_rPosition) const {
  if (!m_File.IsOpen()) return false;
  o_rPosition = m_Position;
  return true;
}

bool VMemoryMappedInputStream::Seek(std::int64_t position) {
  if (!m_File.IsOpen() || position < 0 ||
      static_cast<std::uint64_t>(position) > m_File.GetFileSize())
    return false;
  m_Position = static_cast<std::uint64_t>(position);
  m_Failed = false;
  return true;
}

IInputStreamSeekableOwningAdapter<VMemoryMappedInputStream>::IInputStreamSeekableOwningAdapter(
    VMemoryMappedInputStream stream)
    : m_Stream(std::move(stream)) {
  if (!m_Stream.IsOpen()) throw std::runtime_error("Invalid stream");
}

VInputStreamOpenResult OpenInputStream(const boost::filesystem::path& path, std::uint64_t pageSize,
                                       std::uint32_t maxPages) {
  VMemoryMappedInputStream mapped(pageSize, maxPages);
  if (mapped.Open(path).IsSuccess())
    return {std::make_unique<VMemoryMappedInputStreamVirtual>(std::move(mapped)), ZMT::IResult::Ok};
  auto [pFile, result] = OpenInputFile(path, true);
  if (!pFile) return {nullptr, result};
  return {std::make_unique<VFileInputStreamVirtual>(VFileInputStream(pFile)), ZMT::IResult::Ok};
}

} // namespace UtilsFileSystem
