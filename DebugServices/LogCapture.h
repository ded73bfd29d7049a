#pragma once
// Collects the records of the process-wide logger for as long as it lives; for tests and for
// callers that want log output as a list of messages.

#include "DebugServices/GlobalLog.h"

#include <mutex>
#include <string>
#include <vector>

namespace ZMT {

class VLogCapture {
public:
  /// Installs a capturing sink and opens every channel up to `level`.
  explicit VLogCapture(int level = ELogVerbose) {
    GlobalLog().SetDefaultLevel(level);
    m_Previous = SetLogSink([this](const LogRecord& record) {
      std::lock_guard lock(m_Mutex);
      m_Records.push_back(record);
    });
  }
  ~VLogCapture() {
    SetLogSink(std::move(m_Previous));
    GlobalLog().SetDefaultLevel(ELogWarning);
  }
  VLogCapture(const VLogCapture&) = delete;
  VLogCapture& operator=(const VLogCapture&) = delete;

  std::vector<LogRecord> Records() const {
    std::lock_guard lock(m_Mutex);
    return m_Records;
  }
  /// Messages of one channel, in order.
  std::vector<std::string> Messages(const std::string& channel) const {
    std::lock_guard lock(m_Mutex);
    std::vector<std::string> out;
    for (const auto& r : m_Records)
      if (r.Channel == channel) out.push_back(r.Message);
    return out;
  }
  void Clear() {
    std::lock_guard lock(m_Mutex);
    m_Records.clear();
  }

private:
  mutable std::mutex m_Mutex;
  std::vector<LogRecord> m_Records;
  LogSink m_Previous;
};

} // namespace ZMT
