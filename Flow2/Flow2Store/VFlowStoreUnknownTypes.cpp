#include "Flow2/Flow2Store/VFlowStoreUnknownTypes.h"

#include <exception>

namespace Flow2Store {

using ZMT::IResult;

namespace {
const VUnknownTypeRecord& EmptyRecord() {
  static const VUnknownTypeRecord s_Empty;
  return s_Empty;
}
} // namespace

const ZMT::IFlowItemTypeInfo& VUnknownFlowItem::GetInfo() const {
  return (m_pRecord ? *m_pRecord : EmptyRecord()).m_TypeInfo;
}

const ZMT::ISchema& VUnknownFlowItem::GetSchema() const {
  return (m_pRecord ? *m_pRecord : EmptyRecord()).m_Schema;
}

bool VUnknownFlowItem::Write(ZMT::IOutputStream& io_rStream) const {
  for (const ZMT::IFlowBufferConst* pPage = m_pBytes; pPage; pPage = pPage->GetNext())
    if (pPage->GetSize() > 0 && !io_rStream.Write(pPage->GetData(), pPage->GetSize())) return false;
  return true;
}

VFlowStoreUnknownTypes::VFlowStoreUnknownTypes(ZMT::IFlowStore* i_pOwner)
    : VItemStoreBase(nullptr, i_pOwner, "Unknown") {}

std::uint32_t VFlowStoreUnknownTypes::LocalTypeId(const ZMT::IFlowItemTypeInfo& type) {
  std::uint32_t seed = 0;
  seed = ZMT::Detail::HashCombine32(seed, type.m_TypeId);
  seed = ZMT::Detail::HashCombine32(seed, type.m_Version.m_Major);
  seed = ZMT::Detail::HashCombine32(seed, type.m_Version.m_Minor);
  seed = ZMT::Detail::HashCombine32(seed, type.m_Version.m_Patch);
  return seed | 0x80000000u;
}

IResult VFlowStoreUnknownTypes::RegisterType(const ZMT::IFlowItemTypeInfo& type,
                                             const ZMT::ISchema& schema, std::uint32_t& o_rTypeId) {
  const std::uint32_t typeId = LocalTypeId(type);
  std::lock_guard<std::mutex> lock(m_TypesMutex);
  auto it = m_Types.find(typeId);
  if (it == m_Types.end()) {
    m_Types.emplace(typeId, VUnknownTypeRecord{type, schema});
  } else {
    if (!(it->second.m_TypeInfo == type)) return IResult::Failed;
    if (!(it->second.m_Schema == schema)) return IResult::InvalidVersion;
  }
  o_rTypeId = typeId;
  return IResult::Ok;
}

const VUnknownTypeRecord* VFlowStoreUnknownTypes::FindRecord(std::uint32_t typeId) const {
  std::lock_guard<std::mutex> lock(m_TypesMutex);
  auto it = m_Types.find(typeId);
  return it == m_Types.end() ? nullptr : &it->second; // map nodes never move
}

bool VFlowStoreUnknownTypes::IsRegistered(std::uint32_t typeId) const {
  return FindRecord(typeId) != nullptr;
}

IResult VFlowStoreUnknownTypes::GetOrCreateItem(const ZMT::IFlowItemToken& token,
                                                ZMT::IFlowBufferConst* i_pBytes,
                                                ZMT::IFlowItemHandle& o_rItem) {
  const VUnknownTypeRecord* pRecord = FindRecord(token.m_TypeId);
  VFlowStoreEntry* pEntry = nullptr;
  bool found = false;
  IResult result = IResult::Ok;
  {
    std::lock_guard<std::mutex> lock(m_Mutex);
    if ((pEntry = Lookup(token))) {
      Revive(pEntry);
      found = true;
    } else if (!pRecord) {
      result = IResult::InvalidType;
    } else {
      pEntry = FreePopFront();
      if (pEntry) {
        pEntry->DropBytes();
        pEntry->m_pItem->Clear();
      } else {
        try {
          pEntry = new VFlowStoreEntry(this);
          pEntry->m_pItem = new VUnknownFlowItem();
          ++m_CreatedCount;
        } catch (const std::exception&) {
          delete pEntry;
          pEntry = nullptr;
          result = IResult::AllocationFailure;
        }
      }
      if (pEntry) {
        auto* pItem = static_cast<VUnknownFlowItem*>(pEntry->m_pItem);
        pEntry->m_pBytes = i_pBytes;
        pItem->m_pBytes = i_pBytes;
        pItem->m_pRecord = pRecord;
        pEntry->m_Token = token;
        pEntry->m_RefCount.store(0, std::memory_order_relaxed);
        Link(pEntry);
        MarkLive();
      }
    }
  }
  if (found || result.IsFailure()) i_pBytes->ReleaseChain();
  if (result.IsFailure()) return result;
  o_rItem = ZMT::IFlowItemHandle::Adopt(pEntry);
  return IResult::Ok;
}

} // namespace Flow2Store
