#pragma once
// A seekable output stream over a replacing file, so that stream writers (the Flow file writer)
// reach the disk by the same road as every other file: temporary sibling, then rename.

#include "Utils/UtilsFileSystem/AlignedWrites.h"
#include "Utils/UtilsFileSystem/ReplacingFile.h"
#include "Utils/UtilsFileSystem/Streams.h"

namespace UtilsFileSystem {

class VReplacingFileStream final : public ZMT::IOutputStreamSeekable {
public:
  /// The file must be open; it stays the caller's to commit or abandon.
  explicit VReplacingFileStream(VReplacingFile& io_rFile) : m_rFile(io_rFile) {}

  using ZMT::IOutputStream::Write;
  bool Write(const void* i_pBuffer, std::uint64_t size) override;
  /// All pieces under one lock of the stream.
  bool Write(const ZMT::VGatherList& pieces) override;
  bool GetSize(std::uint64_t& o_rSize) override;
  bool GetPosition(std::uint64_t& o_rPosition) override;
  /// Writing after a seek off a buffer boundary realigns the flushes (see VAlignedWrites).
  bool Seek(std::int64_t position) override;

private:
  VReplacingFile& m_rFile;
  VAlignedWrites m_Aligned;
};

} // namespace UtilsFileSystem
