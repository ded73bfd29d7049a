#pragma once

#include "River/CoreOstraTypesUtils/MathFactory.h"

namespace CoreOstraTypesUtils {

/// Evaluates while parsing. Nodes are VMathNodeSimple holding the value and a normalised text:
/// "( a + b )", "( a * b )", "( a ^ b )", "-a", "1/a". Dependency sets are united at every
/// operation (they stay empty with this factory).
class VMathFactorySimple : public VMathFactoryMaps {
public:
  MathNodePtr Plus(const MathNodePtr& a, const MathNodePtr& b) override;
  MathNodePtr Multiply(const MathNodePtr& a, const MathNodePtr& b) override;
  MathNodePtr Power(const MathNodePtr& a, const MathNodePtr& b) override;
  MathNodePtr Negate(const MathNodePtr& a) override;
  MathNodePtr Reciprocal(const MathNodePtr& a) override;
  /// Text as a stream prints the value.
  MathNodePtr MakeNumber(double value) override;
  /// Keeps the text; the value is read from it ("1.#INF" and "1.#IND" included). Null when the
  /// text is not a number.
  MathNodePtr MakeNumber(const std::string& text) override;
  /// "sin"/"SIN", "cos"/"COS", "tan"/"TAN".
  MathFunctionPtr MakeFunction(const std::string& name) override;
  /// The VMathFunctionSimple code of a function name; -1 for an unknown one.
  static std::int32_t FunctionCode(const std::string& name);
  /// The name as text and the first element as value (0 for an empty view).
  MathNodePtr MakeVariableNode(const std::string& name, std::span<const double> values) override;
  MathNodePtr MakeConstantNode(const std::string& name, std::span<const double> values) override;
};

/// As VMathFactorySimple, and every node records the variables (parameters) and constants it
/// depends on.
class VMathFactorySimpleLinear final : public VMathFactorySimple {
public:
  MathNodePtr MakeVariableNode(const std::string& name, std::span<const double> values) override;
  MathNodePtr MakeConstantNode(const std::string& name, std::span<const double> values) override;
};

/// Value of a number token: decimal text, or "1.#INF" / "1.#IND" for infinity and NaN. False
/// when the text is not entirely a number.
bool ReadNumberText(const std::string& text, double& o_rValue);

} // namespace CoreOstraTypesUtils
