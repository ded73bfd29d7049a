#include "FbxRecordWriter.h"
#include <cstring>
#include <stdexcept>

namespace AnvilFbx {

namespace {
const char kMagic[23] = "Kaydara FBX Binary  \0\x1a";
const uint8_t kFooterMagic[16] = {0xF8, 0x5A, 0x8C, 0x6A, 0xDE, 0xF5, 0xD9, 0x7E,
                                  0xEC, 0xE9, 0x0C, 0xE3, 0x75, 0x8F, 0x29, 0x0B};
constexpr size_t kViewBytes = 16384;
} // namespace

VFbxRecordWriter::VFbxRecordWriter(VFbxByteSink& io_rSink, uint32_t i_version,
                                   size_t i_compressionThreshold)
    : m_rSink(io_rSink), m_version(i_version), m_wide(i_version >= 7500),
      m_threshold(i_compressionThreshold) {}

void VFbxRecordWriter::writeHeader() {
  put(kMagic, 22);      // the magic text, its NUL and 0x1A
  putValue<uint8_t>(0); // little-endian
  putValue<uint32_t>(m_version);
}

void VFbxRecordWriter::begin(std::string_view i_name) {
  if (!m_open.empty()) {
    Open& parent = m_open.back();
    if (!parent.hasChildren) {
      parent.hasChildren = true;
      parent.propertiesEnd = m_rSink.size();
    }
  }
  Open record{m_rSink.size(), 0, 0, 0, false};
  const uint8_t zeros[24] = {};
  put(zeros, m_wide ? 24 : 12); // end offset, property count, property bytes: patched at end
  putValue<uint8_t>(uint8_t(i_name.size()));
  put(i_name.data(), i_name.size());
  record.propertiesStart = m_rSink.size();
  m_open.push_back(record);
}

void VFbxRecordWriter::nullRecord() {
  const uint8_t zeros[25] = {};
  put(zeros, m_wide ? 25 : 13);
}

void VFbxRecordWriter::end(bool i_nested) {
  Open record = m_open.back();
  m_open.pop_back();
  const uint64_t propertiesEnd = record.hasChildren ? record.propertiesEnd : m_rSink.size();
  if (record.hasChildren || i_nested) nullRecord();
  const uint64_t endOffset = m_rSink.size();
  const uint64_t propertyBytes = propertiesEnd - record.propertiesStart;
  if (m_wide) {
    const uint64_t fields[3] = {endOffset, record.count, propertyBytes};
    m_rSink.patch(record.headerOffset, fields, sizeof fields);
  } else {
    if (endOffset > UINT32_MAX) throw std::length_error("file too large for a 32-bit version");
    const uint32_t fields[3] = {uint32_t(endOffset), uint32_t(record.count),
                                uint32_t(propertyBytes)};
    m_rSink.patch(record.headerOffset, fields, sizeof fields);
  }
}

void VFbxRecordWriter::property(char i_type) {
  ++m_open.back().count;
  putValue<char>(i_type);
}

void VFbxRecordWriter::propY(int16_t i_value) {
  property('Y');
  putValue(i_value);
}
void VFbxRecordWriter::propC(uint8_t i_value) {
  property('C');
  putValue(i_value);
}
void VFbxRecordWriter::propI(int32_t i_value) {
  property('I');
  putValue(i_value);
}
void VFbxRecordWriter::propF(float i_value) {
  property('F');
  putValue(i_value);
}
void VFbxRecordWriter::propD(double i_value) {
  property('D');
  putValue(i_value);
}
void VFbxRecordWriter::propL(int64_t i_value) {
  property('L');
  putValue(i_value);
}
void VFbxRecordWriter::propS(std::string_view i_text) {
  property('S');
  putValue<uint32_t>(uint32_t(i_text.size()));
  put(i_text.data(), i_text.size());
}
void VFbxRecordWriter::propR(std::span<const uint8_t> i_bytes) {
  property('R');
  putValue<uint32_t>(uint32_t(i_bytes.size()));
  put(i_bytes.data(), i_bytes.size());
}

void VFbxRecordWriter::array(char i_type, const void* i_pData, uint32_t i_count,
                             size_t i_elementSize, bool i_view) {
  property(i_type);
  const size_t bytes = size_t(i_count) * i_elementSize;
  if (bytes > m_threshold) {
    // The header's stored length is patched once the compressed length is known.
    const uint64_t header = m_rSink.size();
    const uint32_t fields[3] = {i_count, 1, 0};
    put(fields, sizeof fields);
    if (const size_t compressedSize = m_deflater.compress(i_pData, bytes, m_rSink)) {
      const uint32_t stored = uint32_t(compressedSize);
      m_rSink.patch(header + 8, &stored, sizeof stored);
      ++m_compressed;
      return;
    }
    m_rSink.truncate(header);
  }
  putValue<uint32_t>(i_count);
  putValue<uint32_t>(0);
  putValue<uint32_t>(uint32_t(bytes));
  // Below a few pages a view costs more than the copy it saves.
  if (i_view && bytes >= kViewBytes)
    m_rSink.appendView(i_pData, bytes);
  else
    put(i_pData, bytes);
}

void VFbxRecordWriter::propArray(std::span<const float> i_values) {
  array('f', i_values.data(), uint32_t(i_values.size()), sizeof(float));
}
void VFbxRecordWriter::propArray(std::span<const double> i_values) {
  array('d', i_values.data(), uint32_t(i_values.size()), sizeof(double));
}
void VFbxRecordWriter::propArray(std::span<const int64_t> i_values) {
  array('l', i_values.data(), uint32_t(i_values.size()), sizeof(int64_t));
}
void VFbxRecordWriter::propArray(std::span<const int32_t> i_values) {
  array('i', i_values.data(), uint32_t(i_values.size()), sizeof(int32_t));
}

void VFbxRecordWriter::propArrayView(std::span<const float> i_values) {
  array('f', i_values.data(), uint32_t(i_values.size()), sizeof(float), true);
}
void VFbxRecordWriter::propArrayView(std::span<const int64_t> i_values) {
  array('l', i_values.data(), uint32_t(i_values.size()), sizeof(int64_t), true);
}

void VFbxRecordWriter::finish(const uint8_t (&i_rFooterId)[16]) {
  nullRecord();
  put(i_rFooterId, 16);
  // Zeros up to the next multiple of 16 (a whole 16 when already aligned), as files of the
  // reference writer have them.
  const size_t padding = 16 - size_t(m_rSink.size() % 16);
  const uint8_t zeros[128] = {};
  put(zeros, padding);
  put(zeros, 4);
  putValue<uint32_t>(m_version);
  put(zeros, 120);
  put(kFooterMagic, 16);
}

} // namespace AnvilFbx
