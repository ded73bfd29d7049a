#pragma once
// Types whose every value takes the same number of bytes on file (numbers, enums, fixed arrays and
// described classes made only of those): their size is known once per type, and a value is put
// straight into memory, with the same bytes TFlowField<T>::Write gives, without a stream call per
// field.

#include "Flow2/Flow2Types/FlowFieldTraits.h"

#include <array>
#include <cstdint>
#include <cstring>
#include <type_traits>

namespace ZMT::Detail {

template <class T> struct IsStdArray : std::false_type {};
template <class T, std::size_t N> struct IsStdArray<std::array<T, N>> : std::true_type {};

/// The bytes every value of T takes on file; 0 when that depends on the value.
template <class T> std::uint64_t FixedSize() {
  if constexpr (std::is_same_v<T, bool>) {
    return 1;
  } else if constexpr (std::is_arithmetic_v<T> || std::is_enum_v<T>) {
    return sizeof(T);
  } else if constexpr (IsStdArray<T>::value) {
    return std::tuple_size_v<T> * FixedSize<typename T::value_type>();
  } else if constexpr (CFlowClass<T> && std::is_default_constructible_v<T>) {
    static const std::uint64_t s_Size = [] {
      const T value{};
      std::uint64_t size = 0;
      bool fixed = true;
      T::FlowFields(value, [&](const char*, const char*, const auto& field) {
        const std::uint64_t n = FixedSize<std::decay_t<decltype(field)>>();
        fixed = fixed && n != 0;
        size += n;
      });
      return fixed ? size : 0;
    }();
    return s_Size;
  } else {
    return 0;
  }
}

/// Puts a value of a fixed-size type at `p`; gives the byte after it.
template <class T> std::uint8_t* PutFixed(std::uint8_t* p, const T& v) {
  if constexpr (std::is_same_v<T, bool>) {
    *p = v ? 1 : 0;
    return p + 1;
  } else if constexpr (std::is_arithmetic_v<T> || std::is_enum_v<T>) {
    std::memcpy(p, &v, sizeof v);
    return p + sizeof v;
  } else if constexpr (IsStdArray<T>::value) {
    if constexpr (PackedNumbers<T>::value) {
      std::memcpy(p, v.data(), sizeof v);
      return p + sizeof v;
    } else {
      for (const auto& e : v)
        p = PutFixed(p, e);
      return p;
    }
  } else if constexpr (CFlowClass<T>) {
    T::FlowFields(v, [&](const char*, const char*, const auto& field) { p = PutFixed(p, field); });
    return p;
  } else {
    return p; // not of fixed size: never asked for
  }
}

/// Takes a value of a fixed-size type from `p` (the bytes PutFixed gives); gives the byte after it.
template <class T> const std::uint8_t* TakeFixed(const std::uint8_t* p, T& v) {
  if constexpr (std::is_same_v<T, bool>) {
    v = *p != 0;
    return p + 1;
  } else if constexpr (std::is_arithmetic_v<T> || std::is_enum_v<T>) {
    std::memcpy(&v, p, sizeof v);
    return p + sizeof v;
  } else if constexpr (IsStdArray<T>::value) {
    if constexpr (PackedNumbers<T>::value) {
      std::memcpy(v.data(), p, sizeof v);
      return p + sizeof v;
    } else {
      for (auto& e : v)
        p = TakeFixed(p, e);
      return p;
    }
  } else if constexpr (CFlowClass<T>) {
    T::FlowFields(v, [&](const char*, const char*, auto& field) { p = TakeFixed(p, field); });
    return p;
  } else {
    return p; // not of fixed size: never asked for
  }
}

/// Largest fixed size read in one piece through a buffer on the stack.
constexpr std::uint64_t MaxFixedRead = 256;

} // namespace ZMT::Detail
