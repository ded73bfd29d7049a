#include "DebugServices/AssertFail.h"
#include "DebugServices/LogCapture.h"

#include <gtest/gtest.h>

#include <string>

TEST(AssertFail, DefaultHandlerLogsAndExecutionContinues) {
  ZMT::VLogCapture capture;
  int after = 0;
  ANVIL_ASSERT(1 + 1 == 3);
  after = 1;
  EXPECT_EQ(after, 1);
  const auto messages = capture.Messages("Assert");
  ASSERT_EQ(messages.size(), 1u);
  EXPECT_EQ(messages[0], "Assertion failed: 1 + 1 == 3");
}

TEST(AssertFail, InstalledHandlerReceivesExpressionAndPosition) {
  std::string expression;
  int line = 0;
  auto previous = DebugServices::SetAssertFailHandler([&](const char* e, const char*, int l) {
    expression = e;
    line = l;
  });
  ANVIL_ASSERT(true);
  EXPECT_TRUE(expression.empty());
  DebugServices::CallAssertFailHandler("x > 0", "file.cpp", 42);
  DebugServices::SetAssertFailHandler(previous);
  EXPECT_EQ(expression, "x > 0");
  EXPECT_EQ(line, 42);
}
