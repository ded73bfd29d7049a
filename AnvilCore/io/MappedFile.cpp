#include "MappedFile.h"
#include <algorithm>
#include <cerrno>
#include <cstring>
#include <fcntl.h>
#include <sys/mman.h>
#include <sys/stat.h>
#include <unistd.h>

namespace AnvilCore {

MappedFile::~MappedFile() {
  if (m_pData) ::munmap(const_cast<uint8_t*>(m_pData), m_size);
}

bool MappedFile::open(const std::string& i_path, std::string& o_rError) {
  const int fd = ::open(i_path.c_str(), O_RDONLY | O_CLOEXEC);
  if (fd < 0) {
    o_rError = i_path + ": cannot open: " + std::strerror(errno);
    return false;
  }
  struct stat status {};
  if (::fstat(fd, &status) != 0 || !S_ISREG(status.st_mode)) {
    const int error = S_ISDIR(status.st_mode) ? EISDIR : errno;
    ::close(fd);
    o_rError = i_path + ": cannot open: " + std::strerror(error ? error : EINVAL);
    return false;
  }
  m_size = size_t(status.st_size);
  if (m_size > 0) {
    void* p = ::mmap(nullptr, m_size, PROT_READ, MAP_PRIVATE, fd, 0);
    if (p == MAP_FAILED) {
      const int error = errno;
      ::close(fd);
      m_size = 0;
      o_rError = i_path + ": read error: " + std::strerror(error);
      return false;
    }
    ::madvise(p, m_size, MADV_SEQUENTIAL);
    m_pData = static_cast<const uint8_t*>(p);
  }
  ::close(fd);
  return true;
}

void MappedFile::releaseBefore(size_t i_offset) {
  constexpr uintptr_t kUnit = uintptr_t(2) << 20;
  if (!m_pData) return;
  const uintptr_t base = reinterpret_cast<uintptr_t>(m_pData);
  const uintptr_t end = (base + std::min(i_offset, m_size)) / kUnit * kUnit;
  const uintptr_t start =
      std::max(base + m_releasedTo, (base + m_releasedTo + kUnit - 1) / kUnit * kUnit);
  if (end <= start) return;
  ::madvise(reinterpret_cast<void*>(start), end - start, MADV_DONTNEED);
  m_releasedTo = end - base;
}

} // namespace AnvilCore
