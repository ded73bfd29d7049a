#pragma once
// Reads a chunked Flow file back: its type definitions, an index of its states by time, the
// states with their items, and its static items.
//
// Opening follows the tables and the chain of index chunks, so that finding a state reads a
// handful of chunks however long the recording. A file that was never closed, or whose index is
// damaged, is walked chunk by chunk from where the index stops; whatever stands before damage
// still reads, and each problem is described in GetProblems. One thread drives a reader.

#include "Flow2/Flow2File/FlowFileFormat.h"
#include "Flow2/Flow2File/VKnownPositions.h"
#include "Flow2/Flow2Types/IFlowBuffer.h"
#include "Flow2/Flow2Types/IFlowState.h"
#include "Flow2/Flow2Types/IFlowStore.h"
#include "Utils/UtilsFileSystem/MemoryMappedInputStream.h"

#include <cstdint>
#include <map>
#include <string>
#include <unordered_map>
#include <vector>

namespace Flow2File {

class VReader {
public:
  struct VStateEntry {
    std::int64_t m_Tick = 0;
    std::uint64_t m_Position = 0;
    std::uint32_t m_Session = 0;
    std::uint64_t m_Period = 0;
  };
  struct VFileType {
    ZMT::IFlowItemTypeInfo m_Info;
    ZMT::ISchema m_Schema;
    /// Empty when the type can't be read here; m_ReaderResult says why.
    ZMT::IFlowItemFromBytes m_Reader;
    ZMT::IResult m_ReaderResult;
  };

  /// Items are made in `store`, their bytes taken from `buffers`, states from `states`.
  VReader(ZMT::IFlowStoreHandle store, ZMT::IFlowBufferFactoryHandle buffers,
          ZMT::IFlowStateFactoryHandle states);
  VReader(const VReader&) = delete;
  VReader& operator=(const VReader&) = delete;

  /// Reads the header, the type definitions and the index. InvalidFormat for a stream that isn't
  /// a Flow file, InvalidVersion for another major version; OkButPartial when the file is damaged
  /// or unfinished and only what stands before the damage is available.
  ZMT::IResult Open(ZMT::IInputStreamSeekable* i_pStream);
  void Close();

  /// States found, in file order.
  const std::vector<VStateEntry>& GetIndex() const { return m_Index; }
  std::size_t GetStateCount() const { return m_Index.size(); }
  /// The last state of the time's session whose tick is at or before the time's tick; NotFound
  /// when the session has none that early.
  ZMT::IResult FindState(const ZMT::VFlowTimestamp& time, std::size_t& o_rIndex) const;
  /// A state with its items. OkButPartial when some items couldn't be read (their type is
  /// unknown to the file or can't be read here, or their bytes are bad); InvalidFormat when the
  /// state's chunks are damaged, with what was read before the damage in the state.
  ZMT::IResult ReadState(std::size_t index, ZMT::IFlowStateHandle& o_rState);
  /// The items stored outside any state, in file order.
  ZMT::IResult ReadStaticItems(std::vector<ZMT::IFlowItemHandle>& o_rItems);

  const std::map<std::uint32_t, VFileType>& GetTypes() const { return m_Types; }
  const std::vector<std::string>& GetProblems() const { return m_Problems; }
  /// Chunk headers read since Open (to show that seeking doesn't walk the file).
  std::uint64_t GetChunksRead() const { return m_ChunksRead; }
  /// Whether the file was closed by its writer with its tables and index intact.
  bool IsComplete() const { return m_Complete; }

private:
  struct VSessionInfo {
    std::uint32_t m_Session = 0;
    std::uint64_t m_Period = 0;
    ZMT::VFlowTimestamp m_Periodic;
    ZMT::VFlowTimestamp m_Absolute;
  };

  bool ReadHeader(std::uint64_t position, VChunkHeader& o_rHeader);
  bool ReadPayload(std::uint64_t position, const VChunkHeader& header);
  bool ReadAt(std::uint64_t position, void* o_pData, std::uint64_t size);
  /// The bytes in place when the stream is a mapped file that holds them in one window; null
  /// otherwise. Valid until the stream is used again.
  const std::uint8_t* View(std::uint64_t position, std::uint64_t size);
  void Problem(const std::string& text) { m_Problems.push_back(text); }
  /// Follows a chain of TypeTable or ItemTable chunks from `first`.
  void ReadTableChain(std::uint64_t first, EChunkType type, std::vector<std::uint64_t>& o_rList);
  void ReadTypeDefinition(std::uint64_t position, const VChunkHeader& header);
  bool ParseSessionIndex(std::uint64_t position, const VChunkHeader& header, bool takeEntries);
  /// Walks chunks from `position` to the end, gathering what the index lacks.
  void Scan(std::uint64_t position);
  /// Makes the item of a body at `position`: from `i_pBytes` when given, else from the stream.
  ZMT::IResult ReadBody(std::uint64_t position, std::uint64_t size, const VFileType& type,
                        const ZMT::IFlowItemToken& token, ZMT::IFlowItemHandle& o_rItem,
                        const std::uint8_t* i_pBytes = nullptr);
  /// The item of an ItemData or StaticItem chunk another group refers to.
  ZMT::IResult ReadReferenced(std::uint64_t position, std::uint32_t typeId,
                              std::uint64_t flowStoreId, ZMT::IFlowItemHandle& o_rItem);
  const VFileType* Type(std::uint32_t typeId) const;

  ZMT::IFlowStoreHandle m_Store;
  ZMT::IFlowBufferFactoryHandle m_Buffers;
  ZMT::IFlowStateFactoryHandle m_States;
  ZMT::IInputStreamSeekable* m_pStream = nullptr;
  /// The same stream when it is a memory-mapped file: groups are then read in place.
  UtilsFileSystem::IInputStreamSeekableOwningAdapter<UtilsFileSystem::VMemoryMappedInputStream>*
      m_pMapped = nullptr;
  std::uint64_t m_Start = 0;
  std::uint64_t m_Size = 0;
  std::uint64_t m_ChunksRead = 0;
  bool m_Complete = false;
  std::vector<std::uint8_t> m_Payload;
  /// The item chunks of one group.
  std::vector<std::uint8_t> m_Bodies;
  /// The items of one group at the state's own time, moved into the state together.
  ZMT::VItemHandles m_GroupItems;
  std::map<std::uint32_t, VFileType> m_Types;
  std::vector<std::uint64_t> m_TypePositions;
  std::vector<std::uint64_t> m_StaticPositions;
  std::vector<VStateEntry> m_Index;
  std::vector<VSessionInfo> m_Sessions;
  VSessionInfo m_ScanSession;
  std::uint64_t m_LastIndexed = 0;
  /// Tokens of item chunks read lately, so that a reference to one finds the item in the store.
  VKnownPositions m_Known;
  std::vector<std::string> m_Problems;
};

} // namespace Flow2File
