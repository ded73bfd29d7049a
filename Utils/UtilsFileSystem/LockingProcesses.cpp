#include "Utils/UtilsFileSystem/LockingProcesses.h"

#include <algorithm>
#include <charconv>
#include <fstream>
#include <set>

#if defined(__linux__)
#include <sys/stat.h>
#include <sys/sysmacros.h>
#include <unistd.h>
#endif

namespace UtilsFileSystem {

namespace {

std::vector<std::string_view> SplitWords(std::string_view line) {
  std::vector<std::string_view> words;
  std::size_t i = 0;
  while (i < line.size()) {
    while (i < line.size() && (line[i] == ' ' || line[i] == '\t'))
      ++i;
    const std::size_t start = i;
    while (i < line.size() && line[i] != ' ' && line[i] != '\t')
      ++i;
    if (i > start) words.push_back(line.substr(start, i - start));
  }
  return words;
}

template <class T> bool ParseNumber(std::string_view text, T& o_rValue, int base) {
  const auto [end, error] = std::from_chars(text.data(), text.data() + text.size(), o_rValue, base);
  return !text.empty() && error == std::errc() && end == text.data() + text.size();
}

#if defined(__linux__)

void AddLockHolders(dev_t device, ino_t inode, std::set<pid_t>& io_rPids) {
  std::ifstream locks("/proc/locks");
  std::string line;
  while (std::getline(locks, line)) {
    VLockEntry entry;
    if (!ParseLockLine(line, entry) || entry.m_Pid <= 0) continue;
    if (makedev(entry.m_Major, entry.m_Minor) == device && entry.m_Inode == inode) {
      io_rPids.insert(entry.m_Pid);
    }
  }
}

std::string ExecutablePath(pid_t pid) {
  const std::string link = "/proc/" + std::to_string(pid) + "/exe";
  char buffer[4096];
  const ssize_t length = readlink(link.c_str(), buffer, sizeof buffer);
  if (length <= 0 || static_cast<std::size_t>(length) >= sizeof buffer) return "unknown process";
  return std::string(buffer, static_cast<std::size_t>(length));
}

#endif

} // namespace

bool ParseLockLine(std::string_view line, VLockEntry& o_rEntry) {
  const auto words = SplitWords(line);
  // "<id>: <class> <mode> <access> <pid> <major>:<minor>:<inode> <start> <end>"
  if (words.size() < 6 || words[1] == "->") return false;
  VLockEntry entry;
  if (!ParseNumber(words[4], entry.m_Pid, 10)) return false;
  const std::string_view device = words[5];
  const auto first = device.find(':');
  const auto second = device.find(':', first == std::string_view::npos ? first : first + 1);
  if (first == std::string_view::npos || second == std::string_view::npos) return false;
  if (!ParseNumber(device.substr(0, first), entry.m_Major, 16) ||
      !ParseNumber(device.substr(first + 1, second - first - 1), entry.m_Minor, 16) ||
      !ParseNumber(device.substr(second + 1), entry.m_Inode, 10)) {
    return false;
  }
  o_rEntry = entry;
  return true;
}

bool FindLockingProcesses(const boost::filesystem::path& path, std::vector<std::string>& o_rNames) {
#if defined(__linux__)
  struct stat status {};
  if (stat(path.c_str(), &status) != 0) return false;
  // Only a lock holds a file here: an open descriptor alone refuses nobody.
  std::set<pid_t> pids;
  AddLockHolders(status.st_dev, status.st_ino, pids);
  if (pids.size() > MaxLockingProcesses) return false;
  for (pid_t pid : pids)
    o_rNames.push_back(ExecutablePath(pid));
  return true;
#else
  (void)path;
  (void)o_rNames;
  return false;
#endif
}

} // namespace UtilsFileSystem
