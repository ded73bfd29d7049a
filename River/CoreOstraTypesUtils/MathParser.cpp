#include "River/CoreOstraTypesUtils/MathParser.h"

#include "River/CoreOstraTypesUtils/VMathFactorySimple.h"
#include "Utils/UtilsText/ShortDecimal.h"

#include <cctype>
#include <cmath>
#include <cstdint>
#include <cstdlib>
#include <optional>
#include <vector>

namespace CoreOstraTypesUtils {

namespace {

enum ETokenCode {
  ETokenEnd = 0,
  ETokenNumber = 1,
  ETokenIdentifier = 2,
  ETokenDelimiter = 3,
  ETokenPlus = 5,
  ETokenMinus = 6,
  ETokenMultiply = 7,
  ETokenDivide = 8,
  ETokenPower = 9,
  ETokenLeftParenthesis = 10,
  ETokenRightParenthesis = 11,
  ETokenQuotedIdentifier = 12,
};

struct VToken {
  ETokenCode m_Code = ETokenEnd;
  std::string m_Text; ///< the token as written; the bare name for a quoted identifier
  std::size_t m_Position = 0;
};

bool IsSpace(char c) {
  return std::isspace(static_cast<unsigned char>(c)) != 0;
}
bool IsDigit(char c) {
  return c >= '0' && c <= '9';
}
bool IsLetter(char c) {
  return (c >= 'a' && c <= 'z') || (c >= 'A' && c <= 'Z');
}

/// Builds nodes through a factory: the general road.
class VNodeBuilder {
public:
  using Value = MathNodePtr;
  using Function = MathFunctionPtr;

  explicit VNodeBuilder(IMathFactory& factory) : m_rFactory(factory) {}

  static bool IsValid(const Value& value) { return value != nullptr; }
  Value Plus(const Value& a, const Value& b) { return m_rFactory.Plus(a, b); }
  Value Minus(const Value& a, const Value& b) { return m_rFactory.Plus(a, m_rFactory.Negate(b)); }
  Value Multiply(const Value& a, const Value& b) { return m_rFactory.Multiply(a, b); }
  Value Divide(const Value& a, const Value& b) {
    return m_rFactory.Multiply(a, m_rFactory.Reciprocal(b));
  }
  Value Power(const Value& a, const Value& b) { return m_rFactory.Power(a, b); }
  Value Negate(const Value& a) { return m_rFactory.Negate(a); }
  Value Number(double value) { return m_rFactory.MakeNumber(value); }
  /// A variable, else a constant; null when neither.
  Value Name(const std::string& name) {
    Value node = m_rFactory.FindVariable(name);
    if (!node) node = m_rFactory.FindConstant(name);
    return node;
  }
  Function MakeFunction(const std::string& name) { return m_rFactory.MakeFunction(name); }
  static unsigned ArgumentCount(const Function& function) {
    return function ? function->ArgumentCount() : 0;
  }
  Value Apply(const Function& function, const std::vector<Value>& arguments) {
    return function->Apply(arguments);
  }

private:
  IMathFactory& m_rFactory;
};

/// Computes values as it goes, with the arithmetic, names and functions of VMathFactorySimple:
/// the value of a VMathNodeSimple without building one.
class VValueBuilder {
public:
  using Value = std::optional<double>;
  using Function = std::int32_t; ///< the VMathFunctionSimple code; -1 for none

  explicit VValueBuilder(const VMathFactoryMaps& names) : m_rNames(names) {}

  static bool IsValid(const Value& value) { return value.has_value(); }
  Value Plus(const Value& a, const Value& b) { return *a + *b; }
  Value Minus(const Value& a, const Value& b) { return *a + -*b; }
  Value Multiply(const Value& a, const Value& b) { return *a * *b; }
  Value Divide(const Value& a, const Value& b) { return *a * (1.0 / *b); }
  Value Power(const Value& a, const Value& b) { return std::pow(*a, *b); }
  Value Negate(const Value& a) { return -*a; }
  Value Number(double value) { return value; }
  Value Name(const std::string& name) {
    double value = 0.0;
    if (!m_rNames.FindValue(name, value)) return std::nullopt;
    return value;
  }
  Function MakeFunction(const std::string& name) { return VMathFactorySimple::FunctionCode(name); }
  static unsigned ArgumentCount(Function code) { return code >= 0 && code <= 2 ? 1u : 0u; }
  Value Apply(Function code, const std::vector<Value>& arguments) {
    return VMathFunctionSimple::Evaluate(code, *arguments[0]);
  }

private:
  const VMathFactoryMaps& m_rNames;
};

/// The grammar, over either builder: both give the same messages for the same text.
template <class TBuilder> class VParser {
public:
  using Value = typename TBuilder::Value;

  VParser(TBuilder& builder, const std::string& text, char delimiter)
      : m_rBuilder(builder), m_rText(text), m_Delimiter(delimiter) {}

  Value ParseAll() {
    Next();
    if (m_Token.m_Code == ETokenEnd) Fail("Empty expression");
    Value result = Sum();
    if (m_Token.m_Code != ETokenEnd) FailUnexpected();
    return result;
  }

private:
  [[noreturn]] void Fail(const std::string& message) const {
    throw VMathParseException(message, m_Token.m_Position);
  }
  [[noreturn]] void FailUnexpected() const { Fail("Unexpected token \"" + m_Token.m_Text + "\""); }

  Value Checked(Value value, const char* message) const {
    if (!TBuilder::IsValid(value)) Fail(message);
    return value;
  }

  void Next() {
    const std::string& s = m_rText;
    while (m_Position < s.size() && IsSpace(s[m_Position]))
      ++m_Position;
    m_Token = VToken{ETokenEnd, std::string(), m_Position};
    if (m_Position >= s.size()) return;
    const std::size_t start = m_Position;
    const char c = s[m_Position];
    if (IsDigit(c) || c == '.') {
      ScanNumber();
    } else if (IsLetter(c) || c == '_') {
      while (m_Position < s.size() &&
             (IsLetter(s[m_Position]) || IsDigit(s[m_Position]) || s[m_Position] == '_')) {
        ++m_Position;
      }
      m_Token.m_Code = ETokenIdentifier;
    } else if (c == '\'') {
      ScanQuoted();
      return;
    } else {
      ++m_Position;
      m_Token.m_Code = Operator(c);
      if (m_Token.m_Code == ETokenEnd) {
        m_Token.m_Text.assign(1, c);
        FailUnexpected();
      }
    }
    m_Token.m_Text = s.substr(start, m_Position - start);
  }

  ETokenCode Operator(char c) const {
    if (c == m_Delimiter) return ETokenDelimiter;
    switch (c) {
    case '+':
      return ETokenPlus;
    case '-':
      return ETokenMinus;
    case '*':
      return ETokenMultiply;
    case '/':
      return ETokenDivide;
    case '^':
      return ETokenPower;
    case '(':
      return ETokenLeftParenthesis;
    case ')':
      return ETokenRightParenthesis;
    default:
      return ETokenEnd;
    }
  }

  void ScanNumber() {
    const std::string& s = m_rText;
    while (m_Position < s.size() && (IsDigit(s[m_Position]) || s[m_Position] == '.'))
      ++m_Position;
    if (s.compare(m_Position, 4, "#INF") == 0 || s.compare(m_Position, 4, "#IND") == 0) {
      m_Position += 4;
    } else if (m_Position < s.size() && (s[m_Position] == 'e' || s[m_Position] == 'E')) {
      std::size_t p = m_Position + 1;
      if (p < s.size() && (s[p] == '+' || s[p] == '-')) ++p;
      if (p < s.size() && IsDigit(s[p])) {
        while (p < s.size() && IsDigit(s[p]))
          ++p;
        m_Position = p;
      }
    }
    m_Token.m_Code = ETokenNumber;
  }

  void ScanQuoted() {
    const std::string& s = m_rText;
    std::string name;
    ++m_Position; // opening quote
    while (true) {
      if (m_Position >= s.size()) Fail("Missing variable name terminator before end of expression");
      const char c = s[m_Position++];
      if (c == '\'') break;
      if (c == '\\') {
        if (m_Position >= s.size()) {
          Fail("Missing variable name terminator before end of expression");
        }
        name += s[m_Position++];
      } else {
        name += c;
      }
    }
    m_Token.m_Code = ETokenQuotedIdentifier;
    m_Token.m_Text = std::move(name);
  }

  Value Sum() {
    Value left = Product();
    while (m_Token.m_Code == ETokenPlus || m_Token.m_Code == ETokenMinus) {
      const bool minus = m_Token.m_Code == ETokenMinus;
      Next();
      Value right = Product();
      if (minus) {
        left = Checked(m_rBuilder.Minus(left, right), "Minus operator invalid for arguments");
      } else {
        left = Checked(m_rBuilder.Plus(left, right), "Plus operator invalid for arguments");
      }
    }
    return left;
  }

  Value Product() {
    Value left = PowerTerm();
    while (m_Token.m_Code == ETokenMultiply || m_Token.m_Code == ETokenDivide) {
      const bool divide = m_Token.m_Code == ETokenDivide;
      Next();
      Value right = PowerTerm();
      if (divide) {
        left = Checked(m_rBuilder.Divide(left, right), "Divide operator invalid for arguments");
      } else {
        left = Checked(m_rBuilder.Multiply(left, right), "Multiply operator invalid for arguments");
      }
    }
    return left;
  }

  Value PowerTerm() {
    Value left = SignedPrimary();
    while (m_Token.m_Code == ETokenPower) {
      Next();
      Value exponent = SignedPrimary();
      left = Checked(m_rBuilder.Power(left, exponent), "Power operator invalid for arguments");
    }
    return left;
  }

  Value SignedPrimary() {
    if (m_Token.m_Code == ETokenPlus) {
      Next();
      return Primary();
    }
    if (m_Token.m_Code == ETokenMinus) {
      Next();
      return Checked(m_rBuilder.Negate(Primary()), "Minus operator invalid for argument");
    }
    return Primary();
  }

  Value Primary() {
    switch (m_Token.m_Code) {
    case ETokenLeftParenthesis: {
      VDepthGuard guard(*this);
      Next();
      if (m_Token.m_Code == ETokenRightParenthesis) Fail("Missing argument");
      Value inner = Sum();
      if (m_Token.m_Code != ETokenRightParenthesis) Fail("Unbalanced parentheses");
      Next();
      return inner;
    }
    case ETokenNumber: {
      double value = 0.0;
      if (!ReadNumberText(m_Token.m_Text, value)) FailUnexpected();
      Next();
      return m_rBuilder.Number(value);
    }
    case ETokenIdentifier: {
      const std::string name = m_Token.m_Text;
      const std::size_t save = m_Position;
      const VToken identifier = m_Token;
      Next();
      if (m_Token.m_Code == ETokenLeftParenthesis) return Call(name);
      // Not a call: look the name up with the identifier as the current token for errors.
      m_Position = save;
      m_Token = identifier;
      return Name();
    }
    case ETokenQuotedIdentifier:
      return Name();
    default:
      FailUnexpected();
    }
  }

  Value Name() {
    Value node = m_rBuilder.Name(m_Token.m_Text);
    if (!TBuilder::IsValid(node)) {
      Fail("ID \"" + m_Token.m_Text + "\" was referenced but never declared");
    }
    Next();
    return node;
  }

  Value Call(const std::string& name) {
    VDepthGuard guard(*this);
    const auto function = m_rBuilder.MakeFunction(name);
    const unsigned argumentCount = TBuilder::ArgumentCount(function);
    if (argumentCount == 0) Fail("Unknown function \"" + name + "\"");
    Next(); // past "("
    std::vector<Value> arguments;
    if (m_Token.m_Code != ETokenRightParenthesis) {
      while (true) {
        if (m_Token.m_Code == ETokenEnd || m_Token.m_Code == ETokenRightParenthesis ||
            m_Token.m_Code == ETokenDelimiter) {
          Fail("Missing argument(s) in function \"" + name + "\"");
        }
        arguments.push_back(Sum());
        if (m_Token.m_Code == ETokenDelimiter) {
          Next();
          continue;
        }
        if (m_Token.m_Code != ETokenRightParenthesis) Fail("Unbalanced parentheses");
        break;
      }
    }
    if (arguments.size() != argumentCount) {
      Fail("Cannot evaluate \"" + name + "\" for " + std::to_string(arguments.size()) +
           " input arguments (" + std::to_string(argumentCount) + " arguments required)");
    }
    Value result = m_rBuilder.Apply(function, arguments);
    if (!TBuilder::IsValid(result)) Fail("Error in function \"" + name + "\"");
    Next(); // past ")"
    return result;
  }

  /// Bounds the recursion of nested parentheses and calls so hostile texts can't overflow the
  /// stack.
  struct VDepthGuard {
    explicit VDepthGuard(VParser& parser) : m_rParser(parser) {
      if (++m_rParser.m_Depth > MaxDepth) m_rParser.Fail("Expression nested too deeply");
    }
    ~VDepthGuard() { --m_rParser.m_Depth; }
    VParser& m_rParser;
  };
  static constexpr int MaxDepth = 256;

  TBuilder& m_rBuilder;
  const std::string& m_rText;
  int m_Depth = 0;
  char m_Delimiter;
  std::size_t m_Position = 0;
  VToken m_Token;
};

} // namespace

VMathParseException::VMathParseException(const std::string& message, std::size_t column)
    : std::runtime_error("Parse Error at column " + std::to_string(column) + ": " + message),
      m_Message(message), m_Column(column) {}

namespace {

template <class TBuilder>
bool ParseWith(TBuilder& builder, const std::string& text, typename TBuilder::Value& o_rResult,
               std::string& o_rMessage, char delimiter) {
  if (delimiter == ' ') {
    o_rMessage = std::string("Invalid delimiting character '") + delimiter + "'";
    return false;
  }
  try {
    VParser<TBuilder> parser(builder, text, delimiter);
    auto result = parser.ParseAll();
    if (!TBuilder::IsValid(result)) {
      o_rMessage = VMathParseException("Unexpected token \"\"", text.size()).what();
      return false;
    }
    o_rResult = std::move(result);
    o_rMessage = "Parse Succeeded";
    return true;
  } catch (const VMathParseException& error) {
    o_rMessage = error.what();
    return false;
  }
}

/// A number alone, perhaps negated ("12", "-0.5"): the grammar reads it as ReadNumberText's value
/// of the digits, negated. False for anything else.
bool ReadPlainNumber(const std::string& text, double& o_rValue) {
  const std::size_t start = !text.empty() && text[0] == '-' ? 1 : 0;
  double value = 0.0;
  if (!UtilsText::ParseUnsignedShortDecimal(std::string_view(text).substr(start), value)) {
    bool digit = false, point = false;
    for (std::size_t i = start; i < text.size(); ++i) {
      if (IsDigit(text[i])) {
        digit = true;
      } else if (text[i] == '.' && !point) {
        point = true;
      } else {
        return false;
      }
    }
    if (!digit) return false;
    char* end = nullptr;
    value = std::strtod(text.c_str() + start, &end);
    if (end != text.c_str() + text.size()) return false;
  }
  o_rValue = start ? -value : value;
  return true;
}

} // namespace

bool Parse(IMathFactory& factory, const std::string& text, MathNodePtr& o_rResult,
           std::string& o_rMessage, char delimiter) {
  o_rResult.reset();
  VNodeBuilder builder(factory);
  return ParseWith(builder, text, o_rResult, o_rMessage, delimiter);
}

bool ParseValue(const VMathFactoryMaps& names, const std::string& text, double& o_rValue,
                std::string& o_rMessage, char delimiter) {
  // Most expressions of a file are plain numbers: no tokens, no grammar for them. A minus as the
  // argument delimiter would make the sign a delimiter, so that case takes the grammar.
  if (delimiter != ' ' && delimiter != '-' && ReadPlainNumber(text, o_rValue)) {
    o_rMessage = "Parse Succeeded";
    return true;
  }
  VValueBuilder builder(names);
  std::optional<double> value;
  if (!ParseWith(builder, text, value, o_rMessage, delimiter)) return false;
  o_rValue = *value;
  return true;
}

} // namespace CoreOstraTypesUtils
