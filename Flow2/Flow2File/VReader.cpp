#include "Flow2/Flow2File/VReader.h"

#include <algorithm>
#include <exception>
#include <set>

namespace Flow2File {

using ZMT::IResult;

namespace {
constexpr std::uint64_t FirstTable = 40;
constexpr std::uint64_t SecondTable = 60;
constexpr std::uint64_t AfterTables = 80;

std::string At(std::uint64_t position) {
  return " at byte " + std::to_string(position);
}
} // namespace

VReader::VReader(ZMT::IFlowStoreHandle store, ZMT::IFlowBufferFactoryHandle buffers,
                 ZMT::IFlowStateFactoryHandle states)
    : m_Store(std::move(store)), m_Buffers(std::move(buffers)), m_States(std::move(states)) {}

void VReader::Close() {
  m_pStream = nullptr;
  m_pMapped = nullptr;
  m_Start = m_Size = m_ChunksRead = m_LastIndexed = 0;
  m_Complete = false;
  m_Types.clear();
  m_TypePositions.clear();
  m_StaticPositions.clear();
  m_Index.clear();
  m_Sessions.clear();
  m_ScanSession = VSessionInfo();
  m_Known.Clear();
  m_Problems.clear();
}

bool VReader::ReadAt(std::uint64_t position, void* o_pData, std::uint64_t size) {
  if (position > m_Size || size > m_Size - position) return false;
  return m_pStream->Seek(static_cast<std::int64_t>(m_Start + position)) &&
         m_pStream->Read(o_pData, size);
}

const std::uint8_t* VReader::View(std::uint64_t position, std::uint64_t size) {
  if (!m_pMapped || position > m_Size || size > m_Size - position ||
      !m_pMapped->Seek(static_cast<std::int64_t>(m_Start + position)))
    return nullptr;
  const std::uint8_t* pData = nullptr;
  return m_pMapped->Stream().GetContiguous(pData) >= size ? pData : nullptr;
}

bool VReader::ReadHeader(std::uint64_t position, VChunkHeader& o_rHeader) {
  std::uint8_t bytes[Format::ChunkHeaderSize];
  if (!ReadAt(position, bytes, sizeof bytes)) return false;
  ++m_ChunksRead;
  o_rHeader.Decode(bytes);
  return IsChunkType(o_rHeader.m_Type) &&
         o_rHeader.m_PayloadSize <= m_Size - position - Format::ChunkHeaderSize;
}

bool VReader::ReadPayload(std::uint64_t position, const VChunkHeader& header) {
  if (position > m_Size ||
      m_Size - position < Format::ChunkHeaderSize + std::uint64_t(header.m_PayloadSize))
    return false;
  m_Payload.resize(header.m_PayloadSize);
  return ReadAt(position + Format::ChunkHeaderSize, m_Payload.data(), header.m_PayloadSize);
}

IResult VReader::Open(ZMT::IInputStreamSeekable* i_pStream) {
  Close();
  if (!i_pStream) return IResult::InvalidPointer;
  m_pStream = i_pStream;
  m_pMapped = dynamic_cast<UtilsFileSystem::IInputStreamSeekableOwningAdapter<
      UtilsFileSystem::VMemoryMappedInputStream>*>(i_pStream);
  std::uint64_t total = 0;
  if (!m_pStream->GetPosition(m_Start) || !m_pStream->GetSize(total) || total < m_Start) {
    Close();
    return IResult::FileIOFailure;
  }
  m_Size = total - m_Start;

  VChunkHeader header;
  std::uint32_t fields[4] = {};
  std::uint32_t magicSize = 0;
  char magic[sizeof Format::Magic] = {};
  if (!ReadHeader(0, header) || header.m_Type != std::uint16_t(EChunkType::FileHeader) ||
      header.m_PayloadSize != Format::FileHeaderPayload || !ReadPayload(0, header)) {
    Close();
    return IResult::InvalidFormat;
  }
  VByteCursor cursor(m_Payload.data(), m_Payload.size());
  cursor.Get(magicSize);
  cursor.Read(magic, sizeof magic);
  cursor.Read(fields, sizeof fields);
  if (magicSize != sizeof Format::Magic ||
      !std::equal(magic, magic + sizeof magic, Format::Magic) ||
      fields[3] != Format::TicksPerSecond) {
    Close();
    return IResult::InvalidFormat;
  }
  if (fields[0] != Format::VersionMajor) {
    Close();
    return IResult::InvalidVersion;
  }

  // A closed file has its type table linked to the closing one; otherwise walk everything.
  VChunkHeader table;
  std::uint64_t link = 0;
  m_Complete = ReadHeader(FirstTable, table) &&
               table.m_Type == std::uint16_t(EChunkType::TypeTable) &&
               ReadAt(FirstTable + Format::ChunkHeaderSize, &link, 8) && link != 0;
  if (m_Complete) {
    ReadTableChain(FirstTable, EChunkType::TypeTable, m_TypePositions);
    ReadTableChain(SecondTable, EChunkType::ItemTable, m_StaticPositions);
  }
  if (m_Complete) {
    for (std::uint64_t position : m_TypePositions) {
      if (ReadHeader(position, header) &&
          header.m_Type == std::uint16_t(EChunkType::TypeDefinition))
        ReadTypeDefinition(position, header);
      else
        Problem("type table entry" + At(position) + " is not a type definition");
    }
    // The first index chunk follows the tables, perhaps after static items and definitions.
    std::uint64_t position = AfterTables;
    std::uint64_t scanFrom = AfterTables;
    bool found = false;
    while (ReadHeader(position, header)) {
      if (header.m_Type == std::uint16_t(EChunkType::SessionIndex)) found = true;
      if (header.m_Type == std::uint16_t(EChunkType::SessionIndex) ||
          header.m_Type == std::uint16_t(EChunkType::StateHeader))
        break;
      position += Format::ChunkHeaderSize + header.m_PayloadSize;
    }
    if (found) {
      std::set<std::uint64_t> seen;
      for (;;) {
        if (!ParseSessionIndex(position, header, true)) {
          Problem("index chunk" + At(position) + " is damaged");
          break;
        }
        scanFrom = position + Format::ChunkHeaderSize + header.m_PayloadSize;
        std::uint64_t next = 0;
        std::memcpy(&next, m_Payload.data(), 8);
        if (next == 0) break;
        if (next <= position || !seen.insert(next).second || !ReadHeader(next, header) ||
            header.m_Type != std::uint16_t(EChunkType::SessionIndex)) {
          Problem("index link" + At(position) + " is broken");
          m_Complete = false;
          break;
        }
        position = next;
      }
    }
    Scan(scanFrom);
  } else if (m_Size == AfterTables && ReadHeader(FirstTable, header) &&
             header.m_Type == std::uint16_t(EChunkType::TypeTable) &&
             ReadHeader(SecondTable, header) &&
             header.m_Type == std::uint16_t(EChunkType::ItemTable)) {
    // The header and the two opening tables, nothing after: a closed recording of nothing.
    m_Complete = true;
  } else {
    // Not closed, or its tables are damaged: every chunk is walked.
    Problem("the file's tables are missing or damaged: its chunks were walked one by one");
    m_TypePositions.clear();
    m_StaticPositions.clear();
    Scan(FirstTable);
  }

  std::stable_sort(m_Index.begin(), m_Index.end(), [](const VStateEntry& a, const VStateEntry& b) {
    return a.m_Session != b.m_Session ? a.m_Session < b.m_Session : a.m_Tick < b.m_Tick;
  });
  return m_Problems.empty() ? IResult::Ok : IResult::OkButPartial;
}

void VReader::ReadTableChain(std::uint64_t first, EChunkType type,
                             std::vector<std::uint64_t>& o_rList) {
  std::uint64_t position = first;
  std::set<std::uint64_t> seen;
  VChunkHeader header;
  for (;;) {
    if (!ReadHeader(position, header) || header.m_Type != std::uint16_t(type) ||
        header.m_PayloadSize < Format::TableFixed || !ReadPayload(position, header)) {
      Problem("table" + At(position) + " is damaged");
      m_Complete = false;
      return;
    }
    std::uint64_t next = 0;
    std::uint32_t count = 0;
    std::memcpy(&next, m_Payload.data(), 8);
    std::memcpy(&count, m_Payload.data() + 8, 4);
    if (header.m_PayloadSize != Format::TableFixed + std::uint64_t(count) * 8) {
      Problem("table" + At(position) + " has a wrong size");
      m_Complete = false;
      return;
    }
    for (std::uint32_t i = 0; i < count; ++i) {
      std::uint64_t entry = 0;
      std::memcpy(&entry, m_Payload.data() + Format::TableFixed + i * 8, 8);
      o_rList.push_back(entry);
    }
    if (next == 0) return;
    if (next <= position || !seen.insert(next).second) {
      Problem("table link" + At(position) + " is broken");
      m_Complete = false;
      return;
    }
    position = next;
  }
}

void VReader::ReadTypeDefinition(std::uint64_t position, const VChunkHeader& header) {
  if (!ReadPayload(position, header)) {
    Problem("type definition" + At(position) + " is cut short");
    return;
  }
  VFileType type;
  VByteCursor cursor(m_Payload.data(), m_Payload.size());
  if (!DecodeTypeDefinition(cursor, type.m_Info, type.m_Schema)) {
    Problem("type definition" + At(position) + " is damaged");
    return;
  }
  if (m_Types.count(type.m_Info.m_TypeId)) return;
  try {
    type.m_ReaderResult = m_Store->GetReader(type.m_Info, type.m_Schema, type.m_Reader);
  } catch (const std::exception&) {
    type.m_ReaderResult = IResult::FailedWithException;
  }
  if (type.m_ReaderResult.IsFailure()) {
    type.m_Reader = nullptr;
    Problem("type " + type.m_Info.m_Name + " (" + std::to_string(type.m_Info.m_TypeId) +
            ") can't be read here: " + type.m_ReaderResult.Text());
  }
  const std::uint32_t typeId = type.m_Info.m_TypeId;
  m_Types.emplace(typeId, std::move(type));
}

bool VReader::ParseSessionIndex(std::uint64_t position, const VChunkHeader& header,
                                bool takeEntries) {
  if (header.m_PayloadSize < Format::SessionIndexFixed || !ReadPayload(position, header))
    return false;
  VByteCursor c(m_Payload.data(), m_Payload.size());
  std::uint64_t next = 0, firstTick = 0, stateCount = 0, nonEmpty = 0;
  std::uint32_t count = 0;
  VSessionInfo info;
  c.Get(next);
  c.Get(firstTick);
  c.Get(info.m_Period);
  c.Get(info.m_Session);
  for (ZMT::VFlowTimestamp* pTime : {&info.m_Periodic, &info.m_Absolute}) {
    c.Get(pTime->m_Tick);
    c.Get(pTime->m_Period);
    c.Get(pTime->m_Session);
  }
  c.Get(stateCount);
  c.Get(nonEmpty);
  c.Get(count);
  if (c.Left() != std::uint64_t(count) * 16 || info.m_Session == 0) return false;
  if (m_Sessions.empty() || m_Sessions.back().m_Session != info.m_Session)
    m_Sessions.push_back(info);
  m_ScanSession = info;
  if (!takeEntries) return true;
  for (std::uint32_t i = 0; i < count; ++i) {
    VStateEntry entry;
    c.Get(entry.m_Tick);
    c.Get(entry.m_Position);
    entry.m_Session = info.m_Session;
    entry.m_Period = info.m_Period;
    if (entry.m_Position >= m_Size || entry.m_Position <= m_LastIndexed) continue;
    m_Index.push_back(entry);
    m_LastIndexed = entry.m_Position;
  }
  return true;
}

void VReader::Scan(std::uint64_t position) {
  VChunkHeader header;
  while (position < m_Size) {
    if (m_Size - position < Format::ChunkHeaderSize) {
      Problem("the file ends inside a chunk header" + At(position));
      return;
    }
    if (!ReadHeader(position, header)) {
      Problem(IsChunkType(header.m_Type) ? "the file ends inside a chunk" + At(position)
                                         : "damaged chunk" + At(position));
      return;
    }
    switch (static_cast<EChunkType>(header.m_Type)) {
    case EChunkType::TypeDefinition:
      ReadTypeDefinition(position, header);
      break;
    case EChunkType::SessionIndex:
      if (!ParseSessionIndex(position, header, false)) {
        Problem("index chunk" + At(position) + " is damaged");
        return;
      }
      break;
    case EChunkType::StateHeader:
      if (position > m_LastIndexed) {
        if (header.m_PayloadSize != Format::StateHeaderPayload || m_ScanSession.m_Session == 0 ||
            !ReadPayload(position, header)) {
          Problem("state" + At(position) + " is damaged");
          return;
        }
        VStateEntry entry;
        std::memcpy(&entry.m_Tick, m_Payload.data(), 8);
        entry.m_Position = position;
        entry.m_Session = m_ScanSession.m_Session;
        entry.m_Period = m_ScanSession.m_Period;
        m_Index.push_back(entry);
        m_LastIndexed = position;
      }
      break;
    case EChunkType::StaticItem:
      if (std::find(m_StaticPositions.begin(), m_StaticPositions.end(), position) ==
          m_StaticPositions.end())
        m_StaticPositions.push_back(position);
      break;
    default:
      break;
    }
    position += Format::ChunkHeaderSize + header.m_PayloadSize;
  }
}

const VReader::VFileType* VReader::Type(std::uint32_t typeId) const {
  auto it = m_Types.find(typeId);
  return it == m_Types.end() ? nullptr : &it->second;
}

IResult VReader::FindState(const ZMT::VFlowTimestamp& time, std::size_t& o_rIndex) const {
  auto it = std::upper_bound(
      m_Index.begin(), m_Index.end(), time, [](const ZMT::VFlowTimestamp& t, const VStateEntry& e) {
        return t.m_Session != e.m_Session ? t.m_Session < e.m_Session : t.m_Tick < e.m_Tick;
      });
  if (it == m_Index.begin() || std::prev(it)->m_Session != time.m_Session) return IResult::NotFound;
  o_rIndex = static_cast<std::size_t>(std::prev(it) - m_Index.begin());
  return IResult::Ok;
}

IResult VReader::ReadBody(std::uint64_t position, std::uint64_t size, const VFileType& type,
                          const ZMT::IFlowItemToken& token, ZMT::IFlowItemHandle& o_rItem,
                          const std::uint8_t* i_pBytes) {
  ZMT::IFlowBuffer* pChain = nullptr;
  try {
    pChain = m_Buffers->AllocateChain(size);
  } catch (const std::exception&) {
    pChain = nullptr;
  }
  if (!pChain) return IResult::AllocationFailure;
  if (!i_pBytes && !m_pStream->Seek(static_cast<std::int64_t>(m_Start + position))) {
    pChain->ReleaseChain();
    return IResult::FileIOFailure;
  }
  for (ZMT::IFlowBuffer* pPage = pChain; pPage; pPage = pPage->GetMutableNext()) {
    const std::uint64_t piece = pPage->GetSize();
    if (!piece) continue;
    if (i_pBytes) {
      std::memcpy(pPage->GetMutableData(), i_pBytes, piece);
      i_pBytes += piece;
    } else if (!m_pStream->Read(pPage->GetMutableData(), piece)) {
      pChain->ReleaseChain();
      return IResult::FileIOFailure;
    }
  }
  IResult result = IResult::Ok;
  try {
    result = type.m_Reader(token, pChain, o_rItem);
  } catch (const std::exception&) {
    result = IResult::FailedWithException;
  }
  if (result.IsSuccess() && o_rItem) {
    m_Known.Record(position, o_rItem.GetToken());
  }
  return result;
}

IResult VReader::ReadReferenced(std::uint64_t position, std::uint32_t typeId,
                                std::uint64_t flowStoreId, ZMT::IFlowItemHandle& o_rItem) {
  // Bodies are remembered by the position of their bytes, after the chunk's fixed part.
  VChunkHeader header;
  if (!ReadHeader(position, header)) return IResult::InvalidFormat;
  std::uint64_t fixed = 0;
  ZMT::IFlowItemToken token;
  if (header.m_Type == std::uint16_t(EChunkType::ItemData)) {
    fixed = 4;
    token.m_TypeId = typeId;
    token.m_FlowStoreId = flowStoreId;
  } else if (header.m_Type == std::uint16_t(EChunkType::StaticItem)) {
    fixed = 16;
  } else {
    return IResult::InvalidFormat;
  }
  const std::uint64_t body = position + Format::ChunkHeaderSize + fixed;
  ZMT::IFlowItemToken known;
  if (m_Known.Find(body, known) && m_Store->FindItem(known, o_rItem).IsSuccess())
    return IResult::Ok;
  if (header.m_PayloadSize < fixed) return IResult::InvalidFormat;
  if (fixed == 4) {
    if (!ReadAt(position + Format::ChunkHeaderSize, &token.m_ItemId, 4))
      return IResult::InvalidFormat;
  } else {
    std::uint8_t bytes[16];
    if (!ReadAt(position + Format::ChunkHeaderSize, bytes, 16)) return IResult::InvalidFormat;
    std::memcpy(&token.m_ItemId, bytes, 4);
    std::memcpy(&token.m_TypeId, bytes + 4, 4);
    std::memcpy(&token.m_FlowStoreId, bytes + 8, 8);
    if (token.m_TypeId != typeId) return IResult::InvalidFormat;
  }
  const VFileType* pType = Type(typeId);
  if (!pType || !pType->m_Reader) return IResult::InvalidType;
  return ReadBody(body, header.m_PayloadSize - fixed, *pType, token, o_rItem);
}

IResult VReader::ReadState(std::size_t index, ZMT::IFlowStateHandle& o_rState) {
  if (!m_pStream) return IResult::FileNotOpen;
  if (index >= m_Index.size()) return IResult::InvalidIndex;
  const VStateEntry& entry = m_Index[index];
  VChunkHeader header;
  if (!ReadHeader(entry.m_Position, header) ||
      header.m_Type != std::uint16_t(EChunkType::StateHeader) ||
      header.m_PayloadSize != Format::StateHeaderPayload || !ReadPayload(entry.m_Position, header))
    return IResult::InvalidFormat;
  std::int64_t tick = 0;
  std::uint32_t count = 0;
  std::memcpy(&tick, m_Payload.data(), 8);
  std::memcpy(&count, m_Payload.data() + 8, 4);
  const ZMT::VFlowTimestamp time{tick, entry.m_Period, entry.m_Session};
  VSessionInfo session;
  for (const VSessionInfo& info : m_Sessions)
    if (info.m_Session == entry.m_Session) session = info;
  // Every item takes at least 8 bytes of what follows (a position in a group by reference).
  if (std::uint64_t(count) * 8 > m_Size - entry.m_Position) {
    Problem("state" + At(entry.m_Position) + " claims more items than the file holds");
    return IResult::InvalidFormat;
  }
  IResult result = m_States->CreateState(o_rState, time, session.m_Periodic, session.m_Absolute);
  if (result.IsFailure()) return result;
  o_rState->Reserve(count);

  bool partial = false;
  std::uint64_t position = entry.m_Position + Format::ChunkHeaderSize + header.m_PayloadSize;
  std::uint64_t read = 0;
  auto damaged = [&](const std::string& what) {
    Problem("state" + At(entry.m_Position) + ": " + what + At(position));
    return IResult(IResult::InvalidFormat);
  };
  while (read < count) {
    if (!ReadHeader(position, header) || header.m_Type != std::uint16_t(EChunkType::ItemGroup) ||
        !ReadPayload(position, header))
      return damaged("an item group is missing or damaged");
    VByteCursor c(m_Payload.data(), m_Payload.size());
    std::uint64_t flowStoreId = 0;
    std::uint32_t typeId = 0;
    std::uint32_t groupCount = 0;
    ZMT::VFlowTimestamp itemTime = time;
    const bool byReference = header.m_Flags & Format::GroupByReference;
    bool ok = c.Get(flowStoreId) && c.Get(typeId) && c.Get(groupCount);
    if (ok && (header.m_Flags & Format::GroupHasTime))
      ok = c.Get(itemTime.m_Tick) && c.Get(itemTime.m_Period);
    std::uint32_t bodySize = 0;
    if (ok && !byReference) ok = c.Get(bodySize) && c.Left() == 0;
    if (ok && byReference) ok = c.Left() == std::uint64_t(groupCount) * 8;
    if (!ok || groupCount > count - read) return damaged("an item group has a wrong size");
    std::vector<std::uint64_t> references;
    if (byReference) {
      references.resize(groupCount);
      std::memcpy(references.data(), c.Data(), references.size() * 8);
    }
    const std::uint64_t groupEnd = position + Format::ChunkHeaderSize + header.m_PayloadSize;
    const VFileType* pType = Type(typeId);
    if (!pType || !pType->m_Reader) {
      // Items of a type the file doesn't define, or that can't be read here: left out.
      if (!pType)
        Problem("state" + At(entry.m_Position) + ": type " + std::to_string(typeId) +
                " has no definition");
      partial = true;
      read += groupCount;
      position = groupEnd + (byReference ? 0 : bodySize);
      continue;
    }
    if (byReference) {
      for (std::uint64_t reference : references) {
        ZMT::IFlowItemHandle item;
        if (ReadReferenced(reference, typeId, flowStoreId, item).IsFailure() ||
            !o_rState->AddItem(item, itemTime))
          partial = true;
      }
      position = groupEnd;
    } else {
      // The group's items are read in one piece and taken apart in memory.
      position = groupEnd;
      if (bodySize > m_Size - groupEnd) return damaged("the file ends inside an item group");
      const std::uint8_t* pGroup = View(groupEnd, bodySize);
      if (!pGroup) {
        m_Bodies.resize(bodySize);
        if (!ReadAt(groupEnd, m_Bodies.data(), bodySize))
          return damaged("an item group is cut short");
        pGroup = m_Bodies.data();
      }
      std::uint64_t offset = 0;
      // Items at the state's time are moved in as a group, without a reference count each.
      const bool atStateTime = itemTime == time;
      m_GroupItems.clear();
      auto addGroup = [&] {
        if (!m_GroupItems.empty()) o_rState->AddItems(std::move(m_GroupItems));
        m_GroupItems.clear();
      };
      for (std::uint32_t i = 0; i < groupCount; ++i) {
        ++m_ChunksRead;
        if (bodySize - offset < Format::ChunkHeaderSize + 4) {
          addGroup();
          return damaged("an item is missing or damaged");
        }
        header.Decode(pGroup + offset);
        if (header.m_Type != std::uint16_t(EChunkType::ItemData) || header.m_PayloadSize < 4 ||
            header.m_PayloadSize > bodySize - offset - Format::ChunkHeaderSize) {
          addGroup();
          return damaged("an item is missing or damaged");
        }
        ZMT::IFlowItemToken token(0, typeId, flowStoreId);
        std::memcpy(&token.m_ItemId, pGroup + offset + Format::ChunkHeaderSize, 4);
        const std::uint64_t body = offset + Format::ChunkHeaderSize + 4;
        ZMT::IFlowItemHandle item;
        if (ReadBody(groupEnd + body, header.m_PayloadSize - 4, *pType, token, item, pGroup + body)
                .IsFailure())
          partial = true;
        else if (atStateTime)
          m_GroupItems.push_back(std::move(item));
        else if (!o_rState->AddItem(item, itemTime))
          partial = true;
        offset += Format::ChunkHeaderSize + header.m_PayloadSize;
        position = groupEnd + offset;
      }
      addGroup();
      if (offset != bodySize) return damaged("item bodies don't match their group's size");
    }
    read += groupCount;
  }
  return partial ? IResult::OkButPartial : IResult::Ok;
}

IResult VReader::ReadStaticItems(std::vector<ZMT::IFlowItemHandle>& o_rItems) {
  if (!m_pStream) return IResult::FileNotOpen;
  o_rItems.clear();
  bool partial = false;
  for (std::uint64_t position : m_StaticPositions) {
    std::uint8_t bytes[16];
    VChunkHeader header;
    if (!ReadHeader(position, header) || header.m_Type != std::uint16_t(EChunkType::StaticItem) ||
        header.m_PayloadSize < 16 || !ReadAt(position + Format::ChunkHeaderSize, bytes, 16)) {
      Problem("static item" + At(position) + " is damaged");
      partial = true;
      continue;
    }
    std::uint32_t typeId = 0;
    std::memcpy(&typeId, bytes + 4, 4);
    ZMT::IFlowItemHandle item;
    if (ReadReferenced(position, typeId, 0, item).IsFailure()) {
      partial = true;
      continue;
    }
    o_rItems.push_back(std::move(item));
  }
  return partial ? IResult::OkButPartial : IResult::Ok;
}

} // namespace Flow2File
