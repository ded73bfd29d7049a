#pragma once
// The factory interface the expression parser builds through. The parser calls one operation per
// grammar step; what a parse produces depends only on the factory. There is no subtraction or
// division: a-b is Plus(a, Negate(b)) and a/b is Multiply(a, Reciprocal(b)). Every operation
// returns null when an operand is null.

#include "River/CoreOstraTypesUtils/MathFunction.h"
#include "River/CoreOstraTypesUtils/MathNode.h"

#include <map>
#include <span>
#include <string>

namespace CoreOstraTypesUtils {

class IMathFactory {
public:
  virtual MathNodePtr Plus(const MathNodePtr& a, const MathNodePtr& b) = 0;
  virtual MathNodePtr Multiply(const MathNodePtr& a, const MathNodePtr& b) = 0;
  virtual MathNodePtr Power(const MathNodePtr& a, const MathNodePtr& b) = 0;
  virtual MathNodePtr Negate(const MathNodePtr& a) = 0;
  virtual MathNodePtr Reciprocal(const MathNodePtr& a) = 0;
  /// Declares a variable viewing `values` (not copied: the storage must outlive its use).
  virtual void AddVariable(const std::string& name, std::span<const double> values) = 0;
  /// Null when the name is not a variable.
  virtual MathNodePtr FindVariable(const std::string& name) = 0;
  virtual void ClearVariables() = 0;
  virtual void AddConstant(const std::string& name, std::span<const double> values) = 0;
  virtual MathNodePtr FindConstant(const std::string& name) = 0;
  virtual void ClearConstants() = 0;
  virtual MathNodePtr MakeNumber(double value) = 0;
  virtual MathNodePtr MakeNumber(const std::string& text) = 0;
  /// Null for an unknown function name.
  virtual MathFunctionPtr MakeFunction(const std::string& name) = 0;
  virtual ~IMathFactory() = default;
  virtual MathNodePtr MakeVariableNode(const std::string& name, std::span<const double> values) = 0;
  virtual MathNodePtr MakeConstantNode(const std::string& name, std::span<const double> values) = 0;
};

/// Name-to-view tables of variables and constants, shared by the concrete factories.
class VMathFactoryMaps : public IMathFactory {
public:
  void AddVariable(const std::string& name, std::span<const double> values) override {
    m_Variables[name] = values;
  }
  MathNodePtr FindVariable(const std::string& name) override {
    auto it = m_Variables.find(name);
    return it == m_Variables.end() ? nullptr : MakeVariableNode(name, it->second);
  }
  void ClearVariables() override { m_Variables.clear(); }
  void AddConstant(const std::string& name, std::span<const double> values) override {
    m_Constants[name] = values;
  }
  MathNodePtr FindConstant(const std::string& name) override {
    auto it = m_Constants.find(name);
    return it == m_Constants.end() ? nullptr : MakeConstantNode(name, it->second);
  }
  void ClearConstants() override { m_Constants.clear(); }

  /// The value a name stands for, as the simple factories' nodes take it: a variable's, else a
  /// constant's first element (0 for an empty view). False when the name is neither.
  bool FindValue(const std::string& name, double& o_rValue) const {
    auto it = m_Variables.find(name);
    if (it == m_Variables.end()) {
      it = m_Constants.find(name);
      if (it == m_Constants.end()) return false;
    }
    o_rValue = it->second.empty() ? 0.0 : it->second[0];
    return true;
  }

private:
  std::map<std::string, std::span<const double>, std::less<>> m_Variables;
  std::map<std::string, std::span<const double>, std::less<>> m_Constants;
};

} // namespace CoreOstraTypesUtils
