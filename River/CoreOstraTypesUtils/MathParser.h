#pragma once
// Recursive-descent parser of expression texts such as "SomeParam/2" or
// "-'Left Width'*cos(Angle)". Precedence, loosest first: + and -, * and /, ^ (left to right),
// unary sign, then numbers, names, quoted names, calls and parentheses.

#include "River/CoreOstraTypesUtils/MathFactory.h"

#include <cstddef>
#include <stdexcept>
#include <string>

namespace CoreOstraTypesUtils {

/// A parse error: the message and the column (0-based offset of the token) where it stopped.
class VMathParseException : public std::runtime_error {
public:
  VMathParseException(const std::string& message, std::size_t column);
  const std::string& Message() const { return m_Message; }
  std::size_t Column() const { return m_Column; }

private:
  std::string m_Message;
  std::size_t m_Column;
};

/// Parses `text` through `factory`. On success `o_rResult` is the result node and `o_rMessage`
/// "Parse Succeeded"; on failure the result is null and the message is the parse error's text,
/// "Parse Error at column <n>: <message>". `delimiter` separates function arguments; a blank is
/// refused. Exceptions other than parse errors (out of memory) pass.
bool Parse(IMathFactory& factory, const std::string& text, MathNodePtr& o_rResult,
           std::string& o_rMessage, char delimiter = ',');

/// As Parse through a VMathFactorySimple whose variables and constants are those of `names`,
/// giving only the value, the same one, and the same messages. No node is built, so this is the
/// road for evaluation alone.
bool ParseValue(const VMathFactoryMaps& names, const std::string& text, double& o_rValue,
                std::string& o_rMessage, char delimiter = ',');

} // namespace CoreOstraTypesUtils
