#pragma once
// How each kind of field maps to a schema node and to bytes: little-endian, field by field, as
// the schema says. A data class takes part by declaring
//   static constexpr const char* FlowClassName, FlowClassDoc;
//   template <class S, class V> static void FlowFields(S& s, V&& v) { v("Name", "text", s.m_X); }

#include "Flow2/Flow2Types/ISchema.h"
#include "Utils/UtilsFileSystem/Streams.h"

#include <algorithm>
#include <array>
#include <bit>
#include <concepts>
#include <cstdint>
#include <map>
#include <set>
#include <string>
#include <type_traits>
#include <utility>
#include <vector>

static_assert(std::endian::native == std::endian::little,
              "Flow writes values from memory as they stand, which is little-endian only");

namespace ZMT {

template <class T, class = void> struct TFlowField;

/// Enum names for the schema; specialise for an enum to give its class name and values.
template <class E> struct TFlowEnumDescription {
  static constexpr const char* Name = "";
  static std::vector<std::pair<std::string, std::uint32_t>> Values() { return {}; }
};

template <class T>
concept CFlowClass = requires(T& t) {
  { T::FlowClassName } -> std::convertible_to<const char*>;
  T::FlowFields(t, [](const char*, const char*, auto&) {});
};

namespace Detail {
/// Longest piece a variable-length read grows its container by before the bytes are there, so a
/// corrupt length ends in a failed read rather than a huge allocation.
constexpr std::uint32_t ReadGrowStep = 65536;

template <class T> constexpr ISchema::EType ScalarType() {
  if constexpr (std::is_same_v<T, bool>)
    return ISchema::Bool;
  else if constexpr (std::is_floating_point_v<T>)
    return sizeof(T) == 4 ? ISchema::Float32 : ISchema::Float64;
  else if constexpr (std::is_signed_v<T>) {
    if constexpr (sizeof(T) == 1)
      return ISchema::Int8;
    else if constexpr (sizeof(T) == 2)
      return ISchema::Int16;
    else if constexpr (sizeof(T) == 4)
      return ISchema::Int32;
    else
      return ISchema::Int64;
  } else {
    if constexpr (sizeof(T) == 1)
      return ISchema::UInt8;
    else if constexpr (sizeof(T) == 2)
      return ISchema::UInt16;
    else if constexpr (sizeof(T) == 4)
      return ISchema::UInt32;
    else
      return ISchema::UInt64;
  }
}

/// Numbers (not bools) and fixed arrays of them: their bytes in memory are their bytes in a file,
/// so a run of them is written in one piece.
template <class T>
struct PackedNumbers : std::bool_constant<std::is_arithmetic_v<T> && !std::is_same_v<T, bool>> {};
template <class T, std::size_t N>
struct PackedNumbers<std::array<T, N>>
    : std::bool_constant<PackedNumbers<T>::value && sizeof(std::array<T, N>) == sizeof(T) * N> {};

inline bool WriteCount(IOutputStream& s, std::size_t count) {
  if (count > 0xFFFFFFFFu) return false;
  const std::uint32_t n = static_cast<std::uint32_t>(count);
  return s.Write(&n, sizeof n);
}
} // namespace Detail

template <class T> struct TFlowField<T, std::enable_if_t<std::is_arithmetic_v<T>>> {
  static void Schema(ISchema& o_rSchema, bool) { o_rSchema.m_Type = Detail::ScalarType<T>(); }
  static bool Write(IOutputStream& s, const T& v) {
    if constexpr (std::is_same_v<T, bool>) {
      const std::uint8_t b = v ? 1 : 0;
      return s.Write(&b, 1);
    } else {
      return s.Write(&v, sizeof v);
    }
  }
  static bool Read(IInputStream& s, T& v) {
    if constexpr (std::is_same_v<T, bool>) {
      std::uint8_t b = 0;
      if (!s.Read(&b, 1)) return false;
      v = b != 0;
      return true;
    } else {
      return s.Read(&v, sizeof v);
    }
  }
  static std::uint64_t Size(const T&) { return std::is_same_v<T, bool> ? 1 : sizeof(T); }
};

template <class E> struct TFlowField<E, std::enable_if_t<std::is_enum_v<E>>> {
  using U = std::underlying_type_t<E>;
  static_assert(sizeof(U) == 1 || sizeof(U) == 2 || sizeof(U) == 4, "enums are 8, 16 or 32 bit");
  static void Schema(ISchema& o_rSchema, bool) {
    o_rSchema.m_Type = sizeof(U) == 1   ? ISchema::Enum8
                       : sizeof(U) == 2 ? ISchema::Enum16
                                        : ISchema::Enum32;
    o_rSchema.m_Name = TFlowEnumDescription<E>::Name;
    o_rSchema.m_HasName = o_rSchema.m_Name.empty() ? 0 : 1;
    o_rSchema.m_EnumValues = TFlowEnumDescription<E>::Values();
  }
  static bool Write(IOutputStream& s, const E& v) { return s.Write(&v, sizeof v); }
  static bool Read(IInputStream& s, E& v) { return s.Read(&v, sizeof v); }
  static std::uint64_t Size(const E&) { return sizeof(U); }
};

template <> struct TFlowField<std::string> {
  static void Schema(ISchema& o_rSchema, bool) { o_rSchema.m_Type = ISchema::String; }
  static bool Write(IOutputStream& s, const std::string& v) {
    return Detail::WriteCount(s, v.size()) && (v.empty() || s.Write(v.data(), v.size()));
  }
  static bool Read(IInputStream& s, std::string& v) {
    std::uint32_t n = 0;
    if (!s.Read(&n, sizeof n)) return false;
    v.clear();
    while (v.size() < n) {
      const std::size_t have = v.size();
      const std::size_t step = std::min<std::size_t>(n - have, Detail::ReadGrowStep);
      v.resize(have + step);
      if (!s.Read(v.data() + have, step)) return false;
    }
    return true;
  }
  static std::uint64_t Size(const std::string& v) { return 4 + v.size(); }
};

template <class T, std::size_t N> struct TFlowField<std::array<T, N>> {
  static void Schema(ISchema& o_rSchema, bool docs) {
    o_rSchema.m_Type = ISchema::Array;
    o_rSchema.m_Count = static_cast<std::uint32_t>(N);
    o_rSchema.m_Members.resize(1);
    TFlowField<T>::Schema(o_rSchema.m_Members[0].m_Schema, docs);
  }
  static bool Write(IOutputStream& s, const std::array<T, N>& v) {
    // Numbers other than bool are stored as they lie in memory: one write for the whole array.
    if constexpr (Detail::PackedNumbers<T>::value) return s.Write(v.data(), sizeof(T) * N);
    for (const T& e : v)
      if (!TFlowField<T>::Write(s, e)) return false;
    return true;
  }
  static bool Read(IInputStream& s, std::array<T, N>& v) {
    for (T& e : v)
      if (!TFlowField<T>::Read(s, e)) return false;
    return true;
  }
  static std::uint64_t Size(const std::array<T, N>& v) {
    std::uint64_t size = 0;
    for (const T& e : v)
      size += TFlowField<T>::Size(e);
    return size;
  }
};

template <class T> struct TFlowField<std::vector<T>> {
  static void Schema(ISchema& o_rSchema, bool docs) {
    o_rSchema.m_Type = ISchema::List;
    o_rSchema.m_Members.resize(1);
    TFlowField<T>::Schema(o_rSchema.m_Members[0].m_Schema, docs);
  }
  static bool Write(IOutputStream& s, const std::vector<T>& v) {
    if (!Detail::WriteCount(s, v.size())) return false;
    if constexpr (Detail::PackedNumbers<T>::value)
      return v.empty() || s.Write(v.data(), sizeof(T) * v.size());
    for (const T& e : v)
      if (!TFlowField<T>::Write(s, e)) return false;
    return true;
  }
  static bool Read(IInputStream& s, std::vector<T>& v) {
    std::uint32_t n = 0;
    if (!s.Read(&n, sizeof n)) return false;
    v.clear();
    v.reserve(std::min<std::uint32_t>(n, Detail::ReadGrowStep / 8));
    for (std::uint32_t i = 0; i < n; ++i)
      if (!TFlowField<T>::Read(s, v.emplace_back())) return false;
    return true;
  }
  static std::uint64_t Size(const std::vector<T>& v) {
    std::uint64_t size = 4;
    for (const T& e : v)
      size += TFlowField<T>::Size(e);
    return size;
  }
};

template <class A, class B> struct TFlowField<std::pair<A, B>> {
  static void Schema(ISchema& o_rSchema, bool docs) {
    o_rSchema.m_Type = ISchema::Tuple;
    o_rSchema.m_Members.resize(2);
    TFlowField<std::remove_const_t<A>>::Schema(o_rSchema.m_Members[0].m_Schema, docs);
    TFlowField<B>::Schema(o_rSchema.m_Members[1].m_Schema, docs);
  }
  static bool Write(IOutputStream& s, const std::pair<A, B>& v) {
    return TFlowField<std::remove_const_t<A>>::Write(s, v.first) &&
           TFlowField<B>::Write(s, v.second);
  }
  static bool Read(IInputStream& s, std::pair<A, B>& v) {
    return TFlowField<A>::Read(s, v.first) && TFlowField<B>::Read(s, v.second);
  }
  static std::uint64_t Size(const std::pair<A, B>& v) {
    return TFlowField<std::remove_const_t<A>>::Size(v.first) + TFlowField<B>::Size(v.second);
  }
};

/// A map is a list of (key, value) tuples in key order.
template <class K, class V> struct TFlowField<std::map<K, V>> {
  static void Schema(ISchema& o_rSchema, bool docs) {
    o_rSchema.m_Type = ISchema::List;
    o_rSchema.m_Members.resize(1);
    TFlowField<std::pair<K, V>>::Schema(o_rSchema.m_Members[0].m_Schema, docs);
  }
  static bool Write(IOutputStream& s, const std::map<K, V>& v) {
    if (!Detail::WriteCount(s, v.size())) return false;
    for (const auto& [key, value] : v)
      if (!TFlowField<K>::Write(s, key) || !TFlowField<V>::Write(s, value)) return false;
    return true;
  }
  static bool Read(IInputStream& s, std::map<K, V>& v) {
    std::uint32_t n = 0;
    if (!s.Read(&n, sizeof n)) return false;
    v.clear();
    for (std::uint32_t i = 0; i < n; ++i) {
      std::pair<K, V> e;
      if (!TFlowField<std::pair<K, V>>::Read(s, e)) return false;
      v.insert_or_assign(std::move(e.first), std::move(e.second));
    }
    return true;
  }
  static std::uint64_t Size(const std::map<K, V>& v) {
    std::uint64_t size = 4;
    for (const auto& [key, value] : v)
      size += TFlowField<K>::Size(key) + TFlowField<V>::Size(value);
    return size;
  }
};

/// A set is a list of its keys in order.
template <class K> struct TFlowField<std::set<K>> {
  static void Schema(ISchema& o_rSchema, bool docs) {
    o_rSchema.m_Type = ISchema::List;
    o_rSchema.m_Members.resize(1);
    TFlowField<K>::Schema(o_rSchema.m_Members[0].m_Schema, docs);
  }
  static bool Write(IOutputStream& s, const std::set<K>& v) {
    if (!Detail::WriteCount(s, v.size())) return false;
    for (const K& key : v)
      if (!TFlowField<K>::Write(s, key)) return false;
    return true;
  }
  static bool Read(IInputStream& s, std::set<K>& v) {
    std::uint32_t n = 0;
    if (!s.Read(&n, sizeof n)) return false;
    v.clear();
    for (std::uint32_t i = 0; i < n; ++i) {
      K key;
      if (!TFlowField<K>::Read(s, key)) return false;
      v.insert(std::move(key));
    }
    return true;
  }
  static std::uint64_t Size(const std::set<K>& v) {
    std::uint64_t size = 4;
    for (const K& key : v)
      size += TFlowField<K>::Size(key);
    return size;
  }
};

/// A described class is a named tuple of its fields.
template <CFlowClass T> struct TFlowField<T> {
  static void Schema(ISchema& o_rSchema, bool docs);
  static bool Write(IOutputStream& s, const T& v) {
    bool ok = true;
    T::FlowFields(v, [&](const char*, const char*, const auto& field) {
      ok = ok && TFlowField<std::decay_t<decltype(field)>>::Write(s, field);
    });
    return ok;
  }
  static bool Read(IInputStream& s, T& v) {
    bool ok = true;
    T::FlowFields(v, [&](const char*, const char*, auto& field) {
      ok = ok && TFlowField<std::decay_t<decltype(field)>>::Read(s, field);
    });
    return ok;
  }
  static std::uint64_t Size(const T& v) {
    std::uint64_t size = 0;
    T::FlowFields(v, [&](const char*, const char*, const auto& field) {
      size += TFlowField<std::decay_t<decltype(field)>>::Size(field);
    });
    return size;
  }
};

} // namespace ZMT

#include "Flow2/Flow2Types/VClassDescription.h"

template <ZMT::CFlowClass T> void ZMT::TFlowField<T>::Schema(ISchema& o_rSchema, bool docs) {
  VClassDescription::Of<T>().BuildSchema(o_rSchema, docs);
}
