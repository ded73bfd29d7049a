#include "Flow2/Flow2Store/VFlowStore.h"

#include <algorithm>
#include <cstring>
#include <exception>

namespace Flow2Store {

using ZMT::IResult;

IResult VFlowStore::Create(const ZMT::IFlowItemFactories& factories, std::uint64_t flowStoreId,
                           ZMT::IFlowStoreHandle& o_rStore) {
  std::unique_ptr<VFlowStore> pStore;
  try {
    pStore.reset(new VFlowStore(flowStoreId));
    pStore->m_pUnknownTypes = std::make_unique<VFlowStoreUnknownTypes>(pStore.get());
    for (const auto& pFactory : factories) {
      if (!pFactory) return IResult::InvalidPointer;
      const ZMT::IFlowItemTypeInfo& info = pFactory->GetInfo().m_TypeInfo;
      if (pStore->m_TypesById.count(info.m_TypeId) || pStore->m_TypesByName.count(info.m_Name))
        return IResult::AlreadyPresent;
      if (static_cast<std::int32_t>(info.m_TypeId) < 0) return IResult::InvalidId;
      auto pTypeStore =
          std::make_unique<VFlowStoreTypeSpecific>(pFactory, pStore.get(), flowStoreId);
      pStore->m_TypesByName.emplace(info.m_Name, pTypeStore.get());
      pStore->m_TypesById.emplace(info.m_TypeId, std::move(pTypeStore));
    }
    pStore->m_Factories = factories;
    for (const auto& [typeId, pTypeStore] : pStore->m_TypesById) // in id order
      pStore->m_TypeIndex.emplace_back(typeId, pTypeStore.get());
  } catch (const std::bad_alloc&) {
    return IResult::AllocationFailure;
  }
  o_rStore = ZMT::IFlowStoreHandle::Adopt(pStore.release());
  return IResult::Ok;
}

VFlowStore::~VFlowStore() = default;

void VFlowStore::DropReference() {
  if (ZMT::Detail::DropExtraOwner(m_RefCount)) delete this;
}

VFlowStoreTypeSpecific* VFlowStore::ById(std::uint32_t typeId) const {
  // A sorted array: every item made or read looks its type up here.
  auto it = std::lower_bound(m_TypeIndex.begin(), m_TypeIndex.end(), typeId,
                             [](const auto& entry, std::uint32_t id) { return entry.first < id; });
  return it == m_TypeIndex.end() || it->first != typeId ? nullptr : it->second;
}

VItemStoreBase* VFlowStore::StoreOf(const ZMT::IFlowItemToken& token) const {
  if (token.IsUnknownType()) return m_pUnknownTypes.get();
  return ById(token.m_TypeId);
}

IResult VFlowStore::Resolve(const ZMT::IFlowItemTypeInfo& type,
                            VFlowStoreTypeSpecific*& o_rpStore) const {
  VFlowStoreTypeSpecific* pStore = ById(type.m_TypeId);
  if (!pStore) return IResult::InvalidId;
  if (!(pStore->GetVersion() == type.m_Version)) return IResult::InvalidVersion;
  o_rpStore = pStore;
  return IResult::Ok;
}

IResult VFlowStore::GetFlowStoreId(std::uint64_t& o_rId) const {
  o_rId = m_FlowStoreId;
  return IResult::Ok;
}

IResult VFlowStore::GetTypeIds(std::vector<std::uint32_t>& o_rIds) const {
  o_rIds.clear();
  for (const auto& [typeId, pStore] : m_TypesById)
    o_rIds.push_back(typeId);
  return IResult::Ok;
}

IResult VFlowStore::GetTypeInfo(std::uint32_t typeId, ZMT::IFlowItemTypeInfo& o_rInfo) const {
  const VFlowStoreTypeSpecific* pStore = ById(typeId);
  if (!pStore) return IResult::InvalidId;
  o_rInfo = pStore->GetFactory().GetInfo().m_TypeInfo;
  return IResult::Ok;
}

IResult VFlowStore::GetTypeInfo(const std::string& name, ZMT::IFlowItemTypeInfo& o_rInfo) const {
  auto it = m_TypesByName.find(name);
  if (it == m_TypesByName.end()) return IResult::InvalidName;
  o_rInfo = it->second->GetFactory().GetInfo().m_TypeInfo;
  return IResult::Ok;
}

IResult VFlowStore::GetTypeInfos(std::vector<ZMT::IFlowItemTypeInfo>& o_rInfos) const {
  o_rInfos.clear();
  for (const auto& [typeId, pStore] : m_TypesById)
    o_rInfos.push_back(pStore->GetFactory().GetInfo().m_TypeInfo);
  return IResult::Ok;
}

IResult VFlowStore::CreateItem(const ZMT::IFlowItemTypeInfo& type, ZMT::IFlowItemHandle& o_rItem) {
  VFlowStoreTypeSpecific* pStore = nullptr;
  const IResult result = Resolve(type, pStore);
  return result.IsFailure() ? result : pStore->CreateItem(o_rItem);
}

IResult VFlowStore::CreateItems(const ZMT::IFlowItemTypeInfo& type, std::uint32_t count,
                                std::vector<ZMT::IFlowItemHandle>& io_rItems) {
  VFlowStoreTypeSpecific* pStore = nullptr;
  const IResult result = Resolve(type, pStore);
  return result.IsFailure() ? result : pStore->CreateItems(count, io_rItems);
}

IResult VFlowStore::FindItem(const ZMT::IFlowItemToken& token, ZMT::IFlowItemHandle& o_rItem) {
  VItemStoreBase* pStore = StoreOf(token);
  return pStore ? pStore->FindItem(token, o_rItem) : IResult(IResult::InvalidToken);
}

IResult VFlowStore::GetOrCreateItem(const ZMT::IFlowItemToken& token,
                                    ZMT::IFlowBufferConst* i_pBytes,
                                    ZMT::IFlowItemHandle& o_rItem) {
  if (!i_pBytes) return IResult::InvalidPointer;
  if (token.IsUnknownType()) return m_pUnknownTypes->GetOrCreateItem(token, i_pBytes, o_rItem);
  VFlowStoreTypeSpecific* pStore = ById(token.m_TypeId);
  if (!pStore) {
    i_pBytes->ReleaseChain();
    return IResult::InvalidToken;
  }
  return pStore->GetOrCreateItem(token, i_pBytes, {}, o_rItem);
}

IResult VFlowStore::GetReader(const ZMT::IFlowItemTypeInfo& fileType,
                              const ZMT::ISchema& fileSchema, ZMT::IFlowItemFromBytes& o_rReader) {
  VFlowStoreTypeSpecific* pStore = ById(fileType.m_TypeId);
  if (!pStore) {
    std::uint32_t localId = 0;
    if (m_pUnknownTypes->RegisterType(fileType, fileSchema, localId).IsFailure())
      return IResult::InvalidVersion;
    VFlowStoreUnknownTypes* pUnknown = m_pUnknownTypes.get();
    o_rReader = [pUnknown, localId](const ZMT::IFlowItemToken& token, ZMT::IFlowBufferConst* pBytes,
                                    ZMT::IFlowItemHandle& o_rItem) -> IResult {
      if (!pBytes) return IResult::InvalidPointer;
      ZMT::IFlowItemToken local = token;
      local.m_TypeId = localId;
      return pUnknown->GetOrCreateItem(local, pBytes, o_rItem);
    };
    return IResult::Ok;
  }

  const ZMT::IFlowItemTypeInfo& local = pStore->GetFactory().GetInfo().m_TypeInfo;
  ZMT::IFlowItemReadFunction read;
  if (fileType.m_Name == local.m_Name && fileType.m_Version == local.m_Version) {
    // The native reader.
  } else {
    const ZMT::IFlowItemVersion& file = fileType.m_Version;
    if (file.m_Major != local.m_Version.m_Major) return IResult::InvalidType;
    if (file > local.m_Version && file.m_Minor != local.m_Version.m_Minor)
      return IResult::InvalidType;
    read = pStore->GetFactory().GetReader(&fileSchema);
    if (!read) return IResult::InvalidType;
  }
  o_rReader = [pStore, read](const ZMT::IFlowItemToken& token, ZMT::IFlowBufferConst* pBytes,
                             ZMT::IFlowItemHandle& o_rItem) -> IResult {
    if (!pBytes) return IResult::InvalidPointer;
    return pStore->GetOrCreateItem(token, pBytes, read, o_rItem);
  };
  return IResult::Ok;
}

IResult VFlowStore::GetItemBuffer(const ZMT::IFlowItemHandle& item, ZMT::IFlowItemWriter& writer,
                                  const ZMT::IFlowBufferConst*& o_rpBytes) {
  auto* pEntry = dynamic_cast<VFlowStoreEntry*>(item.GetEntry());
  if (!pEntry) return IResult::InvalidHandle;
  VItemStoreBase* pStore = StoreOf(pEntry->m_Token);
  if (!pStore) return IResult::InvalidHandle;
  return pStore->GetItemBuffer(pEntry, writer, o_rpBytes);
}

IResult VFlowStore::CompareItems(const ZMT::IFlowItemHandle& a, const ZMT::IFlowItemHandle& b,
                                 ZMT::IFlowItemWriter& writer, bool& o_rEqual) {
  const ZMT::IFlowBufferConst* pA = nullptr;
  const ZMT::IFlowBufferConst* pB = nullptr;
  IResult result = GetItemBuffer(a, writer, pA);
  if (result.IsFailure()) return result;
  result = GetItemBuffer(b, writer, pB);
  if (result.IsFailure()) return result;

  std::uint64_t offsetA = 0;
  std::uint64_t offsetB = 0;
  for (;;) {
    while (pA && offsetA == pA->GetSize()) {
      pA = pA->GetNext();
      offsetA = 0;
    }
    while (pB && offsetB == pB->GetSize()) {
      pB = pB->GetNext();
      offsetB = 0;
    }
    if (!pA || !pB) {
      o_rEqual = !pA && !pB;
      return IResult::Ok;
    }
    const std::uint64_t piece = std::min(pA->GetSize() - offsetA, pB->GetSize() - offsetB);
    if (std::memcmp(pA->GetData() + offsetA, pB->GetData() + offsetB, piece) != 0) {
      o_rEqual = false;
      return IResult::Ok;
    }
    offsetA += piece;
    offsetB += piece;
  }
}

IResult VFlowStore::GetAllCounts(std::vector<ZMT::IFlowItemCounts>& o_rCounts) const {
  o_rCounts.clear();
  auto add = [&](const VItemStoreBase& store, std::uint32_t typeId) {
    ZMT::IFlowItemCounts counts;
    counts.m_Name = store.GetName();
    counts.m_TypeId = typeId;
    store.GetCounts(counts.m_Live, counts.m_Peak, counts.m_Created);
    o_rCounts.push_back(std::move(counts));
  };
  for (const auto& [typeId, pStore] : m_TypesById)
    add(*pStore, typeId);
  add(*m_pUnknownTypes, 0xFFFFFFFFu);
  return IResult::Ok;
}

IResult VFlowStore::GetItemCounts(const ZMT::IFlowItemTypeInfo& type, std::uint64_t& o_rLive,
                                  std::uint64_t& o_rPeak, std::uint64_t& o_rCreated) const {
  VFlowStoreTypeSpecific* pStore = nullptr;
  const IResult result = Resolve(type, pStore);
  if (result.IsFailure()) return result;
  pStore->GetCounts(o_rLive, o_rPeak, o_rCreated);
  return IResult::Ok;
}

IResult VFlowStore::RegisterUnknownType(const ZMT::IFlowItemTypeInfo& type,
                                        const ZMT::ISchema& schema, std::uint32_t& o_rTypeId) {
  return m_pUnknownTypes->RegisterType(type, schema, o_rTypeId);
}

std::uint64_t VFlowStore::GetFreeCount(std::uint32_t typeId) const {
  const VFlowStoreTypeSpecific* pStore = ById(typeId);
  return pStore ? pStore->GetFreeCount() : 0;
}

} // namespace Flow2Store
