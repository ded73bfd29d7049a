#include "Utils/UtilsFileSystem/ReplacingFileStream.h"

#include "Utils/UtilsFileSystem/FileIO.h"

#include <cstdio>

namespace UtilsFileSystem {

bool VReplacingFileStream::Write(const void* i_pBuffer, std::uint64_t size) {
  std::FILE* pFile = m_rFile.File();
  if (!pFile || m_rFile.WriteError() != 0) return false;
  if (size == 0) return true;
  ::flockfile(pFile);
  const bool ok = m_Aligned.WriteLocked(pFile, i_pBuffer, size);
  ::funlockfile(pFile);
  return ok && m_rFile.WriteError() == 0;
}

bool VReplacingFileStream::Write(const ZMT::VGatherList& pieces) {
  std::FILE* pFile = m_rFile.File();
  if (!pFile || m_rFile.WriteError() != 0) return false;
  bool ok = true;
  ::flockfile(pFile);
  for (const auto& [pData, size] : pieces)
    if (size && !m_Aligned.WriteLocked(pFile, pData, size)) {
      ok = false;
      break;
    }
  ::funlockfile(pFile);
  return ok && m_rFile.WriteError() == 0;
}

bool VReplacingFileStream::GetSize(std::uint64_t& o_rSize) {
  o_rSize = m_rFile.Size();
  return m_rFile.File() != nullptr;
}

bool VReplacingFileStream::GetPosition(std::uint64_t& o_rPosition) {
  const auto [position, result] = TellFile(m_rFile.File());
  if (result.IsFailure()) return false;
  o_rPosition = static_cast<std::uint64_t>(position);
  return true;
}

bool VReplacingFileStream::Seek(std::int64_t position) {
  if (!m_rFile.File() || SeekFile(m_rFile.File(), position, SEEK_SET).IsFailure()) return false;
  m_Aligned.Seeked(static_cast<std::uint64_t>(position));
  return true;
}

} // namespace UtilsFileSystem
