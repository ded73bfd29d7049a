#pragma once
// The one road by which files reach the disk: the bytes go to a temporary sibling of the target,
// which replaces the target only once every byte is written, synced and closed. Any failure on
// the way removes the temporary file and leaves an existing target exactly as it was, with the
// reason kept in words for the message.

#include "Utils/UtilsFileSystem/IResult.h"

#include <boost/filesystem/path.hpp>

#include <cstdint>
#include <cstdio>
#include <string>

namespace UtilsFileSystem {

/// An errno value in words for a message: "disk full" for ENOSPC, "disk quota exceeded",
/// "read-only file system", otherwise the system's text.
std::string DescribeError(int error);

class VReplacingFile {
public:
  VReplacingFile() = default;
  /// Abandons the file unless it was committed.
  ~VReplacingFile();
  VReplacingFile(const VReplacingFile&) = delete;
  VReplacingFile& operator=(const VReplacingFile&) = delete;

  /// Creates the temporary sibling of `target`. Refuses a target that is a folder or that the
  /// user may not write (its mode or owner), naming the processes that hold a lock on it.
  ZMT::IResult Open(const boost::filesystem::path& target);

  /// The stream to write; fully buffered, seekable. Null unless open.
  std::FILE* File() const { return m_pFile; }
  /// fwrite of a whole block; false once any write has failed.
  bool Write(const void* pBuffer, std::size_t size);
  /// The errno of the first write that failed so far; 0 when none has.
  int WriteError() const;
  /// Bytes the stream holds so far (its position at the end), flushed or not.
  std::uint64_t Size() const;

  /// Flushes, syncs and closes the temporary file, then renames it over the target. On failure
  /// the temporary file is removed and the target is untouched.
  ZMT::IResult Commit();
  /// Closes and removes the temporary file; the target is untouched.
  void Abandon();

  /// Why the last step failed, in words ("disk full"); empty after success.
  const std::string& Reason() const { return m_Reason; }
  const boost::filesystem::path& Target() const { return m_Target; }
  const boost::filesystem::path& TemporaryPath() const { return m_Temporary; }

  struct VCookie;

private:
  ZMT::IResult OpenTemporary(const boost::filesystem::path& target);
  ZMT::IResult Fail(int error);
  void CloseQuietly();

  boost::filesystem::path m_Target;
  boost::filesystem::path m_Temporary;
  std::FILE* m_pFile = nullptr;
  VCookie* m_pCookie = nullptr;
  std::string m_Reason;
};

/// The last failure of a replacing file on this thread, for a caller that only sees a false
/// from a writer that wrote by path: the target and the reason. Empty when none since the clear.
struct VReplaceFailure {
  std::string m_Target;
  std::string m_Reason;
};
const VReplaceFailure& LastReplaceFailure();
void ClearLastReplaceFailure();

/// Test support: from now on, writes through replacing files fail with `error` once `bytes`
/// bytes in all have reached the disk through them, as a full disk does.
void InjectWriteFault(std::uint64_t bytes, int error);
/// Ends an injected fault.
void ClearWriteFault();

} // namespace UtilsFileSystem
