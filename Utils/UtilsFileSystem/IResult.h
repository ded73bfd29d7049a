#pragma once
// Status code of file and Flow operations: one 32-bit code whose top bit marks failure.

#include <cstdint>

namespace ZMT {

class IResult {
public:
  enum ECode : std::uint32_t {
    Ok = 0,
    OkButNoEffect = 1,
    OkButPartial = 2,
    OkButFinished = 3,
    OkButModified = 4,
    Failed = 0x80000000u,
    FailedWithException = 0x80000001u,
    Finished = 0x80000002u,
    Stopping = 0x80000003u,
    NotImplemented = 0x80000004u,
    NotSupported = 0x80000005u,
    NotPermitted = 0x80000006u,
    NotAvailable = 0x80000007u,
    NotConnected = 0x80000008u,
    NotSet = 0x80000009u,
    NotFound = 0x8000000au,
    NotRequired = 0x8000000bu,
    AlreadyPresent = 0x8000000cu,
    AlreadyInProgress = 0x8000000du,
    AlreadySet = 0x8000000eu,
    InvalidArgument = 0x8000000fu,
    InvalidIndex = 0x80000010u,
    InvalidName = 0x80000011u,
    InvalidId = 0x80000012u,
    InvalidHandle = 0x80000013u,
    InvalidToken = 0x80000014u,
    InvalidPointer = 0x80000015u,
    InvalidFormat = 0x80000016u,
    InvalidType = 0x80000017u,
    InvalidVersion = 0x80000018u,
    InvalidSession = 0x80000019u,
    InvalidInfo = 0x8000001au,
    InvalidValue = 0x8000001bu,
    InvalidSettings = 0x8000001cu,
    ProtocolFailure = 0x8000001du,
    NetworkFailure = 0x8000001eu,
    AllocationFailure = 0x8000001fu,
    SerialisationFailure = 0x80000020u,
    FileIOFailure = 0x80000021u,
    TimedOut = 0x80000022u,
    WouldBlock = 0x80000023u,
    EndOfData = 0x80000024u,
    Conflict = 0x80000025u,
    FileNotOpen = 0x80000026u,
    ShuttingDown = 0x80000027u,
    DiskFull = 0x80000028u,
    Canceled = 0x80000029u,
    FileNotFound = 0x8000002au,
  };

  constexpr IResult(std::uint32_t code = Ok) : m_Code(code) {}

  constexpr std::uint32_t Code() const { return m_Code; }
  constexpr bool IsFailure() const { return (m_Code & 0x80000000u) != 0; }
  constexpr bool IsSuccess() const { return !IsFailure(); }
  /// "Name: description", such as "NotPermitted: The function is not permitted at this time";
  /// "Unknown result code" for a code outside the table.
  const char* Text() const;

  constexpr bool operator==(const IResult&) const = default;

private:
  std::uint32_t m_Code;
};

} // namespace ZMT
