#pragma once
// A small, independent C3D reader for checking what the exporter wrote: it walks the parameter
// records by their offsets, keeps each record's position, and decodes Intel and DEC floats from
// their definitions (not through the writer's conversion code).
#include <cmath>
#include <cstdint>
#include <cstring>
#include <string>
#include <vector>

namespace C3DTest {

struct Parameter {
  int group = 0;
  std::string groupName;
  std::string name;
  int type = 0; ///< -1 characters, 1 byte, 2 int16, 4 float
  std::vector<int> dims;
  size_t dataOffset = 0; ///< file position of the first data byte
  size_t dataSize = 0;
  size_t offsetWordPos = 0;
  int offsetWord = 0;
};

class File {
public:
  std::vector<uint8_t> bytes;
  std::vector<std::pair<int, std::string>> groups; ///< in file order
  std::vector<Parameter> parameters;               ///< in file order
  size_t sectionEnd = 0;                           ///< position after the closing zero byte
  std::string error;

  explicit File(std::vector<uint8_t> i_bytes) : bytes(std::move(i_bytes)) { parse(); }
  bool ok() const { return error.empty(); }
  bool isDec() const { return bytes.size() > 515 && bytes[515] == 0x55; }

  uint8_t u8(size_t i_pos) const { return bytes.at(i_pos); }
  int u16(size_t i_pos) const { return bytes.at(i_pos) | (bytes.at(i_pos + 1) << 8); }
  int i16(size_t i_pos) const { return int16_t(uint16_t(u16(i_pos))); }
  int32_t i32(size_t i_pos) const {
    return int32_t(uint32_t(u16(i_pos)) | (uint32_t(u16(i_pos + 2)) << 16));
  }
  /// A float in the file's form (processor byte of the parameter section).
  double real(size_t i_pos) const { return isDec() ? decFloat(i_pos) : ieeeFloat(i_pos); }

  double ieeeFloat(size_t i_pos) const {
    const uint32_t bits = uint32_t(i32(i_pos));
    float value;
    std::memcpy(&value, &bits, 4);
    return value;
  }
  /// DEC F-float: word 1 holds sign, 8-bit exponent (bias 128) and the high fraction bits; the
  /// value is 0.1fff... (binary) times 2^(exponent - 128). Exponent 0 is zero.
  double decFloat(size_t i_pos) const {
    const uint32_t high = uint32_t(u16(i_pos)), low = uint32_t(u16(i_pos + 2));
    const int exponent = int((high >> 7) & 0xFF);
    if (exponent == 0) return 0.0;
    const uint32_t fraction = ((high & 0x7F) << 16) | low | 0x800000u;
    const double value = std::ldexp(double(fraction) / 16777216.0, exponent - 128);
    return (high & 0x8000) ? -value : value;
  }

  const Parameter* find(const std::string& i_group, const std::string& i_name) const {
    for (const Parameter& p : parameters)
      if (p.groupName == i_group && p.name == i_name) return &p;
    return nullptr;
  }
  bool hasGroup(const std::string& i_name) const {
    for (const auto& g : groups)
      if (g.second == i_name) return true;
    return false;
  }
  int paramInt(const std::string& i_group, const std::string& i_name) const {
    const Parameter* p = find(i_group, i_name);
    return p ? i16(p->dataOffset) : -99999;
  }
  double paramReal(const std::string& i_group, const std::string& i_name) const {
    const Parameter* p = find(i_group, i_name);
    return p ? real(p->dataOffset) : -99999.0;
  }
  std::vector<int> paramInts(const std::string& i_group, const std::string& i_name) const {
    std::vector<int> values;
    if (const Parameter* p = find(i_group, i_name))
      for (size_t i = 0; i < p->dataSize; i += 2)
        values.push_back(i16(p->dataOffset + i));
    return values;
  }
  std::string paramText(const std::string& i_group, const std::string& i_name) const {
    const Parameter* p = find(i_group, i_name);
    if (!p) return "<missing>";
    return std::string(bytes.begin() + long(p->dataOffset),
                       bytes.begin() + long(p->dataOffset + p->dataSize));
  }
  /// Rows of a 2-dimensional character parameter, trailing blanks removed.
  std::vector<std::string> paramStrings(const std::string& i_group,
                                        const std::string& i_name) const {
    std::vector<std::string> rows;
    const Parameter* p = find(i_group, i_name);
    if (!p || p->dims.size() != 2 || p->dims[0] == 0) return rows;
    const std::string text = paramText(i_group, i_name);
    for (size_t i = 0; i + size_t(p->dims[0]) <= text.size(); i += size_t(p->dims[0])) {
      std::string row = text.substr(i, size_t(p->dims[0]));
      row.erase(row.find_last_not_of(' ') + 1);
      rows.push_back(row);
    }
    return rows;
  }

private:
  void parse() {
    if (bytes.size() < 1024) return fail("shorter than two blocks");
    if (bytes[0] != 2 || bytes[1] != 0x50) return fail("bad header key");
    if (bytes[512] != 1 || bytes[513] != 0x50) return fail("bad parameter section key");
    size_t pos = 516;
    for (;;) {
      if (pos >= bytes.size()) return fail("section runs past the file");
      const int nameLength = int8_t(bytes[pos]);
      if (nameLength == 0) {
        sectionEnd = pos + 1;
        return;
      }
      const int id = int8_t(bytes[pos + 1]);
      const std::string name(bytes.begin() + long(pos + 2),
                             bytes.begin() + long(pos + 2 + size_t(std::abs(nameLength))));
      const size_t wordPos = pos + 2 + size_t(std::abs(nameLength));
      const int offset = u16(wordPos);
      const size_t next = wordPos + size_t(offset);
      if (id < 0) {
        groups.push_back({-id, name});
      } else {
        Parameter p;
        p.group = id;
        p.name = name;
        p.offsetWordPos = wordPos;
        p.offsetWord = offset;
        p.type = int8_t(bytes[wordPos + 2]);
        const int dimCount = bytes[wordPos + 3];
        for (int d = 0; d < dimCount; ++d)
          p.dims.push_back(bytes[wordPos + 4 + size_t(d)]);
        p.dataOffset = wordPos + 4 + size_t(dimCount);
        // The record's extent decides the data size; the description length byte ends it.
        p.dataSize = next - 1 - p.dataOffset;
        for (const auto& g : groups)
          if (g.first == id) p.groupName = g.second;
        if (bytes[next - 1] != 0) return fail("description not empty in " + name);
        parameters.push_back(p);
      }
      pos = next;
    }
  }
  void fail(const std::string& i_text) { error = i_text; }
};

} // namespace C3DTest
