// Every Flow result code: its text and its failure bit.

#include "Flow2/Flow2Types/IFlowResult.h"

#include <gtest/gtest.h>

#include <cstdint>
#include <string>

namespace {

struct VExpected {
  std::uint32_t m_Code;
  const char* m_pText;
};

const VExpected Expected[] = {
    {0x0, "Ok: The function succeeded"},
    {0x1, "OkButNoEffect: The function succeeded but had no effect"},
    {0x2, "OkButPartial: The function succeeded but was only partially applicable"},
    {0x3, "OkButFinished: Successfully finished - no further operation possible"},
    {0x4, "OkButModified: The function succeeded but one or more values or parameters were "
          "modified"},
    {0x80000000, "Failed: The function failed"},
    {0x80000001, "FailedWithException: The function generated an exception"},
    {0x80000002, "Finished: The service requested has finished"},
    {0x80000003, "Stopping: The service requested is stopping"},
    {0x80000004, "NotImplemented: The function is not implemented in this version"},
    {0x80000005, "NotSupported: The function is not supported"},
    {0x80000006, "NotPermitted: The function is not permitted at this time"},
    {0x80000007, "NotAvailable: The information requested was not available"},
    {0x80000008, "NotConnected: The required connection is not present"},
    {0x80000009, "NotSet: The requested information has not been set"},
    {0x8000000a, "NotFound: The requested information, instance or type was not found"},
    {0x8000000b, "NotRequired: The action requested is not necessary"},
    {0x8000000c, "AlreadyPresent: The data or item being set was already present"},
    {0x8000000d, "AlreadyInProgress: The operation requested is already in progress"},
    {0x8000000e, "AlreadySet: The data or item being set is already set"},
    {0x8000000f, "InvalidArgument: A supplied argument was invalid"},
    {0x80000010, "InvalidIndex: A supplied index was invalid or out of range"},
    {0x80000011, "InvalidName: A supplied name was invalid or unrecognized"},
    {0x80000012, "InvalidId: A supplied id was invalid or unrecognized"},
    {0x80000013, "InvalidHandle: A supplied handle was invalid"},
    {0x80000014, "InvalidToken: A supplied token was invalid"},
    {0x80000015, "InvalidPointer: A supplied pointer was invalid"},
    {0x80000016, "InvalidFormat: The data provided or requested was not in the expected format"},
    {0x80000017, "InvalidType: An incorrect type was provided"},
    {0x80000018, "InvalidVersion: An object or file was the wrong version"},
    {0x80000019, "InvalidSession: The session specified was not valid"},
    {0x8000001a, "InvalidInfo: The information supplied was not valid"},
    {0x8000001b, "InvalidValue: A value supplied was not valid"},
    {0x8000001c, "InvalidSettings: The settings supplied were not valid"},
    {0x8000001d, "ProtocolFailure: A protocol error was detected"},
    {0x8000001e, "NetworkFailure: A network error occurred"},
    {0x8000001f, "AllocationFailure: Failed to allocate memory or item"},
    {0x80000020, "SerialisationFailure: Failed during serialization/deserialization of data"},
    {0x80000021, "FileIOFailure: An operation to read or write a file failed"},
    {0x80000022, "TimedOut: The operation timed out"},
    {0x80000023, "WouldBlock: The operation failed as it would have had to block"},
    {0x80000024, "EndOfData: The operation failed as the end of a data stream has been reached"},
    {0x80000025, "Conflict: The operation detected a conflict"},
    {0x80000026, "FileNotOpen: The file is not open or could not be opened"},
    {0x80000027, "ShuttingDown: The operation failed because the component is shutting down"},
    {0x80000028, "DiskFull: No space left on device"},
    {0x80000029, "Canceled: The operation has been canceled"},
    {0x8000002a, "FileNotFound: The file does not exist or is unreadable"},
    {0x80010000, "RPCUnknown: The specified remote function or callback is not known"},
    {0x80010001, "RPCFailed: The remote function or callback invocation could not be invoked"},
    {0x80010002, "RPCInvalid: The remote function or callback invocation was badly formed or "
                 "otherwise invalid"},
    {0x80010003, "RPCNotConnected: The connection to the remote function or callback is not open"},
};

TEST(FlowResult, EveryCodeHasItsTextAndFailureBit) {
  for (const VExpected& expected : Expected) {
    const ZMT::IResult result(expected.m_Code);
    SCOPED_TRACE(expected.m_pText);
    EXPECT_EQ(std::string(ZMT::GetResultText(result)), expected.m_pText);
    EXPECT_EQ(result.IsFailure(), expected.m_Code >= 0x80000000u);
    EXPECT_EQ(result.IsSuccess(), !result.IsFailure());
  }
}

TEST(FlowResult, CodesOutsideTheTableHaveNoText) {
  for (std::uint32_t code : {0x5u, 0x8000002bu, 0x80010004u, 0x40000u, 0x7FFFFFFFu})
    EXPECT_EQ(std::string(ZMT::GetResultText(ZMT::IResult(code))), "Unknown result code") << code;
  EXPECT_TRUE(ZMT::IResult(0x8000002bu).IsFailure());
}

} // namespace
