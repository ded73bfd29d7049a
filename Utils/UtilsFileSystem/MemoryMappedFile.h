#pragma once
// A file opened for mapping: the handles and the size. VMemoryMappedInputFile maps read-only
// windows of it.

#include "Utils/UtilsFileSystem/IResult.h"

#include <boost/filesystem/path.hpp>

#include <cstdint>

namespace UtilsFileSystem {

class VMemoryMappedFileBase {
public:
  VMemoryMappedFileBase() = default;
  ~VMemoryMappedFileBase() { Close(); }
  VMemoryMappedFileBase(VMemoryMappedFileBase&& other) noexcept;
  VMemoryMappedFileBase& operator=(VMemoryMappedFileBase&& other) noexcept;
  VMemoryMappedFileBase(const VMemoryMappedFileBase&) = delete;
  VMemoryMappedFileBase& operator=(const VMemoryMappedFileBase&) = delete;

  bool IsOpen() const { return m_File >= 0; }
  std::uint64_t GetFileSize() const { return m_FileSize; }
  /// Closes the handles; mappings made from them stay valid until unmapped.
  void Close();

protected:
  /// The file handle (on Linux it serves as the mapping handle too).
  int m_File = -1;
  std::uint64_t m_FileSize = 0;
};

class VMemoryMappedInputFile : public VMemoryMappedFileBase {
public:
  /// Opens for reading. FileNotFound, NotPermitted (logging the holders of the file), InvalidType
  /// for a folder, or the mapped failure.
  ZMT::IResult Open(const boost::filesystem::path& path);
  /// Maps `size` bytes from `offset` (a multiple of the system page size) read-only; null on
  /// failure.
  const std::uint8_t* Map(std::uint64_t offset, std::uint64_t size) const;
  static void Unmap(const std::uint8_t* i_pData, std::uint64_t size);
  /// The system's page size: mapping offsets are multiples of it.
  static std::uint64_t SystemPageSize();
};

} // namespace UtilsFileSystem
