#pragma once
// An optional value without a flag of its own: the unset state is a reserved value of T, so the
// record layout and the binary forms stay the width of T.

#include <cstdint>
#include <limits>

namespace ZMT {

/// The reserved "unset" value of each type IOptional supports.
template <class T> struct IOptionalReserved;

template <> struct IOptionalReserved<std::uint32_t> {
  static constexpr std::uint32_t Value = 0xFFFFFFFFu;
};

/// The largest finite double, bit pattern 0x7FEFFFFFFFFFFFFF.
template <> struct IOptionalReserved<double> {
  static constexpr double Value = std::numeric_limits<double>::max();
};

template <class T> class IOptional {
public:
  static constexpr T Reserved = IOptionalReserved<T>::Value;

  /// Unset.
  constexpr IOptional() = default;
  /// Holds `value`; passing the reserved value gives an unset optional.
  constexpr IOptional(T value) : m_Value(value) {}

  constexpr bool IsSet() const { return m_Value != Reserved; }
  constexpr explicit operator bool() const { return IsSet(); }
  /// The value; only meaningful when IsSet().
  constexpr T Value() const { return m_Value; }
  constexpr T ValueOr(T fallback) const { return IsSet() ? m_Value : fallback; }
  constexpr void Reset() { m_Value = Reserved; }

  /// The stored representation, reserved value included; for readers and writers of files.
  constexpr T& Raw() { return m_Value; }
  constexpr const T& Raw() const { return m_Value; }

  constexpr bool operator==(const IOptional&) const = default;

private:
  T m_Value = Reserved;
};

} // namespace ZMT
