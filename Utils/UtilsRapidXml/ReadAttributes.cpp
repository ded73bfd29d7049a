#include "Utils/UtilsRapidXml/ReadAttributes.h"

#include "DebugServices/GlobalLog.h"
#include "Utils/UtilsRapidXml/AttributeText.h"
#include "Utils/UtilsText/ShortDecimal.h"

#include <boost/container/small_vector.hpp>

#include <algorithm>
#include <cmath>

namespace UtilsRapidXml {

namespace {

bool IsBlank(char c) {
  return c == ' ' || c == '\t';
}

bool IsUnsetMark(std::string_view text) {
  return text == "*" || text == "?";
}

bool ParseOptionalDouble(std::string_view text, double& o_rValue) {
  if (IsUnsetMark(TrimBlanks(text))) {
    o_rValue = UnsetDouble;
    return true;
  }
  return ParseDouble(text, o_rValue);
}

/// Reads the attribute's text and converts it with `convert`; shared tail of the scalar readers.
template <class T, class F>
bool ReadConverted(INode& node, std::string_view name, T& o_rValue, std::string_view documentation,
                   std::string_view type, bool required, const IVersion& lower,
                   const IVersion& upper, F convert) {
  std::string_view text;
  if (!node.AttributeText(name, text, documentation, type, required, lower, upper)) return false;
  T value{};
  if (!convert(text, value)) {
    ReportUninterpretable(node, name);
    return false;
  }
  o_rValue = value;
  return true;
}

using VNumbers = boost::container::small_vector<double, 36>;

/// Splits `text` at blanks and converts each token, into `o_rValues`. Short plain decimals are
/// converted as they are scanned, with UtilsText::ShortDecimalValue (so to the same value);
/// other tokens go to `parse`. Returns false when a token did not convert (the count of
/// `o_rValues` is still that of the tokens).
template <class F> bool ScanNumbers(std::string_view text, VNumbers& o_rValues, F parse) {
  bool parsed = true;
  const char* p = text.data();
  const char* const end = p + text.size();
  while (p < end) {
    while (p < end && IsBlank(*p))
      ++p;
    if (p == end) break;
    const char* const start = p;
    const bool negative = *p == '-';
    if (negative) ++p;
    // Integer digits, then a point and fraction digits; anything else in the token makes it
    // not plain, and the token is then skipped to its end.
    std::uint64_t mantissa = 0;
    int digits = 0, fractionDigits = 0;
    for (; p < end && static_cast<unsigned>(*p - '0') < 10u; ++p, ++digits)
      mantissa = mantissa * 10 + static_cast<std::uint64_t>(*p - '0');
    if (p < end && *p == '.') {
      for (++p; p < end && static_cast<unsigned>(*p - '0') < 10u; ++p, ++fractionDigits)
        mantissa = mantissa * 10 + static_cast<std::uint64_t>(*p - '0');
      digits += fractionDigits;
    }
    bool plain = true;
    if (p < end && !IsBlank(*p)) {
      plain = false;
      while (p < end && !IsBlank(*p))
        ++p;
    }
    double value = 0.0;
    if (plain && digits > 0 && digits <= UtilsText::ShortDecimalDigits) {
      value = UtilsText::ShortDecimalValue(mantissa, fractionDigits);
      if (negative) value = -value;
    } else if (parsed &&
               !parse(std::string_view(start, static_cast<std::size_t>(p - start)), value)) {
      parsed = false;
    }
    o_rValues.push_back(value);
  }
  return parsed;
}

/// Reads the attribute as a list of `count` numbers (any for AnyCount) into `o_rValues`; the
/// errors of a wrong count or a token that does not convert are reported here.
template <class F>
bool ReadNumbers(INode& node, std::string_view name, VNumbers& o_rValues, std::size_t count,
                 std::string_view documentation, std::string_view type, bool required,
                 const IVersion& lower, const IVersion& upper, F parse) {
  std::string_view text;
  if (!node.AttributeText(name, text, documentation, type, required, lower, upper)) return false;
  const bool parsed = ScanNumbers(text, o_rValues, parse);
  if (count != AnyCount && o_rValues.size() != count) {
    node.Error(ZMT::FormatOrRaw("%1% node's %2% attribute had incorrect number of components",
                                node.Name(), std::string(name)));
    return false;
  }
  if (!parsed) {
    ReportUninterpretable(node, name);
    return false;
  }
  return true;
}

template <class F>
bool ReadNumberList(INode& node, std::string_view name, std::vector<double>& io_rValues,
                    std::size_t count, std::size_t offset, std::string_view documentation,
                    std::string_view type, bool required, const IVersion& lower,
                    const IVersion& upper, F parse) {
  // The target changes only once the whole list converted.
  VNumbers values;
  if (!ReadNumbers(node, name, values, count, documentation, type, required, lower, upper, parse)) {
    return false;
  }
  if (io_rValues.size() < offset + values.size()) io_rValues.resize(offset + values.size());
  std::copy(values.begin(), values.end(), io_rValues.begin() + static_cast<std::ptrdiff_t>(offset));
  return true;
}

bool ParseListedDouble(std::string_view text, double& o_rValue) {
  return ParseDouble(text, o_rValue);
}

/// Splits as SplitExpressionList does, into views of `text`; false when a quoted name is open.
bool SplitExpressionViews(std::string_view text,
                          boost::container::small_vector<std::string_view, 8>& o_rTokens) {
  // Every token is a run of the trimmed text between spaces outside quoted names.
  text = TrimBlanks(text);
  bool quoted = false, escaped = false;
  std::size_t start = 0;
  for (std::size_t i = 0; i < text.size(); ++i) {
    const char c = text[i];
    if (escaped) {
      escaped = false;
    } else if (quoted) {
      if (c == '\\') escaped = true;
      if (c == '\'') quoted = false;
    } else if (c == '\'') {
      quoted = true;
    } else if (c == ' ') {
      if (i > start) o_rTokens.push_back(text.substr(start, i - start));
      start = i + 1;
    }
  }
  if (quoted) return false;
  if (text.size() > start) o_rTokens.push_back(text.substr(start));
  return true;
}

} // namespace

void ReportUninterpretable(INode& node, std::string_view name) {
  node.Error(ZMT::FormatOrRaw("%1% node's %2% attribute could not be interpreted", node.Name(),
                              std::string(name)));
}

bool ReadString(INode& node, std::string_view name, std::string& o_rValue,
                std::string_view documentation, std::string_view type, bool required,
                const IVersion& lower, const IVersion& upper) {
  return node.Attribute(name, o_rValue, documentation, type, required, lower, upper);
}

bool ReadDouble(INode& node, std::string_view name, double& o_rValue,
                std::string_view documentation, std::string_view type, bool required,
                const IVersion& lower, const IVersion& upper) {
  return ReadConverted(node, name, o_rValue, documentation, type, required, lower, upper,
                       [](std::string_view t, double& v) { return ParseDouble(t, v); });
}

bool ReadOptionalDouble(INode& node, std::string_view name, double& o_rRawValue,
                        std::string_view documentation, std::string_view type, bool required,
                        const IVersion& lower, const IVersion& upper) {
  return ReadConverted(node, name, o_rRawValue, documentation, type, required, lower, upper,
                       [](std::string_view t, double& v) { return ParseOptionalDouble(t, v); });
}

bool ReadBool(INode& node, std::string_view name, bool& o_rValue, std::string_view documentation,
              std::string_view type, bool required, const IVersion& lower, const IVersion& upper) {
  return ReadConverted(node, name, o_rValue, documentation, type, required, lower, upper,
                       [](std::string_view t, bool& v) { return ParseBool(t, v); });
}

bool ReadUnsigned(INode& node, std::string_view name, std::uint32_t& o_rValue,
                  std::string_view documentation, std::string_view type, bool required,
                  const IVersion& lower, const IVersion& upper) {
  return ReadConverted(node, name, o_rValue, documentation, type, required, lower, upper,
                       [](std::string_view t, std::uint32_t& v) { return ParseUnsigned(t, v); });
}

bool ReadVersion(INode& node, std::string_view name, IVersion& o_rValue,
                 std::string_view documentation, std::string_view type, bool required,
                 const IVersion& lower, const IVersion& upper) {
  return ReadConverted(node, name, o_rValue, documentation, type, required, lower, upper,
                       [](std::string_view t, IVersion& v) { return ParseVersion(t, v); });
}

bool ReadColour(INode& node, std::string_view name, ColourBytes& o_rValue,
                std::string_view documentation, std::string_view type, bool required,
                const IVersion& lower, const IVersion& upper) {
  auto convert = [](std::string_view text, ColourBytes& colour) {
    VNumbers components;
    if (!ScanNumbers(text, components, ParseListedDouble) || components.size() != 3) return false;
    for (std::size_t k = 0; k < 3; ++k) {
      if (std::isnan(components[k])) return false;
      colour[k] = static_cast<std::uint8_t>(std::clamp(components[k], 0.0, 255.0));
    }
    colour[3] = 255;
    return true;
  };
  return ReadConverted(node, name, o_rValue, documentation, type, required, lower, upper, convert);
}

bool ReadDoubleList(INode& node, std::string_view name, std::vector<double>& io_rValues,
                    std::size_t count, std::size_t offset, std::string_view documentation,
                    std::string_view type, bool required, const IVersion& lower,
                    const IVersion& upper) {
  return ReadNumberList(node, name, io_rValues, count, offset, documentation, type, required, lower,
                        upper, [](std::string_view t, double& v) { return ParseDouble(t, v); });
}

bool ReadOptionalDoubleList(INode& node, std::string_view name, std::vector<double>& io_rValues,
                            std::size_t count, std::size_t offset, std::string_view documentation,
                            std::string_view type, bool required, const IVersion& lower,
                            const IVersion& upper) {
  return ReadNumberList(node, name, io_rValues, count, offset, documentation, type, required, lower,
                        upper,
                        [](std::string_view t, double& v) { return ParseOptionalDouble(t, v); });
}

bool ReadDoubleListReplacing(INode& node, std::string_view name, std::vector<double>& o_rValues,
                             std::size_t count, std::string_view documentation,
                             std::string_view type, bool required, const IVersion& lower,
                             const IVersion& upper) {
  VNumbers values;
  if (!ReadNumbers(node, name, values, count, documentation, type, required, lower, upper,
                   ParseListedDouble)) {
    return false;
  }
  o_rValues.assign(values.begin(), values.end());
  return true;
}

bool ReadDoubleArray(INode& node, std::string_view name, std::span<double> o_rValues,
                     std::string_view documentation, std::string_view type, bool required,
                     const IVersion& lower, const IVersion& upper) {
  VNumbers values;
  if (!ReadNumbers(node, name, values, o_rValues.size(), documentation, type, required, lower,
                   upper, ParseListedDouble)) {
    return false;
  }
  std::copy(values.begin(), values.end(), o_rValues.begin());
  return true;
}

namespace {

/// Reads and splits an expression list of `count` expressions (any for AnyCount).
bool ReadExpressionViews(INode& node, std::string_view name,
                         boost::container::small_vector<std::string_view, 8>& o_rTokens,
                         std::size_t count, std::string_view documentation, std::string_view type,
                         bool required, const IVersion& lower, const IVersion& upper) {
  std::string_view text;
  if (!node.AttributeText(name, text, documentation, type, required, lower, upper)) return false;
  if (!SplitExpressionViews(text, o_rTokens) || (count != AnyCount && o_rTokens.size() != count)) {
    ReportUninterpretable(node, name);
    return false;
  }
  return true;
}

} // namespace

bool ReadExpressionList(INode& node, std::string_view name, std::vector<std::string>& io_rValues,
                        std::size_t count, std::size_t offset, std::string_view documentation,
                        std::string_view type, bool required, const IVersion& lower,
                        const IVersion& upper) {
  boost::container::small_vector<std::string_view, 8> tokens;
  if (!ReadExpressionViews(node, name, tokens, count, documentation, type, required, lower,
                           upper)) {
    return false;
  }
  if (io_rValues.size() < offset + tokens.size()) io_rValues.resize(offset + tokens.size());
  for (std::size_t k = 0; k < tokens.size(); ++k)
    io_rValues[offset + k].assign(tokens[k]);
  return true;
}

bool ReadExpressionArray(INode& node, std::string_view name, std::span<std::string> o_rValues,
                         std::string_view documentation, std::string_view type, bool required,
                         const IVersion& lower, const IVersion& upper) {
  boost::container::small_vector<std::string_view, 8> tokens;
  if (!ReadExpressionViews(node, name, tokens, o_rValues.size(), documentation, type, required,
                           lower, upper)) {
    return false;
  }
  for (std::size_t k = 0; k < tokens.size(); ++k)
    o_rValues[k].assign(tokens[k]);
  return true;
}

} // namespace UtilsRapidXml
