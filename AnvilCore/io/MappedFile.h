#pragma once
#include <cstddef>
#include <cstdint>
#include <string>

namespace AnvilCore {

/// A whole file mapped read-only into memory: its pages are read as they are touched, and
/// `release` gives back the pages of a part already used, so that a reader that walks the file
/// once holds little of it at a time.
class MappedFile {
public:
  MappedFile() = default;
  ~MappedFile();
  MappedFile(const MappedFile&) = delete;
  MappedFile& operator=(const MappedFile&) = delete;

  /// Maps `i_path`. On failure returns false with "<path>: cannot open: <reason>" or
  /// "<path>: read error: <reason>" in `o_rError`.
  bool open(const std::string& i_path, std::string& o_rError);
  /// The bytes; null for an empty file.
  const uint8_t* data() const { return m_pData; }
  size_t size() const { return m_size; }
  /// Drops from memory what is mapped of the bytes before `i_offset`, in whole units of 2 MB
  /// (the huge pages the system may map a file with, which a smaller release would split);
  /// reading them again reads them from the file.
  void releaseBefore(size_t i_offset);

private:
  const uint8_t* m_pData = nullptr;
  size_t m_size = 0;
  size_t m_releasedTo = 0; ///< bytes before this offset are released
};

} // namespace AnvilCore
