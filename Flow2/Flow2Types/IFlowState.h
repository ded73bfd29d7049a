#pragma once
// A state: an ordered collection of item handles with a time, one per frame.
//
// Records are ordered by type id, then session, tick, item id and store id. Positions are indices
// into that order, valid until the state changes.

#include "Flow2/Flow2Types/IFlowHandles.h"
#include "Flow2/Flow2Types/IFlowItemToken.h"
#include "Flow2/Flow2Types/VFlowTimestamp.h"
#include "Utils/UtilsFileSystem/IResult.h"

#include <cstddef>
#include <cstdint>
#include <vector>

namespace ZMT {

struct VFlowStateRecord {
  IFlowItemToken m_Token;
  VFlowTimestamp m_Time;
  IFlowItemHandle m_Item;
};

using VRecordPosition = std::size_t;
using VTypeIds = std::vector<std::uint32_t>;
using VTokens = std::vector<IFlowItemToken>;
using VItemHandles = std::vector<IFlowItemHandle>;

class IFlowStateFactory;

class IFlowState {
public:
  virtual void Assign(const IFlowState& other) = 0;

  virtual const VFlowTimestamp& GetTime() const = 0;
  /// A new session clears every record; in the same session only records overlapping the new time
  /// stay.
  virtual void SetTime(const VFlowTimestamp& time) = 0;
  virtual const VFlowTimestamp& GetPeriodicReference() const = 0;
  /// The tick is reduced into [0, period) when the period isn't zero.
  virtual void SetPeriodicReference(const VFlowTimestamp& time) = 0;
  virtual const VFlowTimestamp& GetAbsoluteReference() const = 0;
  virtual void SetAbsoluteReference(const VFlowTimestamp& time) = 0;
  virtual void ShiftTime(std::int64_t delta, bool shiftPeriodic, bool shiftAbsolute) = 0;

  virtual std::size_t GetItemCount() const = 0;
  virtual std::size_t GetCapacity() const = 0;

  virtual VRecordPosition Begin() const = 0;
  virtual VRecordPosition End() const = 0;
  /// First record of the type.
  virtual VRecordPosition LowerBound(std::uint32_t typeId) const = 0;
  /// Past the last record of the type.
  virtual VRecordPosition UpperBound(std::uint32_t typeId) const = 0;
  /// First record of the type whose time matches; UpperBound(typeId) if none.
  virtual VRecordPosition LowerBound(std::uint32_t typeId, EMatch match,
                                     const VFlowTimestamp& time) const = 0;
  virtual const VFlowStateRecord& GetRecord(VRecordPosition position) const = 0;

  virtual std::size_t GetItems(VItemHandles& o_rItems, std::uint32_t typeId, EMatch match,
                               const VFlowTimestamp& time) const = 0;
  virtual std::size_t GetItems(VItemHandles& o_rItems, std::uint32_t typeId,
                               EMatch match) const = 0;
  /// The first match; false, leaving the handle alone, if none.
  virtual bool GetItem(IFlowItemHandle& o_rItem, std::uint32_t typeId, EMatch match,
                       const VFlowTimestamp& time) const = 0;
  virtual bool GetItem(IFlowItemHandle& o_rItem, std::uint32_t typeId, EMatch match) const = 0;
  virtual std::size_t CountItems(std::uint32_t typeId, EMatch match,
                                 const VFlowTimestamp& time) const = 0;
  virtual std::size_t CountItems(std::uint32_t typeId, EMatch match) const = 0;

  /// Records of the state's session starting before its tick.
  virtual std::size_t GetBeforeCount() const = 0;
  /// Records of the state's session ending after its end.
  virtual std::size_t GetAfterCount() const = 0;

  virtual void Clear() = 0;
  virtual void Erase(VRecordPosition first, VRecordPosition last) = 0;
  virtual void Erase(VRecordPosition position) = 0;
  /// Puts another item of the same token in a record; false if the tokens differ.
  virtual bool Replace(VRecordPosition position, const IFlowItemHandle& item) = 0;

  virtual std::size_t GetItems(VItemHandles& o_rItems, const VTypeIds& typeIds, EMatch match,
                               const VFlowTimestamp& time) const = 0;
  virtual std::size_t GetItems(VItemHandles& o_rItems, const VTypeIds& typeIds,
                               EMatch match) const = 0;
  virtual std::size_t CountItems(const VTypeIds& typeIds, EMatch match,
                                 const VFlowTimestamp& time) const = 0;
  virtual std::size_t CountItems(const VTypeIds& typeIds, EMatch match) const = 0;
  /// Handles of the records with these tokens, in record order.
  virtual std::size_t GetItems(VItemHandles& o_rItems, const VTokens& tokens) const = 0;
  virtual std::size_t CountItems(const VTokens& tokens) const = 0;
  virtual std::size_t EraseTokens(const VTokens& tokens) = 0;
  virtual std::size_t RetainTokens(const VTokens& tokens) = 0;

  virtual bool FindToken(const IFlowItemToken& token, VFlowTimestamp& o_rTime) const = 0;

  /// Sorted, without duplicates.
  virtual void GetTokens(VTokens& o_rTokens, std::uint32_t typeId, EMatch match,
                         const VFlowTimestamp& time) const = 0;
  virtual void GetTokens(VTokens& o_rTokens, std::uint32_t typeId, EMatch match) const = 0;
  virtual void GetTokens(VTokens& o_rTokens) const = 0;

  /// The forms with a time add nothing and return false unless it overlaps the state's time.
  virtual bool AddItems(const VItemHandles& items, const VFlowTimestamp& time) = 0;
  virtual void AddItems(const VItemHandles& items) = 0;
  /// Moves the handles in at the state's time; the vector is left empty, its capacity kept.
  virtual void AddItems(VItemHandles&& io_rItems) = 0;
  virtual bool AddItem(const IFlowItemHandle& item, const VFlowTimestamp& time,
                       VRecordPosition& o_rPosition) = 0;
  virtual void AddItem(const IFlowItemHandle& item, VRecordPosition& o_rPosition) = 0;
  virtual bool AddItem(const IFlowItemHandle& item, const VFlowTimestamp& time) = 0;
  virtual void AddItem(const IFlowItemHandle& item) = 0;

  virtual std::size_t RemoveType(std::uint32_t typeId) = 0;
  virtual std::size_t RemoveType(std::uint32_t typeId, EMatch match,
                                 const VFlowTimestamp& time) = 0;
  virtual std::size_t RemoveTypes(const VTypeIds& typeIds) = 0;
  virtual std::size_t RetainTypes(const VTypeIds& typeIds) = 0;
  virtual std::size_t RemoveMatching(EMatch match, const VFlowTimestamp& time) = 0;
  virtual std::size_t RemoveMatching(EMatch match) = 0;
  virtual std::size_t RetainMatching(EMatch match, const VFlowTimestamp& time) = 0;
  virtual std::size_t RetainMatching(EMatch match) = 0;

  /// Copies from a state of equal time; false, changing nothing, if the times differ.
  virtual bool CopyFrom(const IFlowState& other) = 0;
  virtual bool CopyTypes(const IFlowState& other, const VTypeIds& typeIds) = 0;
  virtual bool CopyType(const IFlowState& other, std::uint32_t typeId, EMatch match) = 0;
  virtual bool CopyMatching(const IFlowState& other, EMatch match) = 0;
  virtual void CopyTime(const IFlowState& other) = 0;
  /// Merges a state of the same session overlapping in time, keeping records already present;
  /// false otherwise.
  virtual bool Merge(const IFlowState& other) = 0;
  virtual void Reserve(std::size_t count) = 0;
  virtual IFlowStateFactory* GetFactory() const = 0;
  virtual void ShiftSession(std::int32_t delta) = 0;
  /// Increments with every change.
  virtual std::uint64_t GetRevision() const = 0;

  virtual void AddReference() = 0;
  virtual void DropReference() = 0;
  virtual std::uint32_t GetReferenceCount() const = 0;
  virtual ~IFlowState() = default;
};

class IFlowStateFactory {
public:
  virtual IResult CreateState(IFlowStateHandle& o_rState, const VFlowTimestamp& time,
                              const VFlowTimestamp& periodic, const VFlowTimestamp& absolute) = 0;
  virtual IResult CreateStateCopy(IFlowStateHandle& o_rState, const IFlowState& source) = 0;
  virtual void AddReference() = 0;
  virtual void DropReference() = 0;
  virtual ~IFlowStateFactory() = default;
};

} // namespace ZMT
