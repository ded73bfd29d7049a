#pragma once
// An optional value is written as its stored representation: the reserved value is the unset
// state, so the schema is that of the plain value.

#include "Flow2/Flow2Types/FlowFieldTraits.h"
#include "Flow2/Flow2Types/FlowReaderInfo.h"
#include "River/CoreOstraTypes/IOptional.h"

namespace ZMT {

template <class T> struct TFlowField<IOptional<T>> {
  static void Schema(ISchema& o_rSchema, bool docs) { TFlowField<T>::Schema(o_rSchema, docs); }
  static bool Write(IOutputStream& s, const IOptional<T>& v) {
    return TFlowField<T>::Write(s, v.Raw());
  }
  static bool Read(IInputStream& s, IOptional<T>& v) { return TFlowField<T>::Read(s, v.Raw()); }
  static std::uint64_t Size(const IOptional<T>& v) { return TFlowField<T>::Size(v.Raw()); }
};

/// An optional holds nothing but its value, so it is read as the value at the same place.
template <class T> struct TFlowReaderInfo<IOptional<T>> {
  static_assert(sizeof(IOptional<T>) == sizeof(T), "an optional is its value and nothing else");
  static IReaderInfoPtr Get() { return TFlowReaderInfo<T>::Get(); }
};

} // namespace ZMT
