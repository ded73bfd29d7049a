#pragma once

#include "River/CoreOstraTypesUtils/MathNode.h"

#include <cstdint>
#include <memory>
#include <vector>

namespace CoreOstraTypesUtils {

/// A function of fixed arity that a factory offers to the parser.
class IMathFunction {
public:
  virtual ~IMathFunction() = default;
  /// Number of arguments; 0 marks an unusable function.
  virtual unsigned ArgumentCount() const = 0;
  /// Applies the function; null when an argument is null or of a foreign node type.
  virtual MathNodePtr Apply(const std::vector<MathNodePtr>& arguments) const = 0;
};

using MathFunctionPtr = std::shared_ptr<IMathFunction>;

/// Sine (code 0), cosine (1) and tangent (2) of one argument in radians, over VMathNodeSimple.
/// The text is "sin( <argument> )"; an unknown code is unusable and prints as "fn( ".
class VMathFunctionSimple final : public IMathFunction {
public:
  explicit VMathFunctionSimple(std::int32_t code) : m_Code(code) {}
  unsigned ArgumentCount() const override { return m_Code >= 0 && m_Code <= 2 ? 1u : 0u; }
  MathNodePtr Apply(const std::vector<MathNodePtr>& arguments) const override;
  /// The function's value at `argument`; NaN for an unknown code.
  static double Evaluate(std::int32_t code, double argument);

private:
  std::int32_t m_Code;
};

} // namespace CoreOstraTypesUtils
