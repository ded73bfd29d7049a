#include "River/CoreOstraTypesUtils/MathParser.h"

#include "River/CoreOstraTypesUtils/VMathFactorySimple.h"

#include <cctype>
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

class VParser {
public:
  VParser(IMathFactory& factory, const std::string& text, char delimiter)
      : m_rFactory(factory), m_rText(text), m_Delimiter(delimiter) {}

  MathNodePtr ParseAll() {
    Next();
    if (m_Token.m_Code == ETokenEnd) Fail("Empty expression");
    MathNodePtr result = Sum();
    if (m_Token.m_Code != ETokenEnd) FailUnexpected();
    return result;
  }

private:
  [[noreturn]] void Fail(const std::string& message) const {
    throw VMathParseException(message, m_Token.m_Position);
  }
  [[noreturn]] void FailUnexpected() const { Fail("Unexpected token \"" + m_Token.m_Text + "\""); }

  MathNodePtr Checked(MathNodePtr node, const char* message) const {
    if (!node) Fail(message);
    return node;
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

  MathNodePtr Sum() {
    MathNodePtr left = Product();
    while (m_Token.m_Code == ETokenPlus || m_Token.m_Code == ETokenMinus) {
      const bool minus = m_Token.m_Code == ETokenMinus;
      Next();
      MathNodePtr right = Product();
      if (minus) {
        left = Checked(m_rFactory.Plus(left, m_rFactory.Negate(right)),
                       "Minus operator invalid for arguments");
      } else {
        left = Checked(m_rFactory.Plus(left, right), "Plus operator invalid for arguments");
      }
    }
    return left;
  }

  MathNodePtr Product() {
    MathNodePtr left = PowerTerm();
    while (m_Token.m_Code == ETokenMultiply || m_Token.m_Code == ETokenDivide) {
      const bool divide = m_Token.m_Code == ETokenDivide;
      Next();
      MathNodePtr right = PowerTerm();
      if (divide) {
        left = Checked(m_rFactory.Multiply(left, m_rFactory.Reciprocal(right)),
                       "Divide operator invalid for arguments");
      } else {
        left = Checked(m_rFactory.Multiply(left, right), "Multiply operator invalid for arguments");
      }
    }
    return left;
  }

  MathNodePtr PowerTerm() {
    MathNodePtr left = SignedPrimary();
    while (m_Token.m_Code == ETokenPower) {
      Next();
      MathNodePtr exponent = SignedPrimary();
      left = Checked(m_rFactory.Power(left, exponent), "Power operator invalid for arguments");
    }
    return left;
  }

  MathNodePtr SignedPrimary() {
    if (m_Token.m_Code == ETokenPlus) {
      Next();
      return Primary();
    }
    if (m_Token.m_Code == ETokenMinus) {
      Next();
      return Checked(m_rFactory.Negate(Primary()), "Minus operator invalid for argument");
    }
    return Primary();
  }

  MathNodePtr Primary() {
    switch (m_Token.m_Code) {
    case ETokenLeftParenthesis: {
      VDepthGuard guard(*this);
      Next();
      if (m_Token.m_Code == ETokenRightParenthesis) Fail("Missing argument");
      MathNodePtr inner = Sum();
      if (m_Token.m_Code != ETokenRightParenthesis) Fail("Unbalanced parentheses");
      Next();
      return inner;
    }
    case ETokenNumber: {
      double value = 0.0;
      if (!ReadNumberText(m_Token.m_Text, value)) FailUnexpected();
      Next();
      return m_rFactory.MakeNumber(value);
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

  MathNodePtr Name() {
    const std::string name = m_Token.m_Text;
    MathNodePtr node = m_rFactory.FindVariable(name);
    if (!node) node = m_rFactory.FindConstant(name);
    if (!node) Fail("ID \"" + name + "\" was referenced but never declared");
    Next();
    return node;
  }

  MathNodePtr Call(const std::string& name) {
    VDepthGuard guard(*this);
    MathFunctionPtr function = m_rFactory.MakeFunction(name);
    if (!function || function->ArgumentCount() == 0) Fail("Unknown function \"" + name + "\"");
    Next(); // past "("
    std::vector<MathNodePtr> arguments;
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
    if (arguments.size() != function->ArgumentCount()) {
      Fail("Cannot evaluate \"" + name + "\" for " + std::to_string(arguments.size()) +
           " input arguments (" + std::to_string(function->ArgumentCount()) +
           " arguments required)");
    }
    MathNodePtr result = function->Apply(arguments);
    if (!result) Fail("Error in function \"" + name + "\"");
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

  IMathFactory& m_rFactory;
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

bool Parse(IMathFactory& factory, const std::string& text, MathNodePtr& o_rResult,
           std::string& o_rMessage, char delimiter) {
  o_rResult.reset();
  if (delimiter == ' ') {
    o_rMessage = std::string("Invalid delimiting character '") + delimiter + "'";
    return false;
  }
  try {
    VParser parser(factory, text, delimiter);
    MathNodePtr result = parser.ParseAll();
    if (!result) {
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

} // namespace CoreOstraTypesUtils
