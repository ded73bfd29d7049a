#include "DebugServices/GlobalLog.h"
#include "DebugServices/GlobalLogStream.h"
#include "DebugServices/LogCapture.h"

#include <gtest/gtest.h>

#include <stdexcept>

using namespace ZMT;

TEST(GlobalLog, FormatsPositionalArgumentsAndKeepsSourcePosition) {
  VLogCapture capture;
  ZMT_LOG("KMTIO", ELogError, "%2% before %1%", "one", 2);
  const auto records = capture.Records();
  ASSERT_EQ(records.size(), 1u);
  EXPECT_EQ(records[0].Channel, "KMTIO");
  EXPECT_EQ(records[0].Level, ELogError);
  EXPECT_EQ(records[0].Message, "2 before one");
  EXPECT_NE(records[0].File.find("GlobalLogTest.cpp"), std::string::npos);
  EXPECT_GT(records[0].Line, 0);
}

TEST(GlobalLog, UnformattableTextIsLoggedRawAtErrorLevel) {
  VLogCapture capture;
  // Too few arguments, then a malformed directive.
  ZMT_LOG("System", ELogVerbose, "needs %1% and %2%", 1);
  ZMT_LOG("System", ELogInfo, "broken %1");
  const auto records = capture.Records();
  ASSERT_EQ(records.size(), 2u);
  EXPECT_EQ(records[0].Message, "Cannot Format Log Message \"needs %1% and %2%\"");
  EXPECT_EQ(records[0].Level, ELogError);
  EXPECT_EQ(records[1].Message, "Cannot Format Log Message \"broken %1\"");
}

TEST(GlobalLog, ChannelLevelsFilterRecords) {
  VLogCapture capture(ELogWarning);
  GlobalLog().SetLevel("Quiet", ELogError);
  GlobalLog().SetLevel("Chatty", ELogVerbose);
  ZMT_LOG("Quiet", ELogWarning, "dropped");
  ZMT_LOG("Quiet", ELogError, "kept");
  ZMT_LOG("Chatty", ELogVerbose, "kept too");
  ZMT_LOG("Other", ELogInfo, "dropped by default level");
  EXPECT_TRUE(GlobalLog().IsEnabled("Chatty", ELogVerbose));
  EXPECT_FALSE(GlobalLog().IsEnabled("Other", ELogInfo));
  GlobalLog().ResetLevels();
  const auto records = capture.Records();
  ASSERT_EQ(records.size(), 2u);
  EXPECT_EQ(records[0].Message, "kept");
  EXPECT_EQ(records[1].Message, "kept too");
}

TEST(GlobalLog, ThrowingSinkDoesNotReachTheCaller) {
  auto previous = SetLogSink([](const LogRecord&) { throw std::runtime_error("sink failed"); });
  EXPECT_NO_THROW(ZMT_LOG("System", ELogError, "message %1%", 1));
  SetLogSink(previous);
}

namespace {
// Streaming a value that counts its formatting shows whether a suppressed record formats.
struct VCounted {
  int* m_pCount;
};
std::ostream& operator<<(std::ostream& out, const VCounted& counted) {
  ++*counted.m_pCount;
  return out << "x";
}
} // namespace

TEST(GlobalLogStream, OneRecordPerStatementAndNothingWhenSuppressed) {
  VLogCapture capture(ELogWarning);
  int formatted = 0;
  const VCounted counted{&formatted};
  ZMT_LOG_STREAM("SubjectCheck", ELogError) << "Segment "
                                            << "Thigh"
                                            << ", " << 3 << " and " << 0.1 + 0.2 << counted;
  ZMT_LOG_STREAM("SubjectCheck", ELogInfo) << "dropped " << counted;
  const auto records = capture.Records();
  ASSERT_EQ(records.size(), 1u);
  EXPECT_EQ(records[0].Channel, "SubjectCheck");
  EXPECT_EQ(records[0].Level, ELogError);
  EXPECT_EQ(records[0].Message, "Segment Thigh, 3 and 0.30000000000000004x");
  EXPECT_NE(records[0].File.find("GlobalLogTest.cpp"), std::string::npos);
  EXPECT_EQ(formatted, 1);
}
