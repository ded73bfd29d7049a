#pragma once
// Writes a Flow recording as a chunked file: a header, type definitions, static items, one group
// of chunks per state, and index chunks linked through the file for seeking by time.
//
// Each chunk is assembled in pooled pages and reaches the stream in one gather write; nothing is
// rewritten afterwards except the link field of an index or table chunk, patched when its
// successor is written (only on a seekable stream). One thread drives a writer.

#include "Flow2/Flow2File/FlowFileFormat.h"
#include "Flow2/Flow2File/VItemPositionStore.h"
#include "Flow2/Flow2Store/VFlowStreams.h"
#include "Flow2/Flow2Types/IFlowBuffer.h"
#include "Flow2/Flow2Types/IFlowState.h"
#include "Flow2/Flow2Types/IFlowStore.h"

#include <cstdint>
#include <map>
#include <set>
#include <unordered_map>
#include <unordered_set>
#include <vector>

namespace Flow2File {

class VWriter {
public:
  /// With a store, items of types unknown here can be written. Items serialise themselves into the
  /// writer's pages (a shared buffer an item writes passes by reference).
  explicit VWriter(ZMT::IFlowBufferFactoryHandle buffers, ZMT::IFlowStoreHandle store = {});
  /// With a store: take item bodies from the store's cached bytes (made once per item and kept on
  /// its entry), linked in by reference. Worth it when items go to several files; each body then
  /// takes a page of its own, which makes a state of small items slower to write. The file is the
  /// same either way.
  void SetUseStoreBuffers(bool use);
  /// Closes, swallowing any failure.
  ~VWriter();
  VWriter(const VWriter&) = delete;
  VWriter& operator=(const VWriter&) = delete;

  /// Writes the file header and the two empty tables whose links the index grows from.
  ZMT::IResult Open(ZMT::IOutputStreamSeekable* i_pStream);
  /// A stream that can't seek gets the file header only: no index, tables or closing chunks.
  ZMT::IResult Open(ZMT::IOutputStream* i_pStream);
  /// Added to every state's session and tick from now on.
  ZMT::IResult SetOffsets(std::uint32_t session, std::int64_t tick);
  /// One state: its header and its items in groups, an item already in the file by reference.
  /// OkButPartial when items of a type that can't be written were left out.
  ZMT::IResult WriteState(const ZMT::IFlowState& state);
  /// Items outside any state, each once unless `force`.
  ZMT::IResult WriteItems(const std::vector<ZMT::IFlowItemHandle>& items, bool force);
  /// Checks and records a state's time; writes index chunks as sessions start and lists fill.
  ZMT::IResult UpdateTime(const ZMT::VFlowTimestamp& time, const ZMT::VFlowTimestamp& periodic,
                          const ZMT::VFlowTimestamp& absolute);
  /// Writes the closing index and tables (seekable stream) and forgets the stream.
  ZMT::IResult Close();

  bool IsOpen() const { return m_pSeekable || m_pPlain; }
  /// Bytes written since Open.
  std::uint64_t GetPosition() const { return m_Position; }

private:
  struct VSession {
    std::uint32_t m_Session = 0;
    std::uint64_t m_Period = 0;
    std::int64_t m_FirstTick = 0;
    ZMT::VFlowTimestamp m_Periodic;
    ZMT::VFlowTimestamp m_Absolute;
  };
  struct VPendingGroup {
    bool m_Active = false;
    std::uint32_t m_FileTypeId = 0;
    std::uint64_t m_FlowStoreId = 0;
    ZMT::VFlowTimestamp m_Time;
    bool m_ByReference = false;
    std::uint32_t m_Count = 0;
    /// The bodies' size when the group's type has a fixed layout, 0 when not; asked of the first
    /// item (one store's items of one type are of one class).
    std::uint64_t m_FixedSize = UnknownSize;
  };
  static constexpr std::uint64_t UnknownSize = ~std::uint64_t(0);

  ZMT::IOutputStream* Stream() const;
  ZMT::IResult OpenCommon(std::uint64_t start);
  /// Starts a chunk in m_Chunk. FinishChunk writes it in one gather write, followed by `extra`
  /// pieces of `extraSize` bytes, which belong to its payload when `extraInPayload`.
  bool BeginChunk(EChunkType type, std::uint16_t flags);
  ZMT::IResult FinishChunk(const ZMT::VGatherList* i_pExtra = nullptr, std::uint64_t extraSize = 0,
                           bool extraInPayload = false);
  ZMT::IResult WriteGather(const ZMT::VGatherList& pieces, std::uint64_t total);
  ZMT::IResult Patch(std::uint64_t chunkPosition, std::uint64_t link);
  ZMT::IResult WriteSessionIndex();
  ZMT::IResult WriteTable(EChunkType type, std::vector<std::uint64_t>& io_rPending,
                          std::uint64_t& io_rLast);
  ZMT::IResult WriteTypeDefinition(const ZMT::IFlowItem& item, std::uint32_t fileTypeId);
  /// The file type id of a record's type, writing its definition first; false in
  /// o_rWritten when the type is left out.
  ZMT::IResult EnsureType(const ZMT::IFlowItemHandle& item, bool& o_rWritten,
                          std::uint32_t& o_rFileTypeId);
  /// Appends an item body (ItemData chunk) to the pending group.
  ZMT::IResult AddBody(const ZMT::IFlowItemHandle& item);
  /// The bytes of an item body: by reference from the store, or serialised into m_Bodies.
  ZMT::IResult BodyPieces(const ZMT::IFlowItemHandle& item, ZMT::VGatherList& o_rPieces,
                          std::uint64_t& o_rSize, bool& o_rShared);
  ZMT::IResult FlushGroup();
  void Reset();

  ZMT::IFlowStoreHandle m_Store;
  ZMT::IFlowBufferFactoryHandle m_Buffers;
  ZMT::IOutputStreamSeekable* m_pSeekable = nullptr;
  ZMT::IOutputStream* m_pPlain = nullptr;
  std::uint32_t m_SessionOffset = 0;
  std::int64_t m_TickOffset = 0;
  std::uint64_t m_Position = 0;
  /// Where the stream stood at Open: positions in the file count from there.
  std::uint64_t m_Start = 0;
  VSession m_Session;
  std::uint64_t m_NonEmptyStateCount = 0;
  std::uint64_t m_StateCount = 0;
  std::int64_t m_LastTick = 0;
  std::uint64_t m_LastPeriod = 0;
  std::uint32_t m_LastSession = 0;
  std::uint64_t m_LastTypeTable = 0;
  std::uint64_t m_LastItemTable = 0;
  std::uint64_t m_LastSessionIndex = 0;
  bool m_HasSessionIndex = false;
  std::vector<std::pair<std::int64_t, std::uint64_t>> m_PendingIndex;
  std::vector<std::uint64_t> m_PendingItems;
  std::vector<std::uint64_t> m_PendingTypes;
  ZMT::VGatherList m_Gather;
  std::unordered_map<std::uint32_t, std::int64_t> m_WrittenTypes;
  std::unordered_set<ZMT::IFlowItemToken> m_WrittenTokens;
  VItemPositionStore m_Positions;
  ZMT::VGatherList m_BodyGather;
  std::uint64_t m_BodyBytes = 0;
  std::uint32_t m_BodyOffset = 0;
  VPendingGroup m_Group;
  std::vector<std::uint64_t> m_GroupPositions;
  Flow2Store::VFlowOutputStream m_Chunk;
  Flow2Store::VFlowOutputStream m_Bodies;
  std::uint8_t* m_pChunkHeader = nullptr;
  bool m_UseStoreBuffers = false;
  VChunkHeader m_ChunkHeader;
};

} // namespace Flow2File
