#include "Utils/UtilsRapidXml/ReadAttributes.h"

#include "DebugServices/GlobalLog.h"
#include "Utils/UtilsRapidXml/AttributeText.h"

#include <algorithm>
#include <cmath>

namespace UtilsRapidXml {

namespace {

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
bool ReadConverted(INode& node, const std::string& name, T& o_rValue,
                   const std::string& documentation, const std::string& type, bool required,
                   const IVersion& lower, const IVersion& upper, F convert) {
  std::string text;
  if (!node.Attribute(name, text, documentation, type, required, lower, upper)) return false;
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
bool ReadNumberList(INode& node, const std::string& name, std::vector<double>& io_rValues,
                    std::size_t count, std::size_t offset, const std::string& documentation,
                    const std::string& type, bool required, const IVersion& lower,
                    const IVersion& upper, F parse) {
  std::string text;
  if (!node.Attribute(name, text, documentation, type, required, lower, upper)) return false;
  const auto tokens = SplitBlanks(text);
  if (count != AnyCount && tokens.size() != count) {
    node.Error(ZMT::FormatOrRaw("%1% node's %2% attribute had incorrect number of components",
                                node.Name(), name));
    return false;
  }
  std::vector<double> values(tokens.size());
  for (std::size_t i = 0; i < tokens.size(); ++i) {
    if (!parse(tokens[i], values[i])) {
      ReportUninterpretable(node, name);
      return false;
    }
  }
  StoreAt(io_rValues, offset, std::move(values));
  return true;
}

} // namespace

void ReportUninterpretable(INode& node, const std::string& name) {
  node.Error(
      ZMT::FormatOrRaw("%1% node's %2% attribute could not be interpreted", node.Name(), name));
}

bool ReadString(INode& node, const std::string& name, std::string& o_rValue,
                const std::string& documentation, const std::string& type, bool required,
                const IVersion& lower, const IVersion& upper) {
  return node.Attribute(name, o_rValue, documentation, type, required, lower, upper);
}

bool ReadDouble(INode& node, const std::string& name, double& o_rValue,
                const std::string& documentation, const std::string& type, bool required,
                const IVersion& lower, const IVersion& upper) {
  return ReadConverted(node, name, o_rValue, documentation, type, required, lower, upper,
                       [](const std::string& t, double& v) { return ParseDouble(t, v); });
}

bool ReadOptionalDouble(INode& node, const std::string& name, double& o_rRawValue,
                        const std::string& documentation, const std::string& type, bool required,
                        const IVersion& lower, const IVersion& upper) {
  return ReadConverted(node, name, o_rRawValue, documentation, type, required, lower, upper,
                       [](const std::string& t, double& v) { return ParseOptionalDouble(t, v); });
}

bool ReadBool(INode& node, const std::string& name, bool& o_rValue,
              const std::string& documentation, const std::string& type, bool required,
              const IVersion& lower, const IVersion& upper) {
  return ReadConverted(node, name, o_rValue, documentation, type, required, lower, upper,
                       [](const std::string& t, bool& v) { return ParseBool(t, v); });
}

bool ReadUnsigned(INode& node, const std::string& name, std::uint32_t& o_rValue,
                  const std::string& documentation, const std::string& type, bool required,
                  const IVersion& lower, const IVersion& upper) {
  return ReadConverted(node, name, o_rValue, documentation, type, required, lower, upper,
                       [](const std::string& t, std::uint32_t& v) { return ParseUnsigned(t, v); });
}

bool ReadVersion(INode& node, const std::string& name, IVersion& o_rValue,
                 const std::string& documentation, const std::string& type, bool required,
                 const IVersion& lower, const IVersion& upper) {
  return ReadConverted(node, name, o_rValue, documentation, type, required, lower, upper,
                       [](const std::string& t, IVersion& v) { return ParseVersion(t, v); });
}

bool ReadColour(INode& node, const std::string& name, ColourBytes& o_rValue,
                const std::string& documentation, const std::string& type, bool required,
                const IVersion& lower, const IVersion& upper) {
  auto convert = [](const std::string& text, ColourBytes& colour) {
    const auto tokens = SplitBlanks(text);
    if (tokens.size() != 3) return false;
    for (std::size_t i = 0; i < 3; ++i) {
      double component = 0.0;
      if (!ParseDouble(tokens[i], component) || std::isnan(component)) return false;
      colour[i] = static_cast<std::uint8_t>(std::clamp(component, 0.0, 255.0));
    }
    colour[3] = 255;
    return true;
  };
  return ReadConverted(node, name, o_rValue, documentation, type, required, lower, upper, convert);
}

bool ReadDoubleList(INode& node, const std::string& name, std::vector<double>& io_rValues,
                    std::size_t count, std::size_t offset, const std::string& documentation,
                    const std::string& type, bool required, const IVersion& lower,
                    const IVersion& upper) {
  return ReadNumberList(node, name, io_rValues, count, offset, documentation, type, required, lower,
                        upper, [](std::string_view t, double& v) { return ParseDouble(t, v); });
}

bool ReadOptionalDoubleList(INode& node, const std::string& name, std::vector<double>& io_rValues,
                            std::size_t count, std::size_t offset, const std::string& documentation,
                            const std::string& type, bool required, const IVersion& lower,
                            const IVersion& upper) {
  return ReadNumberList(node, name, io_rValues, count, offset, documentation, type, required, lower,
                        upper,
                        [](std::string_view t, double& v) { return ParseOptionalDouble(t, v); });
}

bool ReadExpressionList(INode& node, const std::string& name, std::vector<std::string>& io_rValues,
                        std::size_t count, std::size_t offset, const std::string& documentation,
                        const std::string& type, bool required, const IVersion& lower,
                        const IVersion& upper) {
  std::string text;
  if (!node.Attribute(name, text, documentation, type, required, lower, upper)) return false;
  std::vector<std::string> tokens;
  if (!SplitExpressionList(text, tokens) || (count != AnyCount && tokens.size() != count)) {
    ReportUninterpretable(node, name);
    return false;
  }
  StoreAt(io_rValues, offset, std::move(tokens));
  return true;
}

} // namespace UtilsRapidXml
