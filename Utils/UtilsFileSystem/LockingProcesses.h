#pragma once
// Which processes hold a file: on Linux those holding a lock on it (flock, fcntl or a lease, as
// /proc/locks lists them), named by their executable path. A process that merely has the file
// open holds nothing: Linux refuses an open for the file's mode or owner, never for a reader.

#include <boost/filesystem/path.hpp>

#include <cstdint>
#include <string>
#include <string_view>
#include <sys/types.h>
#include <vector>

namespace UtilsFileSystem {

/// Most holders that are named; with more the search fails, like a fixed-size platform query.
inline constexpr std::size_t MaxLockingProcesses = 10;

/// Appends one executable path per holder, in process id order, or "unknown process" when it
/// can't be read. False when the file can't be examined, when there are more than
/// MaxLockingProcesses holders, or on a platform without a way to ask.
bool FindLockingProcesses(const boost::filesystem::path& path, std::vector<std::string>& o_rNames);

/// One lock of /proc/locks.
struct VLockEntry {
  pid_t m_Pid = -1; ///< -1 for locks owned by an open file description
  unsigned m_Major = 0;
  unsigned m_Minor = 0;
  std::uint64_t m_Inode = 0;
};

/// Parses one line of /proc/locks ("1: POSIX  ADVISORY  WRITE 1234 08:01:5678 0 EOF"). False
/// for lines that are not held locks (waiters marked "->") or don't parse.
bool ParseLockLine(std::string_view line, VLockEntry& o_rEntry);

} // namespace UtilsFileSystem
