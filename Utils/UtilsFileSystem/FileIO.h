#pragma once
// File opening and positioning with one result code per failure. A refused open (permission)
// names the processes that hold the file in the log, channel "System".

#include "Utils/UtilsFileSystem/IResult.h"

#include <boost/filesystem/path.hpp>

#include <cstdint>
#include <cstdio>
#include <fstream>
#include <memory>
#include <utility>

namespace UtilsFileSystem {

/// A file-level result: the value (file, size or position) and the status.
using VFileResult = std::pair<std::FILE*, ZMT::IResult>;
using VPositionResult = std::pair<std::int64_t, ZMT::IResult>;
using VOutputStreamResult = std::pair<std::unique_ptr<std::ofstream>, ZMT::IResult>;
using VInputStreamResult = std::pair<std::unique_ptr<std::ifstream>, ZMT::IResult>;

/// Size of the full buffer given to every file opened here (8 MiB).
inline constexpr std::size_t FullBufferSize = 0x800000;

/// Maps an errno value: EEXIST AlreadyPresent, EINVAL InvalidArgument, ENOENT FileNotFound,
/// EISDIR and ENOTDIR InvalidType, ENOTSUP NotSupported, EPERM and EACCES NotPermitted; anything
/// else FileIOFailure, after logging "Std error code: <system message>" at error level.
ZMT::IResult MapErrno(int error);

/// The path as handed to the platform. On Windows a drive path gets the prefix "\\?\" and a UNC
/// path "\\?\UNC" so that long paths work; elsewhere the path is unchanged.
boost::filesystem::path PlatformPath(const boost::filesystem::path& path);

/// Opens for writing, truncating ("wb" or "w"), fully buffered. On failure the file is null; a
/// NotPermitted failure logs the processes that hold the file.
VFileResult OpenOutputFile(const boost::filesystem::path& path, bool binary);
/// Opens for reading ("rb" or "r"), fully buffered; failures as OpenOutputFile.
VFileResult OpenInputFile(const boost::filesystem::path& path, bool binary);
/// A standard output file stream (truncating). Null on failure, with the code as above.
VOutputStreamResult OpenOutputFileStream(const boost::filesystem::path& path, bool binary);
/// A standard input file stream. Null on failure.
VInputStreamResult OpenInputFileStream(const boost::filesystem::path& path, bool binary);

/// The result of an open that failed with `error`; a refused one logs the holders of the file
/// with `lockedFormat` (%1% the path, %2% the holders).
ZMT::IResult OpenFailureOf(const boost::filesystem::path& path, int error,
                           const char* lockedFormat);

/// fclose; a failure is mapped from errno. A null file is InvalidArgument.
ZMT::IResult CloseFile(std::FILE* pFile);
/// Moves to `offset` from `origin` (SEEK_SET, SEEK_CUR, SEEK_END).
ZMT::IResult SeekFile(std::FILE* pFile, std::int64_t offset, int origin);
/// The position, or -1 with the failure.
VPositionResult TellFile(std::FILE* pFile);
/// The size, found by seeking to the end and back; -1 with the failure of the step that failed.
VPositionResult GetFileSize(std::FILE* pFile);

/// Removes a file: Ok when removed, OkButNoEffect when it did not exist, else the mapped
/// failure, logged (with the holders when the removal was refused).
ZMT::IResult RemoveFile(const boost::filesystem::path& path);

} // namespace UtilsFileSystem
