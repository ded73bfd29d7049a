#pragma once
// Process-wide categorised logger. Library code logs through GlobalLog() with a channel name
// ("KMTIO", "SubjectUtils", ...), a level and the source position; the host decides where the
// records go by setting the sink (stderr by default).

#include <boost/format.hpp>

#include <functional>
#include <map>
#include <mutex>
#include <string>

namespace ZMT {

/// Log levels; lower is more severe. A channel shows a record when its level is at or below the
/// channel's threshold.
enum ELogLevel : int {
  ELogFatal = 1,
  ELogError = 2,
  ELogWarning = 3,
  ELogInfo = 4,
  ELogDebug = 5,
  ELogVerbose = 6,
};

/// One formatted log message as handed to the sink.
struct LogRecord {
  std::string Channel;
  int Level = ELogError;
  std::string Message;
  std::string File; ///< source file of the call, may be empty
  int Line = 0;     ///< source line of the call, 0 when unknown
};

using LogSink = std::function<void(const LogRecord&)>;

/// Formats `format` (boost::format, `%1%` placeholders) with `args`. Returns false and leaves
/// `o_rText` empty when the text can't be formatted (bad directive, wrong argument count).
template <class... TArgs>
bool TryFormat(const std::string& format, std::string& o_rText, const TArgs&... args) noexcept {
  try {
    boost::format f(format);
    if constexpr (sizeof...(TArgs) > 0) (f % ... % args);
    o_rText = f.str();
    return true;
  } catch (...) {
    o_rText.clear();
    return false;
  }
}

/// Formats like TryFormat but never fails: an unformattable text gives the raw format string.
template <class... TArgs> std::string FormatOrRaw(const std::string& format, const TArgs&... args) {
  std::string text;
  if (!TryFormat(format, text, args...)) return format;
  return text;
}

/// The logger. Thread-safe; every operation is cheap when a channel is disabled.
class VGlobalLog {
public:
  /// Threshold for records of channels without their own level (default ELogWarning).
  void SetDefaultLevel(int level);
  /// Threshold of one channel.
  void SetLevel(const std::string& channel, int level);
  /// Forgets the per-channel thresholds.
  void ResetLevels();
  int Level(const std::string& channel) const;
  bool IsEnabled(const std::string& channel, int level) const;

  /// Sends an already formatted message to the sink if the channel's level allows it. Never
  /// throws: a failing sink is ignored.
  void Write(const std::string& channel, int level, const char* file, int line,
             const std::string& message) noexcept;

  /// Formats `format` with `args` and writes it. A text that can't be formatted is logged at
  /// ELogError as: Cannot Format Log Message "<format>".
  template <class... TArgs>
  void Log(const std::string& channel, int level, const char* file, int line,
           const std::string& format, const TArgs&... args) noexcept {
    if (!IsEnabled(channel, level)) return;
    std::string text;
    if (TryFormat(format, text, args...)) {
      Write(channel, level, file, line, text);
    } else {
      WriteFormatFailure(channel, file, line, format);
    }
  }

  /// Replaces the sink and returns the previous one. An empty sink restores the stderr sink.
  LogSink SetSink(LogSink sink);

private:
  void WriteFormatFailure(const std::string& channel, const char* file, int line,
                          const std::string& format) noexcept;

  mutable std::mutex m_Mutex;
  std::map<std::string, int, std::less<>> m_Levels;
  int m_DefaultLevel = ELogWarning;
  LogSink m_Sink;
};

/// The process-wide logger.
VGlobalLog& GlobalLog();

/// Sets the sink of the process-wide logger; returns the previous sink.
LogSink SetLogSink(LogSink sink);

/// The sink used when none is set: one line per record on stderr.
void StderrLogSink(const LogRecord& record);

} // namespace ZMT

/// Logs a boost::format message with the caller's source position.
#define ZMT_LOG(channel, level, ...)                                                               \
  ::ZMT::GlobalLog().Log((channel), (level), __FILE__, __LINE__, __VA_ARGS__)
