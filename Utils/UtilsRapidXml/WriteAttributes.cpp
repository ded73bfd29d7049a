#include "Utils/UtilsRapidXml/WriteAttributes.h"

#include "DebugServices/GlobalLog.h"
#include "Utils/UtilsRapidXml/AttributeText.h"
#include "Utils/UtilsRapidXml/ReadAttributes.h"

namespace UtilsRapidXml {

namespace {

std::string FormatOptionalDouble(double rawValue) {
  return rawValue == UnsetDouble ? std::string("*") : FormatDouble(rawValue);
}

template <class T, class F> std::string JoinWithBlanks(std::span<const T> values, F format) {
  std::string text;
  for (std::size_t i = 0; i < values.size(); ++i) {
    if (i) text += ' ';
    text += format(values[i]);
  }
  return text;
}

/// Writes a number's text, reporting an empty conversion as unstringifiable.
bool WriteNumberText(VWriterNode& node, const std::string& name, const std::string& text,
                     const IVersion& lower, const IVersion& upper) {
  if (node.IsOutOfRange(lower, upper)) return false;
  if (text.empty()) {
    ReportUnstringifiable(node, name);
    return false;
  }
  return node.Attribute(name, text, lower, upper);
}

} // namespace

void ReportUnstringifiable(VWriterNode& node, const std::string& name) {
  node.Error(
      ZMT::FormatOrRaw("Could not stringify %1% node's %2% attribute value.", node.Name(), name));
}

bool WriteString(VWriterNode& node, const std::string& name, const std::string& value,
                 const IVersion& lower, const IVersion& upper) {
  return node.Attribute(name, value, lower, upper);
}

bool WriteDouble(VWriterNode& node, const std::string& name, double value, const IVersion& lower,
                 const IVersion& upper) {
  return WriteNumberText(node, name, FormatDouble(value), lower, upper);
}

bool WriteOptionalDouble(VWriterNode& node, const std::string& name, double rawValue,
                         const IVersion& lower, const IVersion& upper) {
  return WriteNumberText(node, name, FormatOptionalDouble(rawValue), lower, upper);
}

bool WriteBool(VWriterNode& node, const std::string& name, bool value, const IVersion& lower,
               const IVersion& upper) {
  return node.Attribute(name, value ? "true" : "false", lower, upper);
}

bool WriteUnsigned(VWriterNode& node, const std::string& name, std::uint32_t value,
                   const IVersion& lower, const IVersion& upper) {
  return node.Attribute(name, std::to_string(value), lower, upper);
}

bool WriteVersion(VWriterNode& node, const std::string& name, const IVersion& value,
                  const IVersion& lower, const IVersion& upper) {
  return node.Attribute(name, value.ToString(), lower, upper);
}

bool WriteColour(VWriterNode& node, const std::string& name,
                 const std::array<std::uint8_t, 4>& value, const IVersion& lower,
                 const IVersion& upper) {
  const std::string text =
      std::to_string(value[0]) + " " + std::to_string(value[1]) + " " + std::to_string(value[2]);
  return node.Attribute(name, text, lower, upper);
}

bool WriteDoubleList(VWriterNode& node, const std::string& name, std::span<const double> values,
                     const IVersion& lower, const IVersion& upper) {
  return node.Attribute(name, JoinWithBlanks(values, FormatDouble), lower, upper);
}

bool WriteOptionalDoubleList(VWriterNode& node, const std::string& name,
                             std::span<const double> rawValues, const IVersion& lower,
                             const IVersion& upper) {
  return node.Attribute(name, JoinWithBlanks(rawValues, FormatOptionalDouble), lower, upper);
}

bool WriteExpressionList(VWriterNode& node, const std::string& name,
                         std::span<const std::string> values, const IVersion& lower,
                         const IVersion& upper) {
  if (node.IsOutOfRange(lower, upper)) return false;
  for (const auto& expression : values) {
    if (HasUnquotedBlank(expression)) {
      node.Error(
          ZMT::FormatOrRaw("Node %1% attribute value %2% contains spaces.", name, expression));
      return false;
    }
  }
  return node.Attribute(name, JoinWithBlanks(values, [](const std::string& e) { return e; }), lower,
                        upper);
}

} // namespace UtilsRapidXml
