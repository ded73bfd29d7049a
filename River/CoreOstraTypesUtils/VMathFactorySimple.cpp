#include "River/CoreOstraTypesUtils/VMathFactorySimple.h"

#include "Utils/UtilsText/ShortDecimal.h"

#include <cerrno>
#include <cmath>
#include <cstdlib>
#include <limits>
#include <sstream>

namespace CoreOstraTypesUtils {

namespace {

const VMathNodeSimple* AsSimple(const MathNodePtr& node) {
  return dynamic_cast<const VMathNodeSimple*>(node.get());
}

std::shared_ptr<VMathNodeSimple> Combine(const VMathNodeSimple& a, const VMathNodeSimple& b,
                                         const char* op, double value) {
  auto node = std::make_shared<VMathNodeSimple>("( " + a.m_Text + op + b.m_Text + " )", value);
  node->m_Parameters = a.m_Parameters;
  node->m_Parameters.insert(b.m_Parameters.begin(), b.m_Parameters.end());
  node->m_Constants = a.m_Constants;
  node->m_Constants.insert(b.m_Constants.begin(), b.m_Constants.end());
  return node;
}

std::shared_ptr<VMathNodeSimple> Prefix(const VMathNodeSimple& a, const char* prefix,
                                        double value) {
  auto node = std::make_shared<VMathNodeSimple>(prefix + a.m_Text, value);
  node->m_Parameters = a.m_Parameters;
  node->m_Constants = a.m_Constants;
  return node;
}

double FirstOf(std::span<const double> values) {
  return values.empty() ? 0.0 : values[0];
}

} // namespace

bool ReadNumberText(const std::string& text, double& o_rValue) {
  if (UtilsText::ParseUnsignedShortDecimal(text, o_rValue)) return true;
  const auto hash = text.find('#');
  if (hash != std::string::npos) {
    // "1.#INF" and "1.#IND": the legacy spellings of infinity and NaN.
    const std::string suffix = text.substr(hash);
    if (suffix != "#INF" && suffix != "#IND") return false;
    double mantissa = 0.0;
    if (!ReadNumberText(text.substr(0, hash), mantissa)) return false;
    o_rValue = suffix == "#INF" ? std::numeric_limits<double>::infinity()
                                : -std::numeric_limits<double>::quiet_NaN();
    return true;
  }
  if (text.empty()) return false;
  char* end = nullptr;
  errno = 0;
  const double value = std::strtod(text.c_str(), &end);
  if (end != text.c_str() + text.size()) return false;
  o_rValue = value;
  return true;
}

MathNodePtr VMathFactorySimple::Plus(const MathNodePtr& a, const MathNodePtr& b) {
  const auto *x = AsSimple(a), *y = AsSimple(b);
  if (!x || !y) return nullptr;
  return Combine(*x, *y, " + ", x->m_Value + y->m_Value);
}

MathNodePtr VMathFactorySimple::Multiply(const MathNodePtr& a, const MathNodePtr& b) {
  const auto *x = AsSimple(a), *y = AsSimple(b);
  if (!x || !y) return nullptr;
  return Combine(*x, *y, " * ", x->m_Value * y->m_Value);
}

MathNodePtr VMathFactorySimple::Power(const MathNodePtr& a, const MathNodePtr& b) {
  const auto *x = AsSimple(a), *y = AsSimple(b);
  if (!x || !y) return nullptr;
  return Combine(*x, *y, " ^ ", std::pow(x->m_Value, y->m_Value));
}

MathNodePtr VMathFactorySimple::Negate(const MathNodePtr& a) {
  const auto* x = AsSimple(a);
  return x ? Prefix(*x, "-", -x->m_Value) : nullptr;
}

MathNodePtr VMathFactorySimple::Reciprocal(const MathNodePtr& a) {
  const auto* x = AsSimple(a);
  return x ? Prefix(*x, "1/", 1.0 / x->m_Value) : nullptr;
}

MathNodePtr VMathFactorySimple::MakeNumber(double value) {
  std::ostringstream text;
  text << value;
  return std::make_shared<VMathNodeSimple>(text.str(), value);
}

MathNodePtr VMathFactorySimple::MakeNumber(const std::string& text) {
  double value = 0.0;
  if (!ReadNumberText(text, value)) return nullptr;
  return std::make_shared<VMathNodeSimple>(text, value);
}

std::int32_t VMathFactorySimple::FunctionCode(const std::string& name) {
  if (name == "sin" || name == "SIN") return 0;
  if (name == "cos" || name == "COS") return 1;
  if (name == "tan" || name == "TAN") return 2;
  return -1;
}

MathFunctionPtr VMathFactorySimple::MakeFunction(const std::string& name) {
  const std::int32_t code = FunctionCode(name);
  if (code < 0) return nullptr;
  return std::make_shared<VMathFunctionSimple>(code);
}

MathNodePtr VMathFactorySimple::MakeVariableNode(const std::string& name,
                                                 std::span<const double> values) {
  return std::make_shared<VMathNodeSimple>(name, FirstOf(values));
}

MathNodePtr VMathFactorySimple::MakeConstantNode(const std::string& name,
                                                 std::span<const double> values) {
  return std::make_shared<VMathNodeSimple>(name, FirstOf(values));
}

MathNodePtr VMathFactorySimpleLinear::MakeVariableNode(const std::string& name,
                                                       std::span<const double> values) {
  auto node = std::make_shared<VMathNodeSimple>(name, FirstOf(values));
  node->m_Parameters.insert(name);
  return node;
}

MathNodePtr VMathFactorySimpleLinear::MakeConstantNode(const std::string& name,
                                                       std::span<const double> values) {
  auto node = std::make_shared<VMathNodeSimple>(name, FirstOf(values));
  node->m_Constants.insert(name);
  return node;
}

double VMathFunctionSimple::Evaluate(std::int32_t code, double argument) {
  switch (code) {
  case 0:
    return std::sin(argument);
  case 1:
    return std::cos(argument);
  case 2:
    return std::tan(argument);
  default:
    return std::numeric_limits<double>::quiet_NaN();
  }
}

MathNodePtr VMathFunctionSimple::Apply(const std::vector<MathNodePtr>& arguments) const {
  if (arguments.size() != 1) return nullptr;
  const auto* x = dynamic_cast<const VMathNodeSimple*>(arguments[0].get());
  if (!x) return nullptr;
  static const char* const prefixes[] = {"sin( ", "cos( ", "tan( "};
  const double value = Evaluate(m_Code, x->m_Value);
  const char* prefix = ArgumentCount() == 1 ? prefixes[m_Code] : "fn( ";
  auto node = std::make_shared<VMathNodeSimple>(prefix + x->m_Text + " )", value);
  node->m_Parameters = x->m_Parameters;
  node->m_Constants = x->m_Constants;
  return node;
}

} // namespace CoreOstraTypesUtils
