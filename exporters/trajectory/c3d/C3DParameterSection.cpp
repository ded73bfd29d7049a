#include "C3DParameterSection.h"

namespace C3D {

VParameterSection::VParameterSection(bool i_dec, uint8_t i_blockCount) : m_dec(i_dec) {
  m_bytes = {0x01, kFormatKey, i_blockCount,
             i_dec ? uint8_t(EProcessorDec) : uint8_t(EProcessorIntel)};
}

void VParameterSection::appendU16(uint16_t i_value) {
  m_bytes.push_back(uint8_t(i_value & 0xFF));
  m_bytes.push_back(uint8_t(i_value >> 8));
}

void VParameterSection::appendName(int i_id, const std::string& i_name) {
  m_bytes.push_back(uint8_t(i_name.size()));
  m_bytes.push_back(uint8_t(i_id));
  m_bytes.insert(m_bytes.end(), i_name.begin(), i_name.end());
}

void VParameterSection::addGroup(int i_id, const std::string& i_name) {
  appendName(-i_id, i_name);
  appendU16(3); // the offset word and the description length byte
  m_bytes.push_back(0);
}

size_t VParameterSection::addParameter(int i_group, const std::string& i_name,
                                       EParameterType i_type, std::initializer_list<int> i_dims,
                                       const void* i_pData, size_t i_size) {
  appendName(i_group, i_name);
  // From the offset word itself to the end of the record.
  appendU16(uint16_t(2 + 1 + 1 + i_dims.size() + i_size + 1));
  m_bytes.push_back(uint8_t(i_type));
  m_bytes.push_back(uint8_t(i_dims.size()));
  for (int dim : i_dims)
    m_bytes.push_back(uint8_t(dim));
  const size_t offset = m_bytes.size();
  const uint8_t* pData = static_cast<const uint8_t*>(i_pData);
  m_bytes.insert(m_bytes.end(), pData, pData + i_size);
  m_bytes.push_back(0); // no description
  return offset;
}

size_t VParameterSection::addInt(int i_group, const std::string& i_name, int i_value) {
  uint8_t data[2];
  putU16LE(data, uint16_t(i_value));
  return addParameter(i_group, i_name, ETypeInt16, {}, data, 2);
}

void VParameterSection::addInts(int i_group, const std::string& i_name,
                                std::initializer_list<int> i_dims,
                                const std::vector<int>& i_values) {
  std::vector<uint8_t> data(i_values.size() * 2);
  for (size_t i = 0; i < i_values.size(); ++i)
    putU16LE(&data[i * 2], uint16_t(i_values[i]));
  addParameter(i_group, i_name, ETypeInt16, i_dims, data.data(), data.size());
}

void VParameterSection::addByte(int i_group, const std::string& i_name, uint8_t i_value) {
  addParameter(i_group, i_name, ETypeByte, {}, &i_value, 1);
}

void VParameterSection::addFloat(int i_group, const std::string& i_name, float i_value) {
  uint8_t data[4];
  putFloat(data, i_value, m_dec);
  addParameter(i_group, i_name, ETypeFloat, {}, data, 4);
}

void VParameterSection::addFloats(int i_group, const std::string& i_name,
                                  std::initializer_list<int> i_dims,
                                  const std::vector<float>& i_values) {
  std::vector<uint8_t> data(i_values.size() * 4);
  for (size_t i = 0; i < i_values.size(); ++i)
    putFloat(&data[i * 4], i_values[i], m_dec);
  addParameter(i_group, i_name, ETypeFloat, i_dims, data.data(), data.size());
}

void VParameterSection::addText(int i_group, const std::string& i_name,
                                std::initializer_list<int> i_dims, const std::string& i_text) {
  addParameter(i_group, i_name, ETypeChar, i_dims, i_text.data(), i_text.size());
}

void appendPadded(std::string& io_rOut, const std::string& i_text, int i_width) {
  io_rOut += i_text;
  if (int(i_text.size()) < i_width) io_rOut.append(size_t(i_width) - i_text.size(), ' ');
}

} // namespace C3D
