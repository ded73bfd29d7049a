#include "DebugServices/AssertFail.h"

#include "DebugServices/GlobalLog.h"

#include <mutex>

namespace DebugServices {

namespace {

std::mutex& HandlerMutex() {
  static std::mutex s_Mutex;
  return s_Mutex;
}

AssertFailHandler& Handler() {
  static AssertFailHandler s_Handler;
  return s_Handler;
}

void DefaultHandler(const char* expression, const char* file, int line) {
  ZMT::GlobalLog().Log("Assert", ZMT::ELogError, file, line, "Assertion failed: %1%",
                       expression ? expression : "");
}

} // namespace

void CallAssertFailHandler(const char* expression, const char* file, int line) noexcept {
  try {
    AssertFailHandler handler;
    {
      std::lock_guard lock(HandlerMutex());
      handler = Handler();
    }
    if (handler) {
      handler(expression, file, line);
    } else {
      DefaultHandler(expression, file, line);
    }
  } catch (...) {
    // A handler that throws must not end the process from here.
  }
}

AssertFailHandler SetAssertFailHandler(AssertFailHandler handler) {
  std::lock_guard lock(HandlerMutex());
  std::swap(Handler(), handler);
  return handler;
}

} // namespace DebugServices
