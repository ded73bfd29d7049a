#pragma once
// The interface of one Flow item, and the typed form that joins it to a plain data class.

#include "Flow2/Flow2Types/IFlowItemTypeInfo.h"
#include "Flow2/Flow2Types/ISchema.h"
#include "Flow2/Flow2Types/ITypedId.h"
#include "Utils/UtilsFileSystem/Streams.h"

#include <cstdint>
#include <string>

namespace ZMT {

class IFlowItem {
public:
  virtual ~IFlowItem() = default;
  virtual const IFlowItemTypeInfo& GetInfo() const = 0;
  virtual const ISchema& GetSchema() const = 0;
  /// The text of a tag of this item; false, leaving the value untouched, if there is no such tag.
  virtual bool GetTag(TagId tagId, std::string& o_rValue) const = 0;
  /// Restores the default value; true when the item can be reused.
  virtual bool Clear() = 0;
  virtual bool Read(IInputStream& io_rStream) = 0;
  virtual bool Write(IOutputStream& io_rStream) const = 0;
  /// The number of bytes Write produces.
  virtual std::uint64_t GetSize() const = 0;
  /// The bytes Write produces when every item of this type takes the same number, else 0.
  virtual std::uint64_t GetFixedSize() const { return 0; }
  /// For a type of fixed size: puts the bytes Write produces at `p` (GetFixedSize() of room).
  virtual void WriteFixed(std::uint8_t* /*p*/) const {}
};

/// An item that is also a value of the data class T.
template <class T> class IFlowItemTyped : public IFlowItem, public T {
public:
  /// Copies the type's default value over the item.
  bool Clear() override {
    static_cast<T&>(*this) = Default();
    return true;
  }

  /// The per-type default value, built once on first use.
  static const T& Default() {
    static const T s_Default{};
    return s_Default;
  }
};

} // namespace ZMT
