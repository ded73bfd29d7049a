#pragma once
#include "C3DFormat.h"
#include <cstddef>
#include <cstdint>
#include <initializer_list>
#include <string>
#include <vector>

namespace C3D {

/// Builds a parameter section in memory, from its four leading bytes to its closing zero byte.
///
/// Records are laid out as the C3D format has them: name length, group id (negated for a
/// group), name, a 16-bit offset from that word to the record's end, then for a parameter the
/// type, the dimension count, one byte per dimension and the data; every record ends with an
/// empty description. Integers are little-endian; floats take the DEC or Intel form.
class VParameterSection {
public:
  /// Writes the leading bytes: 0x01, the format key, `i_blockCount` and the processor byte.
  VParameterSection(bool i_dec, uint8_t i_blockCount);

  void addGroup(int i_id, const std::string& i_name);
  /// A parameter with raw data; returns the offset of the data within `bytes()`.
  size_t addParameter(int i_group, const std::string& i_name, EParameterType i_type,
                      std::initializer_list<int> i_dims, const void* i_pData, size_t i_size);
  /// One 16-bit integer (low 16 bits of the value), no dimensions.
  size_t addInt(int i_group, const std::string& i_name, int i_value);
  /// 16-bit integers under the given dimensions.
  void addInts(int i_group, const std::string& i_name, std::initializer_list<int> i_dims,
               const std::vector<int>& i_values);
  void addByte(int i_group, const std::string& i_name, uint8_t i_value);
  void addFloat(int i_group, const std::string& i_name, float i_value);
  void addFloats(int i_group, const std::string& i_name, std::initializer_list<int> i_dims,
                 const std::vector<float>& i_values);
  /// Characters, already laid out (padded) by the caller.
  void addText(int i_group, const std::string& i_name, std::initializer_list<int> i_dims,
               const std::string& i_text);
  /// Appends the zero byte that ends the section.
  void finish() { m_bytes.push_back(0); }

  const std::vector<uint8_t>& bytes() const { return m_bytes; }

private:
  void appendName(int i_id, const std::string& i_name);
  void appendU16(uint16_t i_value);

  bool m_dec;
  std::vector<uint8_t> m_bytes;
};

/// Appends `i_text` blank-padded to `i_width`; a longer text is appended whole.
void appendPadded(std::string& io_rOut, const std::string& i_text, int i_width);

} // namespace C3D
