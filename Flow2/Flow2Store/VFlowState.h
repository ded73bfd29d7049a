#pragma once
// A state: item handles in order with their times, one per frame. Not thread-safe: one thread
// fills it at a time; its handles keep the items alive.
//
// The records are one contiguous array kept in order (type id, session, tick, item id, store id).
// A frame holds tens of records, arriving mostly in order, where a sorted array beats a tree; its
// capacity survives Clear and the trip through the pool, so a warmed-up state never allocates.

#include "Flow2/Flow2Types/IFlowState.h"

#include <atomic>
#include <vector>

namespace Flow2Store {

class VFlowStateFactory;

class VFlowState final : public ZMT::IFlowState {
public:
  explicit VFlowState(VFlowStateFactory* i_pFactory) : m_pFactory(i_pFactory) {}

  void Assign(const ZMT::IFlowState& other) override;
  const ZMT::VFlowTimestamp& GetTime() const override { return m_Time; }
  void SetTime(const ZMT::VFlowTimestamp& time) override;
  const ZMT::VFlowTimestamp& GetPeriodicReference() const override { return m_PeriodicReference; }
  void SetPeriodicReference(const ZMT::VFlowTimestamp& time) override;
  const ZMT::VFlowTimestamp& GetAbsoluteReference() const override { return m_AbsoluteReference; }
  void SetAbsoluteReference(const ZMT::VFlowTimestamp& time) override;
  void ShiftTime(std::int64_t delta, bool shiftPeriodic, bool shiftAbsolute) override;

  std::size_t GetItemCount() const override { return m_Records.size(); }
  std::size_t GetCapacity() const override { return m_Records.capacity(); }

  ZMT::VRecordPosition Begin() const override { return 0; }
  ZMT::VRecordPosition End() const override { return m_Records.size(); }
  ZMT::VRecordPosition LowerBound(std::uint32_t typeId) const override;
  ZMT::VRecordPosition UpperBound(std::uint32_t typeId) const override;
  ZMT::VRecordPosition LowerBound(std::uint32_t typeId, ZMT::EMatch match,
                                  const ZMT::VFlowTimestamp& time) const override;
  const ZMT::VFlowStateRecord& GetRecord(ZMT::VRecordPosition position) const override {
    return m_Records[position];
  }

  std::size_t GetItems(ZMT::VItemHandles& o_rItems, std::uint32_t typeId, ZMT::EMatch match,
                       const ZMT::VFlowTimestamp& time) const override;
  std::size_t GetItems(ZMT::VItemHandles& o_rItems, std::uint32_t typeId,
                       ZMT::EMatch match) const override {
    return GetItems(o_rItems, typeId, match, m_Time);
  }
  bool GetItem(ZMT::IFlowItemHandle& o_rItem, std::uint32_t typeId, ZMT::EMatch match,
               const ZMT::VFlowTimestamp& time) const override;
  bool GetItem(ZMT::IFlowItemHandle& o_rItem, std::uint32_t typeId,
               ZMT::EMatch match) const override {
    return GetItem(o_rItem, typeId, match, m_Time);
  }
  std::size_t CountItems(std::uint32_t typeId, ZMT::EMatch match,
                         const ZMT::VFlowTimestamp& time) const override;
  std::size_t CountItems(std::uint32_t typeId, ZMT::EMatch match) const override {
    return CountItems(typeId, match, m_Time);
  }

  std::size_t GetBeforeCount() const override { return m_BeforeCount; }
  std::size_t GetAfterCount() const override { return m_AfterCount; }

  void Clear() override;
  void Erase(ZMT::VRecordPosition first, ZMT::VRecordPosition last) override;
  void Erase(ZMT::VRecordPosition position) override { Erase(position, position + 1); }
  bool Replace(ZMT::VRecordPosition position, const ZMT::IFlowItemHandle& item) override;

  std::size_t GetItems(ZMT::VItemHandles& o_rItems, const ZMT::VTypeIds& typeIds, ZMT::EMatch match,
                       const ZMT::VFlowTimestamp& time) const override;
  std::size_t GetItems(ZMT::VItemHandles& o_rItems, const ZMT::VTypeIds& typeIds,
                       ZMT::EMatch match) const override {
    return GetItems(o_rItems, typeIds, match, m_Time);
  }
  std::size_t CountItems(const ZMT::VTypeIds& typeIds, ZMT::EMatch match,
                         const ZMT::VFlowTimestamp& time) const override;
  std::size_t CountItems(const ZMT::VTypeIds& typeIds, ZMT::EMatch match) const override {
    return CountItems(typeIds, match, m_Time);
  }
  std::size_t GetItems(ZMT::VItemHandles& o_rItems, const ZMT::VTokens& tokens) const override;
  std::size_t CountItems(const ZMT::VTokens& tokens) const override;
  std::size_t EraseTokens(const ZMT::VTokens& tokens) override;
  std::size_t RetainTokens(const ZMT::VTokens& tokens) override;

  bool FindToken(const ZMT::IFlowItemToken& token, ZMT::VFlowTimestamp& o_rTime) const override;

  void GetTokens(ZMT::VTokens& o_rTokens, std::uint32_t typeId, ZMT::EMatch match,
                 const ZMT::VFlowTimestamp& time) const override;
  void GetTokens(ZMT::VTokens& o_rTokens, std::uint32_t typeId, ZMT::EMatch match) const override {
    GetTokens(o_rTokens, typeId, match, m_Time);
  }
  void GetTokens(ZMT::VTokens& o_rTokens) const override;

  bool AddItems(const ZMT::VItemHandles& items, const ZMT::VFlowTimestamp& time) override;
  void AddItems(const ZMT::VItemHandles& items) override;
  void AddItems(ZMT::VItemHandles&& io_rItems) override;
  bool AddItem(const ZMT::IFlowItemHandle& item, const ZMT::VFlowTimestamp& time,
               ZMT::VRecordPosition& o_rPosition) override;
  void AddItem(const ZMT::IFlowItemHandle& item, ZMT::VRecordPosition& o_rPosition) override;
  bool AddItem(const ZMT::IFlowItemHandle& item, const ZMT::VFlowTimestamp& time) override;
  void AddItem(const ZMT::IFlowItemHandle& item) override;

  std::size_t RemoveType(std::uint32_t typeId) override;
  std::size_t RemoveType(std::uint32_t typeId, ZMT::EMatch match,
                         const ZMT::VFlowTimestamp& time) override;
  std::size_t RemoveTypes(const ZMT::VTypeIds& typeIds) override;
  std::size_t RetainTypes(const ZMT::VTypeIds& typeIds) override;
  std::size_t RemoveMatching(ZMT::EMatch match, const ZMT::VFlowTimestamp& time) override;
  std::size_t RemoveMatching(ZMT::EMatch match) override { return RemoveMatching(match, m_Time); }
  std::size_t RetainMatching(ZMT::EMatch match, const ZMT::VFlowTimestamp& time) override;
  std::size_t RetainMatching(ZMT::EMatch match) override { return RetainMatching(match, m_Time); }

  bool CopyFrom(const ZMT::IFlowState& other) override;
  bool CopyTypes(const ZMT::IFlowState& other, const ZMT::VTypeIds& typeIds) override;
  bool CopyType(const ZMT::IFlowState& other, std::uint32_t typeId, ZMT::EMatch match) override;
  bool CopyMatching(const ZMT::IFlowState& other, ZMT::EMatch match) override;
  void CopyTime(const ZMT::IFlowState& other) override;
  bool Merge(const ZMT::IFlowState& other) override;
  void Reserve(std::size_t count) override;
  ZMT::IFlowStateFactory* GetFactory() const override;
  void ShiftSession(std::int32_t delta) override;
  std::uint64_t GetRevision() const override { return m_Revision; }

  void AddReference() override { m_RefCount.fetch_add(1, std::memory_order_relaxed); }
  void DropReference() override;
  std::uint32_t GetReferenceCount() const override { return m_RefCount.load(); }

  /// Back to a fresh state with these times, keeping the capacity (the factory's pool uses it).
  void Reset(const ZMT::VFlowTimestamp& time, const ZMT::VFlowTimestamp& periodic,
             const ZMT::VFlowTimestamp& absolute);

private:
  /// Inserts in order; an identical key keeps the record present. Returns its position.
  ZMT::VRecordPosition Insert(const ZMT::IFlowItemHandle& item, const ZMT::VFlowTimestamp& time);
  ZMT::VRecordPosition Insert(ZMT::IFlowItemHandle&& io_rItem, const ZMT::VFlowTimestamp& time);
  /// Drops the handles of all records, releasing entries of one type store under one lock.
  void ReleaseHandles();
  /// Removes the records the predicate picks; returns how many.
  template <class P> std::size_t EraseIf(P pick);
  /// Adds the other state's records the predicate picks, keeping records present.
  template <class P> void CopyIf(const ZMT::IFlowState& other, P pick);
  void Count(const ZMT::VFlowStateRecord& record, int sign);
  void Recount();
  std::pair<std::size_t, std::size_t> TypeRange(std::uint32_t typeId) const;

  ZMT::VFlowTimestamp m_Time;
  ZMT::VFlowTimestamp m_PeriodicReference;
  ZMT::VFlowTimestamp m_AbsoluteReference;
  VFlowStateFactory* m_pFactory;
  std::vector<ZMT::VFlowStateRecord> m_Records;
  std::vector<ZMT::VFlowStateRecord> m_Scratch;
  std::size_t m_BeforeCount = 0;
  std::size_t m_AfterCount = 0;
  std::uint64_t m_Revision = 0;
  std::atomic<std::uint32_t> m_RefCount{0};
};

} // namespace Flow2Store
