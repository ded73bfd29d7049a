#pragma once
// The store of one Flow instance: one type store per registered type, plus the store of unknown
// types. The set of known types is fixed at construction, so its maps need no lock.

#include "Flow2/Flow2Store/VFlowStoreTypeSpecific.h"
#include "Flow2/Flow2Store/VFlowStoreUnknownTypes.h"
#include "Flow2/Flow2Types/IFlowStore.h"

#include <atomic>
#include <map>
#include <memory>
#include <mutex>
#include <string>
#include <utility>
#include <vector>

namespace Flow2Store {

class VFlowStore final : public ZMT::IFlowStore {
public:
  /// AlreadyPresent if two factories share a type id or a name, InvalidPointer for a null one.
  static ZMT::IResult Create(const ZMT::IFlowItemFactories& factories, std::uint64_t flowStoreId,
                             ZMT::IFlowStoreHandle& o_rStore);

  ZMT::IResult GetFlowStoreId(std::uint64_t& o_rId) const override;
  ZMT::IResult GetTypeIds(std::vector<std::uint32_t>& o_rIds) const override;
  ZMT::IResult GetTypeInfo(std::uint32_t typeId, ZMT::IFlowItemTypeInfo& o_rInfo) const override;
  ZMT::IResult GetTypeInfo(const std::string& name, ZMT::IFlowItemTypeInfo& o_rInfo) const override;
  ZMT::IResult GetTypeInfos(std::vector<ZMT::IFlowItemTypeInfo>& o_rInfos) const override;
  ZMT::IResult CreateItem(const ZMT::IFlowItemTypeInfo& type,
                          ZMT::IFlowItemHandle& o_rItem) override;
  ZMT::IResult CreateItems(const ZMT::IFlowItemTypeInfo& type, std::uint32_t count,
                           std::vector<ZMT::IFlowItemHandle>& io_rItems) override;
  ZMT::IResult FindItem(const ZMT::IFlowItemToken& token, ZMT::IFlowItemHandle& o_rItem) override;
  ZMT::IResult GetOrCreateItem(const ZMT::IFlowItemToken& token, ZMT::IFlowBufferConst* i_pBytes,
                               ZMT::IFlowItemHandle& o_rItem) override;
  ZMT::IResult GetReader(const ZMT::IFlowItemTypeInfo& fileType, const ZMT::ISchema& fileSchema,
                         ZMT::IFlowItemFromBytes& o_rReader) override;
  ZMT::IResult GetItemBuffer(const ZMT::IFlowItemHandle& item, ZMT::IFlowItemWriter& writer,
                             const ZMT::IFlowBufferConst*& o_rpBytes) override;
  ZMT::IResult CompareItems(const ZMT::IFlowItemHandle& a, const ZMT::IFlowItemHandle& b,
                            ZMT::IFlowItemWriter& writer, bool& o_rEqual) override;
  ZMT::IResult GetAllCounts(std::vector<ZMT::IFlowItemCounts>& o_rCounts) const override;
  ZMT::IResult GetItemCounts(const ZMT::IFlowItemTypeInfo& type, std::uint64_t& o_rLive,
                             std::uint64_t& o_rPeak, std::uint64_t& o_rCreated) const override;
  ZMT::IResult RegisterUnknownType(const ZMT::IFlowItemTypeInfo& type, const ZMT::ISchema& schema,
                                   std::uint32_t& o_rTypeId) override;
  void AddReference() override { m_RefCount.fetch_add(1, std::memory_order_relaxed); }
  void DropReference() override;
  ~VFlowStore() override;

  /// Free-list length of one type store (for tests and diagnostics); 0 for an unknown id.
  std::uint64_t GetFreeCount(std::uint32_t typeId) const;

private:
  explicit VFlowStore(std::uint64_t flowStoreId) : m_FlowStoreId(flowStoreId) {}
  /// The type store of a registered type, or the error for it: InvalidId if unknown,
  /// InvalidVersion if the versions differ.
  ZMT::IResult Resolve(const ZMT::IFlowItemTypeInfo& type,
                       VFlowStoreTypeSpecific*& o_rpStore) const;
  VFlowStoreTypeSpecific* ById(std::uint32_t typeId) const;
  /// The store an entry of this token lives in: a type store, the unknown store, or null.
  VItemStoreBase* StoreOf(const ZMT::IFlowItemToken& token) const;

  std::uint64_t m_FlowStoreId;
  std::map<std::uint32_t, std::unique_ptr<VFlowStoreTypeSpecific>> m_TypesById;
  std::map<std::string, VFlowStoreTypeSpecific*> m_TypesByName;
  /// The type stores by id again, as a sorted array for the lookups of every item.
  std::vector<std::pair<std::uint32_t, VFlowStoreTypeSpecific*>> m_TypeIndex;
  std::unique_ptr<VFlowStoreUnknownTypes> m_pUnknownTypes;
  ZMT::IFlowItemFactories m_Factories;
  std::atomic<std::uint32_t> m_RefCount{0};
  std::mutex m_Mutex;
};

} // namespace Flow2Store
