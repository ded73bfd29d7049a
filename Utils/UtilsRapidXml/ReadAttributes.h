#pragma once
// Typed attribute reading over INode::Attribute. Each function declares the attribute, converts
// its text when one was read and returns true only then. A text that does not convert adds the
// error "<node> node's <name> attribute could not be interpreted" and leaves the value as it was,
// so callers set their default first and then call.

#include "Utils/UtilsRapidXml/IEnum.h"
#include "Utils/UtilsRapidXml/INode.h"

#include <array>
#include <cstddef>
#include <cstdint>
#include <limits>
#include <span>
#include <string>
#include <string_view>
#include <vector>

namespace UtilsRapidXml {

/// The stored form of an unset optional double (the largest finite double); "*" or "?" in files.
inline constexpr double UnsetDouble = std::numeric_limits<double>::max();
/// Count for lists whose length is not fixed.
inline constexpr std::size_t AnyCount = std::numeric_limits<std::size_t>::max();

using ColourBytes = std::array<std::uint8_t, 4>;

void ReportUninterpretable(INode& node, std::string_view name);

bool ReadString(INode& node, std::string_view name, std::string& o_rValue,
                std::string_view documentation, std::string_view type, bool required,
                const IVersion& lower = IVersion::None(), const IVersion& upper = IVersion::None());

bool ReadDouble(INode& node, std::string_view name, double& o_rValue,
                std::string_view documentation, std::string_view type, bool required,
                const IVersion& lower = IVersion::None(), const IVersion& upper = IVersion::None());

/// As ReadDouble; "*" or "?" store UnsetDouble.
bool ReadOptionalDouble(INode& node, std::string_view name, double& o_rRawValue,
                        std::string_view documentation, std::string_view type, bool required,
                        const IVersion& lower = IVersion::None(),
                        const IVersion& upper = IVersion::None());

bool ReadBool(INode& node, std::string_view name, bool& o_rValue, std::string_view documentation,
              std::string_view type, bool required, const IVersion& lower = IVersion::None(),
              const IVersion& upper = IVersion::None());

bool ReadUnsigned(INode& node, std::string_view name, std::uint32_t& o_rValue,
                  std::string_view documentation, std::string_view type, bool required,
                  const IVersion& lower = IVersion::None(),
                  const IVersion& upper = IVersion::None());

bool ReadVersion(INode& node, std::string_view name, IVersion& o_rValue,
                 std::string_view documentation, std::string_view type, bool required,
                 const IVersion& lower = IVersion::None(),
                 const IVersion& upper = IVersion::None());

/// Three numbers, each clamped to 0..255; alpha is set to 255.
bool ReadColour(INode& node, std::string_view name, ColourBytes& o_rValue,
                std::string_view documentation, std::string_view type, bool required,
                const IVersion& lower = IVersion::None(), const IVersion& upper = IVersion::None());

/// Exactly `count` numbers (any number for AnyCount), stored from `offset` on; the vector grows
/// as needed and never shrinks. A wrong count is the error "<node> node's <name> attribute had
/// incorrect number of components".
bool ReadDoubleList(INode& node, std::string_view name, std::vector<double>& io_rValues,
                    std::size_t count, std::size_t offset, std::string_view documentation,
                    std::string_view type, bool required, const IVersion& lower = IVersion::None(),
                    const IVersion& upper = IVersion::None());

/// As ReadDoubleList with "*" or "?" for unset entries.
bool ReadOptionalDoubleList(INode& node, std::string_view name, std::vector<double>& io_rValues,
                            std::size_t count, std::size_t offset, std::string_view documentation,
                            std::string_view type, bool required,
                            const IVersion& lower = IVersion::None(),
                            const IVersion& upper = IVersion::None());

/// As ReadDoubleList from offset 0, replacing the whole of `o_rValues` when the list was read.
bool ReadDoubleListReplacing(INode& node, std::string_view name, std::vector<double>& o_rValues,
                             std::size_t count, std::string_view documentation,
                             std::string_view type, bool required,
                             const IVersion& lower = IVersion::None(),
                             const IVersion& upper = IVersion::None());

/// Exactly `o_rValues.size()` numbers into `o_rValues`, left alone unless all were read.
bool ReadDoubleArray(INode& node, std::string_view name, std::span<double> o_rValues,
                     std::string_view documentation, std::string_view type, bool required,
                     const IVersion& lower = IVersion::None(),
                     const IVersion& upper = IVersion::None());

/// Exactly `count` expressions (any number for AnyCount), split so that single-quoted names may
/// hold blanks, stored from `offset` on.
bool ReadExpressionList(INode& node, std::string_view name, std::vector<std::string>& io_rValues,
                        std::size_t count, std::size_t offset, std::string_view documentation,
                        std::string_view type, bool required,
                        const IVersion& lower = IVersion::None(),
                        const IVersion& upper = IVersion::None());

/// Declares the enumeration, then reads one of its keywords.
/// Exactly `o_rValues.size()` expressions into `o_rValues`, left alone unless all were read.
bool ReadExpressionArray(INode& node, std::string_view name, std::span<std::string> o_rValues,
                         std::string_view documentation, std::string_view type, bool required,
                         const IVersion& lower = IVersion::None(),
                         const IVersion& upper = IVersion::None());

/// Declares the enumeration, then reads one of its keywords.
template <class T>
bool ReadEnum(INode& node, std::string_view name, T& o_rValue, const VEnum<T>& enumeration,
              std::string_view documentation, bool required,
              const IVersion& lower = IVersion::None(), const IVersion& upper = IVersion::None()) {
  node.Enum(enumeration);
  std::string_view text;
  if (!node.AttributeText(name, text, documentation, enumeration.TypeName(), required, lower,
                          upper)) {
    return false;
  }
  if (!enumeration.ToValue(text, o_rValue)) {
    ReportUninterpretable(node, name);
    return false;
  }
  return true;
}

} // namespace UtilsRapidXml
