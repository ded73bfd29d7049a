#include "Utils/UtilsFileSystem/FileStreams.h"

#include <cstdint>

namespace UtilsFileSystem {

VFileOutputStream::~VFileOutputStream() {
  Close();
}

VFileOutputStream& VFileOutputStream::operator=(VFileOutputStream&& other) noexcept {
  if (this != &other) {
    Close();
    m_pFile = std::exchange(other.m_pFile, nullptr);
  }
  return *this;
}

bool VFileOutputStream::Write(const void* pBuffer, std::uint64_t size) {
  if (!m_pFile) return false;
  if (size == 0) return true;
  return std::fwrite(pBuffer, static_cast<std::size_t>(size), 1, m_pFile) != 0;
}

ZMT::IResult VFileOutputStream::Close() {
  if (!m_pFile) return ZMT::IResult::InvalidArgument;
  // fclose releases the stream even when its final flush fails: never close it twice.
  return CloseFile(std::exchange(m_pFile, nullptr));
}

VFileInputStream::~VFileInputStream() {
  Close();
}

bool VFileInputStream::Read(void* pBuffer, std::uint64_t size) {
  if (!m_pFile) {
    m_Failed = true;
    return false;
  }
  if (size == 0) return true;
  if (std::fread(pBuffer, static_cast<std::size_t>(size), 1, m_pFile) != 1) {
    m_Failed = true;
    return false;
  }
  return true;
}

ZMT::IResult VFileInputStream::Close() {
  if (!m_pFile) return ZMT::IResult::InvalidArgument;
  return CloseFile(std::exchange(m_pFile, nullptr));
}

bool IOutputStreamSeekableOwningAdapter<VFileOutputStream>::Write(const void* pBuffer,
                                                                  std::uint64_t size) {
  std::FILE* pFile = m_Stream.File();
  if (!pFile) return false;
  if (size == 0) return true;
  ::flockfile(pFile);
  const bool ok = m_Aligned.WriteLocked(pFile, pBuffer, size);
  ::funlockfile(pFile);
  return ok;
}

bool IOutputStreamSeekableOwningAdapter<VFileOutputStream>::Write(const ZMT::VGatherList& pieces) {
  std::FILE* pFile = m_Stream.File();
  if (!pFile) return false;
  bool ok = true;
  ::flockfile(pFile);
  for (const auto& [pData, size] : pieces)
    if (size && !m_Aligned.WriteLocked(pFile, pData, size)) {
      ok = false;
      break;
    }
  ::funlockfile(pFile);
  return ok;
}

bool IOutputStreamSeekableOwningAdapter<VFileOutputStream>::Seek(std::int64_t position) {
  if (!VFileSeekable::Seek(position)) return false;
  m_Aligned.Seeked(static_cast<std::uint64_t>(position));
  return true;
}

bool VFileSeekable::GetSize(std::uint64_t& o_rSize) {
  const auto [size, result] = GetFileSize(SeekableFile());
  if (result.IsFailure()) {
    o_rSize = 0;
    return false;
  }
  o_rSize = static_cast<std::uint64_t>(size);
  return true;
}

bool VFileSeekable::GetPosition(std::uint64_t& o_rPosition) {
  const auto [position, result] = TellFile(SeekableFile());
  if (result.IsFailure()) return false;
  o_rPosition = static_cast<std::uint64_t>(position);
  return true;
}

bool VFileSeekable::Seek(std::int64_t position) {
  return SeekFile(SeekableFile(), position, SEEK_SET).IsSuccess();
}

} // namespace UtilsFileSystem
