#pragma once
// The USDA text of prims and values, appended to a buffer that goes to a file in large blocks.

#include "usd/UsdTypes.h"

#include <cstdio>
#include <string>
#include <string_view>

namespace AnvilUsd {

class VPrim;

/// USD's dictionary order of property names: case folded, runs of digits by their value, byte
/// order to break ties.
bool DictionaryLess(std::string_view a, std::string_view b);

class VTextWriter {
public:
  explicit VTextWriter(std::FILE* pFile) : m_pFile(pFile) { m_Buffer.reserve(BlockSize + 4096); }
  ~VTextWriter() { Flush(); }

  void Text(std::string_view text);
  /// A quoted string or token, escaped; triple quotes when it holds a newline.
  void String(std::string_view text);
  void Double(double value);
  void Value(const VValue& value);
  /// A prim with its properties and children, at `indent` levels of four spaces.
  void Prim(const VPrim& prim, int indent);
  void Flush();

private:
  static constexpr std::size_t BlockSize = 1 << 20;
  void Indent(int indent) { m_Buffer.append(std::size_t(indent) * 4, ' '); }
  void MaybeFlush() {
    if (m_Buffer.size() >= BlockSize) Flush();
  }
  template <class T, class F> void Array(const std::vector<T>& values, F element);

  std::FILE* m_pFile;
  std::string m_Buffer;
};

} // namespace AnvilUsd
