#pragma once
// The generic item and factory that turn a described data class into a Flow item type.
//
// The type class T (a VFlow... wrapper) adds to its data class:
//   static constexpr const char* FlowTypeName;        such as "FlowCameraCalibration"
//   static constexpr std::uint32_t FlowTypeId;
//   static constexpr IFlowItemVersion FlowVersion;
//   static constexpr const char* FlowDescription;      optional
//   bool FlowTag(TagId, std::string&) const;           optional, see FlowTags.h

#include "Flow2/Flow2Types/FlowCompile.h"
#include "Flow2/Flow2Types/FlowFieldTraits.h"
#include "Flow2/Flow2Types/FlowFixedLayout.h"
#include "Flow2/Flow2Types/IFlowItem.h"
#include "Flow2/Flow2Types/IFlowItemFactory.h"
#include "Flow2/Flow2Types/VItemBlockPool.h"

#include <functional>
#include <memory>
#include <new>

namespace ZMT::Detail {

/// The statics of one type: type record and schema (with documentation), built once.
template <class T> const IFlowItemStaticInfo& FlowTypeStatics() {
  static const IFlowItemStaticInfo s_Info = [] {
    IFlowItemStaticInfo info;
    info.m_TypeInfo.m_Name = T::FlowTypeName;
    info.m_TypeInfo.m_TypeId = T::FlowTypeId;
    info.m_TypeInfo.m_Version = T::FlowVersion;
    if constexpr (requires { T::FlowDescription; })
      info.m_TypeInfo.m_Description = T::FlowDescription;
    TFlowField<T>::Schema(info.m_Schema, true);
    return info;
  }();
  return s_Info;
}

template <class T> class VFlowItem final : public IFlowItemTyped<T> {
public:
  const IFlowItemTypeInfo& GetInfo() const override { return FlowTypeStatics<T>().m_TypeInfo; }
  const ISchema& GetSchema() const override { return FlowTypeStatics<T>().m_Schema; }
  bool GetTag(TagId tagId, std::string& o_rValue) const override {
    if constexpr (requires(const T& t) { t.FlowTag(tagId, o_rValue); })
      return static_cast<const T&>(*this).FlowTag(tagId, o_rValue);
    else
      return false;
  }
  bool Read(IInputStream& io_rStream) override {
    const std::uint64_t fixed = FixedSize<T>();
    if (fixed != 0 && fixed <= MaxFixedRead) {
      // One read for the whole body instead of one per field.
      std::uint8_t bytes[MaxFixedRead];
      if (!io_rStream.Read(bytes, fixed)) return false;
      TakeFixed(bytes, static_cast<T&>(*this));
      return true;
    }
    return TFlowField<T>::Read(io_rStream, static_cast<T&>(*this));
  }
  bool Write(IOutputStream& io_rStream) const override {
    return TFlowField<T>::Write(io_rStream, static_cast<const T&>(*this));
  }
  std::uint64_t GetSize() const override {
    return TFlowField<T>::Size(static_cast<const T&>(*this));
  }
  std::uint64_t GetFixedSize() const override { return FixedSize<T>(); }
  void WriteFixed(std::uint8_t* p) const override { PutFixed(p, static_cast<const T&>(*this)); }

  static void* operator new(std::size_t size) {
    if (size != sizeof(VFlowItem)) return ::operator new(size);
    return Blocks::Allocate();
  }
  static void operator delete(void* p, std::size_t size) {
    if (size != sizeof(VFlowItem)) return ::operator delete(p);
    Blocks::Free(p);
  }

private:
  using Blocks = VItemBlockPool<sizeof(IFlowItemTyped<T>), alignof(IFlowItemTyped<T>)>;
};

template <class T> class VFlowItemFactory final : public IFlowItemFactory {
public:
  VFlowItemFactory() : m_Create([]() -> IFlowItem* { return new VFlowItem<T>(); }) {
    FlowTypeStatics<T>();
  }
  /// A factory with its own creation function (tests use one that fails).
  explicit VFlowItemFactory(std::function<IFlowItem*()> create) : m_Create(std::move(create)) {}

  const IFlowItemStaticInfo& GetInfo() const override { return FlowTypeStatics<T>(); }
  /// Raises std::bad_function_call if the creation function is empty.
  IFlowItem* Create() const override { return m_Create(); }
  IFlowItemReadFunction GetReader(const ISchema* i_pFileSchema) const override {
    if (!i_pFileSchema || *i_pFileSchema == FlowTypeStatics<T>().m_Schema)
      return [](IInputStream& io_rStream, IFlowItem& io_rItem) {
        auto* pItem = dynamic_cast<VFlowItem<T>*>(&io_rItem);
        return pItem && pItem->Read(io_rStream);
      };
    // Data written with another version of the type: a reader compiled for that schema.
    IReaderPtr pReader = CompileReader<T>(*i_pFileSchema, FlowTypeStatics<T>().m_Schema);
    if (!pReader) return {};
    return [pReader](IInputStream& io_rStream, IFlowItem& io_rItem) {
      auto* pItem = dynamic_cast<VFlowItem<T>*>(&io_rItem);
      return pItem && pReader->Read(io_rStream, static_cast<T*>(pItem)).IsSuccess();
    };
  }

private:
  std::function<IFlowItem*()> m_Create;
};

} // namespace ZMT::Detail

namespace ZMT {
/// The factories of the given types, in the order given.
template <class... T> IFlowItemFactories MakeFlowItemFactories() {
  return {std::make_shared<Detail::VFlowItemFactory<T>>()...};
}
} // namespace ZMT
