#pragma once
// Evaluation of a subject's expression texts with a message naming what they belong to; shared
// by the reader's checks and the writer's preparation.

#include "DebugServices/GlobalLog.h"
#include "River/CoreOstraTypesUtils/ExpressionParsers.h"

#include <array>
#include <cstddef>
#include <string>
#include <vector>

namespace CoreOstraKMTIO::Detail {

/// What an expression belongs to, named only when a message needs it: "segment '<name>'" or
/// "target <index>".
class VExpressionOwner {
public:
  static VExpressionOwner Segment(const std::string& name) { return {&name, 0}; }
  static VExpressionOwner Target(std::size_t index) { return {nullptr, index}; }

  std::string Text() const {
    return m_pSegmentName ? "segment '" + *m_pSegmentName + "'"
                          : ZMT::FormatOrRaw("target %1%", m_TargetIndex);
  }

private:
  VExpressionOwner(const std::string* pSegmentName, std::size_t targetIndex)
      : m_pSegmentName(pSegmentName), m_TargetIndex(targetIndex) {}

  const std::string* m_pSegmentName;
  std::size_t m_TargetIndex;
};

/// Evaluates `text`; a failure adds "Could not evaluate expression '<text>' of <owner>: <why>".
inline bool Evaluate(CoreOstraTypesUtils::VDynamicExpressionParserSimple& parser,
                     const std::string& text, const VExpressionOwner& owner, double& o_rValue,
                     std::vector<std::string>& o_rErrors) {
  std::string message;
  if (parser.Evaluate(text, o_rValue, message)) return true;
  o_rErrors.push_back(ZMT::FormatOrRaw("Could not evaluate expression '%1%' of %2%: %3%", text,
                                       owner.Text(), message));
  return false;
}

/// Evaluates every text, reporting each failure; false when any failed.
template <std::size_t N>
bool EvaluateAll(CoreOstraTypesUtils::VDynamicExpressionParserSimple& parser,
                 const std::array<std::string, N>& texts, const VExpressionOwner& owner,
                 std::array<double, N>& o_rValues, std::vector<std::string>& o_rErrors) {
  bool ok = true;
  for (std::size_t i = 0; i < N; ++i)
    ok = Evaluate(parser, texts[i], owner, o_rValues[i], o_rErrors) && ok;
  return ok;
}

} // namespace CoreOstraKMTIO::Detail
