#pragma once
// Evaluation of a subject's expression texts with a message naming what they belong to; shared
// by the reader's checks and the writer's preparation.

#include "DebugServices/GlobalLog.h"
#include "River/CoreOstraTypesUtils/ExpressionParsers.h"

#include <array>
#include <string>
#include <vector>

namespace CoreOstraKMTIO::Detail {

/// Evaluates `text`; a failure adds "Could not evaluate expression '<text>' of <owner>: <why>".
inline bool Evaluate(CoreOstraTypesUtils::VDynamicExpressionParserSimple& parser,
                     const std::string& text, const std::string& owner, double& o_rValue,
                     std::vector<std::string>& o_rErrors) {
  std::string message;
  if (parser.Evaluate(text, o_rValue, message)) return true;
  o_rErrors.push_back(
      ZMT::FormatOrRaw("Could not evaluate expression '%1%' of %2%: %3%", text, owner, message));
  return false;
}

/// Evaluates every text, reporting each failure; false when any failed.
template <std::size_t N>
bool EvaluateAll(CoreOstraTypesUtils::VDynamicExpressionParserSimple& parser,
                 const std::array<std::string, N>& texts, const std::string& owner,
                 std::array<double, N>& o_rValues, std::vector<std::string>& o_rErrors) {
  bool ok = true;
  for (std::size_t i = 0; i < N; ++i)
    ok = Evaluate(parser, texts[i], owner, o_rValues[i], o_rErrors) && ok;
  return ok;
}

} // namespace CoreOstraKMTIO::Detail
