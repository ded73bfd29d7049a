#pragma once
// Flow's view of the shared result code: the remote-call codes and a text lookup over every code
// Flow can return.

#include "Utils/UtilsFileSystem/IResult.h"

#include <cstdint>

namespace ZMT {

/// Codes of the remote-call service that Flow results may carry besides those of IResult::ECode.
namespace IResultRPC {
constexpr std::uint32_t RPCUnknown = 0x80010000u;
constexpr std::uint32_t RPCFailed = 0x80010001u;
constexpr std::uint32_t RPCInvalid = 0x80010002u;
constexpr std::uint32_t RPCNotConnected = 0x80010003u;
} // namespace IResultRPC

/// "Name: description" of any Flow result code, remote-call codes included; "Unknown result code"
/// for a code outside the table.
const char* GetResultText(IResult result);

} // namespace ZMT
