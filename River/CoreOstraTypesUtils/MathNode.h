#pragma once
// Results of expression parsing. What a node holds depends on the factory that built it.

#include <memory>
#include <set>
#include <string>

namespace CoreOstraTypesUtils {

/// An abstract parse result.
class IMathNode {
public:
  virtual ~IMathNode() = default;
  /// A normalised text of the expression.
  virtual std::string Text() const = 0;
};

using MathNodePtr = std::shared_ptr<IMathNode>;

/// Node of the evaluating factories: the value, a normalised text and, for the linear factory,
/// the names of the parameters (variables) and constants the value depends on.
class VMathNodeSimple final : public IMathNode {
public:
  VMathNodeSimple(std::string text, double value) : m_Text(std::move(text)), m_Value(value) {}
  std::string Text() const override { return m_Text; }

  std::string m_Text;
  double m_Value = 0.0;
  std::set<std::string> m_Parameters;
  std::set<std::string> m_Constants;
};

} // namespace CoreOstraTypesUtils
