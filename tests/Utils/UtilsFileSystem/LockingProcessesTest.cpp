// Holders of a file are found through child processes that keep it open and locked.

#include "Utils/UtilsFileSystem/LockingProcesses.h"
#include "Utils/UtilsFileSystem/FileIO.h"
#include "Utils/UtilsFileSystem/ReplacingFile.h"

#include "DebugServices/LogCapture.h"
#include "TempDir.h"

#include <gtest/gtest.h>

#include <fcntl.h>
#include <fstream>
#include <linux/capability.h>
#include <signal.h>
#include <sys/file.h>
#include <sys/stat.h>
#include <sys/syscall.h>
#include <sys/wait.h>
#include <unistd.h>

using namespace UtilsFileSystem;

namespace {

enum class ELock { EFcntl, EFlock };

/// Child processes that hold a file open with a lock until the end of the scope.
class VHolders {
public:
  ~VHolders() {
    for (pid_t pid : m_Pids) {
      kill(pid, SIGKILL);
      waitpid(pid, nullptr, 0);
    }
  }
  /// Starts one holder and waits until it has its lock.
  void Start(const boost::filesystem::path& path, ELock lock) {
    int ready[2];
    ASSERT_EQ(pipe(ready), 0);
    const pid_t pid = fork();
    ASSERT_GE(pid, 0);
    if (pid == 0) {
      close(ready[0]);
      const int fd = open(path.c_str(), O_RDWR);
      bool locked = fd >= 0;
      if (locked && lock == ELock::EFcntl) {
        struct flock region {};
        region.l_type = F_RDLCK;
        region.l_whence = SEEK_SET;
        locked = fcntl(fd, F_SETLK, &region) == 0;
      } else if (locked) {
        locked = flock(fd, LOCK_SH) == 0;
      }
      const char status = locked ? 'y' : 'n';
      (void)!write(ready[1], &status, 1);
      for (;;)
        pause();
    }
    close(ready[1]);
    char status = 0;
    ASSERT_EQ(read(ready[0], &status, 1), 1);
    close(ready[0]);
    m_Pids.push_back(pid);
    ASSERT_EQ(status, 'y');
  }

private:
  std::vector<pid_t> m_Pids;
};

std::string OwnExecutable() {
  char buffer[4096];
  const ssize_t length = readlink("/proc/self/exe", buffer, sizeof buffer);
  return std::string(buffer, length > 0 ? static_cast<std::size_t>(length) : 0);
}

/// Drops the capabilities that let root ignore file modes, so that a read-only file refuses
/// writing as it would for anyone else.
bool DropFileModeOverride() {
  __user_cap_header_struct header{_LINUX_CAPABILITY_VERSION_3, 0};
  __user_cap_data_struct data[2]{};
  if (syscall(SYS_capget, &header, data) != 0) return false;
  const unsigned mask = (1u << CAP_DAC_OVERRIDE) | (1u << CAP_DAC_READ_SEARCH);
  data[0].effective &= ~mask;
  return syscall(SYS_capset, &header, data) == 0;
}

/// Runs `body` in a child that can't override file modes and returns what it printed.
template <class TBody> std::string InUnprivilegedChild(TBody body) {
  int report[2];
  if (pipe(report) != 0) return {};
  const pid_t pid = fork();
  if (pid == 0) {
    close(report[0]);
    const std::string text = DropFileModeOverride() ? body() : std::string();
    (void)!write(report[1], text.data(), text.size());
    _exit(0);
  }
  close(report[1]);
  std::string text;
  char buffer[512];
  for (ssize_t n; (n = read(report[0], buffer, sizeof buffer)) > 0;)
    text.append(buffer, static_cast<std::size_t>(n));
  close(report[0]);
  waitpid(pid, nullptr, 0);
  return text;
}

boost::filesystem::path MakeFile(const VTempDir& dir, const std::string& name) {
  const auto path = dir / name;
  std::ofstream(path.string()) << "held";
  return path;
}

} // namespace

TEST(LockingProcesses, ParsesHeldLocksAndSkipsWaiters) {
  VLockEntry entry;
  ASSERT_TRUE(ParseLockLine("1: POSIX  ADVISORY  WRITE 1234 fd:01:5678 0 EOF", entry));
  EXPECT_EQ(entry.m_Pid, 1234);
  EXPECT_EQ(entry.m_Major, 0xfdu);
  EXPECT_EQ(entry.m_Minor, 1u);
  EXPECT_EQ(entry.m_Inode, 5678u);
  ASSERT_TRUE(ParseLockLine("7: OFDLCK ADVISORY  READ  -1 08:02:99 0 EOF", entry));
  EXPECT_EQ(entry.m_Pid, -1);
  EXPECT_FALSE(ParseLockLine("2: -> FLOCK  ADVISORY  WRITE 99 08:01:5 0 EOF", entry));
  EXPECT_FALSE(ParseLockLine("3: POSIX ADVISORY WRITE 12 0801 0 EOF", entry));
  EXPECT_FALSE(ParseLockLine("", entry));
}

TEST(LockingProcesses, NamesEveryHolderOnceByExecutable) {
  VTempDir dir;
  const auto path = MakeFile(dir, "held.kmt");
  std::vector<std::string> names;
  ASSERT_TRUE(FindLockingProcesses(path, names));
  EXPECT_TRUE(names.empty());

  VHolders holders;
  holders.Start(path, ELock::EFcntl);
  holders.Start(path, ELock::EFlock);
  ASSERT_TRUE(FindLockingProcesses(path, names));
  EXPECT_EQ(names, std::vector<std::string>(2, OwnExecutable()));

  names.clear();
  EXPECT_FALSE(FindLockingProcesses(dir / "missing.kmt", names));
}

TEST(LockingProcesses, MoreHoldersThanTheLimitGiveNoAnswer) {
  VTempDir dir;
  const auto path = MakeFile(dir, "crowded.kmt");
  VHolders holders;
  for (std::size_t i = 0; i < MaxLockingProcesses; ++i)
    holders.Start(path, ELock::EFlock);
  std::vector<std::string> names;
  ASSERT_TRUE(FindLockingProcesses(path, names));
  EXPECT_EQ(names.size(), MaxLockingProcesses);
  holders.Start(path, ELock::EFlock);
  names.clear();
  EXPECT_FALSE(FindLockingProcesses(path, names));
}

TEST(LockingProcesses, RefusedOpenNamesTheHolders) {
  VTempDir dir;
  const auto path = MakeFile(dir, "locked.kmt");
  ASSERT_EQ(chmod(path.c_str(), 0444), 0);
  VHolders holders;
  holders.Start(path, ELock::EFcntl);

  // The open runs in a child that can't override file modes.
  const std::string text = InUnprivilegedChild([&] {
    ZMT::VLogCapture capture;
    auto [pFile, result] = OpenOutputFile(path, true);
    std::string lines = std::to_string(result.Code()) + "\n";
    for (const auto& message : capture.Messages("System"))
      lines += message + "\n";
    return lines;
  });
  ASSERT_FALSE(text.empty()) << "capabilities could not be dropped";

  const std::string expected = std::to_string(ZMT::IResult::NotPermitted) + "\n" +
                               "Failed to open output file \"" + path.string() +
                               "\" locked by processes '" + OwnExecutable() + "'.\n";
  EXPECT_EQ(text, expected);
}

TEST(LockingProcesses, AReadOnlyFileIsBlamedOnItsModeAndOnlyLockHoldersAreNamed) {
  VTempDir dir;
  const auto path = MakeFile(dir, "readonly.kmt");
  ASSERT_EQ(chmod(path.c_str(), 0444), 0);
  auto replace = [&] {
    VReplacingFile file;
    const ZMT::IResult result = file.Open(path);
    return std::to_string(result.Code()) + ": " + file.Reason();
  };
  const std::string prefix = std::to_string(ZMT::IResult::NotPermitted) + ": ";

  // A process that merely has the file open holds nothing.
  const int reader = open(path.c_str(), O_RDONLY);
  ASSERT_GE(reader, 0);
  std::string text = InUnprivilegedChild(replace);
  close(reader);
  ASSERT_FALSE(text.empty()) << "capabilities could not be dropped";
  EXPECT_EQ(text, prefix + "permission denied by the file's mode or owner");

  VHolders holders;
  holders.Start(path, ELock::EFlock);
  text = InUnprivilegedChild(replace);
  EXPECT_EQ(text, prefix + "permission denied by the file's mode or owner; locked by processes '" +
                      OwnExecutable() + "'");

  // The plain open says the same in the log when nobody holds a lock.
  const auto free = MakeFile(dir, "free.kmt");
  ASSERT_EQ(chmod(free.c_str(), 0444), 0);
  text = InUnprivilegedChild([&] {
    ZMT::VLogCapture capture;
    OpenOutputFile(free, true);
    std::string lines;
    for (const auto& message : capture.Messages("System"))
      lines += message + "\n";
    return lines;
  });
  EXPECT_EQ(text, "Permission denied for \"" + free.string() +
                      "\": the mode or owner of the file or its folder does not allow it.\n");
}
