#pragma once
// Assertion reporting. A failed check calls CallAssertFailHandler and execution goes on after it
// returns; the default handler logs the failure on the "Assert" channel at error level.

#include <functional>

namespace DebugServices {

using AssertFailHandler = std::function<void(const char* expression, const char* file, int line)>;

/// Reports a failed assertion to the installed handler. Never throws.
void CallAssertFailHandler(const char* expression, const char* file, int line) noexcept;

/// Replaces the handler and returns the previous one; an empty handler restores the default.
AssertFailHandler SetAssertFailHandler(AssertFailHandler handler);

} // namespace DebugServices

/// Checks `expr`; on failure reports it and carries on.
#define ANVIL_ASSERT(expr)                                                                         \
  ((expr) ? (void)0 : ::DebugServices::CallAssertFailHandler(#expr, __FILE__, __LINE__))
