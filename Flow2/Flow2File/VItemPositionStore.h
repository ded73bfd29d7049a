#pragma once
// Where in the file each recently written item stands, so that an item repeated from state to
// state is written once and referred to by position afterwards.
//
// Positions of a state's items live as long as every following state refers to them: each type
// keeps the entries of the present state and of the one before, and an entry not referred to
// again is dropped when the next state of its type ends. Static items are kept for good.

#include "Flow2/Flow2Types/IFlowItemToken.h"

#include <cstdint>
#include <map>
#include <memory>
#include <vector>

namespace Flow2File {

class VItemPositionStore {
public:
  static constexpr std::size_t BucketCount = 2048; // a power of two
  static constexpr std::size_t BlockSize = 128;

  VItemPositionStore();
  VItemPositionStore(const VItemPositionStore&) = delete;
  VItemPositionStore& operator=(const VItemPositionStore&) = delete;

  /// The position of the token's item; an entry of an earlier state is renewed for this one.
  bool Find(const ZMT::IFlowItemToken& token, std::uint64_t& o_rPosition);
  /// A permanent record replaces the token's entry and never ages; a transient one is added
  /// unless the token has an entry already.
  void Record(const ZMT::IFlowItemToken& token, std::uint64_t position, bool permanent);
  /// Ages the entries: those of types present in the ending state that it didn't refer to go.
  void EndState();
  void Clear();
  /// Entries held (tests).
  std::size_t Size() const { return m_Size; }

private:
  static constexpr std::uint64_t Permanent = ~std::uint64_t(0);

  struct VItemPosition {
    ZMT::IFlowItemToken m_Token;
    std::uint64_t m_Position = 0;
    std::uint64_t m_Generation = 0;
    VItemPosition* m_pBucketNext = nullptr;
    /// The link that points at this entry (a bucket or the entry before), so it leaves in O(1).
    VItemPosition** m_ppBucketLink = nullptr;
    VItemPosition* m_pPrev = nullptr;
    VItemPosition* m_pNext = nullptr;
  };
  struct VList {
    VItemPosition* m_pHead = nullptr;
    bool Empty() const { return m_pHead == nullptr; }
  };
  struct VListPair {
    VList m_Current;
    VList m_Previous;
  };

  VItemPosition** Bucket(const ZMT::IFlowItemToken& token);
  VItemPosition* Allocate();
  void Recycle(VItemPosition* i_pEntry);
  static void Push(VList& io_rList, VItemPosition* i_pEntry);
  static void Unhook(VList& io_rList, VItemPosition* i_pEntry);
  void RemoveFromBucket(VItemPosition* i_pEntry);
  VListPair& Lists(std::uint32_t typeId);

  std::vector<VItemPosition*> m_Buckets;
  std::map<std::uint32_t, VListPair> m_Lists;
  VListPair* m_pLastLists = nullptr;
  std::uint32_t m_LastListsType = 0;
  std::vector<std::unique_ptr<VItemPosition[]>> m_Blocks;
  VItemPosition* m_pFree = nullptr;
  /// The bucket of the token Find missed last: a new item is looked for, then recorded.
  VItemPosition** m_ppMissBucket = nullptr;
  ZMT::IFlowItemToken m_MissToken;
  std::uint64_t m_Generation = 0;
  std::size_t m_Size = 0;
};

} // namespace Flow2File
