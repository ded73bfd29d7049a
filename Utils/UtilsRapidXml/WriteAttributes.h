#pragma once
// Typed attribute writing over VWriterNode::Attribute. Each function turns the value into its
// file text and returns whether the attribute was written; a value that can't be turned into text
// adds "Could not stringify <node> node's <name> attribute value." to the errors.

#include "Utils/UtilsRapidXml/IEnum.h"
#include "Utils/UtilsRapidXml/VWriterNode.h"

#include <array>
#include <cstdint>
#include <span>
#include <string>
#include <string_view>

namespace UtilsRapidXml {

void ReportUnstringifiable(VWriterNode& node, std::string_view name);

bool WriteString(VWriterNode& node, std::string_view name, std::string_view value,
                 const IVersion& lower = IVersion::None(),
                 const IVersion& upper = IVersion::None());

/// "%.17g".
bool WriteDouble(VWriterNode& node, std::string_view name, double value,
                 const IVersion& lower = IVersion::None(),
                 const IVersion& upper = IVersion::None());

/// "*" for the unset value (the largest finite double), otherwise as WriteDouble.
bool WriteOptionalDouble(VWriterNode& node, std::string_view name, double rawValue,
                         const IVersion& lower = IVersion::None(),
                         const IVersion& upper = IVersion::None());

/// "true" or "false".
bool WriteBool(VWriterNode& node, std::string_view name, bool value,
               const IVersion& lower = IVersion::None(), const IVersion& upper = IVersion::None());

bool WriteUnsigned(VWriterNode& node, std::string_view name, std::uint32_t value,
                   const IVersion& lower = IVersion::None(),
                   const IVersion& upper = IVersion::None());

/// "major.minor".
bool WriteVersion(VWriterNode& node, std::string_view name, const IVersion& value,
                  const IVersion& lower = IVersion::None(),
                  const IVersion& upper = IVersion::None());

/// Red, green and blue as integers separated by one blank; alpha is not written.
bool WriteColour(VWriterNode& node, std::string_view name, const std::array<std::uint8_t, 4>& value,
                 const IVersion& lower = IVersion::None(),
                 const IVersion& upper = IVersion::None());

/// Numbers separated by one blank.
bool WriteDoubleList(VWriterNode& node, std::string_view name, std::span<const double> values,
                     const IVersion& lower = IVersion::None(),
                     const IVersion& upper = IVersion::None());

/// As WriteDoubleList with "*" for unset entries.
bool WriteOptionalDoubleList(VWriterNode& node, std::string_view name,
                             std::span<const double> rawValues,
                             const IVersion& lower = IVersion::None(),
                             const IVersion& upper = IVersion::None());

/// Expressions separated by one blank. An expression with a blank outside single quotes is
/// refused with "Node <name> attribute value <expression> contains spaces." and nothing is
/// written.
bool WriteExpressionList(VWriterNode& node, std::string_view name,
                         std::span<const std::string> values,
                         const IVersion& lower = IVersion::None(),
                         const IVersion& upper = IVersion::None());

/// The keyword of `value`; a value without one is reported as unstringifiable.
template <class T>
bool WriteEnum(VWriterNode& node, std::string_view name, const T& value,
               const VEnum<T>& enumeration, const IVersion& lower = IVersion::None(),
               const IVersion& upper = IVersion::None()) {
  if (node.IsOutOfRange(lower, upper)) return false;
  std::string keyword;
  if (!enumeration.ToKeyword(value, keyword)) {
    ReportUnstringifiable(node, name);
    return false;
  }
  return node.Attribute(name, keyword, lower, upper);
}

} // namespace UtilsRapidXml
