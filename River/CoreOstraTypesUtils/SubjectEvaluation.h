#pragma once
// Evaluation of a parametrised subject into the solved numeric form for given values of its
// dynamic parameters. Failures are logged on channel "SubjectUtils" at error level; nothing
// throws.

#include "River/CoreOstraTypes/VSubject.h"
#include "River/CoreOstraTypes/VSubjectParametrised.h"
#include "River/CoreOstraTypesUtils/ExpressionParsers.h"

#include <string>
#include <utility>
#include <vector>

namespace CoreOstraTypesUtils {

inline constexpr const char* SubjectUtilsChannel = "SubjectUtils";

/// Which of its own values a subject's dynamic parameters start from.
enum class EParameterValues { EValue, EPrior };

/// A joint without mean or covariance evaluates to zeros of its parameter count (an all-zero
/// covariance is "no information"), and so does an empty covariance of a Gaussian target.
///
/// Evaluates one parametrised subject repeatedly: the static parameters are parsed once, then
/// each Evaluate takes the current dynamic parameter values. Not thread-safe; one per thread.
class VSubjectEvaluator {
public:
  /// Takes a copy of `subject` and parses its static parameters; the dynamic parameters start at
  /// their `Value` or `Prior`. False, with "Error parsing subject static parameter expressions"
  /// logged, when a static parameter can't be defined; Evaluate then fails.
  bool SetSubject(const CoreOstraTypes::VSubjectParametrised& subject,
                  EParameterValues start = EParameterValues::EValue);

  /// Sets a dynamic parameter by name; false, with "Missing parameter <name>" logged, when the
  /// subject has none of that name.
  bool SetParameter(const std::string& name, double value);
  /// Sets several by name; every name is tried, false when any was missing.
  bool SetParameters(const std::vector<std::pair<std::string, double>>& values);
  /// Sets dynamic parameter `index` (position in DynamicParameters); false when out of range.
  bool SetParameter(std::size_t index, double value);

  /// Evaluates every expression into `o_rSubject`, reusing its storage. Each failing segment
  /// group and target is logged and the evaluation goes on to the end before it gives false,
  /// so one run names every bad segment; the record is then complete but not to be used.
  bool Evaluate(CoreOstraTypes::VSubject& o_rSubject);

  const CoreOstraTypes::VSubjectParametrised& Subject() const { return m_Subject; }

private:
  bool EvaluateSegment(const CoreOstraTypes::VSubjectParametrised::VSegment& in,
                       CoreOstraTypes::VSubject::VSegment& out);
  bool EvaluateTarget(const CoreOstraTypes::VSubjectParametrised::VTarget& in,
                      CoreOstraTypes::VSubject::VTarget& out);
  /// Evaluates `text`; an empty text is 0.
  bool Value(const std::string& text, double& o_rValue);

  CoreOstraTypes::VSubjectParametrised m_Subject;
  VDynamicExpressionParserSimple m_Parser;
  std::vector<std::string> m_DynamicNames;
  bool m_Ready = false;
};

/// Evaluates `subject` at its own parameter values (or priors).
bool SubjectFromParametrised(const CoreOstraTypes::VSubjectParametrised& subject,
                             CoreOstraTypes::VSubject& o_rSubject,
                             EParameterValues values = EParameterValues::EValue);

/// Evaluates `subject` with the named dynamic parameters set to the given values; parameters not
/// named keep their own value, and a name the subject lacks fails the conversion.
bool SubjectFromParametrised(const CoreOstraTypes::VSubjectParametrised& subject,
                             const std::vector<std::pair<std::string, double>>& values,
                             CoreOstraTypes::VSubject& o_rSubject);

} // namespace CoreOstraTypesUtils
