#pragma once

#include <compare>
#include <cstdint>
#include <string>

namespace UtilsRapidXml {

/// A document version, major then minor. A negative component means "no version": as a limit it
/// leaves that side open.
struct IVersion {
  std::int32_t m_Major = -1;
  std::int32_t m_Minor = -1;

  constexpr IVersion() = default;
  constexpr IVersion(std::int32_t major, std::int32_t minor) : m_Major(major), m_Minor(minor) {}

  /// The open limit.
  static constexpr IVersion None() { return {}; }
  constexpr bool IsValid() const { return m_Major >= 0 && m_Minor >= 0; }
  /// "3.5"
  std::string ToString() const { return std::to_string(m_Major) + "." + std::to_string(m_Minor); }

  constexpr auto operator<=>(const IVersion&) const = default;
};

/// Whether `version` lies outside the inclusive limits [lower, upper]. Never true when `version`
/// itself is not a valid version; an invalid limit leaves its side open.
constexpr bool IsOutOfRange(const IVersion& version, const IVersion& lower, const IVersion& upper) {
  if (!version.IsValid()) return false;
  return (lower.IsValid() && version < lower) || (upper.IsValid() && version > upper);
}

} // namespace UtilsRapidXml
