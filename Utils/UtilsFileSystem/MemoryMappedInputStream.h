#pragma once
// Reads a file through a small window of mapped pages, so that a file far larger than the
// address space budget can be read at random. The pages are kept most recently used first; a
// position outside them maps a new page, evicting the least recently used one when the window
// is full.

#include "Utils/UtilsFileSystem/FileStreams.h"
#include "Utils/UtilsFileSystem/MemoryMappedFile.h"
#include "Utils/UtilsFileSystem/Streams.h"

#include <cstdint>
#include <memory>
#include <utility>
#include <vector>

namespace UtilsFileSystem {

class VMemoryMappedInputStream {
public:
  static constexpr std::uint64_t DefaultPageSize = 0x10000000; // 256 MiB
  static constexpr std::uint32_t DefaultMaxPages = 2;

  /// The page size is rounded up to a multiple of the system's page size; at least one page.
  explicit VMemoryMappedInputStream(std::uint64_t pageSize = DefaultPageSize,
                                    std::uint32_t maxPages = DefaultMaxPages);
  /// Opens at once; raises std::runtime_error "File not found" or "Failed to open file".
  explicit VMemoryMappedInputStream(const boost::filesystem::path& path,
                                    std::uint64_t pageSize = DefaultPageSize,
                                    std::uint32_t maxPages = DefaultMaxPages);
  ~VMemoryMappedInputStream();
  VMemoryMappedInputStream(VMemoryMappedInputStream&& other) noexcept;
  VMemoryMappedInputStream(const VMemoryMappedInputStream&) = delete;
  VMemoryMappedInputStream& operator=(const VMemoryMappedInputStream&) = delete;

  ZMT::IResult Open(const boost::filesystem::path& path);
  /// Unmaps every page and closes the file, logging the swap count at verbose level.
  void Close();
  bool IsOpen() const { return m_File.IsOpen(); }

  /// Reads exactly `size` bytes from the position; a short file or a failed mapping marks the
  /// stream failed.
  bool Read(void* o_pBuffer, std::uint64_t size);
  bool IsFailed() const { return m_Failed; }
  bool GetSize(std::uint64_t& o_rSize) const;
  bool GetPosition(std::uint64_t& o_rPosition) const;
  /// Any position up to the end of the file.
  bool Seek(std::int64_t position);

  /// Bytes mapped contiguously from the position, without moving: up to the end of its page.
  std::uint64_t GetContiguous(const std::uint8_t*& o_rpData);
  /// Pages mapped so far (each new mapping counts).
  std::uint32_t GetSwapCount() const { return m_SwapCount; }
  std::uint64_t GetPageSize() const { return m_PageSize; }
  std::size_t GetMappedPageCount() const { return m_Pages.size(); }

private:
  struct VPage {
    std::uint64_t m_Begin = 0;
    std::uint64_t m_End = 0;
    const std::uint8_t* m_pData = nullptr;
    std::uint64_t m_Size = 0;
  };
  /// Makes the first page the one holding `position`; false if it can't be mapped.
  bool Ensure(std::uint64_t position);

  VMemoryMappedInputFile m_File;
  std::vector<VPage> m_Pages;
  std::uint64_t m_PageSize;
  std::uint32_t m_MaxPages;
  std::uint32_t m_SwapCount = 0;
  std::uint64_t m_Position = 0;
  bool m_Failed = false;
};

/// A seekable input stream owning a memory-mapped stream.
template <>
class IInputStreamSeekableOwningAdapter<VMemoryMappedInputStream>
    : public ZMT::IInputStreamSeekable {
public:
  /// Raises std::runtime_error "Invalid stream" for a stream that isn't open.
  explicit IInputStreamSeekableOwningAdapter(VMemoryMappedInputStream stream);
  using ZMT::IInputStream::Read;
  bool Read(void* o_pBuffer, std::uint64_t size) override { return m_Stream.Read(o_pBuffer, size); }
  bool IsFailed() const override { return m_Stream.IsFailed(); }
  bool GetSize(std::uint64_t& o_rSize) override { return m_Stream.GetSize(o_rSize); }
  bool GetPosition(std::uint64_t& o_rPosition) override {
    return m_Stream.GetPosition(o_rPosition);
  }
  bool Seek(std::int64_t position) override { return m_Stream.Seek(position); }
  VMemoryMappedInputStream& Stream() { return m_Stream; }

private:
  VMemoryMappedInputStream m_Stream;
};

class VMemoryMappedInputStreamVirtual
    : public IInputStreamSeekableOwningAdapter<VMemoryMappedInputStream> {
public:
  using IInputStreamSeekableOwningAdapter::IInputStreamSeekableOwningAdapter;
  ~VMemoryMappedInputStreamVirtual() override = default;
};

using VInputStreamOpenResult = std::pair<std::unique_ptr<ZMT::IInputStreamSeekable>, ZMT::IResult>;

/// A file for reading: mapped if it can be, else through a plain file stream; null with the code
/// when neither opens.
VInputStreamOpenResult
OpenInputStream(const boost::filesystem::path& path,
                std::uint64_t pageSize = VMemoryMappedInputStream::DefaultPageSize,
                std::uint32_t maxPages = VMemoryMappedInputStream::DefaultMaxPages);

} // namespace UtilsFileSystem
