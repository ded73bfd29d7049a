#include "Utils/UtilsRapidXml/ReadAttributes.h"

#include "DebugServices/GlobalLog.h"
#include "Utils/UtilsRapidXml/AttributeText.h"

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

/// Stores `values` into `io_rTarget` from `offset`, growing it when needed.
template <class T>
void StoreAt(std::vector<T>& io_rTarget, std::size_t offset, std::vector<T>&& values) {
  if (io_rTarget.size() < offset + values.size()) io_rTarget.resize(offset + values.size());
  std::move(values.begin(), values.end(), io_rTarget.begin() + static_cast<std::ptrdiff_t>(offset));
}

template <class F>
bool ReadNumberList(INode& node, std::string_view name, std::vector<double>& io_rValues,
                    std::size_t count, std::size_t offset, std::string_view documentation,
                    std::string_view type, bool required, const IVersion& lower,
                    const IVersion& upper, F parse) {
  std::string_view text;
  if (!node.AttributeText(name, text, documentation, type, required, lower, upper)) return false;
  // Numbers are converted as they are split, into a buffer on the stack for the usual short
  // lists; the target changes only once the whole list converted.
  boost::container::small_vector<double, 36> values;
  bool parsed = true;
  std::size_t i = 0;
  while (i < text.size()) {
    while (i < text.size() && IsBlank(text[i]))
      ++i;
    const std::size_t start = i;
    while (i < text.size() && !IsBlank(text[i]))
      ++i;
    if (i == start) continue;
    double value = 0.0;
    if (parsed && !parse(text.substr(start, i - start), value)) parsed = false;
    values.push_back(value);
  }
  if (count != AnyCount && values.size() != count) {
    node.Error(ZMT::FormatOrRaw("%1% node's %2% attribute had incorrect number of components",
                                node.Name(), std::string(name)));
    return false;
  }
  if (!parsed) {
    ReportUninterpretable(node, name);
    return false;
  }
  if (io_rValues.size() < offset + values.size()) io_rValues.resize(offset + values.size());
  std::copy(values.begin(), values.end(), io_rValues.begin() + static_cast<std::ptrdiff_t>(offset));
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
    std::string_view tokens[3];
    std::size_t count = 0, i = 0;
    while (i < text.size()) {
      while (i < text.size() && IsBlank(text[i]))
        ++i;
      const std::size_t start = i;
      while (i < text.size() && !IsBlank(text[i]))
        ++i;
      if (i == start) continue;
      if (count == 3) return false;
      tokens[count++] = text.substr(start, i - start);
    }
    if (count != 3) return false;
    for (std::size_t k = 0; k < 3; ++k) {
      double component = 0.0;
      if (!ParseDouble(tokens[k], component) || std::isnan(component)) return false;
      colour[k] = static_cast<std::uint8_t>(std::clamp(component, 0.0, 255.0));
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

bool ReadExpressionList(INode& node, std::string_view name, std::vector<std::string>& io_rValues,
                        std::size_t count, std::size_t offset, std::string_view documentation,
                        std::string_view type, bool required, const IVersion& lower,
                        const IVersion& upper) {
  std::string_view text;
  if (!node.AttributeText(name, text, documentation, type, required, lower, upper)) return false;
  std::vector<std::string> tokens;
  if (!SplitExpressionList(text, tokens) || (count != AnyCount && tokens.size() != count)) {
    ReportUninterpretable(node, name);
    return false;
  }
  StoreAt(io_rValues, offset, std::move(tokens));
  return true;
}

} // namespace UtilsRapidXml
