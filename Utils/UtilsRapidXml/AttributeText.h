#pragma once
// Text forms of attribute values: parsing and printing of numbers, flags, versions and lists.
// All parsers return false on a text that does not convert and leave their output alone.

#include "Utils/UtilsRapidXml/IVersion.h"

#include <string>
#include <string_view>
#include <vector>

namespace UtilsRapidXml {

/// `text` without leading and trailing blanks and tabs.
std::string_view TrimBlanks(std::string_view text);

/// Splits at runs of blanks and tabs; an empty or blank text gives no tokens.
std::vector<std::string_view> SplitBlanks(std::string_view text);

/// A double: trimmed, then the whole text must scan as a floating-point number. Also accepts
/// "1.#INF", "-1.#INF" (infinities), "1.#QNAN" (quiet NaN), "-1.#QNAN", "1.#IND" and "-1.#IND"
/// (negative quiet NaN).
bool ParseDouble(std::string_view text, double& o_rValue);

/// "%.17g": round-trips every double; non-finite values print as inf, -inf, nan, -nan. Zero
/// prints as "0" whatever its sign.
std::string FormatDouble(double value);
/// Appends FormatDouble's text of `value` to `io_rText`.
void AppendDouble(std::string& io_rText, double value);
/// FormatDouble's text of `value` in `buffer`.
std::string_view FormatDouble(double value, char (&buffer)[40]);

/// Trimmed "0" / "1", else case-insensitive "true" / "false".
bool ParseBool(std::string_view text, bool& o_rValue);

/// Two decimal integers separated by a point, such as "3.5".
bool ParseVersion(std::string_view text, IVersion& o_rVersion);

/// Unsigned decimal integer that fits 32 bits.
bool ParseUnsigned(std::string_view text, std::uint32_t& o_rValue);

/// Splits a list of expressions at spaces outside quoted names. A quoted name may stand anywhere
/// in a token and hold blanks; inside it a backslash takes the next character (also a quote) as
/// it stands, as the expression parser reads it. False, with `o_rTokens` untouched, when a quoted
/// name has no closing quote.
bool SplitExpressionList(std::string_view text, std::vector<std::string>& o_rTokens);

/// Whether `expression` holds a blank or tab outside quoted names (read as SplitExpressionList
/// reads them).
bool HasUnquotedBlank(std::string_view expression);

} // namespace UtilsRapidXml
