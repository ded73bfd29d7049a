#include "Utils/UtilsFileSystem/MemoryMappedFile.h"

#include "Utils/UtilsFileSystem/FileIO.h"

#include <cerrno>
#include <fcntl.h>
#include <sys/mman.h>
#include <sys/stat.h>
#include <unistd.h>
#include <utility>

namespace UtilsFileSystem {

VMemoryMappedFileBase::VMemoryMappedFileBase(VMemoryMappedFileBase&& other) noexcept
    : m_File(std::exchange(other.m_File, -1)), m_FileSize(std::exchange(other.m_FileSize, 0)) {}

VMemoryMappedFileBase& VMemoryMappedFileBase::operator=(VMemoryMappedFileBase&& other) noexcept {
  if (this != &other) {
    Close();
    m_File = std::exchange(other.m_File, -1);
    m_FileSize = std::exchange(other.m_FileSize, 0);
  }
  return *this;
}

void VMemoryMappedFileBase::Close() {
  if (m_File >= 0) ::close(m_File);
  m_File = -1;
  m_FileSize = 0;
}

ZMT::IResult VMemoryMappedInputFile::Open(const boost::filesystem::path& path) {
  Close();
  errno = 0;
  const int file = ::open(PlatformPath(path).c_str(), O_RDONLY | O_CLOEXEC);
  if (file < 0)
    return OpenFailureOf(path, errno,
                         "Failed to open output file '%1%' locked by processes '%2%'.");
  struct stat status {};
  if (::fstat(file, &status) != 0) {
    const int error = errno;
    ::close(file);
    return MapErrno(error);
  }
  if (S_ISDIR(status.st_mode)) {
    ::close(file);
    return ZMT::IResult::InvalidType;
  }
  m_File = file;
  m_FileSize = static_cast<std::uint64_t>(status.st_size);
  return ZMT::IResult::Ok;
}

const std::uint8_t* VMemoryMappedInputFile::Map(std::uint64_t offset, std::uint64_t size) const {
  if (m_File < 0 || size == 0) return nullptr;
  void* p = ::mmap(nullptr, size, PROT_READ, MAP_PRIVATE, m_File, static_cast<off_t>(offset));
  return p == MAP_FAILED ? nullptr : static_cast<const std::uint8_t*>(p);
}

void VMemoryMappedInputFile::Unmap(const std::uint8_t* i_pData, std::uint64_t size) {
  if (i_pData) ::munmap(const_cast<std::uint8_t*>(i_pData), size);
}

std::uint64_t VMemoryMappedInputFile::SystemPageSize() {
  static const std::uint64_t s_Size = [] {
    const long size = ::sysconf(_SC_PAGESIZE);
    return size > 0 ? static_cast<std::uint64_t>(size) : 4096u;
  }();
  return s_Size;
}

} // namespace UtilsFileSystem
