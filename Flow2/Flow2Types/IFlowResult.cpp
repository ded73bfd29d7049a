#include "Flow2/Flow2Types/IFlowResult.h"

namespace ZMT {

const char* GetResultText(IResult result) {
  switch (result.Code()) {
  case IResultRPC::RPCUnknown:
    return "RPCUnknown: The specified remote function or callback is not known";
  case IResultRPC::RPCFailed:
    return "RPCFailed: The remote function or callback invocation could not be invoked";
  case IResultRPC::RPCInvalid:
    return "RPCInvalid: The remote function or callback invocation was badly formed or otherwise "
           "invalid";
  case IResultRPC::RPCNotConnected:
    return "RPCNotConnected: The connection to the remote function or callback is not open";
  default:
    return result.Text();
  }
}

} // namespace ZMT
