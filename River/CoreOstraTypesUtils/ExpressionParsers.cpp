#include "River/CoreOstraTypesUtils/ExpressionParsers.h"

#include "DebugServices/GlobalLog.h"

namespace CoreOstraTypesUtils {

namespace {

double* Find(const std::vector<std::pair<std::string, double*>>& table, const std::string& name) {
  for (auto& [key, value] : table)
    if (key == name) return value;
  return nullptr;
}

} // namespace

void VStaticExpressionParser::Clear() {
  m_Factory.ClearVariables();
  m_Factory.ClearConstants();
  m_LinearFactory.ClearVariables();
  m_LinearFactory.ClearConstants();
  m_Statics.clear();
  m_Storage.clear();
  m_Dynamics.clear();
}

double* VStaticExpressionParser::Define(const std::string& name, double value, bool variable) {
  m_Storage.push_back(value);
  const std::span<const double> view(&m_Storage.back(), 1);
  if (variable) {
    m_Factory.AddVariable(name, view);
    m_LinearFactory.AddVariable(name, view);
  } else {
    m_Factory.AddConstant(name, view);
    m_LinearFactory.AddConstant(name, view);
    m_Statics.emplace_back(name, &m_Storage.back());
  }
  return &m_Storage.back();
}

bool VStaticExpressionParser::SetParameters(const CoreOstraTypes::VSubjectParametrised& subject,
                                            std::vector<std::string>& o_rErrors) {
  Clear();
  bool ok = true;
  for (const auto& parameter : subject.m_StaticParameters) {
    double value = 0.0;
    if (parameter.m_UserValue.IsSet()) {
      value = parameter.m_UserValue.Value();
    } else if (!parameter.m_DefaultExpression.empty()) {
      std::string message;
      if (!Evaluate(parameter.m_DefaultExpression, value, message)) {
        o_rErrors.push_back(ZMT::FormatOrRaw("Could not evaluate static parameter %1%: %2%",
                                             parameter.m_Name, message));
        ok = false;
        continue;
      }
    } else if (parameter.m_Prior.IsSet()) {
      value = parameter.m_Prior.Value();
    }
    Define(parameter.m_Name, value, false);
  }
  return ok;
}

bool VStaticExpressionParser::Evaluate(const std::string& text, double& o_rValue) {
  std::string message;
  return Evaluate(text, o_rValue, message);
}

bool VStaticExpressionParser::Evaluate(const std::string& text, double& o_rValue,
                                       std::string& o_rMessage) {
  // Only the value is wanted: evaluate without building the node tree and its texts.
  return ParseValue(m_Factory, text, o_rValue, o_rMessage, ',');
}

bool VStaticExpressionParser::StaticValue(const std::string& name, double& o_rValue) const {
  const double* storage = Find(m_Statics, name);
  if (!storage) return false;
  o_rValue = *storage;
  return true;
}

bool VDynamicExpressionParserSimple::SetParameters(
    const CoreOstraTypes::VSubjectParametrised& subject, std::vector<std::string>& o_rErrors) {
  m_Dynamics.clear();
  const bool ok = VStaticExpressionParser::SetParameters(subject, o_rErrors);
  for (const auto& parameter : subject.m_DynamicParameters) {
    m_Dynamics.emplace_back(parameter.m_Name, Define(parameter.m_Name, parameter.m_Value, true));
  }
  return ok;
}

bool VDynamicExpressionParserSimple::SetDynamicValue(const std::string& name, double value) {
  double* storage = Find(m_Dynamics, name);
  if (!storage) return false;
  *storage = value;
  return true;
}

bool VDynamicExpressionParserSimple::EvaluateLinear(const std::string& text,
                                                    VMathNodeSimple& o_rNode,
                                                    std::string& o_rMessage) {
  MathNodePtr node;
  if (!Parse(m_LinearFactory, text, node, o_rMessage, ',')) return false;
  o_rNode = static_cast<const VMathNodeSimple&>(*node);
  return true;
}

} // namespace CoreOstraTypesUtils
