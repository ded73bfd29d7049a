#include "Utils/UtilsFileSystem/ReplacingFile.h"

#include "Utils/UtilsFileSystem/FileIO.h"
#include "Utils/UtilsFileSystem/LockingProcesses.h"

#include <boost/algorithm/string/join.hpp>
#include <boost/filesystem/operations.hpp>

#include <atomic>
#include <cerrno>
#include <cstring>
#include <vector>

#include <fcntl.h>
#include <stdio.h>
#include <sys/stat.h>
#include <unistd.h>

namespace UtilsFileSystem {

namespace {

// Injected fault: bytes that may still reach the disk (-1: no fault), and the error after that.
std::atomic<std::int64_t> g_FaultBudget{-1};
std::atomic<int> g_FaultError{0};

/// Bytes that may be written now under an injected fault; sets errno when none may.
std::size_t AllowedByFault(std::size_t wanted) {
  std::int64_t budget = g_FaultBudget.load();
  while (budget >= 0) {
    const auto allowed = static_cast<std::size_t>(std::min<std::int64_t>(budget, wanted));
    if (g_FaultBudget.compare_exchange_weak(budget, budget - std::int64_t(allowed))) {
      if (allowed == 0) errno = g_FaultError.load();
      return allowed;
    }
  }
  return wanted;
}

thread_local VReplaceFailure t_LastFailure;

mode_t CurrentUmask() {
  const mode_t mask = ::umask(022);
  ::umask(mask);
  return mask;
}

std::string Quoted(const boost::filesystem::path& path) {
  return "'" + path.string() + "'";
}

} // namespace

/// The stream's back end: the descriptor and the first error any write met.
struct VReplacingFile::VCookie {
  int m_Fd = -1;
  int m_FirstError = 0;

  void Record(int error) {
    if (m_FirstError == 0) m_FirstError = error ? error : EIO;
  }

  static ssize_t WriteBytes(void* pCookie, const char* pBuffer, std::size_t size) {
    auto* pSelf = static_cast<VCookie*>(pCookie);
    std::size_t done = 0;
    while (done < size) {
      const std::size_t allowed = AllowedByFault(size - done);
      if (allowed == 0) {
        pSelf->Record(errno);
        break;
      }
      const ssize_t n = ::write(pSelf->m_Fd, pBuffer + done, allowed);
      if (n < 0) {
        if (errno == EINTR) continue;
        pSelf->Record(errno);
        break;
      }
      done += std::size_t(n);
    }
    return ssize_t(done);
  }

  static int Seek(void* pCookie, off64_t* pOffset, int whence) {
    auto* pSelf = static_cast<VCookie*>(pCookie);
    const off64_t position = ::lseek64(pSelf->m_Fd, *pOffset, whence);
    if (position < 0) return -1;
    *pOffset = position;
    return 0;
  }

  static int Close(void* pCookie) {
    auto* pSelf = static_cast<VCookie*>(pCookie);
    const int fd = std::exchange(pSelf->m_Fd, -1);
    if (fd >= 0 && ::close(fd) != 0) {
      pSelf->Record(errno);
      return -1;
    }
    return 0;
  }
};

std::string DescribeError(int error) {
  switch (error) {
  case ENOSPC:
    return "disk full";
  case EDQUOT:
    return "disk quota exceeded";
  case EROFS:
    return "read-only file system";
  case EFBIG:
    return "file too large for the file system";
  default:
    return std::strerror(error);
  }
}

const VReplaceFailure& LastReplaceFailure() {
  return t_LastFailure;
}

void ClearLastReplaceFailure() {
  t_LastFailure = {};
}

void InjectWriteFault(std::uint64_t bytes, int error) {
  g_FaultError = error;
  g_FaultBudget = std::int64_t(bytes);
}

void ClearWriteFault() {
  g_FaultBudget = -1;
}

VReplacingFile::~VReplacingFile() {
  if (m_pFile) Abandon();
}

ZMT::IResult VReplacingFile::Open(const boost::filesystem::path& target) {
  if (m_pFile) Abandon();
  m_Reason.clear();
  const ZMT::IResult result = OpenTemporary(target);
  if (result.IsFailure()) t_LastFailure = {m_Target.string(), m_Reason};
  return result;
}

ZMT::IResult VReplacingFile::OpenTemporary(const boost::filesystem::path& target) {
  boost::system::error_code ec;
  // Replace the file a link points to, not the link.
  m_Target =
      boost::filesystem::is_symlink(target, ec) ? boost::filesystem::canonical(target, ec) : target;
  if (ec) m_Target = target;

  struct stat status {};
  const bool exists = ::stat(m_Target.c_str(), &status) == 0;
  if (exists && S_ISDIR(status.st_mode)) {
    m_Reason = "it is a folder";
    return ZMT::IResult::InvalidType;
  }
  if (exists && ::faccessat(AT_FDCWD, m_Target.c_str(), W_OK, AT_EACCESS) != 0) {
    const int error = errno;
    if (error != EACCES && error != EPERM) {
      m_Reason = DescribeError(error);
      return MapErrno(error);
    }
    m_Reason = "permission denied by the file's mode or owner";
    std::vector<std::string> holders;
    if (FindLockingProcesses(m_Target, holders) && !holders.empty())
      m_Reason += "; locked by processes '" + boost::algorithm::join(holders, "', '") + "'";
    return ZMT::IResult::NotPermitted;
  }

  const boost::filesystem::path folder =
      m_Target.has_parent_path() ? m_Target.parent_path() : boost::filesystem::path(".");
  std::string pattern =
      (folder / ("." + m_Target.filename().string() + ".anvil-XXXXXX.tmp")).string();
  std::vector<char> name(pattern.begin(), pattern.end());
  name.push_back('\0');
  const int fd = ::mkostemps(name.data(), 4, O_CLOEXEC);
  if (fd < 0) {
    const int error = errno;
    if (error == EACCES || error == EPERM)
      m_Reason = "permission denied by the mode or owner of the folder " + Quoted(folder);
    else if (error == ENOENT)
      m_Reason = "the folder " + Quoted(folder) + " does not exist";
    else
      m_Reason = DescribeError(error);
    return error == ENOSPC ? ZMT::IResult(ZMT::IResult::DiskFull) : MapErrno(error);
  }
  m_Temporary = name.data();
  ::fchmod(fd, exists ? (status.st_mode & 07777) : (0666 & ~CurrentUmask()));

  m_pCookie = new VCookie{fd};
  const cookie_io_functions_t functions{nullptr, &VCookie::WriteBytes, &VCookie::Seek,
                                        &VCookie::Close};
  m_pFile = ::fopencookie(m_pCookie, "w", functions);
  if (!m_pFile) {
    const int error = errno;
    VCookie::Close(m_pCookie);
    delete std::exchange(m_pCookie, nullptr);
    ::unlink(m_Temporary.c_str());
    m_Reason = DescribeError(error);
    return ZMT::IResult::AllocationFailure;
  }
  std::setvbuf(m_pFile, nullptr, _IOFBF, FullBufferSize);
  return ZMT::IResult::Ok;
}

bool VReplacingFile::Write(const void* pBuffer, std::size_t size) {
  if (!m_pFile || m_pCookie->m_FirstError) return false;
  return size == 0 || std::fwrite(pBuffer, size, 1, m_pFile) == 1;
}

int VReplacingFile::WriteError() const {
  return m_pCookie ? m_pCookie->m_FirstError : 0;
}

std::uint64_t VReplacingFile::Size() const {
  if (!m_pFile) return 0;
  std::fflush(m_pFile);
  struct stat status {};
  if (m_pCookie->m_Fd < 0 || ::fstat(m_pCookie->m_Fd, &status) != 0) return 0;
  return std::uint64_t(status.st_size);
}

ZMT::IResult VReplacingFile::Fail(int error) {
  m_Reason = DescribeError(error ? error : EIO);
  t_LastFailure = {m_Target.string(), m_Reason};
  Abandon();
  if (error == ENOSPC || error == EDQUOT) return ZMT::IResult::DiskFull;
  const ZMT::IResult result = MapErrno(error ? error : EIO);
  return result.IsFailure() ? result : ZMT::IResult(ZMT::IResult::Failed);
}

ZMT::IResult VReplacingFile::Commit() {
  if (!m_pFile) return ZMT::IResult::FileNotOpen;
  errno = 0;
  if (std::fflush(m_pFile) != 0 || std::ferror(m_pFile) || m_pCookie->m_FirstError)
    return Fail(m_pCookie->m_FirstError ? m_pCookie->m_FirstError : errno);
  // A full disk may only show when the data is allocated, so sync before the name moves.
  if (::fsync(m_pCookie->m_Fd) != 0) return Fail(errno);
  std::FILE* pFile = std::exchange(m_pFile, nullptr);
  const int closed = std::fclose(pFile);
  const int closeError = m_pCookie->m_FirstError ? m_pCookie->m_FirstError : errno;
  delete std::exchange(m_pCookie, nullptr);
  if (closed != 0) return Fail(closeError);
  if (::rename(m_Temporary.c_str(), m_Target.c_str()) != 0) return Fail(errno);
  m_Temporary.clear();
  m_Reason.clear();
  return ZMT::IResult::Ok;
}

void VReplacingFile::CloseQuietly() {
  if (m_pFile) std::fclose(std::exchange(m_pFile, nullptr));
  delete std::exchange(m_pCookie, nullptr);
}

void VReplacingFile::Abandon() {
  CloseQuietly();
  if (!m_Temporary.empty()) ::unlink(m_Temporary.c_str());
  m_Temporary.clear();
}

} // namespace UtilsFileSystem
