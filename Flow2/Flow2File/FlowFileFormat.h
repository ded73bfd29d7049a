#pragma once
// The chunked Flow file: chunk kinds, fixed sizes, and the encoding of type definitions.
//
// Every chunk starts with an 8-byte header (u16 kind, u16 flags, u32 payload size); all integers
// are little-endian and positions are byte offsets from where the file's stream started.

#include "Flow2/Flow2Types/IFlowItemTypeInfo.h"
#include "Flow2/Flow2Types/ISchema.h"
#include "Utils/UtilsFileSystem/Streams.h"

#include <cstdint>
#include <cstring>
#include <string>

namespace Flow2File {

enum class EChunkType : std::uint16_t {
  FileHeader = 0,
  SessionIndex = 1,
  TypeTable = 2,
  TypeDefinition = 3,
  StateHeader = 4,
  // 5 is never written.
  ItemTable = 6,
  StaticItem = 7,
  ItemGroup = 8,
  ItemData = 9,
};

/// Whether a value is one of the chunk kinds a file holds.
constexpr bool IsChunkType(std::uint16_t value) {
  return value <= 9 && value != 5;
}

namespace Format {
constexpr std::uint32_t ChunkHeaderSize = 8;
constexpr char Magic[12] = {'O', 's', 't', 'r', 'a', 'M', 'C', 'P', 'F', 'i', 'l', 'e'};
constexpr std::uint32_t VersionMajor = 1;
constexpr std::uint32_t VersionMinor = 1;
constexpr std::uint32_t VersionPatch = 0;
constexpr std::uint32_t TicksPerSecond = 135000000;
constexpr std::uint32_t FileHeaderPayload = 32;
constexpr std::uint32_t StateHeaderPayload = 12;
constexpr std::uint32_t SessionIndexFixed = 88;
constexpr std::uint32_t TableFixed = 12;
/// ItemGroup sizes with the chunk header, before any positions.
constexpr std::uint32_t GroupSize = 28;
constexpr std::uint32_t GroupSizeWithTime = 44;
/// ItemGroup flags.
constexpr std::uint16_t GroupByReference = 2;
constexpr std::uint16_t GroupHasTime = 4;
/// ItemData and StaticItem flag: the body holds a shared buffer.
constexpr std::uint16_t BodyShared = 1;
/// Index chunks and tables are written once this many entries wait.
constexpr std::size_t MaxPending = 10000;
} // namespace Format

struct VChunkHeader {
  std::uint16_t m_Type = 0;
  std::uint16_t m_Flags = 0;
  std::uint32_t m_PayloadSize = 0;

  void Encode(std::uint8_t* o_pBytes) const {
    std::memcpy(o_pBytes, &m_Type, 2);
    std::memcpy(o_pBytes + 2, &m_Flags, 2);
    std::memcpy(o_pBytes + 4, &m_PayloadSize, 4);
  }
  void Decode(const std::uint8_t* i_pBytes) {
    std::memcpy(&m_Type, i_pBytes, 2);
    std::memcpy(&m_Flags, i_pBytes + 2, 2);
    std::memcpy(&m_PayloadSize, i_pBytes + 4, 4);
  }
};

/// Reads values from a byte range, refusing to run past its end.
class VByteCursor {
public:
  VByteCursor(const std::uint8_t* i_pBytes, std::size_t size) : m_pBytes(i_pBytes), m_Left(size) {}
  bool Read(void* o_pData, std::size_t size) {
    if (size > m_Left) return false;
    if (size) std::memcpy(o_pData, m_pBytes, size);
    m_pBytes += size;
    m_Left -= size;
    return true;
  }
  template <class T> bool Get(T& o_rValue) { return Read(&o_rValue, sizeof(T)); }
  bool String(std::string& o_rText);
  std::size_t Left() const { return m_Left; }
  const std::uint8_t* Data() const { return m_pBytes; }

private:
  const std::uint8_t* m_pBytes;
  std::size_t m_Left;
};

/// A type definition's payload: name, id, version, description, schema.
bool EncodeTypeDefinition(ZMT::IOutputStream& io_rStream, const ZMT::IFlowItemTypeInfo& info,
                          const ZMT::ISchema& schema);
/// False for a payload that isn't a whole, well-formed definition.
bool DecodeTypeDefinition(VByteCursor& io_rCursor, ZMT::IFlowItemTypeInfo& o_rInfo,
                          ZMT::ISchema& o_rSchema);

bool EncodeSchema(ZMT::IOutputStream& io_rStream, const ZMT::ISchema& schema);
/// Nesting is limited, and every count must fit the bytes that are left.
bool DecodeSchema(VByteCursor& io_rCursor, ZMT::ISchema& o_rSchema);

} // namespace Flow2File
