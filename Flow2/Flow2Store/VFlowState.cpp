#include "Flow2/Flow2Store/VFlowState.h"

#include "Flow2/Flow2Store/VFlowStateFactory.h"
#include "Flow2/Flow2Store/VItemStoreBase.h"

#include <algorithm>
#include <tuple>
#include <typeinfo>

namespace Flow2Store {

using ZMT::EMatch;
using ZMT::IFlowItemHandle;
using ZMT::IFlowItemToken;
using ZMT::VFlowStateRecord;
using ZMT::VFlowTimestamp;
using ZMT::VRecordPosition;

namespace {

auto Key(const VFlowStateRecord& record) {
  return std::make_tuple(record.m_Token.m_TypeId, record.m_Time.m_Session, record.m_Time.m_Tick,
                         record.m_Token.m_ItemId, record.m_Token.m_FlowStoreId);
}

bool RecordLess(const VFlowStateRecord& a, const VFlowStateRecord& b) {
  // The order of Key, spelled out: this runs for every record added.
  if (a.m_Token.m_TypeId != b.m_Token.m_TypeId) return a.m_Token.m_TypeId < b.m_Token.m_TypeId;
  if (a.m_Time.m_Session != b.m_Time.m_Session) return a.m_Time.m_Session < b.m_Time.m_Session;
  if (a.m_Time.m_Tick != b.m_Time.m_Tick) return a.m_Time.m_Tick < b.m_Time.m_Tick;
  if (a.m_Token.m_ItemId != b.m_Token.m_ItemId) return a.m_Token.m_ItemId < b.m_Token.m_ItemId;
  return a.m_Token.m_FlowStoreId < b.m_Token.m_FlowStoreId;
}

bool TokenLess(const IFlowItemToken& a, const IFlowItemToken& b) {
  return std::tie(a.m_TypeId, a.m_ItemId, a.m_FlowStoreId) <
         std::tie(b.m_TypeId, b.m_ItemId, b.m_FlowStoreId);
}

bool Contains(const ZMT::VTypeIds& typeIds, std::uint32_t typeId) {
  return std::find(typeIds.begin(), typeIds.end(), typeId) != typeIds.end();
}

bool Contains(const ZMT::VTokens& tokens, const IFlowItemToken& token) {
  return std::find(tokens.begin(), tokens.end(), token) != tokens.end();
}

void SortUnique(ZMT::VTokens& io_rTokens) {
  std::sort(io_rTokens.begin(), io_rTokens.end(), TokenLess);
  io_rTokens.erase(std::unique(io_rTokens.begin(), io_rTokens.end()), io_rTokens.end());
}

std::int64_t WrapTick(std::int64_t tick, std::uint64_t period) {
  if (period == 0) return tick;
  const auto p = static_cast<std::int64_t>(period);
  const std::int64_t r = tick % p;
  return r < 0 ? r + p : r;
}

} // namespace

void VFlowState::Count(const VFlowStateRecord& record, int sign) {
  if (record.m_Time.m_Session != m_Time.m_Session) return;
  if (record.m_Time.m_Tick < m_Time.m_Tick) m_BeforeCount += sign;
  const std::int64_t end = record.m_Time.m_Tick + static_cast<std::int64_t>(record.m_Time.m_Period);
  if (end > m_Time.m_Tick + static_cast<std::int64_t>(m_Time.m_Period)) m_AfterCount += sign;
}

void VFlowState::Recount() {
  m_BeforeCount = m_AfterCount = 0;
  for (const VFlowStateRecord& record : m_Records)
    Count(record, 1);
}

std::pair<std::size_t, std::size_t> VFlowState::TypeRange(std::uint32_t typeId) const {
  auto first = std::partition_point(m_Records.begin(), m_Records.end(), [&](const auto& record) {
    return record.m_Token.m_TypeId < typeId;
  });
  auto last = std::partition_point(first, m_Records.end(), [&](const auto& record) {
    return record.m_Token.m_TypeId == typeId;
  });
  return {static_cast<std::size_t>(first - m_Records.begin()),
          static_cast<std::size_t>(last - m_Records.begin())};
}

void VFlowState::Reset(const VFlowTimestamp& time, const VFlowTimestamp& periodic,
                       const VFlowTimestamp& absolute) {
  Clear();
  m_Time = time;
  SetPeriodicReference(periodic);
  m_AbsoluteReference = absolute;
  m_RefCount.store(0, std::memory_order_relaxed);
}

void VFlowState::Assign(const ZMT::IFlowState& other) {
  if (&other == this) return;
  m_Time = other.GetTime();
  m_PeriodicReference = other.GetPeriodicReference();
  m_AbsoluteReference = other.GetAbsoluteReference();
  if (auto* pOther = dynamic_cast<const VFlowState*>(&other)) {
    m_Records = pOther->m_Records;
    m_BeforeCount = pOther->m_BeforeCount;
    m_AfterCount = pOther->m_AfterCount;
  } else {
    m_Records.clear();
    for (VRecordPosition i = other.Begin(); i != other.End(); ++i)
      m_Records.push_back(other.GetRecord(i));
    Recount();
  }
  ++m_Revision;
}

void VFlowState::SetTime(const VFlowTimestamp& time) {
  if (time.m_Session != m_Time.m_Session)
    m_Records.clear();
  else
    std::erase_if(m_Records, [&](const auto& record) {
      return !ZMT::Matches(record.m_Time, EMatch::Overlap, time);
    });
  m_Time = time;
  Recount();
  ++m_Revision;
}

void VFlowState::SetPeriodicReference(const VFlowTimestamp& time) {
  m_PeriodicReference = time;
  m_PeriodicReference.m_Tick = WrapTick(time.m_Tick, time.m_Period);
  ++m_Revision;
}

void VFlowState::SetAbsoluteReference(const VFlowTimestamp& time) {
  m_AbsoluteReference = time;
  ++m_Revision;
}

void VFlowState::ShiftTime(std::int64_t delta, bool shiftPeriodic, bool shiftAbsolute) {
  for (VFlowStateRecord& record : m_Records)
    record.m_Time.m_Tick += delta;
  m_Time.m_Tick += delta;
  if (shiftPeriodic && !m_PeriodicReference.IsEmpty())
    m_PeriodicReference.m_Tick =
        WrapTick(m_PeriodicReference.m_Tick + delta, m_PeriodicReference.m_Period);
  if (shiftAbsolute && !m_AbsoluteReference.IsEmpty()) m_AbsoluteReference.m_Tick += delta;
  ++m_Revision;
}

VRecordPosition VFlowState::LowerBound(std::uint32_t typeId) const {
  return TypeRange(typeId).first;
}

VRecordPosition VFlowState::UpperBound(std::uint32_t typeId) const {
  return TypeRange(typeId).second;
}

VRecordPosition VFlowState::LowerBound(std::uint32_t typeId, EMatch match,
                                       const VFlowTimestamp& time) const {
  const auto [first, last] = TypeRange(typeId);
  for (std::size_t i = first; i < last; ++i)
    if (ZMT::Matches(m_Records[i].m_Time, match, time)) return i;
  return last;
}

std::size_t VFlowState::GetItems(ZMT::VItemHandles& o_rItems, std::uint32_t typeId, EMatch match,
                                 const VFlowTimestamp& time) const {
  o_rItems.clear();
  const auto [first, last] = TypeRange(typeId);
  for (std::size_t i = first; i < last; ++i)
    if (ZMT::Matches(m_Records[i].m_Time, match, time)) o_rItems.push_back(m_Records[i].m_Item);
  return o_rItems.size();
}

bool VFlowState::GetItem(IFlowItemHandle& o_rItem, std::uint32_t typeId, EMatch match,
                         const VFlowTimestamp& time) const {
  const VRecordPosition position = LowerBound(typeId, match, time);
  if (position == UpperBound(typeId)) return false;
  o_rItem = m_Records[position].m_Item;
  return true;
}

std::size_t VFlowState::CountItems(std::uint32_t typeId, EMatch match,
                                   const VFlowTimestamp& time) const {
  const auto [first, last] = TypeRange(typeId);
  std::size_t count = 0;
  for (std::size_t i = first; i < last; ++i)
    count += ZMT::Matches(m_Records[i].m_Time, match, time) ? 1 : 0;
  return count;
}

void VFlowState::Clear() {
  if (m_Records.empty()) return;
  ReleaseHandles();
  m_Records.clear();
  m_BeforeCount = m_AfterCount = 0;
  ++m_Revision;
}

void VFlowState::Erase(VRecordPosition first, VRecordPosition last) {
  last = std::min(last, m_Records.size());
  if (first >= last) return;
  for (std::size_t i = first; i < last; ++i)
    Count(m_Records[i], -1);
  m_Records.erase(m_Records.begin() + first, m_Records.begin() + last);
  ++m_Revision;
}

bool VFlowState::Replace(VRecordPosition position, const IFlowItemHandle& item) {
  if (position >= m_Records.size() || !item) return false;
  if (item.GetToken() == m_Records[position].m_Token) {
    m_Records[position].m_Item = item;
    ++m_Revision;
    return true;
  }
  const VFlowTimestamp time = m_Records[position].m_Time;
  Erase(position);
  Insert(item, time);
  return true;
}

std::size_t VFlowState::GetItems(ZMT::VItemHandles& o_rItems, const ZMT::VTypeIds& typeIds,
                                 EMatch match, const VFlowTimestamp& time) const {
  o_rItems.clear();
  for (const VFlowStateRecord& record : m_Records)
    if (Contains(typeIds, record.m_Token.m_TypeId) && ZMT::Matches(record.m_Time, match, time))
      o_rItems.push_back(record.m_Item);
  return o_rItems.size();
}

std::size_t VFlowState::CountItems(const ZMT::VTypeIds& typeIds, EMatch match,
                                   const VFlowTimestamp& time) const {
  return std::count_if(m_Records.begin(), m_Records.end(), [&](const auto& record) {
    return Contains(typeIds, record.m_Token.m_TypeId) && ZMT::Matches(record.m_Time, match, time);
  });
}

std::size_t VFlowState::GetItems(ZMT::VItemHandles& o_rItems, const ZMT::VTokens& tokens) const {
  o_rItems.clear();
  for (const VFlowStateRecord& record : m_Records)
    if (Contains(tokens, record.m_Token)) o_rItems.push_back(record.m_Item);
  return o_rItems.size();
}

std::size_t VFlowState::CountItems(const ZMT::VTokens& tokens) const {
  return std::count_if(m_Records.begin(), m_Records.end(),
                       [&](const auto& record) { return Contains(tokens, record.m_Token); });
}

template <class P> std::size_t VFlowState::EraseIf(P pick) {
  std::size_t removed = 0;
  std::erase_if(m_Records, [&](const VFlowStateRecord& record) {
    if (!pick(record)) return false;
    Count(record, -1);
    ++removed;
    return true;
  });
  if (removed) ++m_Revision;
  return removed;
}

std::size_t VFlowState::EraseTokens(const ZMT::VTokens& tokens) {
  return EraseIf([&](const auto& record) { return Contains(tokens, record.m_Token); });
}

std::size_t VFlowState::RetainTokens(const ZMT::VTokens& tokens) {
  return EraseIf([&](const auto& record) { return !Contains(tokens, record.m_Token); });
}

bool VFlowState::FindToken(const IFlowItemToken& token, VFlowTimestamp& o_rTime) const {
  const auto [first, last] = TypeRange(token.m_TypeId);
  for (std::size_t i = first; i < last; ++i)
    if (m_Records[i].m_Token == token) {
      o_rTime = m_Records[i].m_Time;
      return true;
    }
  return false;
}

void VFlowState::GetTokens(ZMT::VTokens& o_rTokens, std::uint32_t typeId, EMatch match,
                           const VFlowTimestamp& time) const {
  o_rTokens.clear();
  const auto [first, last] = TypeRange(typeId);
  for (std::size_t i = first; i < last; ++i)
    if (ZMT::Matches(m_Records[i].m_Time, match, time)) o_rTokens.push_back(m_Records[i].m_Token);
  SortUnique(o_rTokens);
}

void VFlowState::GetTokens(ZMT::VTokens& o_rTokens) const {
  o_rTokens.clear();
  for (const VFlowStateRecord& record : m_Records)
    o_rTokens.push_back(record.m_Token);
  SortUnique(o_rTokens);
}

VRecordPosition VFlowState::Insert(const IFlowItemHandle& item, const VFlowTimestamp& time) {
  IFlowItemHandle copy = item;
  return Insert(std::move(copy), time);
}

VRecordPosition VFlowState::Insert(IFlowItemHandle&& io_rItem, const VFlowTimestamp& time) {
  VFlowStateRecord probe{io_rItem.GetEntry()->m_Token, time, {}};
  ++m_Revision;
  // Frames mostly arrive in order: appending needs no search.
  if (m_Records.empty() || RecordLess(m_Records.back(), probe)) {
    probe.m_Item = std::move(io_rItem);
    Count(m_Records.emplace_back(std::move(probe)), 1);
    return m_Records.size() - 1;
  }
  auto it = std::lower_bound(m_Records.begin(), m_Records.end(), probe, RecordLess);
  if (it != m_Records.end() && Key(*it) == Key(probe)) {
    --m_Revision;
    return it - m_Records.begin();
  }
  probe.m_Item = std::move(io_rItem);
  it = m_Records.insert(it, std::move(probe));
  Count(*it, 1);
  return it - m_Records.begin();
}

void VFlowState::ReleaseHandles() {
  constexpr std::size_t BatchSize = 64;
  VFlowStoreEntry* batch[BatchSize];
  std::size_t count = 0;
  auto flush = [&] {
    if (count) batch[0]->m_pStore->ReleaseEntries(batch, count);
    count = 0;
  };
  for (VFlowStateRecord& record : m_Records) {
    ZMT::IFlowStoreEntry* pEntry = record.m_Item.Detach();
    if (!pEntry || !ZMT::Detail::DropExtraOwner(pEntry->m_RefCount)) continue;
    if (typeid(*pEntry) != typeid(VFlowStoreEntry)) {
      pEntry->Release();
      continue;
    }
    auto* pStoreEntry = static_cast<VFlowStoreEntry*>(pEntry);
    if (count == BatchSize || (count && batch[0]->m_pStore != pStoreEntry->m_pStore)) flush();
    batch[count++] = pStoreEntry;
  }
  flush();
}

bool VFlowState::AddItems(const ZMT::VItemHandles& items, const VFlowTimestamp& time) {
  if (!ZMT::Matches(time, EMatch::Overlap, m_Time)) return false;
  for (const IFlowItemHandle& item : items)
    if (item) Insert(item, time);
  return true;
}

void VFlowState::AddItems(const ZMT::VItemHandles& items) {
  for (const IFlowItemHandle& item : items)
    if (item) Insert(item, m_Time);
}

void VFlowState::AddItems(ZMT::VItemHandles&& io_rItems) {
  m_Records.reserve(m_Records.size() + io_rItems.size());
  for (IFlowItemHandle& item : io_rItems)
    if (item) Insert(std::move(item), m_Time);
  io_rItems.clear();
}

bool VFlowState::AddItem(const IFlowItemHandle& item, const VFlowTimestamp& time,
                         VRecordPosition& o_rPosition) {
  if (!ZMT::Matches(time, EMatch::Overlap, m_Time)) return false;
  o_rPosition = item ? Insert(item, time) : End();
  return true;
}

void VFlowState::AddItem(const IFlowItemHandle& item, VRecordPosition& o_rPosition) {
  o_rPosition = item ? Insert(item, m_Time) : End();
}

bool VFlowState::AddItem(const IFlowItemHandle& item, const VFlowTimestamp& time) {
  if (!ZMT::Matches(time, EMatch::Overlap, m_Time)) return false;
  if (item) Insert(item, time);
  return true;
}

void VFlowState::AddItem(const IFlowItemHandle& item) {
  if (item) Insert(item, m_Time);
}

std::size_t VFlowState::RemoveType(std::uint32_t typeId) {
  const auto [first, last] = TypeRange(typeId);
  Erase(first, last);
  return last - first;
}

std::size_t VFlowState::RemoveType(std::uint32_t typeId, EMatch match, const VFlowTimestamp& time) {
  return EraseIf([&](const auto& record) {
    return record.m_Token.m_TypeId == typeId && ZMT::Matches(record.m_Time, match, time);
  });
}

std::size_t VFlowState::RemoveTypes(const ZMT::VTypeIds& typeIds) {
  return EraseIf([&](const auto& record) { return Contains(typeIds, record.m_Token.m_TypeId); });
}

std::size_t VFlowState::RetainTypes(const ZMT::VTypeIds& typeIds) {
  return EraseIf([&](const auto& record) { return !Contains(typeIds, record.m_Token.m_TypeId); });
}

std::size_t VFlowState::RemoveMatching(EMatch match, const VFlowTimestamp& time) {
  return EraseIf([&](const auto& record) { return ZMT::Matches(record.m_Time, match, time); });
}

std::size_t VFlowState::RetainMatching(EMatch match, const VFlowTimestamp& time) {
  return EraseIf([&](const auto& record) { return !ZMT::Matches(record.m_Time, match, time); });
}

template <class P> void VFlowState::CopyIf(const ZMT::IFlowState& other, P pick) {
  if (&other == this) return;
  for (VRecordPosition i = other.Begin(); i != other.End(); ++i) {
    const VFlowStateRecord& record = other.GetRecord(i);
    if (pick(record)) Insert(record.m_Item, record.m_Time);
  }
}

bool VFlowState::CopyFrom(const ZMT::IFlowState& other) {
  if (!(other.GetTime() == m_Time)) return false;
  CopyIf(other, [](const auto&) { return true; });
  return true;
}

bool VFlowState::CopyTypes(const ZMT::IFlowState& other, const ZMT::VTypeIds& typeIds) {
  if (!(other.GetTime() == m_Time)) return false;
  CopyIf(other, [&](const auto& record) { return Contains(typeIds, record.m_Token.m_TypeId); });
  return true;
}

bool VFlowState::CopyType(const ZMT::IFlowState& other, std::uint32_t typeId, EMatch match) {
  if (!(other.GetTime() == m_Time)) return false;
  CopyIf(other, [&](const auto& record) {
    return record.m_Token.m_TypeId == typeId && ZMT::Matches(record.m_Time, match, m_Time);
  });
  return true;
}

bool VFlowState::CopyMatching(const ZMT::IFlowState& other, EMatch match) {
  if (!(other.GetTime() == m_Time)) return false;
  CopyIf(other, [&](const auto& record) { return ZMT::Matches(record.m_Time, match, m_Time); });
  return true;
}

void VFlowState::CopyTime(const ZMT::IFlowState& other) {
  SetTime(other.GetTime());
  m_PeriodicReference = other.GetPeriodicReference();
  m_AbsoluteReference = other.GetAbsoluteReference();
}

bool VFlowState::Merge(const ZMT::IFlowState& other) {
  if (&other == this) return true;
  if (!ZMT::Matches(other.GetTime(), EMatch::Overlap, m_Time)) return false;
  m_Scratch.clear();
  m_Scratch.reserve(m_Records.size() + other.GetItemCount());
  std::size_t mine = 0;
  VRecordPosition theirs = other.Begin();
  while (mine < m_Records.size() || theirs != other.End()) {
    if (theirs == other.End()) {
      m_Scratch.push_back(std::move(m_Records[mine++]));
    } else if (mine == m_Records.size()) {
      m_Scratch.push_back(other.GetRecord(theirs++));
    } else {
      const VFlowStateRecord& record = other.GetRecord(theirs);
      if (RecordLess(record, m_Records[mine])) {
        m_Scratch.push_back(record);
        ++theirs;
      } else {
        if (Key(record) == Key(m_Records[mine])) ++theirs; // keep the record present
        m_Scratch.push_back(std::move(m_Records[mine++]));
      }
    }
  }
  m_Records.swap(m_Scratch);
  m_Scratch.clear();
  Recount();
  ++m_Revision;
  return true;
}

void VFlowState::Reserve(std::size_t count) {
  m_Records.reserve(count);
}

ZMT::IFlowStateFactory* VFlowState::GetFactory() const {
  return m_pFactory;
}

void VFlowState::ShiftSession(std::int32_t delta) {
  auto shift = [delta](VFlowTimestamp& time) {
    if (!time.IsEmpty()) time.m_Session += static_cast<std::uint32_t>(delta);
  };
  shift(m_Time);
  shift(m_PeriodicReference);
  shift(m_AbsoluteReference);
  for (VFlowStateRecord& record : m_Records)
    shift(record.m_Time);
  std::sort(m_Records.begin(), m_Records.end(), RecordLess);
  Recount();
  ++m_Revision;
}

void VFlowState::DropReference() {
  if (!ZMT::Detail::DropExtraOwner(m_RefCount)) return;
  if (m_pFactory)
    m_pFactory->ReturnState(this);
  else
    delete this;
}

} // namespace Flow2Store
