#pragma once
// Byte streams over C files: the plain owning wrappers and their seekable stream adapters.

#include "Utils/UtilsFileSystem/AlignedWrites.h"
#include "Utils/UtilsFileSystem/FileIO.h"
#include "Utils/UtilsFileSystem/Streams.h"

#include <cstdio>
#include <utility>

namespace UtilsFileSystem {

/// Owns a FILE* opened for writing. A null file answers every write with false. The destructor
/// closes the file.
class VFileOutputStream {
public:
  explicit VFileOutputStream(std::FILE* pFile = nullptr) : m_pFile(pFile) {}
  ~VFileOutputStream();
  VFileOutputStream(VFileOutputStream&& other) noexcept
      : m_pFile(std::exchange(other.m_pFile, nullptr)) {}
  VFileOutputStream& operator=(VFileOutputStream&& other) noexcept;
  VFileOutputStream(const VFileOutputStream&) = delete;
  VFileOutputStream& operator=(const VFileOutputStream&) = delete;

  /// fwrite of the whole block; true for an empty block on an open file.
  bool Write(const void* pBuffer, std::uint64_t size);
  /// Closes now; the result of fclose (InvalidArgument when no file is open).
  ZMT::IResult Close();
  std::FILE* File() const { return m_pFile; }

private:
  std::FILE* m_pFile;
};

/// Owns a FILE* opened for reading.
class VFileInputStream {
public:
  explicit VFileInputStream(std::FILE* pFile = nullptr) : m_pFile(pFile) {}
  ~VFileInputStream();
  VFileInputStream(VFileInputStream&& other) noexcept
      : m_pFile(std::exchange(other.m_pFile, nullptr)), m_Failed(other.m_Failed) {}
  VFileInputStream(const VFileInputStream&) = delete;
  VFileInputStream& operator=(const VFileInputStream&) = delete;

  /// Reads exactly `size` bytes; a short read marks the stream failed.
  bool Read(void* pBuffer, std::uint64_t size);
  bool IsFailed() const { return m_Failed; }
  ZMT::IResult Close();
  std::FILE* File() const { return m_pFile; }

private:
  std::FILE* m_pFile;
  bool m_Failed = false;
};

/// ISeekable over a file: position by TellFile, seek from the start by SeekFile, size by
/// GetFileSize.
class VFileSeekable : public virtual ZMT::ISeekable {
public:
  bool GetSize(std::uint64_t& o_rSize) override;
  bool GetPosition(std::uint64_t& o_rPosition) override;
  bool Seek(std::int64_t position) override;

protected:
  /// The file being positioned; null once closed.
  virtual std::FILE* SeekableFile() const = 0;
};

template <class TStream> class IOutputStreamSeekableOwningAdapter;

/// An output stream that owns a VFileOutputStream and is seekable.
template <>
class IOutputStreamSeekableOwningAdapter<VFileOutputStream> : public ZMT::IOutputStreamSeekable,
                                                              public VFileSeekable {
public:
  explicit IOutputStreamSeekableOwningAdapter(VFileOutputStream stream)
      : m_Stream(std::move(stream)) {}
  bool Write(const void* pBuffer, std::uint64_t size) override;
  using ZMT::IOutputStream::Write;
  /// All pieces under one lock of the file.
  bool Write(const ZMT::VGatherList& pieces) override;
  /// After a seek to a position that isn't a multiple of FullBufferSize, the buffer is flushed
  /// once when the writing reaches the next multiple: the file's buffer then goes on writing whole
  /// aligned blocks, which the kernel takes without zeroing the pages a block half covers.
  bool Seek(std::int64_t position) override;
  VFileOutputStream& Stream() { return m_Stream; }

protected:
  std::FILE* SeekableFile() const override { return m_Stream.File(); }

private:
  VFileOutputStream m_Stream;
  VAlignedWrites m_Aligned;
};

template <class TStream> class IInputStreamSeekableOwningAdapter;

/// An input stream that owns a VFileInputStream and is seekable.
template <>
class IInputStreamSeekableOwningAdapter<VFileInputStream> : public ZMT::IInputStreamSeekable,
                                                            public VFileSeekable {
public:
  explicit IInputStreamSeekableOwningAdapter(VFileInputStream stream)
      : m_Stream(std::move(stream)) {}
  bool Read(void* pBuffer, std::uint64_t size) override { return m_Stream.Read(pBuffer, size); }
  using ZMT::IInputStream::Read;
  bool IsFailed() const override { return m_Stream.IsFailed(); }
  VFileInputStream& Stream() { return m_Stream; }

protected:
  std::FILE* SeekableFile() const override { return m_Stream.File(); }

private:
  VFileInputStream m_Stream;
};

/// The seekable file output stream as a class of its own, for callers that hold it by pointer.
class VFileOutputStreamVirtual : public IOutputStreamSeekableOwningAdapter<VFileOutputStream> {
public:
  using IOutputStreamSeekableOwningAdapter::IOutputStreamSeekableOwningAdapter;
  ~VFileOutputStreamVirtual() override = default;
};

class VFileInputStreamVirtual : public IInputStreamSeekableOwningAdapter<VFileInputStream> {
public:
  using IInputStreamSeekableOwningAdapter::IInputStreamSeekableOwningAdapter;
  ~VFileInputStreamVirtual() override = default;
};

} // namespace UtilsFileSystem

namespace Flow2File {
/// The file output stream under the name the Flow file writer uses.
class VFileStreamOutput : public UtilsFileSystem::VFileOutputStreamVirtual {
public:
  using VFileOutputStreamVirtual::VFileOutputStreamVirtual;
};
} // namespace Flow2File
