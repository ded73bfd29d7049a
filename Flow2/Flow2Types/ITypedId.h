#pragma once
// An integer id that can't be mixed up with other ids, with a reserved invalid value.

namespace ZMT {

struct IInvalidIdValueZero {
  template <class T> static constexpr T Value() { return T(0); }
};

template <class TValue, class TTag, class TInvalid> class ITypedId {
public:
  constexpr ITypedId() : m_Value(TInvalid::template Value<TValue>()) {}
  constexpr explicit ITypedId(TValue value) : m_Value(value) {}
  constexpr TValue Value() const { return m_Value; }
  constexpr bool IsValid() const { return m_Value != TInvalid::template Value<TValue>(); }
  constexpr bool operator==(const ITypedId&) const = default;

private:
  TValue m_Value;
};

struct TagIdTag;
/// Identifies a tag of an item; 0 is invalid.
using TagId = ITypedId<int, TagIdTag, IInvalidIdValueZero>;

} // namespace ZMT
