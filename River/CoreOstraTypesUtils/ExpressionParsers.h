#pragma once
// Expression evaluation over one subject's parameters. Static parameters become constants and
// dynamic parameters variables of the factories, each a single-element view into storage owned
// by the parser.

#include "River/CoreOstraTypes/VSubjectParametrised.h"
#include "River/CoreOstraTypesUtils/MathParser.h"
#include "River/CoreOstraTypesUtils/VMathFactorySimple.h"

#include <deque>
#include <string>
#include <vector>

namespace CoreOstraTypesUtils {

class IExpressionParser {
public:
  virtual ~IExpressionParser() = default;
  /// Defines the subject's parameters. Returns false when any static parameter could not be
  /// defined (its message is appended to `o_rErrors`); the others are still defined.
  virtual bool SetParameters(const CoreOstraTypes::VSubjectParametrised& subject,
                             std::vector<std::string>& o_rErrors) = 0;
  /// Evaluates one expression text; false when it doesn't parse (the caller reports).
  virtual bool Evaluate(const std::string& text, double& o_rValue) = 0;
};

/// Evaluates static parameter expressions only. A static parameter's value is its user value if
/// set; else its default expression, parsed over the parameters before it; else its prior if set;
/// else 0.
class VStaticExpressionParser : public IExpressionParser {
public:
  bool SetParameters(const CoreOstraTypes::VSubjectParametrised& subject,
                     std::vector<std::string>& o_rErrors) override;
  bool Evaluate(const std::string& text, double& o_rValue) override;
  /// As Evaluate, with the parse message ("Parse Succeeded" or the error).
  bool Evaluate(const std::string& text, double& o_rValue, std::string& o_rMessage);

  /// Value of a defined static parameter; false when unknown.
  bool StaticValue(const std::string& name, double& o_rValue) const;

protected:
  /// Adds a parameter to both factories as a variable or a constant; returns its storage.
  double* Define(const std::string& name, double value, bool variable);
  void Clear();

  VMathFactorySimple m_Factory;
  VMathFactorySimpleLinear m_LinearFactory;

  std::deque<double> m_Storage; ///< stable addresses for the factories' views
  std::vector<std::pair<std::string, double*>> m_Statics;
  std::vector<std::pair<std::string, double*>> m_Dynamics;
};

/// Static parameters as constants and dynamic parameters, at their `Value`, as variables. The
/// linear parse tells which parameters an expression depends on.
class VDynamicExpressionParserSimple final : public VStaticExpressionParser {
public:
  bool SetParameters(const CoreOstraTypes::VSubjectParametrised& subject,
                     std::vector<std::string>& o_rErrors) override;

  /// Changes a dynamic parameter's value for later evaluations; false when unknown.
  bool SetDynamicValue(const std::string& name, double value);

  /// Parses with the linear factory: value, text and the parameter and constant names used.
  bool EvaluateLinear(const std::string& text, VMathNodeSimple& o_rNode, std::string& o_rMessage);
};

} // namespace CoreOstraTypesUtils
