#pragma once
// Lines of text formatted straight into one large buffer, which goes to the stream in one fwrite
// whenever the next line might not fit, and at the end.
#include <algorithm>
#include <cstddef>
#include <cstdio>
#include <vector>

namespace TrajectoryExport {

class TextBlock {
public:
  /// `i_lineMax`: the most characters one line can take.
  TextBlock(FILE* i_pFile, size_t i_lineMax)
      : m_pFile(i_pFile), m_lineMax(i_lineMax), m_buffer(std::max(kBlockBytes, 2 * i_lineMax)) {}
  ~TextBlock() { flush(); }
  TextBlock(const TextBlock&) = delete;
  TextBlock& operator=(const TextBlock&) = delete;

  /// Where the next line starts; room for `i_lineMax` characters follows.
  char* lineStart() {
    if (m_buffer.size() - m_used < m_lineMax) flush();
    return m_buffer.data() + m_used;
  }
  /// Ends the line begun at `lineStart` at `i_pEnd`.
  void lineEnd(const char* i_pEnd) { m_used = size_t(i_pEnd - m_buffer.data()); }
  void flush() {
    if (m_used > 0) std::fwrite(m_buffer.data(), 1, m_used, m_pFile);
    m_used = 0;
  }

private:
  static constexpr size_t kBlockBytes = size_t(1) << 20;
  FILE* m_pFile;
  size_t m_lineMax;
  std::vector<char> m_buffer;
  size_t m_used = 0;
};

} // namespace TrajectoryExport
