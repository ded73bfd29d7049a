#include "Utils/UtilsFileSystem/FileIO.h"

#include "DebugServices/GlobalLog.h"
#include "Utils/UtilsFileSystem/LockingProcesses.h"

#include <boost/algorithm/string/join.hpp>
#include <boost/filesystem/operations.hpp>

#include <cerrno>
#include <cstring>
#include <system_error>

namespace UtilsFileSystem {

namespace {

const char* const Channel = "System";

#define FILE_LOG(level, ...) ZMT_LOG(Channel, level, __VA_ARGS__)

/// The mapped code of a failed call; a code that isn't a failure becomes Failed.
ZMT::IResult FailureOf(int error) {
  const ZMT::IResult result = MapErrno(error);
  return result.IsFailure() ? result : ZMT::IResult(ZMT::IResult::Failed);
}

/// Names of the holders, joined for a message; empty when none were found.
std::string JoinedLockers(const boost::filesystem::path& path) {
  std::vector<std::string> names;
  if (!FindLockingProcesses(path, names) || names.empty()) return {};
  return boost::algorithm::join(names, "', '");
}

/// The failure of an open, logging the holders when the open was refused.
ZMT::IResult OpenFailure(const boost::filesystem::path& path, int error, const char* lockedFormat) {
  const ZMT::IResult result = FailureOf(error);
  if (result == ZMT::IResult::NotPermitted) {
    const std::string lockers = JoinedLockers(path);
    if (!lockers.empty())
      FILE_LOG(ZMT::ELogError, lockedFormat, path, lockers);
    else
      FILE_LOG(ZMT::ELogError,
               "Permission denied for %1%: the mode or owner of the file or its "
               "folder does not allow it.",
               path);
  }
  return result;
}

VFileResult OpenFile(const boost::filesystem::path& path, const char* mode,
                     const char* lockedFormat) {
  errno = 0;
  std::FILE* pFile = std::fopen(PlatformPath(path).c_str(), mode);
  if (!pFile) return {nullptr, OpenFailure(path, errno, lockedFormat)};
  if (std::setvbuf(pFile, nullptr, _IOFBF, FullBufferSize) != 0) {
    FILE_LOG(ZMT::ELogWarning, "Failed to enable full buffering for file stream %1%.", path);
  }
  return {pFile, ZMT::IResult::Ok};
}

} // namespace

ZMT::IResult MapErrno(int error) {
  const std::error_condition condition = std::generic_category().default_error_condition(error);
  using std::errc;
  if (condition == errc::file_exists) return ZMT::IResult::AlreadyPresent;
  if (condition == errc::invalid_argument) return ZMT::IResult::InvalidArgument;
  if (condition == errc::no_such_file_or_directory) return ZMT::IResult::FileNotFound;
  if (condition == errc::is_a_directory) return ZMT::IResult::InvalidType;
  if (condition == errc::not_a_directory) return ZMT::IResult::InvalidType;
  if (condition == errc::not_supported) return ZMT::IResult::NotSupported;
  if (condition == errc::operation_not_permitted) return ZMT::IResult::NotPermitted;
  if (condition == errc::permission_denied) return ZMT::IResult::NotPermitted;
  FILE_LOG(ZMT::ELogError, "Std error code: %1%", std::generic_category().message(error));
  return ZMT::IResult::FileIOFailure;
}

boost::filesystem::path PlatformPath(const boost::filesystem::path& path) {
#ifdef _WIN32
  const std::wstring text = path.wstring();
  if (text.size() >= 2 && text[0] == L'\\' && text[1] == L'\\') {
    if (text.rfind(L"\\\\?\\", 0) == 0) return path;
    return boost::filesystem::path(L"\\\\?\\UNC" + text.substr(1));
  }
  if (text.size() >= 2 && text[1] == L':') return boost::filesystem::path(L"\\\\?\\" + text);
#endif
  return path;
}

ZMT::IResult OpenFailureOf(const boost::filesystem::path& path, int error,
                           const char* lockedFormat) {
  return OpenFailure(path, error, lockedFormat);
}

VFileResult OpenOutputFile(const boost::filesystem::path& path, bool binary) {
  return OpenFile(path, binary ? "wb" : "w",
                  "Failed to open output file %1% locked by processes '%2%'.");
}

VFileResult OpenInputFile(const boost::filesystem::path& path, bool binary) {
  return OpenFile(path, binary ? "rb" : "r",
                  "Failed to open input file %1% locked by processes '%2%'.");
}

VOutputStreamResult OpenOutputFileStream(const boost::filesystem::path& path, bool binary) {
  std::ios::openmode mode = std::ios::out | std::ios::trunc;
  if (binary) mode |= std::ios::binary;
  errno = 0;
  auto pStream = std::make_unique<std::ofstream>(PlatformPath(path).string(), mode);
  if (!pStream->is_open()) {
    return {nullptr, OpenFailure(path, errno,
                                 "Failed to open output file stream %1% locked by processes "
                                 "'%2%'.")};
  }
  return {std::move(pStream), ZMT::IResult::Ok};
}

VInputStreamResult OpenInputFileStream(const boost::filesystem::path& path, bool binary) {
  std::ios::openmode mode = std::ios::in;
  if (binary) mode |= std::ios::binary;
  errno = 0;
  auto pStream = std::make_unique<std::ifstream>(PlatformPath(path).string(), mode);
  if (!pStream->is_open()) {
    return {nullptr,
            OpenFailure(path, errno, "Failed to open input file %1% locked by processes '%2%'.")};
  }
  return {std::move(pStream), ZMT::IResult::Ok};
}

ZMT::IResult CloseFile(std::FILE* pFile) {
  if (!pFile) return ZMT::IResult::InvalidArgument;
  errno = 0;
  if (std::fclose(pFile) != 0) return FailureOf(errno);
  return ZMT::IResult::Ok;
}

ZMT::IResult SeekFile(std::FILE* pFile, std::int64_t offset, int origin) {
  if (!pFile) return ZMT::IResult::InvalidArgument;
  errno = 0;
  if (fseeko(pFile, static_cast<off_t>(offset), origin) != 0) return FailureOf(errno);
  return ZMT::IResult::Ok;
}

VPositionResult TellFile(std::FILE* pFile) {
  if (!pFile) return {-1, ZMT::IResult::InvalidArgument};
  errno = 0;
  const off_t position = ftello(pFile);
  if (position < 0) return {-1, FailureOf(errno)};
  return {static_cast<std::int64_t>(position), ZMT::IResult::Ok};
}

VPositionResult GetFileSize(std::FILE* pFile) {
  const auto [position, tellResult] = TellFile(pFile);
  if (tellResult.IsFailure()) return {-1, tellResult};
  if (auto result = SeekFile(pFile, 0, SEEK_END); result.IsFailure()) return {-1, result};
  const auto [size, sizeResult] = TellFile(pFile);
  if (sizeResult.IsFailure()) return {-1, sizeResult};
  if (auto result = SeekFile(pFile, position, SEEK_SET); result.IsFailure()) return {-1, result};
  return {size, ZMT::IResult::Ok};
}

ZMT::IResult RemoveFile(const boost::filesystem::path& path) {
  boost::system::error_code error;
  const bool removed = boost::filesystem::remove(PlatformPath(path), error);
  if (!error) {
    if (removed) {
      FILE_LOG(ZMT::ELogVerbose, "Removed file '%1%'.", path.string());
      return ZMT::IResult::Ok;
    }
    FILE_LOG(ZMT::ELogVerbose, "Nothing to remove: '%1%' did not exist.", path.string());
    return ZMT::IResult::OkButNoEffect;
  }
  const ZMT::IResult result = MapErrno(error.value());
  if (!result.IsFailure()) {
    FILE_LOG(ZMT::ELogError, "Failed to remove file '%1%': %2%", path.string(), error.message());
    return result;
  }
  if (result == ZMT::IResult::NotPermitted) {
    const std::string lockers = JoinedLockers(path);
    if (!lockers.empty()) {
      FILE_LOG(ZMT::ELogError, "Failed to remove file '%1%': file is locked by processes '%2%'.",
               path.string(), lockers);
      return result;
    }
  }
  FILE_LOG(ZMT::ELogError, "Failed to remove file '%1%': %2%", path.string(), result.Text());
  return result;
}

} // namespace UtilsFileSystem
