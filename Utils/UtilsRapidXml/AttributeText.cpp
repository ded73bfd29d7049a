#include "Utils/UtilsRapidXml/AttributeText.h"
#include "Utils/UtilsText/ShortDecimal.h"

#include <cctype>
#include <charconv>
#include <cmath>
#include <cstdint>
#include <cstdio>
#include <limits>

namespace UtilsRapidXml {

namespace {

bool IsBlank(char c) {
  return c == ' ' || c == '\t';
}

/// Follows the quoted names of an expression as its parser reads them: a single quote opens a
/// name, a backslash inside takes the next character as it stands, a single quote closes it.
class VQuoteScanner {
public:
  /// Whether `c` belongs to a quoted name (its quotes included).
  bool Next(char c) {
    if (m_Escaped) {
      m_Escaped = false;
      return true;
    }
    if (m_Quoted) {
      if (c == '\\') m_Escaped = true;
      if (c == '\'') m_Quoted = false;
      return true;
    }
    if (c == '\'') m_Quoted = true;
    return m_Quoted;
  }
  /// A name is still open: its closing quote is missing.
  bool Open() const { return m_Quoted; }

private:
  bool m_Quoted = false;
  bool m_Escaped = false;
};

/// Whether `text` starts as a plain decimal number does: an optional minus, then a digit or a
/// point.
bool StartsPlainNumber(std::string_view text) {
  if (!text.empty() && text.front() == '-') text.remove_prefix(1);
  return !text.empty() && ((text.front() >= '0' && text.front() <= '9') || text.front() == '.');
}

struct VSpecialDouble {
  std::string_view m_Text;
  double m_Value;
};

} // namespace

std::string_view TrimBlanks(std::string_view text) {
  while (!text.empty() && IsBlank(text.front()))
    text.remove_prefix(1);
  while (!text.empty() && IsBlank(text.back()))
    text.remove_suffix(1);
  return text;
}

std::vector<std::string_view> SplitBlanks(std::string_view text) {
  std::vector<std::string_view> tokens;
  std::size_t i = 0;
  while (i < text.size()) {
    while (i < text.size() && IsBlank(text[i]))
      ++i;
    const std::size_t start = i;
    while (i < text.size() && !IsBlank(text[i]))
      ++i;
    if (i > start) tokens.push_back(text.substr(start, i - start));
  }
  return tokens;
}

bool ParseDouble(std::string_view text, double& o_rValue) {
  const std::string_view trimmed = TrimBlanks(text);
  // Plain decimal numbers, nearly every value of a file, convert without a copy: on them
  // from_chars and the scanf conversion below agree to the bit (both round correctly). Anything
  // else (a sign other than minus, hexadecimal, inf, nan, a value out of range) takes the scanf
  // road so that it reads exactly as it always has.
  if (UtilsText::ParseShortDecimal(trimmed, o_rValue)) return true;
  if (StartsPlainNumber(trimmed)) {
    double value = 0.0;
    const char* last = trimmed.data() + trimmed.size();
    const auto [end, error] = std::from_chars(trimmed.data(), last, value);
    if (error == std::errc() && end == last) {
      o_rValue = value;
      return true;
    }
  }
  const std::string copy(trimmed);
  double value = 0.0;
  int consumed = 0;
  if (!copy.empty() && std::sscanf(copy.c_str(), "%lf%n", &value, &consumed) == 1 &&
      consumed == static_cast<int>(copy.size())) {
    o_rValue = value;
    return true;
  }
  const double inf = std::numeric_limits<double>::infinity();
  const double qnan = std::numeric_limits<double>::quiet_NaN();
  static const VSpecialDouble specials[] = {
      {"1.#INF", inf},     {"-1.#INF", -inf}, {"1.#QNAN", qnan},
      {"-1.#QNAN", -qnan}, {"1.#IND", -qnan}, {"-1.#IND", -qnan},
  };
  for (const auto& special : specials) {
    if (trimmed == special.m_Text) {
      o_rValue = special.m_Value;
      return true;
    }
  }
  return false;
}

std::string FormatDouble(double value) {
  char buffer[40];
  return std::string(FormatDouble(value, buffer));
}

void AppendDouble(std::string& io_rText, double value) {
  char buffer[40];
  io_rText += FormatDouble(value, buffer);
}

std::string_view FormatDouble(double value, char (&buffer)[40]) {
  if (value == 0.0) return "0"; // never "-0": a sign on zero is an artefact of arithmetic
  // An integer below 10^15 prints under "%.17g" as its digits alone: write them directly.
  if (value > -1e15 && value < 1e15) {
    const auto whole = static_cast<std::int64_t>(value);
    if (static_cast<double>(whole) == value) {
      const auto [end, error] = std::to_chars(buffer, buffer + 40, whole);
      return {buffer, static_cast<std::size_t>(end - buffer)};
    }
  }
  // to_chars with a precision is specified as printf's "%.17g" in the C locale, inf and nan
  // spellings included, and needs neither the locale nor a format string.
  const auto [end, error] =
      std::to_chars(buffer, buffer + 40, value, std::chars_format::general, 17);
  if (error != std::errc()) return {};
  return {buffer, static_cast<std::size_t>(end - buffer)};
}

bool ParseBool(std::string_view text, bool& o_rValue) {
  const std::string_view trimmed = TrimBlanks(text);
  if (trimmed == "0" || trimmed == "1") {
    o_rValue = trimmed == "1";
    return true;
  }
  // Case-insensitive for ASCII letters only, as tolower in the C locale.
  auto equalsIgnoringCase = [trimmed](std::string_view lower) {
    if (trimmed.size() != lower.size()) return false;
    for (std::size_t i = 0; i < lower.size(); ++i)
      if ((trimmed[i] | 0x20) != lower[i]) return false;
    return true;
  };
  if (equalsIgnoringCase("true") || equalsIgnoringCase("false")) {
    o_rValue = trimmed.size() == 4;
    return true;
  }
  return false;
}

bool ParseUnsigned(std::string_view text, std::uint32_t& o_rValue) {
  const std::string_view trimmed = TrimBlanks(text);
  std::uint32_t value = 0;
  const auto [end, error] = std::from_chars(trimmed.data(), trimmed.data() + trimmed.size(), value);
  if (trimmed.empty() || error != std::errc() || end != trimmed.data() + trimmed.size()) {
    return false;
  }
  o_rValue = value;
  return true;
}

bool ParseVersion(std::string_view text, IVersion& o_rVersion) {
  const std::string_view trimmed = TrimBlanks(text);
  const auto point = trimmed.find('.');
  if (point == std::string_view::npos) return false;
  const std::string_view major = trimmed.substr(0, point);
  const std::string_view minor = trimmed.substr(point + 1);
  auto parsePart = [](std::string_view part, std::int32_t& out) {
    if (part.empty() || !std::isdigit(static_cast<unsigned char>(part.front()))) return false;
    const auto [end, error] = std::from_chars(part.data(), part.data() + part.size(), out);
    return error == std::errc() && end == part.data() + part.size();
  };
  IVersion version;
  if (!parsePart(major, version.m_Major) || !parsePart(minor, version.m_Minor)) return false;
  o_rVersion = version;
  return true;
}

bool SplitExpressionList(std::string_view text, std::vector<std::string>& o_rTokens) {
  // Tokens end at blanks outside quoted names, wherever the quotes stand in the token. Only the
  // space separates: a tab inside a token is white space within one expression.
  std::vector<std::string> tokens;
  std::string token;
  VQuoteScanner scanner;
  for (char c : TrimBlanks(text)) {
    if (!scanner.Next(c) && c == ' ') {
      if (!token.empty()) tokens.push_back(std::move(token));
      token.clear();
      continue;
    }
    token += c;
  }
  if (scanner.Open()) return false;
  if (!token.empty()) tokens.push_back(std::move(token));
  o_rTokens = std::move(tokens);
  return true;
}

bool HasUnquotedBlank(std::string_view expression) {
  VQuoteScanner scanner;
  for (char c : expression)
    if (!scanner.Next(c) && IsBlank(c)) return true;
  return false;
}

} // namespace UtilsRapidXml
