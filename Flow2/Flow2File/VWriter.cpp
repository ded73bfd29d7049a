#include "Flow2/Flow2File/VWriter.h"

#include "Flow2/Flow2Store/VFlowBuffers.h"

#include <cerrno>

namespace Flow2File {

using ZMT::IResult;

namespace {
constexpr std::int64_t LeftOut = -1;
} // namespace

VWriter::VWriter(ZMT::IFlowBufferFactoryHandle buffers, ZMT::IFlowStoreHandle store)
    : m_Store(std::move(store)), m_Buffers(std::move(buffers)), m_Chunk(*m_Buffers),
      m_Bodies(*m_Buffers) {}

void VWriter::SetUseStoreBuffers(bool use) {
  m_UseStoreBuffers = use && m_Store;
}

VWriter::~VWriter() {
  if (IsOpen()) Close();
}

ZMT::IOutputStream* VWriter::Stream() const {
  return m_pSeekable ? static_cast<ZMT::IOutputStream*>(m_pSeekable) : m_pPlain;
}

IResult VWriter::Open(ZMT::IOutputStreamSeekable* i_pStream) {
  if (IsOpen()) return IResult::AlreadyInProgress;
  if (!i_pStream) return IResult::InvalidPointer;
  std::uint64_t start = 0;
  if (!i_pStream->GetPosition(start)) return IResult::FileIOFailure;
  m_pSeekable = i_pStream;
  // The index waits here until a chunk of it is written: its whole length up front, so that
  // recording allocates nothing per state.
  m_PendingIndex.reserve(Format::MaxPending + 1);
  IResult result = OpenCommon(start);
  if (result.IsSuccess())
    result = WriteTable(EChunkType::TypeTable, m_PendingTypes, m_LastTypeTable);
  if (result.IsSuccess())
    result = WriteTable(EChunkType::ItemTable, m_PendingItems, m_LastItemTable);
  if (result.IsFailure()) Reset();
  return result;
}

IResult VWriter::Open(ZMT::IOutputStream* i_pStream) {
  if (IsOpen()) return IResult::AlreadyInProgress;
  if (!i_pStream) return IResult::InvalidPointer;
  m_pPlain = i_pStream;
  const IResult result = OpenCommon(0);
  if (result.IsFailure()) Reset();
  return result;
}

IResult VWriter::OpenCommon(std::uint64_t start) {
  m_Start = start;
  m_Position = 0;
  if (!BeginChunk(EChunkType::FileHeader, 0)) return IResult::AllocationFailure;
  const std::uint32_t magicSize = sizeof Format::Magic;
  const std::uint32_t fields[4] = {Format::VersionMajor, Format::VersionMinor, Format::VersionPatch,
                                   Format::TicksPerSecond};
  m_Chunk.Write(&magicSize, 4);
  m_Chunk.Write(Format::Magic, sizeof Format::Magic);
  m_Chunk.Write(fields, sizeof fields);
  return FinishChunk();
}

IResult VWriter::SetOffsets(std::uint32_t session, std::int64_t tick) {
  m_SessionOffset = session;
  m_TickOffset = tick;
  return IResult::Ok;
}

bool VWriter::BeginChunk(EChunkType type, std::uint16_t flags) {
  if (ZMT::IFlowBuffer* pOld = m_Chunk.TakeChain()) pOld->ReleaseChain();
  void* pHeader = nullptr;
  if (m_Chunk.GetScratch(pHeader, Format::ChunkHeaderSize) != Format::ChunkHeaderSize) return false;
  m_pChunkHeader = static_cast<std::uint8_t*>(pHeader);
  m_ChunkHeader.m_Type = static_cast<std::uint16_t>(type);
  m_ChunkHeader.m_Flags = flags;
  return true;
}

IResult VWriter::FinishChunk(const ZMT::VGatherList* i_pExtra, std::uint64_t extraSize,
                             bool extraInPayload) {
  if (m_Chunk.IsFailed() || !m_pChunkHeader) {
    if (ZMT::IFlowBuffer* pChain = m_Chunk.TakeChain()) pChain->ReleaseChain();
    return IResult::AllocationFailure;
  }
  const std::uint64_t chunkSize = m_Chunk.GetTotal();
  const std::uint64_t payload =
      chunkSize - Format::ChunkHeaderSize + (extraInPayload ? extraSize : 0);
  if (payload > 0xFFFFFFFFu) {
    m_Chunk.TakeChain()->ReleaseChain();
    return IResult::InvalidValue;
  }
  m_ChunkHeader.m_PayloadSize = static_cast<std::uint32_t>(payload);
  m_ChunkHeader.Encode(m_pChunkHeader);
  m_pChunkHeader = nullptr;
  m_Gather.clear();
  for (const ZMT::IFlowBufferConst* pPage = m_Chunk.Head(); pPage; pPage = pPage->GetNext())
    if (pPage->GetSize()) m_Gather.emplace_back(pPage->GetData(), pPage->GetSize());
  if (i_pExtra) m_Gather.insert(m_Gather.end(), i_pExtra->begin(), i_pExtra->end());
  const IResult result = WriteGather(m_Gather, chunkSize + extraSize);
  if (ZMT::IFlowBuffer* pChain = m_Chunk.TakeChain()) pChain->ReleaseChain();
  return result;
}

IResult VWriter::WriteGather(const ZMT::VGatherList& pieces, std::uint64_t total) {
  ZMT::IOutputStream* pStream = Stream();
  if (!pStream) return IResult::FileNotOpen;
  errno = 0;
  const bool ok = pStream->Write(pieces);
  const int error = errno;
  m_Position += total; // advances even on failure: later positions stay where they were meant
  if (ok) return IResult::Ok;
  return error == ENOSPC ? IResult::DiskFull : IResult::FileIOFailure;
}

IResult VWriter::Patch(std::uint64_t chunkPosition, std::uint64_t link) {
  if (!m_pSeekable) return IResult::Ok;
  const auto at = static_cast<std::int64_t>(m_Start + chunkPosition + Format::ChunkHeaderSize);
  if (!m_pSeekable->Seek(at) || !m_pSeekable->Write(&link, sizeof link) ||
      !m_pSeekable->Seek(static_cast<std::int64_t>(m_Start + m_Position)))
    return IResult::FileIOFailure;
  return IResult::Ok;
}

IResult VWriter::WriteTable(EChunkType type, std::vector<std::uint64_t>& io_rPending,
                            std::uint64_t& io_rLast) {
  const std::uint64_t position = m_Position;
  const std::uint64_t next = 0;
  const auto count = static_cast<std::uint32_t>(io_rPending.size());
  if (!BeginChunk(type, 0)) return IResult::AllocationFailure;
  m_Chunk.Write(&next, 8);
  m_Chunk.Write(&count, 4);
  if (count) m_Chunk.Write(io_rPending.data(), io_rPending.size() * 8);
  IResult result = FinishChunk();
  if (result.IsFailure()) return result;
  // The two opening tables stand at fixed places and start the chains.
  if (io_rLast != 0 || position != (type == EChunkType::TypeTable ? 40u : 60u))
    result = Patch(io_rLast, position);
  io_rLast = position;
  io_rPending.clear();
  return result;
}

IResult VWriter::WriteSessionIndex() {
  if (!m_pSeekable) return IResult::Ok;
  const std::uint64_t position = m_Position;
  if (!BeginChunk(EChunkType::SessionIndex, 0)) return IResult::AllocationFailure;
  const std::uint64_t next = 0;
  const auto count = static_cast<std::uint32_t>(m_PendingIndex.size());
  m_Chunk.Write(&next, 8);
  m_Chunk.Write(&m_Session.m_FirstTick, 8);
  m_Chunk.Write(&m_Session.m_Period, 8);
  m_Chunk.Write(&m_Session.m_Session, 4);
  for (const ZMT::VFlowTimestamp* pTime : {&m_Session.m_Periodic, &m_Session.m_Absolute}) {
    m_Chunk.Write(&pTime->m_Tick, 8);
    m_Chunk.Write(&pTime->m_Period, 8);
    m_Chunk.Write(&pTime->m_Session, 4);
  }
  m_Chunk.Write(&m_StateCount, 8);
  m_Chunk.Write(&m_NonEmptyStateCount, 8);
  m_Chunk.Write(&count, 4);
  for (const auto& [tick, statePosition] : m_PendingIndex) {
    m_Chunk.Write(&tick, 8);
    m_Chunk.Write(&statePosition, 8);
  }
  IResult result = FinishChunk();
  if (result.IsFailure()) return result;
  if (m_HasSessionIndex) result = Patch(m_LastSessionIndex, position);
  m_LastSessionIndex = position;
  m_HasSessionIndex = true;
  m_PendingIndex.clear();
  return result;
}

IResult VWriter::UpdateTime(const ZMT::VFlowTimestamp& time, const ZMT::VFlowTimestamp& periodic,
                            const ZMT::VFlowTimestamp& absolute) {
  if (!IsOpen()) return IResult::FileNotOpen;
  const std::uint32_t session = time.m_Session + m_SessionOffset;
  const std::int64_t tick = time.m_Tick + m_TickOffset;
  if (session == 0 || session < m_LastSession) return IResult::InvalidSession;
  const bool sessionChanged = session != m_LastSession;
  if (!sessionChanged) {
    // States may skip frames, never go back or change rate within a session.
    const auto period = static_cast<std::int64_t>(time.m_Period);
    if (time.m_Period != m_LastPeriod || period <= 0 || tick < m_LastTick + period ||
        (tick - m_LastTick - period) % period != 0)
      return IResult::InvalidIndex;
  } else if (time.m_Period == 0 || time.m_Period > std::uint64_t(INT64_MAX)) {
    return IResult::InvalidIndex; // a session needs a rate
  }

  IResult result = IResult::Ok;
  if (sessionChanged && m_LastSession != 0) result = WriteSessionIndex();
  if (result.IsFailure()) return result;
  if (sessionChanged) {
    m_Session.m_Session = session;
    m_Session.m_Period = time.m_Period;
    m_Session.m_FirstTick = tick;
    m_Session.m_Periodic = periodic;
    if (!periodic.IsEmpty()) {
      m_Session.m_Periodic.m_Session += m_SessionOffset;
      m_Session.m_Periodic.m_Tick += m_TickOffset;
      if (periodic.m_Period != 0) {
        const auto p = static_cast<std::int64_t>(periodic.m_Period);
        m_Session.m_Periodic.m_Tick = ((m_Session.m_Periodic.m_Tick % p) + p) % p;
      }
    }
    m_Session.m_Absolute = absolute;
    if (!absolute.IsEmpty()) {
      m_Session.m_Absolute.m_Session += m_SessionOffset;
      m_Session.m_Absolute.m_Tick += m_TickOffset;
    }
    m_StateCount = 0;
    m_NonEmptyStateCount = 0;
  }
  if (sessionChanged || m_PendingIndex.size() >= Format::MaxPending) result = WriteSessionIndex();
  if (result.IsFailure()) return result;
  m_StateCount = static_cast<std::uint64_t>(tick - m_Session.m_FirstTick) / m_Session.m_Period + 1;
  m_LastTick = tick;
  m_LastPeriod = time.m_Period;
  m_LastSession = session;
  return IResult::Ok;
}

IResult VWriter::WriteTypeDefinition(const ZMT::IFlowItem& item, std::uint32_t fileTypeId) {
  const std::uint64_t position = m_Position;
  if (!BeginChunk(EChunkType::TypeDefinition, 0)) return IResult::AllocationFailure;
  ZMT::IFlowItemTypeInfo info = item.GetInfo();
  info.m_TypeId = fileTypeId;
  if (!EncodeTypeDefinition(m_Chunk, info, item.GetSchema())) return IResult::FileIOFailure;
  const IResult result = FinishChunk();
  if (result.IsSuccess() && m_pSeekable) m_PendingTypes.push_back(position);
  return result;
}

IResult VWriter::EnsureType(const ZMT::IFlowItemHandle& item, bool& o_rWritten,
                            std::uint32_t& o_rFileTypeId) {
  const std::uint32_t typeId = item.GetToken().m_TypeId;
  auto found = m_WrittenTypes.find(typeId);
  if (found != m_WrittenTypes.end()) {
    o_rWritten = found->second >= 0;
    o_rFileTypeId = static_cast<std::uint32_t>(found->second);
    return IResult::Ok;
  }
  if (!item.Get()) return IResult::InvalidHandle;
  std::uint32_t fileTypeId = typeId;
  if (static_cast<std::int32_t>(typeId) < 0) {
    // A type this process doesn't know: written under the id its own record carries, unless
    // that id means something else here or is taken already.
    fileTypeId = item->GetInfo().m_TypeId;
    ZMT::IFlowItemTypeInfo known;
    if (!m_Store || m_Store->GetTypeInfo(fileTypeId, known).IsSuccess() ||
        m_WrittenTypes.count(fileTypeId) || static_cast<std::int32_t>(fileTypeId) < 0) {
      m_WrittenTypes.emplace(typeId, LeftOut);
      o_rWritten = false;
      return IResult::Ok;
    }
    m_WrittenTypes.emplace(fileTypeId, fileTypeId);
  }
  m_WrittenTypes.emplace(typeId, fileTypeId);
  o_rWritten = true;
  o_rFileTypeId = fileTypeId;
  return WriteTypeDefinition(*item, fileTypeId);
}

IResult VWriter::BodyPieces(const ZMT::IFlowItemHandle& item, ZMT::VGatherList& o_rPieces,
                            std::uint64_t& o_rSize, bool& o_rShared) {
  const ZMT::IFlowBufferConst* pBytes = nullptr;
  const IResult result = m_Store->GetItemBuffer(item, m_Buffers->GetItemWriter(), pBytes);
  if (result.IsFailure()) return IResult::SerialisationFailure;
  o_rSize = 0;
  for (const ZMT::IFlowBufferConst* pPage = pBytes; pPage; pPage = pPage->GetNext())
    if (const std::uint64_t size = pPage->GetSize()) {
      o_rPieces.emplace_back(pPage->GetData(), size);
      o_rSize += size;
    }
  o_rShared = pBytes && pBytes->HasSharedBuffer();
  return IResult::Ok;
}

IResult VWriter::AddBody(const ZMT::IFlowItemHandle& item) {
  constexpr std::uint64_t Head = Format::ChunkHeaderSize + 4;
  if (m_Group.m_FixedSize == UnknownSize) m_Group.m_FixedSize = item->GetFixedSize();
  // A body of fixed size goes straight into the page with its chunk header: one reservation and
  // one call, no stream write per field.
  const bool fixed = !m_UseStoreBuffers && m_Group.m_FixedSize != 0 &&
                     m_Group.m_FixedSize <= Flow2Store::VFlowBufferFixed::Capacity - Head;
  void* pHeader = nullptr;
  const std::uint64_t reserve = fixed ? Head + m_Group.m_FixedSize : Head;
  if (m_Bodies.GetScratch(pHeader, reserve) != reserve) return IResult::AllocationFailure;
  std::uint64_t size = 0;
  bool shared = false;
  if (fixed) {
    item->WriteFixed(static_cast<std::uint8_t*>(pHeader) + Head);
    size = m_Group.m_FixedSize;
  } else if (m_UseStoreBuffers) {
    m_BodyGather.emplace_back(pHeader, Head);
    const IResult result = BodyPieces(item, m_BodyGather, size, shared);
    if (result.IsFailure()) return result;
  } else {
    const std::uint64_t before = m_Bodies.GetTotal();
    const std::uint64_t sharedBefore = m_Bodies.GetSharedCount();
    if (!item->Write(m_Bodies)) return IResult::SerialisationFailure;
    if (m_Bodies.IsFailed()) return IResult::AllocationFailure;
    size = m_Bodies.GetTotal() - before;
    shared = m_Bodies.GetSharedCount() != sharedBefore;
  }
  if (size + 4 > 0xFFFFFFFFu) return IResult::InvalidValue;
  VChunkHeader header{static_cast<std::uint16_t>(EChunkType::ItemData),
                      static_cast<std::uint16_t>(shared ? Format::BodyShared : 0),
                      static_cast<std::uint32_t>(size + 4)};
  auto* pBytes = static_cast<std::uint8_t*>(pHeader);
  header.Encode(pBytes);
  const std::uint32_t itemId = item.GetToken().m_ItemId;
  std::memcpy(pBytes + Format::ChunkHeaderSize, &itemId, 4);

  m_Positions.Record(item.GetToken(), m_Position + m_BodyOffset, false);
  const std::uint64_t chunk = Head + size;
  m_BodyOffset += static_cast<std::uint32_t>(chunk);
  m_BodyBytes += chunk;
  return IResult::Ok;
}

IResult VWriter::FlushGroup() {
  if (!m_Group.m_Active) return IResult::Ok;
  m_Group.m_Active = false;
  const bool hasTime = !m_Group.m_Time.IsEmpty();
  const auto flags =
      static_cast<std::uint16_t>((m_Group.m_ByReference ? Format::GroupByReference : 0) |
                                 (hasTime ? Format::GroupHasTime : 0));
  IResult result = IResult::Ok;
  if (!BeginChunk(EChunkType::ItemGroup, flags)) {
    result = IResult::AllocationFailure;
  } else {
    m_Chunk.Write(&m_Group.m_FlowStoreId, 8);
    m_Chunk.Write(&m_Group.m_FileTypeId, 4);
    m_Chunk.Write(&m_Group.m_Count, 4);
    if (hasTime) {
      const std::int64_t tick = m_Group.m_Time.m_Tick + m_TickOffset;
      m_Chunk.Write(&tick, 8);
      m_Chunk.Write(&m_Group.m_Time.m_Period, 8);
    }
    if (m_Group.m_ByReference) {
      m_Chunk.Write(m_GroupPositions.data(), m_GroupPositions.size() * 8);
      result = FinishChunk();
    } else {
      if (m_BodyBytes > 0xFFFFFFFFu) {
        result = IResult::InvalidValue;
      } else {
        const auto bodySize = static_cast<std::uint32_t>(m_BodyBytes);
        m_Chunk.Write(&bodySize, 4);
        if (!m_UseStoreBuffers) {
          m_BodyGather.clear();
          for (const ZMT::IFlowBufferConst* pPage = m_Bodies.Head(); pPage;
               pPage = pPage->GetNext())
            if (pPage->GetSize()) m_BodyGather.emplace_back(pPage->GetData(), pPage->GetSize());
        }
        result = FinishChunk(&m_BodyGather, m_BodyBytes, false);
      }
    }
  }
  m_GroupPositions.clear();
  m_BodyGather.clear();
  m_BodyBytes = 0;
  if (ZMT::IFlowBuffer* pChain = m_Bodies.TakeChain()) pChain->ReleaseChain();
  return result;
}

IResult VWriter::WriteState(const ZMT::IFlowState& state) {
  if (!IsOpen()) return IResult::FileNotOpen;
  const ZMT::VFlowTimestamp& time = state.GetTime();
  IResult result = UpdateTime(time, state.GetPeriodicReference(), state.GetAbsoluteReference());
  if (result.IsFailure()) return result;
  const std::size_t records = state.GetItemCount();
  if (records == 0) return IResult::Ok;
  ++m_NonEmptyStateCount;

  bool leftOut = false;
  std::uint32_t count = 0;
  bool first = true;
  std::uint32_t lastType = 0;
  bool lastWritten = false;
  for (std::size_t i = 0; i < records; ++i) {
    const ZMT::VFlowStateRecord& record = state.GetRecord(i);
    if (first || record.m_Token.m_TypeId != lastType) {
      std::uint32_t fileTypeId = 0;
      result = EnsureType(record.m_Item, lastWritten, fileTypeId);
      if (result.IsFailure()) return result;
      lastType = record.m_Token.m_TypeId;
      first = false;
    }
    if (lastWritten)
      ++count;
    else
      leftOut = true;
  }

  const std::uint64_t statePosition = m_Position;
  const std::int64_t tick = time.m_Tick + m_TickOffset;
  if (!BeginChunk(EChunkType::StateHeader, 0)) return IResult::AllocationFailure;
  m_Chunk.Write(&tick, 8);
  m_Chunk.Write(&count, 4);
  result = FinishChunk();
  if (result.IsFailure()) return result;
  if (m_pSeekable) m_PendingIndex.emplace_back(tick, statePosition);

  m_Group = VPendingGroup();
  // Records come sorted by type: the file type id is looked up once per run.
  std::int64_t mappedType = LeftOut;
  first = true;
  for (std::size_t i = 0; i < records; ++i) {
    const ZMT::VFlowStateRecord& record = state.GetRecord(i);
    if (first || record.m_Token.m_TypeId != lastType) {
      auto mapped = m_WrittenTypes.find(record.m_Token.m_TypeId);
      if (mapped == m_WrittenTypes.end()) return IResult::Failed;
      mappedType = mapped->second;
      lastType = record.m_Token.m_TypeId;
      first = false;
    }
    if (mappedType < 0) continue;
    const auto fileTypeId = static_cast<std::uint32_t>(mappedType);
    const ZMT::VFlowTimestamp itemTime =
        record.m_Time == time ? ZMT::VFlowTimestamp() : record.m_Time;
    std::uint64_t position = 0;
    const bool byReference = m_Positions.Find(record.m_Token, position);
    if (!m_Group.m_Active || m_Group.m_FileTypeId != fileTypeId || !(m_Group.m_Time == itemTime) ||
        m_Group.m_FlowStoreId != record.m_Token.m_FlowStoreId ||
        m_Group.m_ByReference != byReference) {
      result = FlushGroup();
      if (result.IsFailure()) return result;
      m_Group = VPendingGroup{true, fileTypeId, record.m_Token.m_FlowStoreId, itemTime, byReference,
                              0,    UnknownSize};
      m_BodyOffset = itemTime.IsEmpty() ? Format::GroupSize : Format::GroupSizeWithTime;
    }
    if (byReference) {
      m_GroupPositions.push_back(position);
    } else {
      result = AddBody(record.m_Item);
      if (result.IsFailure()) {
        FlushGroup();
        return result;
      }
    }
    ++m_Group.m_Count;
  }
  result = FlushGroup();
  if (result.IsFailure()) return result;
  m_Positions.EndState();
  return leftOut ? IResult::OkButPartial : IResult::Ok;
}

IResult VWriter::WriteItems(const std::vector<ZMT::IFlowItemHandle>& items, bool force) {
  if (!IsOpen()) return IResult::FileNotOpen;
  IResult overall = IResult::Ok;
  for (const ZMT::IFlowItemHandle& item : items) {
    if (!item) continue;
    const ZMT::IFlowItemToken token = item.GetToken();
    if (!m_WrittenTokens.insert(token).second && !force) continue;
    bool written = false;
    std::uint32_t fileTypeId = 0;
    IResult result = EnsureType(item, written, fileTypeId);
    if (result.IsFailure()) return result;
    if (!written) {
      overall = IResult::OkButPartial;
      continue;
    }
    const std::uint64_t position = m_Position;
    m_Positions.Record(token, position, true);

    ZMT::VGatherList body;
    std::uint64_t size = 0;
    bool shared = false;
    if (!BeginChunk(EChunkType::StaticItem, 0)) return IResult::AllocationFailure;
    m_Chunk.Write(&token.m_ItemId, 4);
    m_Chunk.Write(&fileTypeId, 4);
    m_Chunk.Write(&token.m_FlowStoreId, 8);
    if (m_UseStoreBuffers) {
      result = BodyPieces(item, body, size, shared);
      if (result.IsFailure()) return result;
    } else {
      const std::uint64_t sharedBefore = m_Chunk.GetSharedCount();
      if (!item->Write(m_Chunk)) return IResult::SerialisationFailure;
      shared = m_Chunk.GetSharedCount() != sharedBefore;
    }
    if (shared) m_ChunkHeader.m_Flags |= Format::BodyShared;
    result = FinishChunk(&body, size, true);
    if (result.IsFailure()) return result;
    if (m_pSeekable) {
      m_PendingItems.push_back(position);
      if (m_PendingItems.size() > Format::MaxPending) {
        result = WriteTable(EChunkType::ItemTable, m_PendingItems, m_LastItemTable);
        if (result.IsFailure()) return result;
      }
    }
  }
  return overall;
}

IResult VWriter::Close() {
  if (!IsOpen()) return IResult::FileNotOpen;
  IResult result = IResult::Ok;
  if (m_pSeekable) {
    if (m_StateCount != 0) result = WriteSessionIndex();
    if (result.IsSuccess() && !m_PendingTypes.empty())
      result = WriteTable(EChunkType::TypeTable, m_PendingTypes, m_LastTypeTable);
    if (result.IsSuccess() && !m_PendingItems.empty())
      result = WriteTable(EChunkType::ItemTable, m_PendingItems, m_LastItemTable);
  }
  Reset();
  return result;
}

void VWriter::Reset() {
  m_pSeekable = nullptr;
  m_pPlain = nullptr;
  m_Position = 0;
  m_Start = 0;
  m_Session = VSession();
  m_NonEmptyStateCount = 0;
  m_StateCount = 0;
  m_LastTick = 0;
  m_LastPeriod = 0;
  m_LastSession = 0;
  m_LastTypeTable = 0;
  m_LastItemTable = 0;
  m_LastSessionIndex = 0;
  m_HasSessionIndex = false;
  m_PendingIndex.clear();
  m_PendingItems.clear();
  m_PendingTypes.clear();
  m_WrittenTypes.clear();
  m_WrittenTokens.clear();
  m_Positions.Clear();
  m_BodyGather.clear();
  m_GroupPositions.clear();
  m_BodyBytes = 0;
  m_Group = VPendingGroup();
  if (ZMT::IFlowBuffer* pChain = m_Chunk.TakeChain()) pChain->ReleaseChain();
  if (ZMT::IFlowBuffer* pChain = m_Bodies.TakeChain()) pChain->ReleaseChain();
  m_pChunkHeader = nullptr;
}

} // namespace Flow2File
