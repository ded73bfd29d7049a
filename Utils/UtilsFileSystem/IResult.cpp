#include "Utils/UtilsFileSystem/IResult.h"

namespace ZMT {

namespace {

struct VResultText {
  std::uint32_t m_Code;
  const char* m_pText;
};

constexpr VResultText Texts[] = {
    {IResult::Ok, "Ok: The function succeeded"},
    {IResult::OkButNoEffect, "OkButNoEffect: The function succeeded but had no effect"},
    {IResult::OkButPartial,
     "OkButPartial: The function succeeded but was only partially applicable"},
    {IResult::OkButFinished,
     "OkButFinished: Successfully finished - no further operation possible"},
    {IResult::OkButModified, "OkButModified: The function succeeded but one or more values or "
                             "parameters were modified"},
    {IResult::Failed, "Failed: The function failed"},
    {IResult::FailedWithException, "FailedWithException: The function generated an exception"},
    {IResult::Finished, "Finished: The service requested has finished"},
    {IResult::Stopping, "Stopping: The service requested is stopping"},
    {IResult::NotImplemented, "NotImplemented: The function is not implemented in this version"},
    {IResult::NotSupported, "NotSupported: The function is not supported"},
    {IResult::NotPermitted, "NotPermitted: The function is not permitted at this time"},
    {IResult::NotAvailable, "NotAvailable: The information requested was not available"},
    {IResult::NotConnected, "NotConnected: The required connection is not present"},
    {IResult::NotSet, "NotSet: The requested information has not been set"},
    {IResult::NotFound, "NotFound: The requested information, instance or type was not found"},
    {IResult::NotRequired, "NotRequired: The action requested is not necessary"},
    {IResult::AlreadyPresent, "AlreadyPresent: The data or item being set was already present"},
    {IResult::AlreadyInProgress,
     "AlreadyInProgress: The operation requested is already in progress"},
    {IResult::AlreadySet, "AlreadySet: The data or item being set is already set"},
    {IResult::InvalidArgument, "InvalidArgument: A supplied argument was invalid"},
    {IResult::InvalidIndex, "InvalidIndex: A supplied index was invalid or out of range"},
    {IResult::InvalidName, "InvalidName: A supplied name was invalid or unrecognized"},
    {IResult::InvalidId, "InvalidId: A supplied id was invalid or unrecognized"},
    {IResult::InvalidHandle, "InvalidHandle: A supplied handle was invalid"},
    {IResult::InvalidToken, "InvalidToken: A supplied token was invalid"},
    {IResult::InvalidPointer, "InvalidPointer: A supplied pointer was invalid"},
    {IResult::InvalidFormat,
     "InvalidFormat: The data provided or requested was not in the expected format"},
    {IResult::InvalidType, "InvalidType: An incorrect type was provided"},
    {IResult::InvalidVersion, "InvalidVersion: An object or file was the wrong version"},
    {IResult::InvalidSession, "InvalidSession: The session specified was not valid"},
    {IResult::InvalidInfo, "InvalidInfo: The information supplied was not valid"},
    {IResult::InvalidValue, "InvalidValue: A value supplied was not valid"},
    {IResult::InvalidSettings, "InvalidSettings: The settings supplied were not valid"},
    {IResult::ProtocolFailure, "ProtocolFailure: A protocol error was detected"},
    {IResult::NetworkFailure, "NetworkFailure: A network error occurred"},
    {IResult::AllocationFailure, "AllocationFailure: Failed to allocate memory or item"},
    {IResult::SerialisationFailure,
     "SerialisationFailure: Failed during serialization/deserialization of data"},
    {IResult::FileIOFailure, "FileIOFailure: An operation to read or write a file failed"},
    {IResult::TimedOut, "TimedOut: The operation timed out"},
    {IResult::WouldBlock, "WouldBlock: The operation failed as it would have had to block"},
    {IResult::EndOfData, "EndOfData: The operation failed as the end of a data stream has been "
                         "reached"},
    {IResult::Conflict, "Conflict: The operation detected a conflict"},
    {IResult::FileNotOpen, "FileNotOpen: The file is not open or could not be opened"},
    {IResult::ShuttingDown,
     "ShuttingDown: The operation failed because the component is shutting down"},
    {IResult::DiskFull, "DiskFull: No space left on device"},
    {IResult::Canceled, "Canceled: The operation has been canceled"},
    {IResult::FileNotFound, "FileNotFound: The file does not exist or is unreadable"},
};

} // namespace

const char* IResult::Text() const {
  for (const auto& entry : Texts)
    if (entry.m_Code == m_Code) return entry.m_pText;
  return "Unknown result code";
}

} // namespace ZMT
