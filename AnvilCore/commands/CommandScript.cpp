#include "CommandScript.h"
#include "CommandRegistry.h"
#include "CommandScriptLexer.h"
#include <cerrno>
#include <climits>
#include <cmath>
#include <cstdlib>
#include <sstream>

namespace AnvilCore {

namespace {

std::string lower(std::string i_text) {
  for (char& c : i_text)
    if (c >= 'A' && c <= 'Z') c = static_cast<char>(c - 'A' + 'a');
  return i_text;
}

bool parseBool(const std::string& i_text, Variable::BoolType& o_rValue) {
  const std::string t = lower(i_text);
  if (t == "true" || t == "1" || t == "on")
    o_rValue = Variable::ETrue;
  else if (t == "false" || t == "0" || t == "off")
    o_rValue = Variable::EFalse;
  else if (t == "toggle")
    o_rValue = Variable::EToggle;
  else
    return false;
  return true;
}

bool parseInt(const std::string& i_text, int& o_rValue) {
  if (i_text.empty()) return false;
  size_t i = (i_text[0] == '-' || i_text[0] == '+') ? 1 : 0;
  if (i == i_text.size()) return false;
  for (size_t k = i; k < i_text.size(); ++k)
    if (i_text[k] < '0' || i_text[k] > '9') return false;
  errno = 0;
  const long long value = std::strtoll(i_text.c_str(), nullptr, 10);
  if (errno == ERANGE || value < INT_MIN || value > INT_MAX) return false;
  o_rValue = static_cast<int>(value);
  return true;
}

bool parseFloat(const std::string& i_text, double& o_rValue) {
  if (i_text.empty()) return false;
  char* pEnd = nullptr;
  errno = 0;
  const double value = std::strtod(i_text.c_str(), &pEnd);
  if (*pEnd != '\0' || errno == ERANGE || !std::isfinite(value)) return false;
  o_rValue = value;
  return true;
}

// Converts one value token to the option's type; false with a message naming what was expected.
bool convertValue(const ScriptToken& i_rToken, const CommandOption& i_rOption,
                  Variable& io_rVariable, std::string& o_rMessage) {
  const std::string option = std::string("-") + i_rOption.getName().GetStr();
  const std::string found = " found \"" + i_rToken.text + "\"";
  switch (i_rOption.getType()) {
  case Variable::EBool: {
    Variable::BoolType value;
    if (parseBool(i_rToken.text, value)) {
      io_rVariable.addBool(value);
      return true;
    }
    o_rMessage = option + " expects a bool (true, false, 1, 0, on, off or toggle);" + found;
    return false;
  }
  case Variable::EInteger: {
    int value;
    if (parseInt(i_rToken.text, value)) {
      io_rVariable.addInt(value);
      return true;
    }
    o_rMessage = option + " expects a 32-bit integer;" + found;
    return false;
  }
  case Variable::EFloat: {
    double value;
    if (parseFloat(i_rToken.text, value)) {
      io_rVariable.addFloat(value);
      return true;
    }
    o_rMessage = option + " expects a finite number;" + found;
    return false;
  }
  case Variable::EString:
    io_rVariable.addString(i_rToken.text);
    return true;
  default:
    o_rMessage = option + " has a type this parser does not know";
    return false;
  }
}

class LineParser {
public:
  LineParser(const CommandRegistry& i_rRegistry, int i_line, ScriptError& o_rError)
      : m_rRegistry(i_rRegistry), m_line(i_line), m_rError(o_rError) {}

  // Parses one line's tokens into a call; false with `m_rError` filled.
  bool parse(const std::vector<ScriptToken>& i_rTokens, int i_endColumn, ScriptCall& o_rCall) {
    const ScriptToken& name = i_rTokens.front();
    o_rCall.position = {m_line, name.column};
    o_rCall.pCommand = name.quoted ? nullptr : m_rRegistry.find(name.text);
    if (!o_rCall.pCommand) return fail(name.column, "unknown command \"" + name.text + "\"");
    const Command& command = *o_rCall.pCommand;
    size_t i = 1;
    while (i < i_rTokens.size()) {
      const ScriptToken& optionToken = i_rTokens[i++];
      if (optionToken.quoted || optionToken.text.size() < 2 || optionToken.text[0] != '-')
        return fail(optionToken.column,
                    "expected an option (-name), found \"" + optionToken.text + "\"");
      const int id = command.findOption(optionToken.text.substr(1));
      if (id < 0)
        return fail(optionToken.column,
                    "unknown option \"" + optionToken.text + "\" of " + command.getName().GetStr());
      const CommandOption& option = *command.getOption(id);
      CommandArgument arg;
      arg.m_id = static_cast<uint64_t>(id);
      arg.m_value = Variable(option.getType());
      for (int k = 0; k < option.getArity(); ++k) {
        const std::string missing =
            optionToken.text + " needs a value (" + Variable::typeName(option.getType()) + ")";
        if (i >= i_rTokens.size()) return fail(i_endColumn, missing);
        const ScriptToken& value = i_rTokens[i];
        // An option name where a value belongs is a forgotten value, whatever the type.
        if (!value.quoted && value.text.size() > 1 && value.text[0] == '-' &&
            command.findOption(value.text.substr(1)) >= 0)
          return fail(value.column, missing + ", found the option \"" + value.text + "\"");
        std::string message;
        if (!convertValue(value, option, arg.m_value, message)) return fail(value.column, message);
        ++i;
      }
      o_rCall.args.push_back(std::move(arg));
    }
    for (int id = 0; id < command.getNumOptions(); ++id) {
      if (!command.getOption(id)->isRequired()) continue;
      bool given = false;
      for (const CommandArgument& arg : o_rCall.args)
        given = given || arg.m_id == uint64_t(id);
      if (!given)
        return fail(name.column, std::string(command.getName().GetStr()) + " needs -" +
                                     command.getOption(id)->getName().GetStr());
    }
    if (!command.checkArgSyntax(o_rCall.args))
      return fail(name.column,
                  "the options do not match " + std::string(command.getArgSyntaxString().GetStr()));
    return true;
  }

  bool fail(int i_column, const std::string& i_message) {
    m_rError.position = {m_line, i_column};
    m_rError.message = i_message;
    return false;
  }

private:
  const CommandRegistry& m_rRegistry;
  int m_line;
  ScriptError& m_rError;
};

} // namespace

std::string ScriptError::toString() const {
  std::ostringstream out;
  if (!source.empty()) out << source << ":";
  if (position.line > 0) out << position.line << ":";
  if (position.column > 0) out << position.column << ":";
  if (out.tellp() > 0) out << " ";
  out << message;
  return out.str();
}

bool parseScript(const std::string& i_text, const std::string& i_source,
                 const CommandRegistry& i_rRegistry, std::vector<ScriptCall>& o_rCalls,
                 ScriptError& o_rError) {
  o_rCalls.clear();
  o_rError = ScriptError();
  o_rError.source = i_source;
  std::vector<ScriptCall> calls;
  std::istringstream in(i_text);
  std::string line;
  std::vector<ScriptToken> tokens;
  for (int lineNumber = 1; std::getline(in, line); ++lineNumber) {
    std::string message;
    int column = 0;
    if (!tokenizeScriptLine(line, tokens, message, column)) {
      o_rError.position = {lineNumber, column};
      o_rError.message = message;
      return false;
    }
    if (tokens.empty()) continue;
    ScriptCall call;
    LineParser parser(i_rRegistry, lineNumber, o_rError);
    if (!parser.parse(tokens, tokens.back().endColumn, call)) return false;
    calls.push_back(std::move(call));
  }
  o_rCalls = std::move(calls);
  return true;
}

bool runScript(const std::vector<ScriptCall>& i_rCalls, const std::string& i_source,
               ScriptError& o_rError) {
  for (const ScriptCall& call : i_rCalls) {
    if (call.pCommand->doCommand(call.args)) continue;
    o_rError.source = i_source;
    o_rError.position = call.position;
    o_rError.message = std::string(call.pCommand->getName().GetStr()) + " failed";
    return false;
  }
  return true;
}

bool executeScript(const std::string& i_text, const std::string& i_source,
                   const CommandRegistry& i_rRegistry, ScriptError& o_rError) {
  std::vector<ScriptCall> calls;
  return parseScript(i_text, i_source, i_rRegistry, calls, o_rError) &&
         runScript(calls, i_source, o_rError);
}

} // namespace AnvilCore
