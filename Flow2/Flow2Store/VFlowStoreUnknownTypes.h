#pragma once
// Items of types this process doesn't know: kept as their raw bytes under a local type id, so that
// they survive a read and a rewrite byte for byte.

#include "Flow2/Flow2Store/VItemStoreBase.h"
#include "Flow2/Flow2Types/IFlowItem.h"

#include <cstdint>
#include <map>
#include <mutex>

namespace Flow2Store {

struct VUnknownTypeRecord {
  ZMT::IFlowItemTypeInfo m_TypeInfo;
  ZMT::ISchema m_Schema;
};

/// The data class of an unknown item: nothing but where its bytes and type are.
struct IFlowUnknownType {
  const ZMT::IFlowBufferConst* m_pBytes = nullptr;
  const VUnknownTypeRecord* m_pRecord = nullptr;
};

class VUnknownFlowItem final : public ZMT::IFlowItemTyped<IFlowUnknownType> {
public:
  const ZMT::IFlowItemTypeInfo& GetInfo() const override;
  const ZMT::ISchema& GetSchema() const override;
  bool GetTag(ZMT::TagId, std::string&) const override { return false; }
  bool Clear() override {
    m_pBytes = nullptr;
    return true;
  }
  bool Read(ZMT::IInputStream&) override { return false; }
  /// Every page of the bytes, in order.
  bool Write(ZMT::IOutputStream& io_rStream) const override;
  std::uint64_t GetSize() const override { return m_pBytes ? m_pBytes->GetChainSize() : 0; }
};

class VFlowStoreUnknownTypes final : public VItemStoreBase {
public:
  explicit VFlowStoreUnknownTypes(ZMT::IFlowStore* i_pOwner);

  /// The local id of a type: the 32-bit combine chain over id, major, minor and patch, top bit
  /// set.
  static std::uint32_t LocalTypeId(const ZMT::IFlowItemTypeInfo& type);

  /// Failed if the id is known with another record, InvalidVersion if with another schema.
  ZMT::IResult RegisterType(const ZMT::IFlowItemTypeInfo& type, const ZMT::ISchema& schema,
                            std::uint32_t& o_rTypeId);
  /// The item of the token, or a new one holding the bytes; InvalidType if the token's type isn't
  /// registered. Takes the bytes over.
  ZMT::IResult GetOrCreateItem(const ZMT::IFlowItemToken& token, ZMT::IFlowBufferConst* i_pBytes,
                               ZMT::IFlowItemHandle& o_rItem);
  bool IsRegistered(std::uint32_t typeId) const;

private:
  const VUnknownTypeRecord* FindRecord(std::uint32_t typeId) const;

  mutable std::mutex m_TypesMutex;
  std::map<std::uint32_t, VUnknownTypeRecord> m_Types;
};

} // namespace Flow2Store
