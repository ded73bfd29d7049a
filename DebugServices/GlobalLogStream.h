#pragma once
// Stream form of the process-wide logger, for messages assembled from pieces:
//   ZMT_LOG_STREAM("SubjectCheck", ZMT::ELogError) << "Segment " << name << ", invalid";
// The record is written when the temporary stream ends, as one message. Nothing is formatted
// when the channel's level suppresses the record.

#include "DebugServices/GlobalLog.h"

#include <sstream>
#include <string>

namespace ZMT {

class VGlobalLogStream {
public:
  VGlobalLogStream(std::string channel, int level, const char* file, int line)
      : m_Channel(std::move(channel)), m_Level(level), m_pFile(file), m_Line(line),
        m_Enabled(GlobalLog().IsEnabled(m_Channel, level)) {
    if (m_Enabled) m_Stream.precision(17);
  }
  VGlobalLogStream(const VGlobalLogStream&) = delete;
  VGlobalLogStream& operator=(const VGlobalLogStream&) = delete;
  ~VGlobalLogStream() {
    if (m_Enabled) GlobalLog().Write(m_Channel, m_Level, m_pFile, m_Line, m_Stream.str());
  }

  template <class T> VGlobalLogStream& operator<<(const T& value) {
    if (m_Enabled) m_Stream << value;
    return *this;
  }

  /// Whether the record will be written.
  bool Enabled() const { return m_Enabled; }

private:
  std::string m_Channel;
  int m_Level;
  const char* m_pFile;
  int m_Line;
  bool m_Enabled;
  std::ostringstream m_Stream;
};

/// A stream whose text becomes one record of `channel` at `level` when it ends.
inline VGlobalLogStream GlobalLogStream(std::string channel, int level, const char* file = "",
                                        int line = 0) {
  return VGlobalLogStream(std::move(channel), level, file, line);
}

} // namespace ZMT

/// A log stream with the caller's source position.
#define ZMT_LOG_STREAM(channel, level)                                                             \
  ::ZMT::GlobalLogStream((channel), (level), __FILE__, __LINE__)
