#pragma once
#include "plugin/host/Command.h"
#include <string>
#include <vector>

namespace AnvilCore {

class CommandRegistry;

/// A place in a script: 1-based line and column (in bytes).
struct ScriptPosition {
  int line = 0;
  int column = 0;
};

/// Why a script could not be parsed or run.
struct ScriptError {
  std::string source; ///< names the script in messages (a file name, "-c 2")
  ScriptPosition position;
  std::string message;
  /// "source:line:column: message" (the column left out when it is 0).
  std::string toString() const;
};

/// One call, parsed and type-checked, ready to run.
struct ScriptCall {
  Command* pCommand = nullptr;
  CommandArgList args;
  ScriptPosition position; ///< of the command name
};

/// Parses script text. Each line holds at most one call: a command name, then `-option value`
/// pairs. Bool values are true/false, 1/0, on/off (any case) or toggle; integers are decimal;
/// floats as C reads them; a value holding blanks is written in double quotes with backslash
/// escapes (\" \\ \n \t). `#` outside quotes starts a comment; blank lines are skipped.
/// The whole text is checked first: on any error nothing is returned in `o_rCalls`, and the
/// error names the first offending line and column.
bool parseScript(const std::string& i_text, const std::string& i_source,
                 const CommandRegistry& i_rRegistry, std::vector<ScriptCall>& o_rCalls,
                 ScriptError& o_rError);

/// Runs calls in order with `doCommand`. Stops at the first call that fails (its command has
/// logged why) and reports its position; the calls before it stay applied.
bool runScript(const std::vector<ScriptCall>& i_rCalls, const std::string& i_source,
               ScriptError& o_rError);

/// Parses and runs a script; nothing runs unless the whole text parses.
bool executeScript(const std::string& i_text, const std::string& i_source,
                   const CommandRegistry& i_rRegistry, ScriptError& o_rError);

} // namespace AnvilCore
