#include "CommandScriptLexer.h"

namespace AnvilCore {

namespace {
bool isBlank(char c) {
  return c == ' ' || c == '\t' || c == '\r' || c == '\v' || c == '\f';
}

// Reads a quoted token starting at the quote `io_rPos`; leaves `io_rPos` after the closing quote.
bool readQuoted(const std::string& i_line, size_t& io_rPos, std::string& o_rText,
                std::string& o_rMessage, int& o_rColumn) {
  const size_t open = io_rPos++;
  while (io_rPos < i_line.size()) {
    const char c = i_line[io_rPos];
    if (c == '"') {
      ++io_rPos;
      return true;
    }
    if (c == '\\') {
      if (io_rPos + 1 >= i_line.size()) break;
      const char e = i_line[io_rPos + 1];
      switch (e) {
      case '"':
        o_rText += '"';
        break;
      case '\\':
        o_rText += '\\';
        break;
      case 'n':
        o_rText += '\n';
        break;
      case 't':
        o_rText += '\t';
        break;
      default:
        o_rMessage = std::string("unknown escape \"\\") + e + "\" in a quoted value";
        o_rColumn = static_cast<int>(io_rPos) + 1;
        return false;
      }
      io_rPos += 2;
      continue;
    }
    o_rText += c;
    ++io_rPos;
  }
  o_rMessage = "unterminated quoted value (no closing \")";
  o_rColumn = static_cast<int>(open) + 1;
  return false;
}
} // namespace

bool tokenizeScriptLine(const std::string& i_line, std::vector<ScriptToken>& o_rTokens,
                        std::string& o_rMessage, int& o_rColumn) {
  o_rTokens.clear();
  size_t pos = 0;
  while (pos < i_line.size()) {
    if (isBlank(i_line[pos])) {
      ++pos;
      continue;
    }
    if (i_line[pos] == '#') break;
    ScriptToken token;
    token.column = static_cast<int>(pos) + 1;
    if (i_line[pos] == '"') {
      token.quoted = true;
      if (!readQuoted(i_line, pos, token.text, o_rMessage, o_rColumn)) return false;
      if (pos < i_line.size() && !isBlank(i_line[pos]) && i_line[pos] != '#') {
        o_rMessage = "a quoted value must be followed by a blank";
        o_rColumn = static_cast<int>(pos) + 1;
        return false;
      }
    } else {
      while (pos < i_line.size() && !isBlank(i_line[pos]) && i_line[pos] != '#') {
        if (i_line[pos] == '"') {
          o_rMessage = "a quote may only start a value";
          o_rColumn = static_cast<int>(pos) + 1;
          return false;
        }
        token.text += i_line[pos++];
      }
    }
    token.endColumn = static_cast<int>(pos) + 1;
    o_rTokens.push_back(std::move(token));
  }
  return true;
}

} // namespace AnvilCore
