#include "DebugServices/GlobalLog.h"

#include <cstdio>

namespace ZMT {

namespace {

const char* LevelName(int level) {
  switch (level) {
  case ELogFatal:
    return "fatal";
  case ELogError:
    return "error";
  case ELogWarning:
    return "warning";
  case ELogInfo:
    return "info";
  case ELogDebug:
    return "debug";
  default:
    return "verbose";
  }
}

} // namespace

void StderrLogSink(const LogRecord& record) {
  if (record.File.empty()) {
    std::fprintf(stderr, "[%s] %s: %s\n", record.Channel.c_str(), LevelName(record.Level),
                 record.Message.c_str());
  } else {
    std::fprintf(stderr, "[%s] %s: %s (%s:%d)\n", record.Channel.c_str(), LevelName(record.Level),
                 record.Message.c_str(), record.File.c_str(), record.Line);
  }
}

void VGlobalLog::SetDefaultLevel(int level) {
  std::lock_guard lock(m_Mutex);
  m_DefaultLevel = level;
}

void VGlobalLog::SetLevel(const std::string& channel, int level) {
  std::lock_guard lock(m_Mutex);
  m_Levels[channel] = level;
}

void VGlobalLog::ResetLevels() {
  std::lock_guard lock(m_Mutex);
  m_Levels.clear();
}

int VGlobalLog::Level(const std::string& channel) const {
  std::lock_guard lock(m_Mutex);
  auto it = m_Levels.find(channel);
  return it == m_Levels.end() ? m_DefaultLevel : it->second;
}

bool VGlobalLog::IsEnabled(const std::string& channel, int level) const {
  return level <= Level(channel);
}

void VGlobalLog::Write(const std::string& channel, int level, const char* file, int line,
                       const std::string& message) noexcept {
  try {
    if (!IsEnabled(channel, level)) return;
    LogRecord record{channel, level, message, file ? file : "", line};
    LogSink sink;
    {
      std::lock_guard lock(m_Mutex);
      sink = m_Sink;
    }
    if (sink) {
      sink(record);
    } else {
      StderrLogSink(record);
    }
  } catch (...) {
    // Logging must never disturb the caller.
  }
}

void VGlobalLog::WriteFormatFailure(const std::string& channel, const char* file, int line,
                                    const std::string& format) noexcept {
  try {
    Write(channel, ELogError, file, line, "Cannot Format Log Message \"" + format + "\"");
  } catch (...) {
  }
}

LogSink VGlobalLog::SetSink(LogSink sink) {
  std::lock_guard lock(m_Mutex);
  std::swap(m_Sink, sink);
  return sink;
}

VGlobalLog& GlobalLog() {
  static VGlobalLog s_Log;
  return s_Log;
}

LogSink SetLogSink(LogSink sink) {
  return GlobalLog().SetSink(std::move(sink));
}

} // namespace ZMT
