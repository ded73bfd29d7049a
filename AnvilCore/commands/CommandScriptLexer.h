#pragma once
#include <string>
#include <vector>

namespace AnvilCore {

/// One word of a script line.
struct ScriptToken {
  std::string text;  ///< with quotes removed and escapes resolved
  int column = 0;    ///< 1-based column of its first character
  int endColumn = 0; ///< 1-based column just after its last character
  bool quoted = false;
};

/// Splits one line (without its newline) into tokens. Returns false with a message and a column
/// on an unterminated quote or a bad escape. `#` outside quotes ends the line's content.
bool tokenizeScriptLine(const std::string& i_line, std::vector<ScriptToken>& o_rTokens,
                        std::string& o_rMessage, int& o_rColumn);

} // namespace AnvilCore
