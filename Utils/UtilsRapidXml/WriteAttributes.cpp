#include "Utils/UtilsRapidXml/WriteAttributes.h"

#include "DebugServices/GlobalLog.h"
#include "Utils/UtilsRapidXml/AttributeText.h"
#include "Utils/UtilsRapidXml/ReadAttributes.h"

namespace UtilsRapidXml {

namespace {

void AppendOptionalDouble(std::string& io_rText, double rawValue) {
  if (rawValue == UnsetDouble) {
    io_rText += '*';
  } else {
    AppendDouble(io_rText, rawValue);
  }
}

/// The values separated by one blank, each appended by `append`, in a buffer kept between calls
/// (one writer runs on one thread) so that a list costs no allocation.
template <class T, class F> std::string_view JoinWithBlanks(std::span<const T> values, F append) {
  thread_local std::string text;
  text.clear();
  for (std::size_t i = 0; i < values.size(); ++i) {
    if (i) text += ' ';
    append(text, values[i]);
  }
  return text;
}

/// Writes a number's text, reporting an empty conversion as unstringifiable.
bool WriteNumberText(VWriterNode& node, std::string_view name, std::string_view text,
                     const IVersion& lower, const IVersion& upper) {
  if (node.IsOutOfRange(lower, upper)) return false;
  if (text.empty()) {
    ReportUnstringifiable(node, name);
    return false;
  }
  return node.Attribute(name, text, lower, upper);
}

} // namespace

void ReportUnstringifiable(VWriterNode& node, std::string_view name) {
  node.Error(ZMT::FormatOrRaw("Could not stringify %1% node's %2% attribute value.", node.Name(),
                              std::string(name)));
}

bool WriteString(VWriterNode& node, std::string_view name, std::string_view value,
                 const IVersion& lower, const IVersion& upper) {
  return node.Attribute(name, value, lower, upper);
}

bool WriteDouble(VWriterNode& node, std::string_view name, double value, const IVersion& lower,
                 const IVersion& upper) {
  char buffer[40];
  std::string_view text = FormatDouble(value, buffer);
  return WriteNumberText(node, name, text, lower, upper);
}

bool WriteOptionalDouble(VWriterNode& node, std::string_view name, double rawValue,
                         const IVersion& lower, const IVersion& upper) {
  char buffer[40];
  const std::string_view text = rawValue == UnsetDouble ? "*" : FormatDouble(rawValue, buffer);
  return WriteNumberText(node, name, text, lower, upper);
}

bool WriteBool(VWriterNode& node, std::string_view name, bool value, const IVersion& lower,
               const IVersion& upper) {
  return node.Attribute(name, value ? "true" : "false", lower, upper);
}

bool WriteUnsigned(VWriterNode& node, std::string_view name, std::uint32_t value,
                   const IVersion& lower, const IVersion& upper) {
  return node.Attribute(name, std::to_string(value), lower, upper);
}

bool WriteVersion(VWriterNode& node, std::string_view name, const IVersion& value,
                  const IVersion& lower, const IVersion& upper) {
  return node.Attribute(name, value.ToString(), lower, upper);
}

bool WriteColour(VWriterNode& node, std::string_view name, const std::array<std::uint8_t, 4>& value,
                 const IVersion& lower, const IVersion& upper) {
  const std::string text =
      std::to_string(value[0]) + " " + std::to_string(value[1]) + " " + std::to_string(value[2]);
  return node.Attribute(name, text, lower, upper);
}

bool WriteDoubleList(VWriterNode& node, std::string_view name, std::span<const double> values,
                     const IVersion& lower, const IVersion& upper) {
  return node.Attribute(
      name, JoinWithBlanks(values, [](std::string& t, double v) { AppendDouble(t, v); }), lower,
      upper);
}

bool WriteOptionalDoubleList(VWriterNode& node, std::string_view name,
                             std::span<const double> rawValues, const IVersion& lower,
                             const IVersion& upper) {
  return node.Attribute(name, JoinWithBlanks(rawValues, AppendOptionalDouble), lower, upper);
}

bool WriteExpressionList(VWriterNode& node, std::string_view name,
                         std::span<const std::string> values, const IVersion& lower,
                         const IVersion& upper) {
  if (node.IsOutOfRange(lower, upper)) return false;
  for (const auto& expression : values) {
    if (HasUnquotedBlank(expression)) {
      node.Error(ZMT::FormatOrRaw("Node %1% attribute value %2% contains spaces.",
                                  std::string(name), expression));
      return false;
    }
  }
  return node.Attribute(
      name, JoinWithBlanks(values, [](std::string& t, const std::string& e) { t += e; }), lower,
      upper);
}

} // namespace UtilsRapidXml
