#pragma once
// The binary FBX container: the header, node records with their typed properties and nested
// lists, arrays compressed with zlib above a threshold, and the footer. Record headers are
// 32-bit below version 7500 and 64-bit from it on.
#include "fbx/FbxByteSink.h"
#include "fbx/FbxDeflater.h"
#include <cstdint>
#include <span>
#include <string_view>
#include <vector>

namespace AnvilFbx {

class VFbxRecordWriter {
public:
  VFbxRecordWriter(VFbxByteSink& io_rSink, uint32_t i_version, size_t i_compressionThreshold);

  /// The 27 bytes before the first record.
  void writeHeader();
  /// Opens a record; its properties follow, then its children.
  void begin(std::string_view i_name);
  /// Closes the innermost record. A record with children, or one opened as a scope
  /// (`i_nested`), ends with a null record.
  void end(bool i_nested = false);
  /// A record that is a scope: no properties, always a nested list.
  void beginScope(std::string_view i_name) { begin(i_name); }

  void propY(int16_t i_value);
  void propC(uint8_t i_value);
  void propI(int32_t i_value);
  void propF(float i_value);
  void propD(double i_value);
  void propL(int64_t i_value);
  void propS(std::string_view i_text);
  void propR(std::span<const uint8_t> i_bytes);
  void propArray(std::span<const float> i_values);
  void propArray(std::span<const double> i_values);
  void propArray(std::span<const int64_t> i_values);
  void propArray(std::span<const int32_t> i_values);
  /// Arrays whose values stay alive and unchanged until the sink is written. Those stored raw
  /// that are large go out from where they lie instead of being copied.
  void propArrayView(std::span<const float> i_values);
  void propArrayView(std::span<const int64_t> i_values);

  /// Ends the top-level list and writes the footer. `i_rFooterId` is the 16-byte id written
  /// after the last record.
  void finish(const uint8_t (&i_rFooterId)[16]);

  uint32_t version() const { return m_version; }
  /// Arrays written compressed so far.
  int compressedArrays() const { return m_compressed; }

private:
  struct Open {
    uint64_t headerOffset;
    uint64_t propertiesStart;
    uint64_t propertiesEnd; // 0 while properties are still being written
    uint64_t count;
    bool hasChildren;
  };
  void property(char i_type);
  void array(char i_type, const void* i_pData, uint32_t i_count, size_t i_elementSize,
             bool i_view = false);
  void put(const void* i_pData, size_t i_size) { m_rSink.append(i_pData, i_size); }
  template <typename T> void putValue(T i_value) { put(&i_value, sizeof i_value); }
  void nullRecord();

  VFbxByteSink& m_rSink;
  uint32_t m_version;
  bool m_wide;
  size_t m_threshold;
  std::vector<Open> m_open;
  VFbxDeflater m_deflater;
  int m_compressed = 0;
};

} // namespace AnvilFbx
